// The front panel on a form against the simulator, driven as an operator drives it: function keys,
// a knob dragged for two seconds, typed values and their focus rules, the decade buttons, and what
// an error and a panel made mid-session show. Asserts on the widgets and on the driver call trace.
#include "../platform/test_support.h"
#include "qzivi/panels/XUIFgen1.h"
#include "qzivi/panels/XWinLabel.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/support/timers.h"
#include "qzivi/trace.h"
#include "qzivi/widgets/QZButton.h"
#include "qzivi/widgets/QZKnob.h"

#include <QApplication>
#include <QComboBox>
#include <QLabel>
#include <QLineEdit>
#include <QTest>
#include <QToolButton>

#include <cmath>
#include <numbers>

using namespace qzivi;

namespace {

// The arguments of a trace record, split at ", ".
QStringList Arguments(const ivi::TraceRecord& record) {
    return QString::fromStdString(record.arguments).split(QStringLiteral(", "));
}

} // namespace

class FrontPanelTest : public QObject {
    Q_OBJECT

    std::unique_ptr<test::StoreScope> store_;
    std::unique_ptr<QZIviFgenWidget> form_;

    QZIviFgen& Control() { return form_->Control(); }
    template <typename T>
    T* Child(const QString& name) {
        auto* child = form_->findChild<T*>(name);
        if (!child) qFatal("no child %s", qPrintable(name));
        return child;
    }
    QZButton* Function(int n) { return Child<QZButton>(QStringLiteral("qzbtnFunction%1").arg(n)); }
    QZKnob* Knob(int n) { return Child<QZKnob>(QStringLiteral("knobFgen%1").arg(n)); }
    QLineEdit* Field(int n) { return Child<QLineEdit>(QStringLiteral("txtInput%1").arg(n)); }
    QToolButton* Decade(int n) {
        return Child<QToolButton>(QStringLiteral("cmdMulFactor%1").arg(n));
    }
    int Pressed() {
        int pressed = 0;
        for (int i = 1; i <= 8; ++i)
            if (Function(i)->Value()) pressed = pressed ? -1 : i;
        return pressed;
    }

    // The frequencies the instrument was given, in the order it got them.
    static std::vector<double> Frequencies(const ivi::TraceRecorder& trace) {
        std::vector<double> out;
        for (const auto& r : trace.Records())
            if (r.function == "IviFgen_ConfigureStandardWaveform" && r.status >= 0)
                out.push_back(Arguments(r).at(5).toDouble());
        return out;
    }

    void Focus(QWidget* widget) {
        widget->setFocus();
        QTRY_COMPARE(QApplication::focusWidget(), widget);
    }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<test::StoreScope>();
        store_->UseStore("[Bench]\nmodule = builtin\nresource = SIM\n"
                         "channel Channel1 = 1\nchannel Channel2 = 2\n"
                         "[Broken]\nmodule = builtin\nresource = SIM\n"
                         "options = DriverSetup=Fail=ConfigureOutputMode:0xBFFA0001:1\n"
                         "channel Channel1 = 1\n");
        form_ = std::make_unique<QZIviFgenWidget>();
        form_->setProperty("UIStyle", 1);
        form_->setProperty("LogicalName", "Bench");
        Control().ExceptionOnError(false);
        Control().Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt);
        Control().Channels()->Add("Channel1");
        form_->show();
        QVERIFY(QTest::qWaitForWindowActive(form_.get()));
    }
    void cleanup() {
        form_.reset();
        store_.reset();
    }

    void eachFunctionKeyConfiguresItsFunction() {
        Control().Configure();
        QCOMPARE(Pressed(), 1);
        for (int n = 1; n <= 6; ++n) {
            ivi::TraceRecorder trace;
            QTest::mouseClick(Function(n), Qt::LeftButton);
            QCOMPARE(Pressed(), n);
            bool configured = false;
            for (const auto& r : trace.Records())
                if (r.function == "IviFgen_ConfigureStandardWaveform")
                    configured = Arguments(r).at(2).toInt() == n && r.status >= 0;
            QVERIFY2(configured, qPrintable(QStringLiteral("function %1").arg(n)));
            QCOMPARE(Control().Channels()->Item(1)->FuncWaveform(), n);
        }
        // With a waveform in the tree the arbitrary key works, and takes the first waveform.
        QVERIFY(!Function(7)->isEnabled());
        std::vector<double> ramp(64);
        for (std::size_t i = 0; i < ramp.size(); ++i)
            ramp[i] = -1 + 2.0 * static_cast<double>(i) / 63;
        Control().Waveforms()->Add("Ramp")->Data(std::move(ramp));
        Control().Configure();
        QVERIFY(Function(7)->isEnabled() && !Function(8)->isEnabled());
        ivi::TraceRecorder trace;
        QTest::mouseClick(Function(7), Qt::LeftButton);
        QCOMPARE(Pressed(), 7);
        QCOMPARE(Control().OutputMode(), qzivifgenOutputArb);
        const auto calls = trace.Functions();
        QVERIFY(std::find(calls.begin(), calls.end(), "IviFgen_CreateArbWaveform") != calls.end());
        QCOMPARE(Child<QComboBox>("cmbArbWfmList")->currentText(), QStringLiteral("Ramp"));
        QVERIFY(Child<QComboBox>("cmbArbWfmList")->isEnabled());
        QVERIFY(!Child<QComboBox>("cmbSeqWfmList")->isEnabled());

        Control().Sequences()->Add("Twice")->Add(Control().Waveforms()->Item(1), 2);
        Control().Configure();
        trace.Clear();
        QTest::mouseClick(Function(8), Qt::LeftButton);
        QCOMPARE(Pressed(), 8);
        QCOMPARE(Control().OutputMode(), qzivifgenOutputSeq);
        const auto sequenced = trace.Functions();
        QVERIFY(std::find(sequenced.begin(), sequenced.end(), "IviFgen_CreateArbSequence") !=
                sequenced.end());
        QCOMPARE(Child<QComboBox>("cmbSeqWfmList")->currentText(), QStringLiteral("Twice"));
        QVERIFY(!Knob(3)->isVisible()); // no duty cycle outside the standard functions
    }

    void aTwoSecondDragConfiguresAtMostTwiceASecondAndTheFinalValueOnce() {
        Control().Configure();
        TimerLoop clock;
        const TickSourceScope ticks(&clock);
        int runs = 0;
        const auto counted = Control().Configured.Connect([&] { ++runs; });
        ivi::TraceRecorder trace;

        QZKnob* knob = Knob(0);
        const QPointF centre = QRectF(knob->rect()).center();
        const double radius = knob->width() / 4.0;
        const auto at = [&](double degrees) {
            const double a = degrees * std::numbers::pi / 180;
            return (centre + QPointF(radius * std::cos(a), -radius * std::sin(a))).toPoint();
        };
        QTest::mousePress(knob, Qt::LeftButton, {}, at(200));
        for (int step = 1; step <= 100; ++step) { // every 20 ms, from lower left over the top
            clock.Advance(20);
            QTest::mouseMove(knob, at(200 - 2 * step));
        }
        const double beforeRelease = knob->Value();
        QTest::mouseRelease(knob, Qt::LeftButton, {}, at(-30));
        const double final = knob->Value();
        QVERIFY(final != beforeRelease);

        QVERIFY2(runs <= 5 && runs >= 2, qPrintable(QString::number(runs)));
        const auto sent = Frequencies(trace);
        QVERIFY2(std::count(sent.begin(), sent.end(), final) == 1,
                 qPrintable(QStringLiteral("%1 in %2 sent").arg(final).arg(sent.size())));
        QCOMPARE(sent.back(), final);
        QCOMPARE(Control().Channels()->Item(1)->FuncFrequency(), final);
    }

    void aTypedValueReachesTheInstrumentAndEscRestoresTheShownOne() {
        Control().Configure();
        QLineEdit* field = Field(0);
        QCOMPARE(field->text(), QStringLiteral("1.000000 kHz"));
        Focus(field);
        field->selectAll();
        ivi::TraceRecorder trace;
        QTest::keyClicks(field, "2.5 k");
        QTest::keyClick(field, Qt::Key_Return);
        QCOMPARE(Frequencies(trace), std::vector<double>{2500});
        QCOMPARE(field->text(), QStringLiteral("2.500000 kHz"));
        QCOMPARE(Knob(0)->Value(), 2500.0);

        Focus(field);
        field->selectAll();
        QTest::keyClicks(field, "7");
        QTest::keyClick(field, Qt::Key_Escape);
        QCOMPARE(field->text(), QStringLiteral("2.500000 kHz"));
        QCOMPARE(Control().Channels()->Item(1)->FuncFrequency(), 2500.0);
    }

    void leavingAChangedFieldWithoutEnterIsRefused() {
        Control().Configure();
        QLineEdit* field = Field(2);
        Focus(field);
        field->selectAll();
        QTest::keyClicks(field, "3");
        Knob(2)->setFocus();
        QTRY_COMPARE(QApplication::focusWidget(), field);
        QCOMPARE(field->text(), QStringLiteral("3"));
        QCOMPARE(Control().Channels()->Item(1)->FuncAmplitude(), 2.0);
        QTest::keyClick(field, Qt::Key_Return);
        QCOMPARE(Control().Channels()->Item(1)->FuncAmplitude(), 3.0);
        QCOMPARE(field->text(), QStringLiteral("3.00 V"));
        Focus(Knob(1)); // settled: it may go
    }

    // The panel is drawn in Arial's metrics; in a wider font the captions would run out of their
    // labels at the designed size.
    void everyCaptionFitsItsLabelAtTheDesignedSize() {
        Control().Configure();
        form_->resize(form_->sizeHint());
        QTRY_COMPARE(Child<XUIFgen1>(QString())->size(), form_->sizeHint());
        const auto labels = form_->findChildren<XWinLabel*>();
        QVERIFY(labels.size() >= 8);
        for (const XWinLabel* label : labels) {
            const int needed = QFontMetrics(label->Font()).horizontalAdvance(label->Shown());
            QVERIFY2(needed <= label->width(), qPrintable(QStringLiteral("\"%1\" needs %2 of %3 px")
                                                              .arg(label->Shown())
                                                              .arg(needed)
                                                              .arg(label->width())));
        }
    }

    void theDecadeLabelsNameTheEndsOfTheFrequencyKnob() {
        const auto ends = [&] {
            return Child<XWinLabel>(QStringLiteral("lblFgen4"))->Shown() + " to " +
                   Child<XWinLabel>(QStringLiteral("lblFgen5"))->Shown();
        };
        QCOMPARE(ends(), QStringLiteral("1 Hz to 10 Hz")); // the knob's axis before any session
        Control().Configure();
        QCOMPARE(ends(), QStringLiteral("100 Hz to 1 kHz")); // 1 kHz tops its decade
        QTest::mouseClick(Decade(0), Qt::LeftButton);
        QCOMPARE(ends(), QStringLiteral("1 kHz to 10 kHz"));
        QCOMPARE(Field(0)->text(), QStringLiteral("10.000000 kHz"));
    }

    void theDecadeButtonsStopAtTheDriversLimits() {
        Control().Configure();
        ivi::TraceRecorder trace;
        int clicks = 0;
        while (Decade(0)->isEnabled() && clicks < 30) {
            QTest::mouseClick(Decade(0), Qt::LeftButton);
            ++clicks;
        }
        QVERIFY(clicks < 30);
        const double top = Frequencies(trace).back();
        QVERIFY(Decade(1)->isEnabled());
        QCOMPARE(Knob(0)->Value(), top);
        QVERIFY(Knob(0)->Maximum() >= top);
        clicks = 0;
        while (Decade(1)->isEnabled() && clicks < 30) {
            QTest::mouseClick(Decade(1), Qt::LeftButton);
            ++clicks;
        }
        QVERIFY(clicks < 30);
        const double bottom = Frequencies(trace).back();
        QVERIFY(bottom < 1000 && top > 1000);
        QCOMPARE(Knob(0)->Minimum(), bottom);
        QVERIFY(Decade(0)->isEnabled());
        // The limits are the driver's: one step past either end is refused by it.
        int errors = 0;
        const auto counted = Control().IviError.Connect(
            [&](std::int32_t, const std::string&, const std::string&) { ++errors; });
        const auto refused = [&](double f) {
            const int before = errors;
            Control().Channels()->Item(1)->FuncFrequency(f);
            Control().Configure();
            const bool failed = errors > before;
            Control().Channels()->Item(1)->FuncFrequency(1000);
            Control().Configure();
            return failed;
        };
        QVERIFY(refused(top * 1.5));
        QVERIFY(refused(bottom / 1.5));
    }

    void theFirstTurnAfterInitConfigures() {
        Control().Init();
        int runs = 0;
        const auto counted = Control().Configured.Connect([&] { ++runs; });
        QVERIFY(Knob(2)->isEnabled());
        const double before = Control().Channels()->Item(1)->FuncAmplitude();
        QTest::keyClick(Knob(2), Qt::Key_Up);
        QCOMPARE(runs, 1);
        QVERIFY(Control().Channels()->Item(1)->FuncAmplitude() != before);
        QCOMPARE(Control().Channels()->Item(1)->FuncAmplitude(), Knob(2)->Value());
    }

    void dcLeavesOnlyTheOffset() {
        Control().Configure();
        QTest::mouseClick(Function(6), Qt::LeftButton);
        QCOMPARE(Pressed(), 6);
        QVERIFY(Knob(1)->isEnabled() && Field(1)->isEnabled());
        for (int i : {0, 2, 3})
            QVERIFY2(!Knob(i)->isEnabled(), qPrintable(QString::number(i)));
        for (int i : {0, 2, 3})
            QVERIFY2(!Field(i)->isEnabled(), qPrintable(QString::number(i)));
        QVERIFY(!Decade(0)->isEnabled() && !Decade(1)->isEnabled());
        QTest::mouseClick(Function(2), Qt::LeftButton); // the square has a duty cycle
        QVERIFY(Knob(0)->isEnabled() && Knob(3)->isEnabled() && Field(3)->isEnabled());
        QTest::mouseClick(Function(1), Qt::LeftButton);
        QVERIFY(!Knob(3)->isEnabled());
    }

    void anErrorReleasesTheKeysUntilTheNextGoodConfigure() {
        form_->setProperty("LogicalName", "Broken");
        Control().Configure();
        auto* lamp = Child<QLabel>("lblError");
        QVERIFY(lamp->isVisible());
        QVERIFY2(lamp->toolTip().startsWith("Error -30701:  "), qPrintable(lamp->toolTip()));
        QCOMPARE(Pressed(), 0);
        Control().Configure();
        QVERIFY(!lamp->isVisible());
        QCOMPARE(Pressed(), 1);
    }

    void aPanelMadeInTheMiddleOfASessionShowsItAtOnce() {
        Control().Configure();
        form_->setProperty("UIStyle", 0); // the icon keeps what the panel showed
        Control().Channels()->Item(1)->FuncWaveform(qzivifgenWaveformSquare);
        Control().Channels()->Item(1)->FuncFrequency(2e6);
        Control().Configure();
        QVERIFY(form_->findChild<XUIFgen1*>() == nullptr);
        form_->setProperty("UIStyle", 1);
        QVERIFY(form_->findChild<XUIFgen1*>() != nullptr);
        QCOMPARE(Pressed(), 2);
        QCOMPARE(Field(0)->text(), QStringLiteral("2.000000 MHz"));
        QVERIFY(Knob(0)->Minimum() <= 2e6 && 2e6 <= Knob(0)->Maximum());
        QCOMPARE(Field(2)->text(), QStringLiteral("2.00 V"));
        QVERIFY(Knob(3)->isEnabled());
    }

    void belowTheSmallestSizeTheFieldsGiveWay() {
        form_->resize(90, 30);
        QVERIFY(!Field(0)->isVisible());
        form_->resize(form_->findChild<XUIFgen1*>()->sizeHint());
        QVERIFY(Field(0)->isVisible());
        QVERIFY(Function(8)->geometry().right() <= form_->width());
    }
};

QTEST_MAIN(FrontPanelTest)
#include "front_panel_test.moc"
