// The configurations page in the page host: the list kept in step with the stored
// configurations, renames refused as they must be, load, store, export and import through the
// file dialogs (the file the page writes read back by the core), and the check on the instrument.
#include "page_bench.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/PIviConfigurations.h"

#include <QApplication>
#include <QFileDialog>
#include <QFileInfo>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTest>
#include <QTimer>
#include <QToolButton>

using namespace qzivi;

class ConfigurationsPageTest : public QObject, test::PageTest<PIviConfigurations> {
    Q_OBJECT

    QZIviConfigurations& Copy() { return *Control().PropCopy()->Configurations(); }
    void Rename(int row, const QString& text) {
        Bench::Rename(page_->lstConfigs, page_->txtRename, row, text);
    }

private slots:
    void init() { bench_ = std::make_unique<Bench>(); }
    void cleanup() { bench_.reset(); }

    void anEmptyListLeavesOnlyAddAndDefaults() {
        Open();
        for (QWidget* b :
             {static_cast<QWidget*>(page_->cmdLoad), static_cast<QWidget*>(page_->cmdStore),
              static_cast<QWidget*>(page_->cmdImport), static_cast<QWidget*>(page_->cmdExport),
              static_cast<QWidget*>(page_->cmdDel)})
            QVERIFY2(!b->isEnabled(), qPrintable(b->objectName()));
        QVERIFY(page_->cmdAdd->isEnabled() && page_->cmdDefaults->isEnabled());
        QCOMPARE(Host().focusWidget(), static_cast<QWidget*>(page_->cmdAdd));
    }

    void addRenameAndRemoveKeepTheCollectionInStep() {
        Open();
        page_->cmdAdd->click();
        page_->cmdAdd->click();
        QCOMPARE(Copy().Count(), 2);
        QCOMPARE(Copy().Item(2)->Name(), std::string("NewConfig2"));
        QVERIFY(page_->Changed() && page_->cmdLoad->isEnabled());

        Rename(0, "Bench");
        QCOMPARE(Copy().Item(1)->Name(), std::string("Bench"));
        const std::int32_t counter = Control().LastChangeIndex();
        page_->Changed(false);
        Rename(1, "Bench"); // taken
        QCOMPARE(page_->lstConfigs->item(1)->text(), QStringLiteral("NewConfig2"));
        QCOMPARE(Copy().Item(2)->Name(), std::string("NewConfig2"));
        QVERIFY(page_->Changed()); // marked changed all the same
        Rename(1, "   ");
        QCOMPARE(Copy().Item(2)->Name(), std::string("NewConfig2"));
        QCOMPARE(Control().LastChangeIndex(), counter);

        // An apply ends a rename still open, and keeps it.
        page_->lstConfigs->setCurrentRow(1);
        QTest::keyClick(page_->lstConfigs, Qt::Key_F2);
        QTest::keyClicks(page_->txtRename, "Sweep");
        Host().Apply();
        QCOMPARE(Control().Configurations()->Item(2)->Name(), std::string("Sweep"));
        QVERIFY(page_->txtRename->isHidden());

        page_->lstConfigs->setCurrentRow(0);
        page_->cmdDel->click();
        QCOMPARE(Copy().Count(), 1);
        QCOMPARE(Copy().Item(1)->Name(), std::string("Sweep"));
        page_->cmdDel->click();
        QCOMPARE(Copy().Count(), 0);
        QVERIFY(!page_->cmdLoad->isEnabled() && !page_->cmdDel->isEnabled());
        Host().Apply();
        QCOMPARE(Control().Configurations()->Count(), 0);
    }

    void storeLoadAndDefaults() {
        Control().ArbSampleRate(5000);
        Open();
        page_->cmdAdd->click(); // a snapshot of the copy as it stands
        Control().PropCopy()->ArbSampleRate(7000);
        page_->cmdLoad->click(); // back to the snapshot, applied
        QCOMPARE(Control().ArbSampleRate(), 5000.0);
        Control().PropCopy()->ArbSampleRate(9000);
        page_->cmdStore->click();
        page_->cmdDefaults->click();
        QVERIFY(Control().PropCopy()->ArbSampleRate() != 9000);
        QCOMPARE(Copy().Count(), 1); // the stored ones stay
        page_->cmdLoad->click();
        QCOMPARE(Control().ArbSampleRate(), 9000.0);
    }

    void exportAndImportGoThroughTheFileDialogs() {
        Control().ArbSampleRate(4321);
        Open();
        page_->cmdAdd->click();
        const QString path = QString::fromStdString((bench_->store.Dir() / "bench").string());
        Bench::ChooseFile(path);
        page_->cmdExport->click();
        QVERIFY(QFileInfo::exists(path + ".qzc")); // the default extension added
        QZIviFgen reader;
        reader.InitProperties();
        reader.Configurations()->Add("FromFile", (path + ".qzc").toStdString())->Load();
        QCOMPARE(reader.ArbSampleRate(), 4321.0);

        reader.ArbSampleRate(1234);
        const std::string other = (bench_->store.Dir() / "other.qzc").string();
        reader.Configurations()->Add("Other")->Export(other);
        page_->Changed(false);
        Bench::ChooseFile(QString::fromStdString(other));
        page_->cmdImport->click();
        QVERIFY(page_->Changed());
        page_->cmdLoad->click();
        QCOMPARE(Control().ArbSampleRate(), 1234.0);
        QVERIFY(bench_->boxes.empty());
    }

    void theCheckOnTheInstrumentSaysWhatHappenedAndLeavesNoSession() {
        Open();
        Control().Channels()->Add("Channel1");
        page_->cmdVerifyConfig->click();
        QCOMPARE(bench_->boxes.size(), std::size_t{1});
        QCOMPARE(bench_->boxes[0].text, std::string("Configuration Verified!"));
        QVERIFY(bench_->boxes[0].icon == BoxIcon::Information);
        QCOMPARE(Control().SessionHandle(), 0);

        Control().Init(); // open before: closed after all the same
        Control().LogicalName("NoSuchGenerator");
        page_->cmdVerifyConfig->click();
        QCOMPARE(bench_->boxes.size(), std::size_t{2});
        QVERIFY(bench_->boxes[1].icon == BoxIcon::Exclamation);
        QVERIFY2(bench_->boxes[1].text.starts_with(
                     "Verification Failed!\r\nPlease investigate the following problem:\r\n\r\n"),
                 bench_->boxes[1].text.c_str());
        QVERIFY(bench_->boxes[1].text.size() > 70);
        QCOMPARE(Control().SessionHandle(), 0);
    }
};

QTEST_MAIN(ConfigurationsPageTest)
#include "configurations_page_test.moc"
