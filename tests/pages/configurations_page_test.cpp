// The configurations page in the page host: the list kept in step with the stored
// configurations, renames refused as they must be, load, store, export and import through the
// file dialogs (the file the page writes read back by the core), and the check on the instrument.
#include "../platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
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

class ConfigurationsPageTest : public QObject {
    Q_OBJECT

    std::unique_ptr<test::StoreScope> store_;
    std::unique_ptr<QZIviFgen> control_;
    std::unique_ptr<CPageHost> host_;
    PIviConfigurations* page_ = nullptr;
    std::vector<MessageBoxRequest> boxes_;
    std::unique_ptr<MessageBoxScope> boxScope_;

    void Open() {
        host_ = std::make_unique<CPageHost>(std::vector<QZIviFgen*>{control_.get()});
        page_ = new PIviConfigurations;
        host_->AddPage(page_);
        host_->show();
    }
    QZIviConfigurations& Copy() { return *control_->PropCopy()->Configurations(); }
    // Answers the next file dialog with `path`.
    static void ChooseFile(const QString& path) {
        QTimer::singleShot(0, [path] {
            auto* dialog = qobject_cast<QFileDialog*>(QApplication::activeModalWidget());
            QVERIFY(dialog != nullptr);
            dialog->selectFile(path);
            QMetaObject::invokeMethod(dialog, "accept");
        });
    }
    void Rename(int row, const QString& text) {
        page_->lstConfigs->setCurrentRow(row);
        page_->lstConfigs->setFocus();
        QTest::keyClick(page_->lstConfigs, Qt::Key_F2);
        page_->txtRename->selectAll();
        QTest::keyClicks(page_->txtRename, text);
        QTest::keyClick(page_->txtRename, Qt::Key_Return);
    }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<test::StoreScope>();
        control_ = std::make_unique<QZIviFgen>();
        control_->InitProperties();
        control_->ExceptionOnError(false);
        boxes_.clear();
        boxScope_ = std::make_unique<MessageBoxScope>(
            [this](const MessageBoxRequest& r) { boxes_.push_back(r); });
    }
    void cleanup() {
        host_.reset();
        control_.reset();
        boxScope_.reset();
        store_.reset();
    }

    void anEmptyListLeavesOnlyAddAndDefaults() {
        Open();
        for (QWidget* b :
             {static_cast<QWidget*>(page_->cmdLoad), static_cast<QWidget*>(page_->cmdStore),
              static_cast<QWidget*>(page_->cmdImport), static_cast<QWidget*>(page_->cmdExport),
              static_cast<QWidget*>(page_->cmdDel)})
            QVERIFY2(!b->isEnabled(), qPrintable(b->objectName()));
        QVERIFY(page_->cmdAdd->isEnabled() && page_->cmdDefaults->isEnabled());
        QCOMPARE(host_->focusWidget(), static_cast<QWidget*>(page_->cmdAdd));
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
        const std::int32_t counter = control_->LastChangeIndex();
        page_->Changed(false);
        Rename(1, "Bench"); // taken
        QCOMPARE(page_->lstConfigs->item(1)->text(), QStringLiteral("NewConfig2"));
        QCOMPARE(Copy().Item(2)->Name(), std::string("NewConfig2"));
        QVERIFY(page_->Changed()); // marked changed all the same
        Rename(1, "   ");
        QCOMPARE(Copy().Item(2)->Name(), std::string("NewConfig2"));
        QCOMPARE(control_->LastChangeIndex(), counter);

        // An apply ends a rename still open, and keeps it.
        page_->lstConfigs->setCurrentRow(1);
        QTest::keyClick(page_->lstConfigs, Qt::Key_F2);
        QTest::keyClicks(page_->txtRename, "Sweep");
        host_->Apply();
        QCOMPARE(control_->Configurations()->Item(2)->Name(), std::string("Sweep"));
        QVERIFY(page_->txtRename->isHidden());

        page_->lstConfigs->setCurrentRow(0);
        page_->cmdDel->click();
        QCOMPARE(Copy().Count(), 1);
        QCOMPARE(Copy().Item(1)->Name(), std::string("Sweep"));
        page_->cmdDel->click();
        QCOMPARE(Copy().Count(), 0);
        QVERIFY(!page_->cmdLoad->isEnabled() && !page_->cmdDel->isEnabled());
        host_->Apply();
        QCOMPARE(control_->Configurations()->Count(), 0);
    }

    void storeLoadAndDefaults() {
        control_->ArbSampleRate(5000);
        Open();
        page_->cmdAdd->click(); // a snapshot of the copy as it stands
        control_->PropCopy()->ArbSampleRate(7000);
        page_->cmdLoad->click(); // back to the snapshot, applied
        QCOMPARE(control_->ArbSampleRate(), 5000.0);
        control_->PropCopy()->ArbSampleRate(9000);
        page_->cmdStore->click();
        page_->cmdDefaults->click();
        QVERIFY(control_->PropCopy()->ArbSampleRate() != 9000);
        QCOMPARE(Copy().Count(), 1); // the stored ones stay
        page_->cmdLoad->click();
        QCOMPARE(control_->ArbSampleRate(), 9000.0);
    }

    void exportAndImportGoThroughTheFileDialogs() {
        control_->ArbSampleRate(4321);
        Open();
        page_->cmdAdd->click();
        const QString path = QString::fromStdString((store_->Dir() / "bench").string());
        ChooseFile(path);
        page_->cmdExport->click();
        QVERIFY(QFileInfo::exists(path + ".qzc")); // the default extension added
        QZIviFgen reader;
        reader.InitProperties();
        reader.Configurations()->Add("FromFile", (path + ".qzc").toStdString())->Load();
        QCOMPARE(reader.ArbSampleRate(), 4321.0);

        reader.ArbSampleRate(1234);
        const std::string other = (store_->Dir() / "other.qzc").string();
        reader.Configurations()->Add("Other")->Export(other);
        page_->Changed(false);
        ChooseFile(QString::fromStdString(other));
        page_->cmdImport->click();
        QVERIFY(page_->Changed());
        page_->cmdLoad->click();
        QCOMPARE(control_->ArbSampleRate(), 1234.0);
        QVERIFY(boxes_.empty());
    }

    void theCheckOnTheInstrumentSaysWhatHappenedAndLeavesNoSession() {
        Open();
        control_->Channels()->Add("Channel1");
        page_->cmdVerifyConfig->click();
        QCOMPARE(boxes_.size(), std::size_t{1});
        QCOMPARE(boxes_[0].text, std::string("Configuration Verified!"));
        QVERIFY(boxes_[0].icon == BoxIcon::Information);
        QCOMPARE(control_->SessionHandle(), 0);

        control_->Init(); // open before: closed after all the same
        control_->LogicalName("NoSuchGenerator");
        page_->cmdVerifyConfig->click();
        QCOMPARE(boxes_.size(), std::size_t{2});
        QVERIFY(boxes_[1].icon == BoxIcon::Exclamation);
        QVERIFY2(boxes_[1].text.starts_with(
                     "Verification Failed!\r\nPlease investigate the following problem:\r\n\r\n"),
                 boxes_[1].text.c_str());
        QVERIFY(boxes_[1].text.size() > 70);
        QCOMPARE(control_->SessionHandle(), 0);
    }
};

QTEST_MAIN(ConfigurationsPageTest)
#include "configurations_page_test.moc"
