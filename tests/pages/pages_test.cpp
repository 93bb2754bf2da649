// The control page and the general page in the page host, on a control of their own: what they
// show, what they save, and which of their applies make the other pages reload.
#include "../platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/PGeneral.h"
#include "qzivi/pages/PIviX.h"
#include "qzivi/panels/Pictures.h"

#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QLineEdit>
#include <QTabWidget>
#include <QTest>
#include <QToolButton>

using namespace qzivi;

class PagesTest : public QObject {
    Q_OBJECT

    std::unique_ptr<test::StoreScope> store_;
    std::unique_ptr<QZIviFgen> control_;
    std::unique_ptr<CPageHost> host_;
    PIviX* control_page_ = nullptr;
    PGeneral* general_ = nullptr;

    void Open() {
        host_ = std::make_unique<CPageHost>(std::vector<QZIviFgen*>{control_.get()});
        control_page_ = new PIviX;
        general_ = new PGeneral;
        host_->AddPage(control_page_);
        host_->AddPage(general_);
        host_->show();
    }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<test::StoreScope>();
        control_ = std::make_unique<QZIviFgen>();
        control_->InitProperties();
    }
    void cleanup() {
        host_.reset();
        control_.reset();
        store_.reset();
    }

    void theControlPageShowsAnUnlistedNameAsItStandsAndItsStylePreview() {
        control_->LogicalName("Bench7");
        control_->UIStyle(1);
        Open();
        QVERIFY(control_page_->cmbLogicalName->findText("SampleFGen") >= 0);
        QCOMPARE(control_page_->cmbLogicalName->currentText(), QStringLiteral("Bench7"));
        QCOMPARE(control_page_->cmbUIStyle->count(), 3);
        QCOMPARE(control_page_->cmbUIStyle->currentText(), QStringLiteral("Allow Control"));
        const QImage shown = control_page_->imgUIStyle->pixmap().toImage();
        const QImage expected =
            LoadPictureFromResource(2001)
                .pixmap(control_page_->imgUIStyle->size(), control_page_->devicePixelRatioF())
                .toImage();
        QVERIFY(!shown.isNull());
        QVERIFY(shown == expected);
        QVERIFY(!control_page_->Changed());
        QVERIFY(control_page_->chkIviX[1]->isChecked()); // ExceptionOnError
        QCOMPARE(control_page_->chkIviX[1]->text(), QStringLiteral("Exception on errors"));

        QTest::mouseClick(control_page_->chkIviX[2], Qt::LeftButton);
        host_->Apply();
        QCOMPARE(control_->LogicalName(), std::string("Bench7")); // saved unchanged
        QVERIFY(control_->AutoConfigure());
        QCOMPARE(control_->UIStyle(), 1);
    }

    void onlyANewLogicalNameMakesTheOtherPagesReload() {
        Open();
        QTest::mouseClick(control_page_->chkIviX[3], Qt::LeftButton);
        host_->Apply();
        QCOMPARE(control_->LastChangeIndex(), 0);
        control_page_->cmbLogicalName->setEditText("Bench7");
        host_->Apply();
        QCOMPARE(control_->LastChangeIndex(), 1);
        QCOMPARE(control_->LogicalName(), std::string("Bench7"));
        control_page_->Changed(true);
        host_->Apply();
        QCOMPARE(control_->LastChangeIndex(), 1);
    }

    void theConfigurationButtonOpensTheStoreOrSaysItCannot() {
        Open();
        QString opened;
        {
            const StoreEditorScope editor([&](const QString& path) {
                opened = path;
                return true;
            });
            QTest::mouseClick(control_page_->cmdBMC, Qt::LeftButton);
        }
        QCOMPARE(opened.toStdString(), (store_->Dir() / "qzivi" / "qzivi.conf").string());

        std::vector<MessageBoxRequest> boxes;
        const StoreEditorScope none([](const QString&) { return false; });
        const MessageBoxScope shown([&](const MessageBoxRequest& r) { boxes.push_back(r); });
        QTest::mouseClick(control_page_->cmdBMC, Qt::LeftButton);
        QCOMPARE(boxes.size(), std::size_t{1});
        QCOMPARE(boxes[0].text, std::string("Incorrect version of the Benchmate Console.  Please "
                                            "update to the latest version for this "
                                            "functionality."));
        QVERIFY(!boxes[0].critical);
    }

    void theGeneralPageDropsAModeWhoseExtensionWasTakenAway() {
        control_->Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt);
        control_->OutputMode(qzivifgenOutputSeq);
        Open();
        QCOMPARE(general_->cmbGeneral[0]->count(), 3);
        QCOMPARE(general_->cmbGeneral[0]->currentText(), QStringLiteral("Arb Sequence"));
        // The extensions page (here, the copy itself) takes the sequences away and alerts.
        control_->PropCopy()->Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt);
        control_->IncrementLastChangeIndex();
        host_->Tabs().setCurrentIndex(1);
        QCOMPARE(general_->cmbGeneral[0]->count(), 2);
        QCOMPARE(control_->PropCopy()->OutputMode(), qzivifgenOutputFunc);
        QVERIFY(!general_->Changed()); // no action of the user
    }

    void theSampleRateIsTheLeadingNumber() {
        Open();
        host_->Tabs().setCurrentIndex(1);
        general_->txtGeneral->setText("2k");
        QVERIFY(general_->Changed());
        host_->Apply();
        QCOMPARE(control_->ArbSampleRate(), 2.0);
        general_->txtGeneral->setText("2.5e6 Hz");
        host_->Apply();
        QCOMPARE(control_->ArbSampleRate(), 2.5e6);
        general_->txtGeneral->setText("fast");
        host_->Apply();
        QCOMPARE(control_->ArbSampleRate(), 0.0);
    }
};

QTEST_MAIN(PagesTest)
#include "pages_test.moc"
