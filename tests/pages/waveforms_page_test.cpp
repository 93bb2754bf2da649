// The waveforms page: a waveform read from each file format and from held points, with its
// preview; files that cannot be read are refused and the waveform keeps its file.
#include "page_bench.h"
#include "qzivi/pages/PArb.h"
#include "qzivi/widgets/QZGraph.h"

#include <QCheckBox>
#include <QLabel>
#include <QToolButton>

#include <cmath>
#include <cstdint>
#include <filesystem>
#include <fstream>

using namespace qzivi;

namespace {

const std::vector<double> kPoints = {0.5, -0.25, 1.0, -1.0, 0.0, 0.75, -0.5, 0.25};

// The points in the file format: text lines, or 16- or 32-bit integers, least significant first.
std::string WriteFile(const std::filesystem::path& path, int format,
                      const std::vector<double>& points) {
    std::ofstream out(path, std::ios::binary);
    for (double p : points) {
        if (format == 1) {
            out << p << "\n";
        } else {
            const double scale = format == 2 ? 32767.0 : 2147483647.0;
            const auto value = static_cast<std::int64_t>(std::llround(p * scale));
            for (int b = 0; b < (format == 2 ? 2 : 4); ++b)
                out.put(static_cast<char>((value >> (8 * b)) & 0xFF));
        }
    }
    return path.string();
}

} // namespace

class WaveformsPageTest : public QObject, test::PageTest<PArb> {
    Q_OBJECT

    std::filesystem::path Dir() const { return bench_->store.Dir(); }
    void ComparePreview(const std::vector<double>& expected, double tolerance) {
        const auto& shown = page_->qzgrphPreview->Data();
        QVERIFY(shown);
        QCOMPARE(shown->size(), expected.size());
        for (std::size_t i = 0; i < expected.size(); ++i)
            QVERIFY2(std::fabs((*shown)[i] - expected[i]) <= tolerance,
                     qPrintable(QString("point %1: %2").arg(i).arg((*shown)[i])));
        QCOMPARE(page_->lblPreview->text(), QString("%1 points").arg(expected.size()));
    }

private slots:
    void init() { bench_ = std::make_unique<Bench>(); }
    void cleanup() { bench_.reset(); }

    void eachFileFormatIsReadWithItsPreviewAndApplied() {
        page_ = bench_->Open<PArb>();
        for (int format = 1; format <= 3; ++format) {
            const std::string path =
                WriteFile(Dir() / ("points" + std::to_string(format)), format, kPoints);
            QTest::mouseClick(page_->cmdAdd, Qt::LeftButton);
            QVERIFY2(bench_->boxes.empty(), bench_->BoxTexts().c_str());
            QCOMPARE(page_->lstWaveforms->currentItem()->text(), QString("Waveform%1").arg(format));
            QVERIFY(Bench::ChooseValue(page_->cmbWfmSource, format));
            QVERIFY(Bench::ChooseValue(page_->cmbAutoNormalize, qzivifgenNoAutoNormalize));
            if (format == 2) { // through the browse button and its dialog
                Bench::ChooseFile(QString::fromStdString(path));
                QTest::mouseClick(page_->cmdFile, Qt::LeftButton);
                QCOMPARE(page_->txtFileName->text().toStdString(), path);
            } else {
                Bench::Finish(page_->txtFileName, QString::fromStdString(path));
            }
            ComparePreview(kPoints, format == 1 ? 0 : 1e-4);
            // A new waveform holds its points; the last one reads its file at each Configure.
            QVERIFY(page_->chkPersist->isChecked());
            if (format == 3) page_->chkPersist->click();
        }
        // Normalising shows at once in the preview: the peak becomes 1 either way here.
        QVERIFY(Bench::ChooseValue(page_->cmbAutoNormalize, qzivifgenNormalizeAndRemoveOffset));
        QVERIFY(page_->qzgrphPreview->Data());
        bench_->Apply();
        auto& waveforms = *Control().Waveforms();
        QCOMPARE(waveforms.Count(), 3);
        for (int format = 1; format <= 3; ++format) {
            const auto& w = *waveforms.Item(format);
            QCOMPARE(w.Source(), format == 3 ? format : qzivifgenpersisted);
            QCOMPARE(w.PersistedWfmSource(), std::to_string(format));
            QCOMPARE(w.Filename(), (Dir() / ("points" + std::to_string(format))).string());
            QCOMPARE(w.AutoNormalizeMode(),
                     format == 3 ? qzivifgenNormalizeAndRemoveOffset : qzivifgenNoAutoNormalize);
        }
        QCOMPARE(*waveforms.Item(1)->Data(), kPoints);
    }

    void heldPointsShowAndStayHeldThroughTheApply() {
        auto& held = *Control().Waveforms()->Add("Held"); // persisted, with no file
        held.Data(kPoints);
        const std::string path =
            WriteFile(Dir() / "kept.txt", 1, {0.1, 0.2, 0.3, 0.4, 0.5, 0.6, 0.7, 0.8});
        auto& read = *Control().Waveforms()->Add("Read", qzivifgenpersisted, path);
        read.AutoNormalizeMode(qzivifgenNoAutoNormalize);
        read.Data(); // read once, then held
        std::filesystem::remove(path);
        page_ = bench_->Open<PArb>();
        QVERIFY(page_->chkPersist->isChecked());
        ComparePreview(kPoints, 0);
        Bench::Click(page_->lstWaveforms, 1);
        QVERIFY(page_->chkPersist->isChecked());
        ComparePreview({0.1, 0.2, 0.3, 0.4, 0.5, 0.6, 0.7, 0.8}, 1e-12);
        Bench::Click(page_->lstWaveforms, 0);
        QVERIFY(Bench::ChooseValue(page_->cmbAutoNormalize, qzivifgenNormalize));
        bench_->Apply();
        QVERIFY(bench_->boxes.empty());
        auto& live = *Control().Waveforms();
        QCOMPARE(live.Item(1)->Source(), qzivifgenpersisted);
        QCOMPARE(*live.Item(1)->Data(), kPoints);
        QCOMPARE(live.Item(2)->Source(), qzivifgenpersisted);
        QCOMPARE(live.Item(2)->Data()->size(), std::size_t{8}); // the file is gone; the points stay
    }

    void aFileThatCannotBeReadIsRefusedAndTheWaveformKeepsItsFile() {
        const std::string good = WriteFile(Dir() / "good.txt", 1, kPoints);
        Control().Waveforms()->Add("W", qzivifgenASCIIFile, good);
        const std::string empty = WriteFile(Dir() / "empty.txt", 1, {});
        const std::string corrupt = (Dir() / "corrupt.txt").string();
        std::ofstream(corrupt) << "no numbers, only words\n";
        std::filesystem::create_directory(Dir() / "folder");
        const struct {
            std::string path;
            const char* says;
        } cases[] = {
            {(Dir() / "missing.txt").string(), "Could not find file."},
            {empty, "Invalid Waveform."},
            {corrupt, "Invalid Waveform."},
            {(Dir() / "folder").string(), "is no regular file"},
        };
        page_ = bench_->Open<PArb>();
        for (const auto& c : cases) {
            bench_->boxes.clear();
            Bench::Finish(page_->txtFileName, QString::fromStdString(c.path));
            QVERIFY2(page_->lblPreview->text().contains(c.says),
                     qPrintable(page_->lblPreview->text()));
            bench_->Apply();
            QCOMPARE(bench_->boxes.size(), std::size_t{1});
            QVERIFY2(bench_->boxes[0].text.find(c.says) != std::string::npos,
                     bench_->boxes[0].text.c_str());
            QCOMPARE(Control().Waveforms()->Item(1)->Filename(), good);
        }
        // The browse button does not take such a file into the field at all.
        bench_->boxes.clear();
        Bench::Finish(page_->txtFileName, QString::fromStdString(good));
        Bench::ChooseFile(QString::fromStdString(empty));
        QTest::mouseClick(page_->cmdFile, Qt::LeftButton);
        QCOMPARE(bench_->boxes.size(), std::size_t{1});
        QCOMPARE(page_->txtFileName->text().toStdString(), good);
        ComparePreview(kPoints, 0);
    }

    void moreThanTheInstrumentTakesIsRefusedWhileASessionIsOpen() {
        const std::string big = WriteFile(Dir() / "big.txt", 1, std::vector<double>(32, 0.5));
        Control().Waveforms()->Add("W");
        Control().Init(false, false, "DriverSetup=MaxWaveformSize=16");
        QVERIFY(Control().SessionHandle() != 0);
        page_ = bench_->Open<PArb>();
        Bench::Finish(page_->txtFileName, QString::fromStdString(big));
        QVERIFY2(
            page_->lblPreview->text().contains("holds 32 points; the instrument takes at most 16"),
            qPrintable(page_->lblPreview->text()));
        bench_->Apply();
        QCOMPARE(bench_->boxes.size(), std::size_t{1});
        QVERIFY(Control().Waveforms()->Item(1)->Filename().empty());
    }

    void withoutTheWaveformExtensionTheListEmptiesAndAllIsClosed() {
        Control().Waveforms()->Add("A");
        Control().Extensions(0x3FF & ~qzivifgenArbWfmExt);
        page_ = bench_->Open<PArb>();
        QCOMPARE(page_->lstWaveforms->count(), 0);
        QCOMPARE(Control().PropCopy()->Waveforms()->Count(), 0);
        for (QWidget* w :
             {static_cast<QWidget*>(page_->cmdAdd), static_cast<QWidget*>(page_->cmbWfmSource),
              static_cast<QWidget*>(page_->txtFileName), static_cast<QWidget*>(page_->chkPersist)})
            QVERIFY(!w->isEnabled());
    }

    void renamesAreExactAndNamesFreeByTheList() {
        for (const char* name : {"Waveform1", "Waveform3"})
            Control().Waveforms()->Add(name);
        page_ = bench_->Open<PArb>();
        QTest::mouseClick(page_->cmdAdd, Qt::LeftButton);
        QCOMPARE(page_->lstWaveforms->item(2)->text(), QString("Waveform2"));
        Bench::Rename(page_->lstWaveforms, page_->txtRename, 0, "Waveform3"); // taken
        Bench::Rename(page_->lstWaveforms, page_->txtRename, 1, "WAVEFORM1"); // case differs
        QCOMPARE(Bench::Entries(page_->lstWaveforms),
                 (QStringList{"Waveform1", "WAVEFORM1", "Waveform2"}));
        bench_->Apply();
        QCOMPARE(Control().Waveforms()->Item(2)->Name(), std::string("WAVEFORM1"));
        QCOMPARE(Control().Waveforms()->Count(), 3);
    }
};

QTEST_MAIN(WaveformsPageTest)
#include "waveforms_page_test.moc"
