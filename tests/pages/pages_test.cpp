// The control page and the general page in the page host, on a control of their own: what they
// show, what they save, and which of their applies make the other pages reload.
#include "page_bench.h"
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

class PagesTest : public QObject, test::PageTest<PIviX> {
    Q_OBJECT

    PGeneral* general_ = nullptr;
    PExtensions* extensions_ = nullptr;
    PInternal* internal_ = nullptr;

    void Open() {
        PageTest::Open();
        general_ = bench_->Page<PGeneral>();
        extensions_ = bench_->Page<PExtensions>();
        internal_ = bench_->Page<PInternal>();
    }
    void Click(QWidget* box) { QTest::mouseClick(box, Qt::LeftButton, {}, QPoint(4, 4)); }

private slots:
    void init() { bench_ = std::make_unique<Bench>(true); }
    void cleanup() { bench_.reset(); }

    void theControlPageShowsAnUnlistedNameAsItStandsAndItsStylePreview() {
        Control().LogicalName("Bench7");
        Control().UIStyle(1);
        Open();
        QVERIFY(page_->cmbLogicalName->findText("SampleFGen") >= 0);
        QCOMPARE(page_->cmbLogicalName->currentText(), QStringLiteral("Bench7"));
        QCOMPARE(page_->cmbUIStyle->count(), 3);
        QCOMPARE(page_->cmbUIStyle->currentText(), QStringLiteral("Allow Control"));
        const QImage shown = page_->imgUIStyle->pixmap().toImage();
        const QImage expected = LoadPictureFromResource(2001)
                                    .pixmap(page_->imgUIStyle->size(), page_->devicePixelRatioF())
                                    .toImage();
        QVERIFY(!shown.isNull());
        QVERIFY(shown == expected);
        QVERIFY(!page_->Changed());
        QVERIFY(page_->chkIviX[1]->isChecked()); // ExceptionOnError
        QCOMPARE(page_->chkIviX[1]->text(), QStringLiteral("Exception on errors"));

        Click(page_->chkIviX[2]);
        Host().Apply();
        QCOMPARE(Control().LogicalName(), std::string("Bench7")); // saved unchanged
        QVERIFY(Control().AutoConfigure());
        QCOMPARE(Control().UIStyle(), 1);
    }

    void onlyANewLogicalNameMakesTheOtherPagesReload() {
        Open();
        Click(page_->chkIviX[3]);
        Host().Apply();
        QCOMPARE(Control().LastChangeIndex(), 0);
        page_->cmbLogicalName->setEditText("Bench7");
        Host().Apply();
        QCOMPARE(Control().LastChangeIndex(), 1);
        QCOMPARE(Control().LogicalName(), std::string("Bench7"));
        page_->Changed(true);
        Host().Apply();
        QCOMPARE(Control().LastChangeIndex(), 1);
    }

    void theConfigurationButtonOpensTheStoreOrSaysItCannot() {
        Open();
        QString opened;
        {
            const StoreEditorScope editor([&](const QString& path) {
                opened = path;
                return true;
            });
            QTest::mouseClick(page_->cmdBMC, Qt::LeftButton);
        }
        QCOMPARE(opened.toStdString(), (bench_->store.Dir() / "qzivi" / "qzivi.conf").string());

        const auto& boxes = bench_->boxes;
        const StoreEditorScope none([](const QString&) { return false; });
        QTest::mouseClick(page_->cmdBMC, Qt::LeftButton);
        QCOMPARE(boxes.size(), std::size_t{1});
        QCOMPARE(boxes[0].text, std::string("Incorrect version of the Benchmate Console.  Please "
                                            "update to the latest version for this "
                                            "functionality."));
        QVERIFY(boxes[0].icon == BoxIcon::None);
    }

    void theGeneralPageDropsAModeWhoseExtensionWasTakenAway() {
        Control().Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt);
        Control().OutputMode(qzivifgenOutputSeq);
        Open();
        QCOMPARE(general_->cmbGeneral[0]->count(), 3);
        QCOMPARE(general_->cmbGeneral[0]->currentText(), QStringLiteral("Arb Sequence"));
        // The extensions page (here, the copy itself) takes the sequences away and alerts.
        Control().PropCopy()->Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt);
        Control().IncrementLastChangeIndex();
        bench_->Show<PGeneral>();
        QCOMPARE(general_->cmbGeneral[0]->count(), 2);
        QCOMPARE(Control().PropCopy()->OutputMode(), qzivifgenOutputFunc);
        QVERIFY(!general_->Changed()); // no action of the user
    }

    void theSampleRateIsTheLeadingNumber() {
        Open();
        bench_->Show<PGeneral>();
        general_->txtGeneral->setText("2k");
        QVERIFY(general_->Changed());
        Host().Apply();
        QCOMPARE(Control().ArbSampleRate(), 2.0);
        general_->txtGeneral->setText("2.5e6 Hz");
        Host().Apply();
        QCOMPARE(Control().ArbSampleRate(), 2.5e6);
        general_->txtGeneral->setText("fast");
        Host().Apply();
        QCOMPARE(Control().ArbSampleRate(), 0.0);
    }

    void theTriggerOptionsAndTheSequenceBoxFallWithTheirParents() {
        Control().Extensions(0x3FF);
        Open();
        bench_->Show<PExtensions>();
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
        Control().Extensions(0x3FF | 0x4000);
        Control().OutputMode(qzivifgenOutputSeq);
        Open();
        bench_->Show<PExtensions>();
        const std::int32_t before = Control().LastChangeIndex();
        Click(extensions_->chkExtension[2]);
        Host().Apply();
        QCOMPARE(Control().OutputMode(), qzivifgenOutputFunc);
        QCOMPARE(Control().Extensions(), 0x3FF & ~(qzivifgenArbWfmExt | qzivifgenArbSeqExt));
        QCOMPARE(Control().LastChangeIndex(), before + 1); // the other pages reload
        bench_->Show<PGeneral>();
        QCOMPARE(general_->cmbGeneral[0]->count(), 1);
    }

    void closedInternalFieldsAreBlankAndKeepTheirValues() {
        Control().Extensions(0);
        Control().Internal()->AMInternalDepth(42);
        Open();
        bench_->Show<PInternal>();
        for (int i : {0, 1, 3, 4, 6}) {
            QVERIFY(!internal_->txtInternal[i]->isEnabled());
            QVERIFY(internal_->txtInternal[i]->text().isEmpty());
        }
        QCOMPARE(internal_->cmbWaveform[2]->count(), 0);
        internal_->Changed(true);
        Host().Apply();
        QCOMPARE(Control().Internal()->AMInternalDepth(), 42.0);
    }

    void onlyTheOpenFMFieldsAreStored() {
        Control().Extensions(qzivifgenModulateFMExt);
        const double rate = Control().Internal()->InternalTriggerRate();
        Open();
        bench_->Show<PInternal>();
        QCOMPARE(Host().focusWidget(), internal_->txtInternal[4]); // the last open group wins
        internal_->txtInternal[4]->setText("12.5");
        internal_->txtInternal[6]->setText("400");
        Host().Apply();
        QCOMPARE(Control().Internal()->FMInternalDeviation(), 12.5);
        QCOMPARE(Control().Internal()->FMInternalFrequency(), 400.0);
        QCOMPARE(Control().Internal()->InternalTriggerRate(), rate);
    }

    void aBadNumberStopsTheInternalSaveThere() {
        Control().Extensions(0x3FF);
        Open();
        bench_->Show<PInternal>();
        const double frequency = Control().Internal()->AMInternalFrequency();
        internal_->txtInternal[0]->setText("250");
        internal_->txtInternal[1]->setText("lots");
        internal_->txtInternal[3]->setText("77");
        Host().Apply();
        QCOMPARE(Control().Internal()->InternalTriggerRate(), 250.0);
        QCOMPARE(Control().Internal()->AMInternalFrequency(), frequency);
    }
};

QTEST_MAIN(PagesTest)
#include "pages_test.moc"
