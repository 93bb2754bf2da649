// The front panel program's window, driven offscreen as a user drives it: a saved configuration
// opened and configured, a function key pressed on the panel, and the scope view following; the
// log of errors; the files remembered.
#include "PanelWindow.h"
#include "platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/widgets/QZButton.h"

#include <QLabel>
#include <QMenu>
#include <QMenuBar>
#include <QPlainTextEdit>
#include <QSettings>
#include <QSplitter>
#include <QTest>

#include <cmath>

using qzfgen::PanelWindow;

class PanelProgramTest : public QObject {
    Q_OBJECT

    std::unique_ptr<qzivi::test::StoreScope> store_; // also a settings folder of its own
    const QString example_ = QStringLiteral(QZIVI_SOURCE_DIR "/examples/two-channels.qzc");

    static std::vector<double> Samples(PanelWindow& w, std::size_t channel) {
        const auto& traces = w.Scope().Traces();
        return channel < traces.size() ? traces[channel].volts : std::vector<double>();
    }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<qzivi::test::StoreScope>();
        QSettings("QZIviFgen", "qzfgen-panel").clear(); // Qt reads the settings folder only once
    }
    void cleanup() { store_.reset(); }

    void aFunctionKeyChangesWhatTheScopeShows() {
        PanelWindow w("SampleFGen");
        w.show();
        QVERIFY(w.OpenFile(example_));
        w.Init();
        w.Configure();
        QCOMPARE(w.Scope().Traces().size(), std::size_t{2});
        const std::vector<double> sine = Samples(w, 0);
        QVERIFY(!sine.empty());
        // A sine takes many levels; the square that follows only two.
        auto levels = [](std::vector<double> v) {
            for (double& x : v)
                x = std::round(x * 1000);
            std::sort(v.begin(), v.end());
            return std::unique(v.begin(), v.end()) - v.begin();
        };
        QVERIFY(levels(sine) > 50);
        auto* square = w.Form().findChild<qzivi::QZButton*>("qzbtnFunction2");
        QVERIFY(square);
        QTest::mouseClick(square, Qt::LeftButton);
        QCOMPARE(w.Control().Channels()->Item(1)->FuncWaveform(), qzivi::qzivifgenWaveformSquare);
        const std::vector<double> after = Samples(w, 0);
        QVERIFY(after != sine);
        QCOMPARE(levels(after), 2);
        QVERIFY2(!w.Log().toPlainText().contains("Error"), qPrintable(w.Log().toPlainText()));
    }

    void failuresGoToTheLogAndTheFileStaysAsItWas() {
        const std::string notes = store_->Write("notes.qzc", "no configuration\n");
        PanelWindow w("NoSuchGenerator");
        QVERIFY(w.OpenFile(example_));
        QVERIFY(!w.OpenFile(QString::fromStdString(notes)));
        QCOMPARE(w.FileName(), example_);
        QVERIFY2(w.Log().toPlainText().contains("Error -31609"), qPrintable(w.Log().toPlainText()));
        QVERIFY(!w.Log().toPlainText().contains("Open failed")); // told once, as it came
        w.Init();
        QVERIFY2(w.Log().toPlainText().contains("NoSuchGenerator"),
                 qPrintable(w.Log().toPlainText()));
        QCOMPARE(w.Control().Channels()->Count(), 2); // the example's tree still stands
        // A refused start leaves the window's state as it was: nothing claims to generate.
        auto* state = w.findChild<QLabel*>("state");
        QVERIFY(state);
        const QString before = state->text();
        w.Initiate();
        QCOMPARE(state->text(), before);
        QVERIFY2(w.Log().toPlainText().contains("Error -31600"), qPrintable(w.Log().toPlainText()));
    }

    void theLastFileAndTheRecentOnesAreRemembered() {
        const QString copy = QString::fromStdString((store_->Dir() / "copy.qzc").string());
        {
            PanelWindow w("SampleFGen");
            QVERIFY(w.OpenFile(example_));
            QVERIFY(w.SaveFile(copy));
            w.close();
        }
        QSettings settings("QZIviFgen", "qzfgen-panel");
        QCOMPARE(settings.value("lastFile").toString(), copy);
        QCOMPARE(settings.value("recentFiles").toStringList(), (QStringList{copy, example_}));
        PanelWindow again("SampleFGen");
        QVERIFY(again.OpenFile(copy));
        QCOMPARE(again.Control().Channels()->Count(), 2);
    }

    void thePanelKeepsItsDesignedWidthAndTheSplitIsRemembered() {
        const int designed = qzivi::QZIviFgenWidget().sizeHint().width();
        int dragged = 0;
        {
            PanelWindow w("SampleFGen");
            w.resize(designed + 400, 560); // narrower than the panel and the scope would like
            w.show();
            QCOMPARE(w.Form().width(), designed);
            w.resize(designed + 700, 560);
            QCOMPARE(w.Form().width(), designed); // the scope takes the new room
            auto* split = w.findChild<QSplitter*>("split");
            QVERIFY(split);
            split->setSizes({designed + 100, 600});
            dragged = w.Form().width();
            QVERIFY(dragged > designed);
            w.close();
        }
        PanelWindow again("SampleFGen");
        again.show();
        QCOMPARE(again.Form().width(), dragged);
    }
};

QTEST_MAIN(PanelProgramTest)
#include "panel_program_test.moc"
