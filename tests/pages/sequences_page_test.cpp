// The sequences page: a sequence built, its cells edited and refused, reordered and applied plays
// on the simulator in the new order; items follow their waveforms as the tree's references do.
#include "page_bench.h"
#include "qzivi/model/Channels.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/pages/PArb.h"
#include "qzivi/pages/PChannels.h"
#include "qzivi/pages/PSequence.h"

#include <QTreeWidget>

#include <fstream>

using namespace qzivi;

class SequencesPageTest : public QObject, test::PageTest<PSequence> {
    Q_OBJECT

    // A waveform of eight equal points, read from its file without normalising.
    void AddLevel(const std::string& name, double level) {
        const std::string path = (bench_->store.Dir() / (name + ".txt")).string();
        std::ofstream file(path);
        for (int i = 0; i < 8; ++i)
            file << level << "\n";
        Control().Waveforms()->Add(name, qzivifgenASCIIFile, path, qzivifgenNoAutoNormalize);
    }
    QStringList Rows() const {
        QStringList rows;
        for (int r = 0; r < page_->lstvWfmItems->topLevelItemCount(); ++r)
            rows << page_->lstvWfmItems->topLevelItem(r)->text(0) + " x" +
                        page_->lstvWfmItems->topLevelItem(r)->text(1);
        return rows;
    }
    // Two clicks on a cell open its edit box; the text and Return end it.
    void EditCell(int row, int column, const QString& text) {
        QTreeWidget* table = page_->lstvWfmItems;
        QTreeWidgetItem* item = table->topLevelItem(row);
        const QRect cell = table->visualRect(table->indexFromItem(item, column));
        QTest::mouseClick(table->viewport(), Qt::LeftButton, {}, cell.center());
        QTest::mouseClick(table->viewport(), Qt::LeftButton, {}, cell.center());
        QVERIFY(page_->txtSIRename->isVisible());
        Bench::Enter(page_->txtSIRename, text);
        QVERIFY(!page_->txtSIRename->isVisible());
    }

private slots:
    void init() { bench_ = std::make_unique<Bench>(); }
    void cleanup() { bench_.reset(); }

    void aSequenceBuiltAndReorderedPlaysOnTheSimulatorInTheNewOrder() {
        AddLevel("High", 0.75); // a first point's sign would be lost: the reader starts at a digit
        AddLevel("Low", 0.25);
        Control().OutputMode(qzivifgenOutputSeq);
        Control().ArbSampleRate(1e6);
        auto& channel = *Control().Channels()->Add("1");
        channel.ArbGain(1);
        channel.ArbOffset(0);
        page_ = bench_->Open<PSequence>();

        QTest::mouseClick(page_->cmdAdd, Qt::LeftButton);
        QCOMPARE(Bench::Entries(page_->lstSequence), QStringList{"Sequence1"});
        QVERIFY(page_->cmdAddSeqItem->isEnabled());
        QTest::mouseClick(page_->cmdAddSeqItem, Qt::LeftButton);
        QTest::mouseClick(page_->cmdAddSeqItem, Qt::LeftButton);
        QCOMPARE(Rows(), (QStringList{"High x1", "High x1"}));
        EditCell(1, 0, "Low");
        EditCell(1, 1, "3.7");
        QCOMPARE(Rows(), (QStringList{"High x1", "Low x4"}));
        QVERIFY(!page_->cmdDown->isEnabled()); // the last row goes no lower
        QTest::mouseClick(page_->cmdUp, Qt::LeftButton);
        QCOMPARE(Rows(), (QStringList{"Low x4", "High x1"}));
        QVERIFY(!page_->cmdUp->isEnabled());
        bench_->Show<PChannels>(); // the channel takes the new sequence by being shown
        bench_->Apply();
        QVERIFY2(bench_->boxes.empty(), bench_->BoxTexts().c_str());
        QCOMPARE(Control().Sequences()->Count(), 1);
        auto& sequence = *Control().Sequences()->Item(1);
        QCOMPARE(sequence.Count(), 2);
        QCOMPARE(sequence.SequenceItem(1)->Waveform()->Name(), std::string("Low"));
        QCOMPARE(sequence.SequenceItem(1)->Iterations(), 4);
        QCOMPARE(Control().Channels()->Item(1)->Sequence()->Name(), std::string("Sequence1"));

        std::string failures;
        const auto heard = Control().IviError.Connect(
            [&](std::int32_t, const std::string&, const std::string& text) { failures += text; });
        Control().Init();
        Control().Configure();
        Control().Initiate();
        QVERIFY2(failures.empty(), failures.c_str());
        // Half a sample in, one sample apart: 4 x 8 points of Low, then 8 of High.
        const std::vector<double> out = Control().Engine().RenderOutput("1", 0.5e-6, 1e-6, 48);
        for (std::size_t i = 0; i < out.size(); ++i)
            QVERIFY2(out[i] == (i < 32 || i >= 40 ? 0.25 : 0.75),
                     qPrintable(QString("sample %1 is %2").arg(i).arg(out[i])));
    }

    void refusedCellsKeepTheirText() {
        AddLevel("High", 0.25);
        auto& sequence = *Control().Sequences()->Add("S");
        sequence.Add(Control().Waveforms()->Item(1), 2);
        page_ = bench_->Open<PSequence>();
        QCOMPARE(Rows(), QStringList{"High x2"});
        EditCell(0, 1, "0");
        EditCell(0, 1, "no number");
        EditCell(0, 0, "high"); // names are exact
        EditCell(0, 0, "Nowhere");
        QCOMPARE(Rows(), QStringList{"High x2"});
        EditCell(0, 1, "12");
        QCOMPARE(Rows(), QStringList{"High x12"});
        // Escape leaves the cell as it was.
        QTreeWidget* table = page_->lstvWfmItems;
        const QRect cell = table->visualRect(table->indexFromItem(table->topLevelItem(0), 1));
        QTest::mouseDClick(table->viewport(), Qt::LeftButton, {}, cell.center());
        Bench::Type(page_->txtSIRename, "7");
        QTest::keyClick(page_->txtSIRename, Qt::Key_Escape);
        QCOMPARE(Rows(), QStringList{"High x12"});
    }

    void withoutWaveformsOrTheExtensionTheSequencesGo() {
        Control().Sequences()->Add("S");
        page_ = bench_->Open<PSequence>();
        QCOMPARE(page_->lstSequence->count(), 0);
        QCOMPARE(Control().PropCopy()->Sequences()->Count(), 0);
        QVERIFY(!page_->cmdAdd->isEnabled());
        QVERIFY(!page_->cmdAddSeqItem->isEnabled());
        bench_->host.reset();

        AddLevel("High", 0.25);
        Control().Extensions(0x3FF & ~qzivifgenArbSeqExt);
        page_ = bench_->Open<PSequence>();
        QCOMPARE(Control().PropCopy()->Sequences()->Count(), 0);
        QVERIFY(!page_->cmdAdd->isEnabled());
    }

    void itemsFollowTheirWaveformsAndOneWithoutIsDropped() {
        AddLevel("High", 0.75);
        AddLevel("Low", 0.25);
        auto& waveforms = *Control().Waveforms();
        auto& sequence = *Control().Sequences()->Add("S");
        sequence.Add(waveforms.Item(1), 1);
        sequence.Add(nullptr, 5); // lost its waveform
        sequence.Add(waveforms.Item(2), 3);
        page_ = bench_->Open<PSequence>();
        QCOMPARE(Rows(), (QStringList{"High x1", "Low x3"}));
        QVERIFY(page_->Changed());

        auto* arb = bench_->Page<PArb>();
        bench_->Show<PArb>();
        Bench::Rename(arb->lstWaveforms, arb->txtRename, 1, "Deep");
        bench_->Show<PSequence>();
        QCOMPARE(Rows(), (QStringList{"High x1", "Deep x3"}));
        bench_->Apply();
        auto& live = *Control().Sequences()->Item(1);
        QCOMPARE(live.Count(), 2);
        QCOMPARE(live.SequenceItem(2)->Waveform()->Name(), std::string("Deep"));
    }
};

QTEST_MAIN(SequencesPageTest)
#include "sequences_page_test.moc"
