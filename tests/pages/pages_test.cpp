// The control page and the general page in the page host, on a control of their own: what they
// show, what they save, and which of their applies make the other pages reload.
#include "../platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/PExtensions.h"
#include "qzivi/pages/PGeneral.h"
#include "qzivi/pages/PInternal.h"
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
    PExtensions* extensions_ = nullptr;
    PInternal* internal_ = nullptr;

    void Open() {
        host_ = std::make_unique<CPageHost>(std::vector<QZIviFgen*>{control_.get()});
        control_page_ = new PIviX;
        general_ = new PGeneral;
        extensions_ = new PExtensions;
        internal_ = new PInternal;
        host_->AddPage(control_page_);
        host_->AddPage(general_);
        host_->AddPage(extensions_);
        host_->AddPage(internal_);
        host_->show();
    }
    void Click(QWidget* box) { QTest::mouseClick(box, Qt::LeftButton, {}, QPoint(4, 4)); }

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
        QVERIFY(boxes[0].icon == BoxIcon::None);
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

    void theTriggerOptionsAndTheSequenceBoxFallWithTheirParents() {
        control_->Extensions(0x3FF);
        Open();
        host_->Tabs().setCurrentIndex(2);
        auto** box = extensions_->chkExtension;
        Click(box[5]);
        for (int i : {6, 7, 8})
            QVERIFY(!box[i]->isEnabled() && !box[i]->isChecked());
        Click(box[5]);
        for (int i : {6, 7, 8})
            QVERIFY(box[i]->isEnabled() && !box[i]->isChecked());
        Click(box[2]);
        QVERIFY(!box[4]->isEnabled() && !box[4]->isChecked());
        QVERIFY(extensions_->Changed());
    }

    void theModeFollowsTheOutputModeExtensionsLeftOn() {
        struct Case {
            std::int32_t mask, mode, fixed;
        };
        for (const Case c : {Case{0, 2, 0},
                             {1, 1, 0},
                             {2, 0, 1},
                             {2, 2, 1},
                             {3, 2, 1},
                             {3, 1, 1},
                             {10, 0, 1},
                             {10, 2, 2},
                             {11, 2, 2},
                             {11, 0, 0},
                             {8, 2, 2}})
            QCOMPARE(FixedOutputMode(c.mask, c.mode), c.fixed);

        // Through the page: the waveform box off takes the sequences along, and the mode.
        control_->Extensions(0x3FF | 0x4000);
        control_->OutputMode(qzivifgenOutputSeq);
        Open();
        host_->Tabs().setCurrentIndex(2);
        const std::int32_t before = control_->LastChangeIndex();
        Click(extensions_->chkExtension[2]);
        host_->Apply();
        QCOMPARE(control_->OutputMode(), qzivifgenOutputFunc);
        QCOMPARE(control_->Extensions(), 0x3FF & ~(qzivifgenArbWfmExt | qzivifgenArbSeqExt));
        QCOMPARE(control_->LastChangeIndex(), before + 1); // the other pages reload
        host_->Tabs().setCurrentIndex(1);
        QCOMPARE(general_->cmbGeneral[0]->count(), 1);
    }

    void closedInternalFieldsAreBlankAndKeepTheirValues() {
        control_->Extensions(0);
        control_->Internal()->AMInternalDepth(42);
        Open();
        host_->Tabs().setCurrentIndex(3);
        for (int i : {0, 1, 3, 4, 6}) {
            QVERIFY(!internal_->txtInternal[i]->isEnabled());
            QVERIFY(internal_->txtInternal[i]->text().isEmpty());
        }
        QCOMPARE(internal_->cmbWaveform[2]->count(), 0);
        internal_->Changed(true);
        host_->Apply();
        QCOMPARE(control_->Internal()->AMInternalDepth(), 42.0);
    }

    void onlyTheOpenFMFieldsAreStored() {
        control_->Extensions(qzivifgenModulateFMExt);
        const double rate = control_->Internal()->InternalTriggerRate();
        Open();
        host_->Tabs().setCurrentIndex(3);
        QCOMPARE(host_->focusWidget(), internal_->txtInternal[4]); // the last open group wins
        internal_->txtInternal[4]->setText("12.5");
        internal_->txtInternal[6]->setText("400");
        host_->Apply();
        QCOMPARE(control_->Internal()->FMInternalDeviation(), 12.5);
        QCOMPARE(control_->Internal()->FMInternalFrequency(), 400.0);
        QCOMPARE(control_->Internal()->InternalTriggerRate(), rate);
    }

    void aBadNumberStopsTheInternalSaveThere() {
        control_->Extensions(0x3FF);
        Open();
        host_->Tabs().setCurrentIndex(3);
        const double frequency = control_->Internal()->AMInternalFrequency();
        internal_->txtInternal[0]->setText("250");
        internal_->txtInternal[1]->setText("lots");
        internal_->txtInternal[3]->setText("77");
        host_->Apply();
        QCOMPARE(control_->Internal()->InternalTriggerRate(), 250.0);
        QCOMPARE(control_->Internal()->AMInternalFrequency(), frequency);
    }
};

QTEST_MAIN(PagesTest)
#include "pages_test.moc"
