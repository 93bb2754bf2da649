// The channels page in the page host: a channel made, renamed, switched off and edited on each tab
// reaches the live tree and the simulator; the frames follow the output mode and the extensions;
// refused names and closed fields behave as the page promises.
#include "page_bench.h"
#include "qzivi/model/Channels.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/PArb.h"
#include "qzivi/pages/PChannels.h"
#include "qzivi/panels/MessageBoxes.h"
#include "qzivi/trace.h"

#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTabBar>
#include <QTabWidget>
#include <QTest>

using namespace qzivi;

class ChannelsPageTest : public QObject, test::PageTest<PChannels> {
    Q_OBJECT

    void Reopen() {
        bench_->host.reset();
        Open();
    }
    void Rename(int row, const QString& name) {
        Bench::Rename(page_->lstChans, page_->txtRename, row, name);
    }
    QStringList Entries() const { return Bench::Entries(page_->lstChans); }
    // The arguments of the first traced call of `function` on channel "1".
    static QString CallOn(const ivi::TraceRecorder& trace, const char* function) {
        for (const auto& record : trace.Records())
            if (record.function == function && record.arguments.find("\"1\"") != std::string::npos)
                return QString::fromStdString(record.arguments);
        return {};
    }

private slots:
    void init() { bench_ = std::make_unique<Bench>(); }
    void cleanup() { bench_.reset(); }

    void aChannelMadeOnEachTabReachesTheLiveTreeAndTheSimulator() {
        Open();
        QTest::mouseClick(page_->cmdAdd, Qt::LeftButton);
        QCOMPARE(Entries(), QStringList{"CHANNEL1"});
        Rename(0, "1");
        QCOMPARE(Entries(), QStringList{"1"});

        // Tab 1: the function.
        QVERIFY(Bench::Choose(page_->cmbChannel[5], "Square"));
        QVERIFY(page_->txtChan[3]->isEnabled());
        Bench::Type(page_->txtChan[0], "2.5");
        Bench::Type(page_->txtChan[1], "2500");
        Bench::Type(page_->txtChan[2], "90");
        Bench::Type(page_->txtChan[3], "30");
        Bench::Type(page_->txtChan[4], "0.5");
        // Tab 2: the operation.
        page_->tabChan->setCurrentIndex(1);
        QCOMPARE(page_->FrameShown(), 2);
        Bench::Type(page_->txtChan[6], "50");
        QVERIFY(Bench::Choose(page_->cmbChannel[7], "Burst"));
        QVERIFY(Bench::Choose(page_->cmbChannel[8], "Software"));
        Bench::Type(page_->txtChan[9], "7");
        // Tab 3: the modulation; its source list opens with its check box.
        page_->tabChan->setCurrentIndex(2);
        QCOMPARE(page_->FrameShown(), 3);
        QVERIFY(!page_->cmbChannel[11]->isEnabled());
        page_->chkChan[10]->click();
        QVERIFY(page_->cmbChannel[11]->isEnabled());
        QVERIFY(Bench::Choose(page_->cmbChannel[11], "Internal"));
        // The output goes off by its check box.
        page_->lstChans->item(0)->setCheckState(Qt::Unchecked);
        QVERIFY(bench_->host->ApplyButton().isEnabled());
        bench_->Apply();

        QCOMPARE(Control().Channels()->Count(), 1);
        const auto& c = *Control().Channels()->Item(1);
        QCOMPARE(c.Name(), std::string("1"));
        QCOMPARE(c.FuncWaveform(), qzivifgenWaveformSquare);
        QCOMPARE(c.FuncAmplitude(), 2.5);
        QCOMPARE(c.FuncFrequency(), 2500.0);
        QCOMPARE(c.FuncStartPhase(), 90.0);
        QCOMPARE(c.FuncDutyCycleHigh(), 30.0);
        QCOMPARE(c.FuncDCOffset(), 0.5);
        QCOMPARE(c.OutputImpedance(), 50.0);
        QCOMPARE(c.OperationMode(), qzivifgenOperateBurst);
        QCOMPARE(c.TriggerSource(), qzivifgenSoftwareTrigger);
        QCOMPARE(c.BurstCount(), 7);
        QVERIFY(c.AMEnabled());
        QCOMPARE(c.AMSource(), qzivifgenAMInternal);
        QVERIFY(!c.FMEnabled());
        QVERIFY(!c.OutputEnabled());

        ivi::TraceRecorder trace;
        Control().Init();
        Control().Configure();
        const QString waveform = CallOn(trace, "IviFgen_ConfigureStandardWaveform");
        QVERIFY2(waveform.contains("2.5") && waveform.contains("2500") && waveform.contains("90"),
                 qPrintable(waveform));
        QVERIFY2(CallOn(trace, "IviFgen_ConfigureOutputEnabled").contains("0"),
                 qPrintable(CallOn(trace, "IviFgen_ConfigureOutputEnabled")));
        QVERIFY2(CallOn(trace, "IviFgen_ConfigureBurstCount").contains("7"),
                 qPrintable(CallOn(trace, "IviFgen_ConfigureBurstCount")));
        QVERIFY(!CallOn(trace, "IviFgen_ConfigureAMEnabled").isEmpty());
    }

    void clickingAnotherEntryKeepsTheFieldsOfTheOneLeftBehind() {
        Control().Channels()->Add("1");
        Control().Channels()->Add("2");
        Open();
        page_->lstChans->setCurrentRow(0);
        Bench::Type(page_->txtChan[0], "3.3");
        Bench::Click(page_->lstChans, 1);
        QCOMPARE(page_->lstChans->currentRow(), 1);
        QCOMPARE(page_->txtChan[0]->text(), QString::fromStdString(text::FormatNumber(
                                                Control().Channels()->Item(2)->FuncAmplitude())));
        bench_->Apply();
        QCOMPARE(Control().Channels()->Item(1)->FuncAmplitude(), 3.3);
    }

    void refusedNamesAndClosedFieldsKeepOrClearAsThePageSays() {
        Control().Channels()->Add("1");
        Control().Channels()->Add("2");
        Control().Channels()->Item(1)->FuncDutyCycleHigh(40);
        Control().Channels()->Item(1)->BurstCount(9);
        Control().Extensions(0x3FF & ~qzivifgenBurstExt);
        Open();
        Rename(0, "2"); // taken
        Rename(0, "   ");
        QCOMPARE(Entries(), (QStringList{"1", "2"}));
        Rename(0, "Two");
        QCOMPARE(Entries(), (QStringList{"Two", "2"}));
        // Not a square, so the duty cycle is closed and empty; the burst count hangs on its
        // extension. Both write 0.
        QVERIFY(!page_->txtChan[3]->isEnabled());
        QVERIFY(page_->txtChan[3]->text().isEmpty());
        QVERIFY(!page_->txtChan[9]->isEnabled());
        QVERIFY(!page_->lblChan[9]->isEnabled());
        Bench::Type(page_->txtChan[0], "no digits");
        bench_->Apply();
        const auto& c = *Control().Channels()->Item(1);
        QCOMPARE(c.Name(), std::string("Two"));
        QCOMPARE(c.FuncDutyCycleHigh(), 0.0);
        QCOMPARE(c.BurstCount(), 0);
        QCOMPARE(c.FuncAmplitude(), 0.0);
    }

    void removingAChannelRemovesItAndWritesNothingToIt() {
        for (const char* name : {"1", "2", "3"})
            Control().Channels()->Add(name);
        Open();
        page_->lstChans->setCurrentRow(1);
        Bench::Type(page_->txtChan[0], "4");
        QTest::mouseClick(page_->cmdDel, Qt::LeftButton);
        QCOMPARE(Entries(), (QStringList{"1", "3"}));
        bench_->Apply();
        QCOMPARE(Control().Channels()->Count(), 2);
        QCOMPARE(Control().Channels()->Item(2)->Name(), std::string("3"));
        QVERIFY(Control().Channels()->Item(2)->FuncAmplitude() != 4.0);
        // Removing the last channel leaves the fields empty and closed, the add button open.
        page_->lstChans->setCurrentRow(0);
        QTest::keyClick(page_->lstChans, Qt::Key_Delete);
        QTest::keyClick(page_->lstChans, Qt::Key_Delete);
        QCOMPARE(page_->lstChans->count(), 0);
        QVERIFY(!page_->txtChan[0]->isEnabled() && page_->txtChan[0]->text().isEmpty());
        QVERIFY(!page_->lblChan[0]->isEnabled());
        QVERIFY(page_->cmdAdd->isEnabled());
    }

    void theFirstTabFollowsTheOutputModeAndAnArbChannelTakesTheFirstWaveform() {
        Control().Waveforms()->Add("Ramp");
        Control().Waveforms()->Add("Steps");
        Control().Sequences()->Add("Train");
        Control().Channels()->Add("1");
        Control().OutputMode(qzivifgenOutputFunc);
        Open();
        QCOMPARE(page_->FrameShown(), 1);
        QVERIFY(!page_->Changed());
        Control().OutputMode(qzivifgenOutputArb);
        Reopen();
        QCOMPARE(page_->FrameShown(), 4);
        QCOMPARE(page_->cmbChannel[14]->currentText(), QString("Ramp"));
        QVERIFY2(page_->Changed(), "the waveform given by the showing is a change");
        Bench::Type(page_->txtChan[15], "1000");
        Bench::Type(page_->txtChan[16], "0.5");
        QVERIFY(Bench::Choose(page_->cmbChannel[14], "Steps"));
        page_->tabChan->setCurrentIndex(2);
        QCOMPARE(page_->FrameShown(), 3); // tabs 2 and 3 are the same in every mode
        page_->tabChan->setCurrentIndex(0);
        bench_->Apply();
        const auto& c = *Control().Channels()->Item(1);
        QCOMPARE(c.ArbWaveform()->Name(), std::string("Steps"));
        QCOMPARE(c.ArbFrequency(), 1000.0);
        QCOMPARE(c.ArbGain(), 0.5);
        QCOMPARE(c.Sequence()->Name(), std::string("Train"));
        Control().OutputMode(qzivifgenOutputSeq);
        Reopen();
        QCOMPARE(page_->FrameShown(), 5);
        QCOMPARE(page_->cmbChannel[18]->currentText(), QString("Train"));
        QCOMPARE(page_->txtChan[19]->text(), QString("1000"));
    }

    void withoutWaveformsTheListReadsNoneAndWritesNone() {
        Control().Channels()->Add("1");
        Control().OutputMode(qzivifgenOutputArb);
        Open();
        QCOMPARE(page_->cmbChannel[14]->currentText(), QString("None"));
        Bench::Type(page_->txtChan[15], "5");
        bench_->Apply();
        QVERIFY(!Control().Channels()->Item(1)->ArbWaveform());
    }

    void renamingAWaveformMakesTheChannelsLetGoAsTheTreeDoes() {
        Control().Waveforms()->Add("Ramp");
        Control().Waveforms()->Add("Steps");
        Control().Channels()->Add("1");
        Control().Channels()->Item(1)->ArbWaveform(Control().Waveforms()->Item(2));
        Control().OutputMode(qzivifgenOutputArb);
        Open();
        QCOMPARE(page_->cmbChannel[14]->currentText(), QString("Steps"));
        auto* waveforms = bench_->Page<PArb>();
        bench_->Show<PArb>();
        Bench::Rename(waveforms->lstWaveforms, waveforms->txtRename, 1, "Stairs");
        bench_->Show<PChannels>();
        // The rename made every channel forget its waveform; showing gives it the first.
        QCOMPARE(page_->cmbChannel[14]->itemText(1), QString("Stairs"));
        QCOMPARE(page_->cmbChannel[14]->currentText(), QString("Ramp"));
        QVERIFY(page_->Changed());
    }

    void withoutAnOutputExtensionTheChannelsGoAndEveryTabSaysWhy() {
        Control().Channels()->Add("1");
        Control().Channels()->Add("2");
        Control().Extensions(qzivifgenTriggerExt);
        Open();
        QCOMPARE(page_->lstChans->count(), 0);
        QVERIFY(!page_->cmdAdd->isEnabled());
        for (int tab = 0; tab < 3; ++tab) {
            page_->tabChan->setCurrentIndex(tab);
            QCOMPARE(page_->FrameShown(), 0);
            QVERIFY(page_->lblChan[PChannels::kFields]->isVisible());
        }
        QVERIFY(!page_->Changed());
        QTest::mouseClick(bench_->host->Tabs().tabBar(), Qt::LeftButton, {},
                          bench_->host->Tabs().tabBar()->tabRect(0).center());
        bench_->host->accept();
        QCOMPARE(Control().Channels()->Count(), 2); // nothing was applied
    }
};

QTEST_MAIN(ChannelsPageTest)
#include "channels_page_test.moc"
