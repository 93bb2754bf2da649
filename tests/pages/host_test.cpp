// The page host and the page cycle, with pages that record what they are told, and the list
// helpers on real lists.
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/pages/PropertyPage.h"
#include "qzivi/support/failure.h"

#include <QApplication>
#include <QComboBox>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QTabWidget>
#include <QTest>
#include <QTimer>

#include <cstdlib>

using namespace qzivi;

namespace {

// A page over ArbSampleRate that notes each step of its cycle.
class RecordingPage : public PropertyPage {
public:
    RecordingPage(const QString& caption, bool alert, QStringList& log)
        : PropertyPage(caption), field(new QLineEdit(this)), m_bAlert(alert), m_oLog(log) {
        connect(field, &QLineEdit::textChanged, this, [this] { UserChanged(); });
    }
    int loads = 0;
    QLineEdit* field;

protected:
    void Created() override { m_oLog << Caption() + " created"; }
    void Load() override {
        ++loads;
        m_oLog << Caption() + " load";
        field->setText(QString::number(Props().ArbSampleRate()));
    }
    void Save() override { Props().ArbSampleRate(field->text().toDouble()); }
    void Apply() override {
        m_oLog << Caption() + " apply";
        SaveQuietly();
        Link().ApplyChanges(m_bAlert);
    }
    QWidget* FirstControl() override { return field; }

private:
    bool m_bAlert;
    QStringList& m_oLog;
};

PropertyBag BagOf(QZIviFgen& control) {
    PropertyBag bag;
    control.WriteProperties(bag);
    return bag;
}

} // namespace

class PageHostTest : public QObject {
    Q_OBJECT

private slots:
    void init() { ::setenv("QZIVI_SESSION_MANAGER", "none", 1); }

    void theOtherPageReloadsOnceAfterAnAlertingApply() {
        QZIviFgen control;
        control.InitProperties();
        QStringList log;
        CPageHost host({&control});
        auto* general = new RecordingPage("General", true, log);
        auto* other = new RecordingPage("Other", false, log);
        host.AddPage(general);
        host.AddPage(other);
        host.show();
        QCOMPARE(log,
                 (QStringList{"General created", "General load", "Other created", "Other load"}));
        QVERIFY(!host.ApplyButton().isEnabled());
        QVERIFY(!general->Changed()); // loading is no change

        const double before = control.ArbSampleRate();
        general->field->setText("2e6");
        QVERIFY(general->Changed());
        QVERIFY(host.ApplyButton().isEnabled());
        QCOMPARE(control.ArbSampleRate(), before); // nothing live before the apply
        host.Apply();
        QCOMPARE(control.ArbSampleRate(), 2e6);
        QVERIFY(!host.ApplyButton().isEnabled());
        QCOMPARE(general->loads, 1); // its own alert
        host.Tabs().setCurrentIndex(1);
        QCOMPARE(other->loads, 2);
        QCOMPARE(other->field->text().toDouble(), 2e6);
        host.Tabs().setCurrentIndex(0);
        host.Tabs().setCurrentIndex(1);
        QCOMPARE(other->loads, 2); // once
        QCOMPARE(log.filter("apply"), QStringList{"General apply"});
    }

    void cancelLeavesTheLiveTreeAsItWasAndEndsEveryPage() {
        QZIviFgen control;
        control.InitProperties();
        control.Channels()->Add("Channel1");
        const PropertyBag before = BagOf(control);
        QStringList log;
        {
            CPageHost host({&control});
            auto* page = new RecordingPage("General", true, log);
            host.AddPage(page);
            host.show();
            page->field->setText("123");
            QTest::keyClick(&host, Qt::Key_Escape);
            QVERIFY(!host.isVisible());
            QVERIFY(control.PropCopy() == nullptr); // the copy went with the last page
        }
        QVERIFY(BagOf(control) == before);
    }

    void okAppliesTheChangedPagesAndCloses() {
        QZIviFgen control;
        control.InitProperties();
        QStringList log;
        CPageHost host({&control});
        auto* page = new RecordingPage("General", true, log);
        host.AddPage(page);
        host.show();
        page->field->setText("5e5");
        QTest::keyClick(&host, Qt::Key_Return);
        QCOMPARE(control.ArbSampleRate(), 5e5);
        QCOMPARE(host.result(), int(QDialog::Accepted));
    }

    void aFailureInAPageShowsACriticalBoxWithTheTextsAsGiven() {
        QZIviFgen control;
        CPageHost host({&control}); // puts the Qt boxes in
        host.show();
        QString title, text;
        QMessageBox::Icon icon = QMessageBox::NoIcon;
        QTimer::singleShot(0, [&] {
            auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget());
            QVERIFY(box != nullptr);
            title = box->windowTitle();
            text = box->text();
            icon = box->icon();
            box->accept();
        });
        try {
            RaiseRuntime(-31601, "Waveform \"Ramp\" has no data.", "Waveforms.Item");
        } catch (...) {
            HandleError("Apply", 1, nullptr);
        }
        QCOMPARE(icon, QMessageBox::Critical);
        QCOMPARE(title, QStringLiteral("Apply"));
        QVERIFY2(text.endsWith("Waveform \"Ramp\" has no data."), qPrintable(text));
    }

    void aTableFillsAListWithTheColumnsThatHaveATextAndTheirValues() {
        QComboBox list;
        list.addItem("old");
        const Variant table = Variant::Array({"Function", "", "Sequence", 0, 1, 2}, 2);
        QVERIFY(FillComboFromTable(list, table, true));
        QCOMPARE(list.count(), 2);
        QCOMPARE(list.itemText(1), QStringLiteral("Sequence"));
        QCOMPARE(list.itemData(1).toInt(), 2);
        QComboBox only;
        FillComboFromTable(only, Variant::Array({"", "", "Sequence", 0, 1, 2}, 2), true);
        QCOMPARE(only.count(), 1);
        QCOMPARE(only.itemData(0).toInt(), 2);
        FillComboFromTable(only, Variant(3), true); // no array: untouched
        QCOMPARE(only.count(), 1);
        FillComboFromTable(only, Variant::Array({"a", "", "b"}), false);
        QCOMPARE(only.count(), 3);

        QVERIFY(SelectComboEntry(list, Variant(2), true, true));
        QCOMPARE(list.currentIndex(), 1);
        QCOMPARE(ComboValue(list).AsInt32(), 2);
        QVERIFY(SelectComboEntry(list, Variant(7), true, true)); // not held: the first
        QCOMPARE(list.currentIndex(), 0);
        list.setCurrentIndex(-1);
        QCOMPARE(ComboValue(list, -1).AsInt32(), -1);
        QVERIFY(ComboValue(list).IsMissing());
        QComboBox empty;
        QVERIFY(!SelectComboEntry(empty, Variant(1), true, true)); // a fixed list takes no text
        QComboBox names;
        names.setEditable(true);
        names.addItem("SampleFGen");
        QVERIFY(SelectComboEntry(names, Variant("Bench7"), false, false));
        QCOMPARE(names.currentText(), QStringLiteral("Bench7"));
    }
};

QTEST_MAIN(PageHostTest)
#include "host_test.moc"
