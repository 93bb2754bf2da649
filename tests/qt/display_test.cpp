// The display panel on a form against the simulator: what it shows for each output mode, the
// error lamp, a panel made in the middle of a session, and stepping through the channels.
#include "../platform/test_support.h"
#include "qzivi/panels/XUIFgen2.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/widgets/QZGraph.h"

#include <QLabel>
#include <QTest>

using namespace qzivi;

class DisplayTest : public QObject {
    Q_OBJECT

    std::unique_ptr<test::StoreScope> store_;
    std::unique_ptr<QZIviFgenWidget> form_;

    QString Text(const char* name) { return form_->findChild<QLabel*>(name)->text(); }
    bool Shown(const char* name) { return !form_->findChild<QLabel*>(name)->isHidden(); }
    XUIFgen2* Display() { return form_->findChild<XUIFgen2*>(); }
    QZIviFgen& Control() { return form_->Control(); }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<test::StoreScope>();
        store_->UseStore("[Big]\nmodule = builtin\nresource = SIM\n"
                         "options = DriverSetup=MaxWaveformSize=10000000;Memory=10000000\n"
                         "channel Channel1 = 1\nchannel Channel2 = 2\n"
                         "[Broken]\nmodule = builtin\nresource = SIM\n"
                         "options = DriverSetup=Fail=ConfigureOutputMode:0xBFFA0001:1\n"
                         "channel Channel1 = 1\n");
        form_ = std::make_unique<QZIviFgenWidget>();
        form_->setProperty("UIStyle", 2);
        form_->setProperty("LogicalName", "Big");
        Control().ExceptionOnError(false);
        Control().Channels()->Add("Channel1");
    }
    void cleanup() {
        form_.reset();
        store_.reset();
    }

    void aSineShowsItsNameReadingAndShape() {
        QVERIFY(Display() != nullptr);
        QCOMPARE(Text("lblChannel"), QStringLiteral("< No Channels>"));
        Control().Configure();
        QCOMPARE(Text("lblChannel"), QStringLiteral("Channel1"));
        QCOMPARE(Text("lblWaveform"), QStringLiteral("Sine"));
        QCOMPARE(Text("lblReading"), QStringLiteral("1.000000 kHz"));
        QCOMPARE(Text("lblDriver"), QStringLiteral("QZSimFgen"));
        QVERIFY(Shown("lblDriver") && Shown("lblSimulated") && !Shown("lblError"));
        QCOMPARE(Display()->Graph().Data()->size(), std::size_t{50});
        QCOMPARE(Display()->UiState() & 12, 12);

        Control().Channels()->Item(1)->FuncWaveform(qzivifgenWaveformDC);
        Control().Channels()->Item(1)->FuncDCOffset(1.5);
        Control().Configure();
        QCOMPARE(Text("lblWaveform"), QStringLiteral("DC"));
        QCOMPARE(Text("lblReading"), QStringLiteral("1.50 V"));
        QCOMPARE(*Display()->Graph().Data(), std::vector<double>(100, 1.5));
        QVERIFY(Display()->Graph().YAxis().Maximum() > 1.5); // the driver's limits
    }

    void aLargeHeldWaveformIsShownWithoutACopy() {
        Control().Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt);
        std::vector<double> points(10'000'000);
        for (std::size_t i = 0; i < points.size(); ++i)
            points[i] = static_cast<double>(i % 1000) / 1000.0;
        const auto waveform = Control().Waveforms()->Add("Big");
        waveform->Data(std::move(points));
        Control().OutputMode(qzivifgenOutputArb);
        Control().Configure();
        QCOMPARE(Text("lblWaveform"), QStringLiteral("Big"));
        QCOMPARE(Display()->Graph().Data().get(), waveform->Data().get());
        QCOMPARE(Display()->Graph().YAxis().Minimum(), 0.0);
        QCOMPARE(Text("lblReading"), QStringLiteral("100.000000 uHz")); // 1000 / 10M
        // A new waveform drops the channel's reference while the panel shows it: the panel's
        // steps fail quietly and leave what they showed.
        Control().Waveforms()->Add("Another");
        QVERIFY(Control().Channels()->Item(1)->ArbWaveform() == nullptr);
        QCOMPARE(Text("lblWaveform"), QStringLiteral("Big"));
    }

    void anErrorLightsTheLampUntilTheNextGoodConfigure() {
        form_->setProperty("LogicalName", "Broken");
        Control().Configure();
        QVERIFY(Shown("lblError"));
        const QString tip = form_->findChild<QLabel*>("lblError")->toolTip();
        QVERIFY2(tip.startsWith("Error -30701:  "), qPrintable(tip));
        QCOMPARE(Display()->UiState() & 2, 2);
        Control().Configure();
        QVERIFY(!Shown("lblError"));
        QCOMPARE(Display()->UiState() & 2, 0);
    }

    void aPanelMadeInTheMiddleOfASessionShowsItAtOnce() {
        Control().Configure();
        form_->setProperty("UIStyle", 0);
        QVERIFY(Display() == nullptr);
        form_->setProperty("UIStyle", 2);
        QVERIFY(Display() != nullptr);
        QCOMPARE(Text("lblChannel"), QStringLiteral("Channel1"));
        QCOMPARE(Text("lblReading"), QStringLiteral("1.000000 kHz"));
    }

    void theArrowsStepThroughTheChannels() {
        Control().Channels()->Add("Channel2");
        Control().Configure();
        auto* next = form_->findChild<QLabel*>("pictChangeChan0");
        QVERIFY(next->isEnabled());
        QCOMPARE(Text("lblChannel"), QStringLiteral("Channel2")); // the last added is active
        QTest::mouseClick(next, Qt::LeftButton);
        QCOMPARE(Text("lblChannel"), QStringLiteral("Channel1"));
        QTest::mouseClick(form_->findChild<QLabel*>("pictChangeChan1"), Qt::LeftButton);
        QCOMPARE(Text("lblChannel"), QStringLiteral("Channel2"));
        Control().Channels()->Remove(2);
        Control().Channels()->Remove(1);
        QCOMPARE(Text("lblChannel"), QStringLiteral("<No Channels>"));
        QCOMPARE(Text("lblReading"), QStringLiteral("Off"));
        QVERIFY(!next->isEnabled());
    }
};

QTEST_MAIN(DisplayTest)
#include "display_test.moc"
