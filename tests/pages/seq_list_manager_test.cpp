// The two-level list manager's table on real widgets: automatic cells, the move buttons, the
// removal step and its events, in-place cell edits, and what an empty or closed table ignores.
#include "qzivi/pages/CIviFgenSeqPageImp.h"

#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTest>
#include <QTreeWidget>

using namespace qzivi;

class SeqListManagerTest : public QObject {
    Q_OBJECT

    std::unique_ptr<QWidget> page_;
    QListWidget* list_ = nullptr;
    QTreeWidget* table_ = nullptr;
    QPushButton *add_ = nullptr, *remove_ = nullptr, *addRow_ = nullptr, *removeRow_ = nullptr,
                *up_ = nullptr, *down_ = nullptr;
    QLineEdit *edit_ = nullptr, *cellEdit_ = nullptr;
    std::unique_ptr<CIviFgenSeqPageImp> mgr_;
    QStringList events_;
    std::vector<Connection> connections_;

    QStringList Rows() const {
        QStringList rows;
        for (int r = 0; r < table_->topLevelItemCount(); ++r) {
            QStringList cells;
            for (int c = 0; c < table_->columnCount(); ++c)
                cells << table_->topLevelItem(r)->text(c);
            rows << cells.join(',');
        }
        return rows;
    }
    QPoint Cell(int row, int column) const {
        return table_->visualRect(table_->indexFromItem(table_->topLevelItem(row), column))
            .center();
    }

private slots:
    void init() {
        page_ = std::make_unique<QWidget>();
        page_->resize(500, 300);
        list_ = new QListWidget(page_.get());
        list_->setGeometry(10, 10, 100, 200);
        table_ = new QTreeWidget(page_.get());
        table_->setGeometry(120, 10, 250, 200);
        add_ = new QPushButton("Add", page_.get());
        remove_ = new QPushButton("Remove", page_.get());
        addRow_ = new QPushButton("Add row", page_.get());
        removeRow_ = new QPushButton("Remove row", page_.get());
        up_ = new QPushButton("Up", page_.get());
        down_ = new QPushButton("Down", page_.get());
        edit_ = new QLineEdit(page_.get());
        cellEdit_ = new QLineEdit(page_.get());
        mgr_ = std::make_unique<CIviFgenSeqPageImp>();
        mgr_->Attach(list_, table_, add_, remove_, addRow_, removeRow_, edit_, cellEdit_, nullptr,
                     nullptr, up_, down_);
        mgr_->SetLVHeaderInfo({"Waveform", "Iterations"});
        events_.clear();
        connections_.clear();
        connections_.push_back(mgr_->LVBeforeRemove.Connect(
            [&](std::int32_t i) { events_ << QString("LVBeforeRemove %1").arg(i); }));
        connections_.push_back(mgr_->LVItemRemoved.Connect(
            [&](std::int32_t i) { events_ << QString("LVItemRemoved %1").arg(i); }));
        connections_.push_back(mgr_->LVItemAdded.Connect(
            [&](std::int32_t i) { events_ << QString("LVItemAdded %1").arg(i); }));
        connections_.push_back(mgr_->LVListItemSelected.Connect(
            [&](std::int32_t i) { events_ << QString("LVListItemSelected %1").arg(i); }));
        page_->show();
    }
    void cleanup() {
        connections_.clear();
        mgr_.reset();
        page_.reset();
    }

    void newRowsTakeTheBaseNamesThenTheHandlersThenThePendingCells() {
        QTest::mouseClick(addRow_, Qt::LeftButton);
        QCOMPARE(Rows(), QStringList{"Column1,Column2"});
        mgr_->BaseNamesLV({"Sine", "1"});
        QTest::mouseClick(addRow_, Qt::LeftButton);
        const auto given = mgr_->BeforeAddLVItem.Connect([](std::vector<std::string>& cells) {
            cells = {"Square", "2"};
        });
        QTest::mouseClick(addRow_, Qt::LeftButton);
        mgr_->AddLVI({"Ramp", "9"}); // the pending cells win over the handler's
        QCOMPARE(Rows(), (QStringList{"Column1,Column2", "Sine,1", "Square,2", "Ramp,9"}));
        QCOMPARE(mgr_->LVIndex(), 4);
        QVERIFY(events_.contains("LVItemAdded 4"));
    }

    void theMoveButtonsSwapCellsAndAreOfferedOnlyWhereTheyCanMove() {
        for (const char* name : {"A", "B", "C"})
            mgr_->AddLVI({name, "1"});
        QVERIFY(up_->isEnabled());
        QVERIFY(!down_->isEnabled()); // the last row
        QTest::mouseClick(up_, Qt::LeftButton);
        QTest::mouseClick(up_, Qt::LeftButton);
        QCOMPARE(Rows(), (QStringList{"C,1", "A,1", "B,1"}));
        QCOMPARE(mgr_->LVIndex(), 1);
        QVERIFY(!up_->isEnabled());
        QVERIFY(down_->isEnabled());
        QTest::mouseClick(table_->viewport(), Qt::LeftButton, {}, Cell(1, 0));
        QTest::mouseClick(down_, Qt::LeftButton);
        QCOMPARE(Rows(), (QStringList{"C,1", "B,1", "A,1"}));
        QVERIFY(events_.contains("LVListItemSelected 3"));
    }

    void removingSelectsTheSameIndexAndClearingRaisesOnlyTheBeforeEvents() {
        for (const char* name : {"A", "B", "C"})
            mgr_->AddLVI({name, "1"});
        mgr_->LVIndex(3);
        events_.clear();
        QTest::mouseClick(removeRow_, Qt::LeftButton);
        QCOMPARE(Rows(), (QStringList{"A,1", "B,1"}));
        QCOMPARE(mgr_->LVIndex(), 2); // past the end: the last row
        QCOMPARE(events_, (QStringList{"LVBeforeRemove 3", "LVItemRemoved 3"}));
        events_.clear();
        mgr_->ClearLV();
        QCOMPARE(Rows(), QStringList{});
        QCOMPARE(events_, (QStringList{"LVBeforeRemove 2", "LVBeforeRemove 1"}));
        QVERIFY(!removeRow_->isEnabled());
        QVERIFY(!table_->isEnabled());
        QVERIFY(addRow_->isEnabled());
    }

    void aCellEditIsValidatedAndEndsByItsKeys() {
        mgr_->AddLVI({"A", "1"});
        mgr_->AddLVI({"B", "2"});
        std::vector<std::tuple<int, int, std::string>> asked;
        const auto validate = mgr_->LVValidate.Connect(
            [&](std::int32_t row, std::int32_t column, std::string& text, bool& cancel) {
                asked.emplace_back(row, column, text);
                if (text == "bad") cancel = true;
                if (text == "3.7") text = "4";
            });
        // A first click chooses the cell, a second on the same cell edits it.
        QTest::mouseClick(table_->viewport(), Qt::LeftButton, {}, Cell(1, 1));
        QVERIFY(!cellEdit_->isVisible());
        QTest::mouseClick(table_->viewport(), Qt::LeftButton, {}, Cell(1, 1));
        QVERIFY(cellEdit_->isVisible());
        QCOMPARE(cellEdit_->text(), QString("2"));
        cellEdit_->selectAll();
        QTest::keyClicks(cellEdit_, "3.7");
        QTest::keyClick(cellEdit_, Qt::Key_Return);
        QCOMPARE(Rows(), (QStringList{"A,1", "B,4"}));
        QCOMPARE(asked.back(), std::make_tuple(2, 1, std::string("3.7")));
        // Refused; and cancelled by Escape, which the question then carries.
        QTest::mouseDClick(table_->viewport(), Qt::LeftButton, {}, Cell(0, 0));
        cellEdit_->selectAll();
        QTest::keyClicks(cellEdit_, "bad");
        QTest::keyClick(cellEdit_, Qt::Key_Return);
        bool escaped = false;
        const auto cancelled = mgr_->LVValidate.Connect(
            [&](std::int32_t, std::int32_t, std::string&, bool& cancel) { escaped = cancel; });
        QTest::keyClick(table_, Qt::Key_F2);
        QTest::keyClicks(cellEdit_, "x");
        QTest::keyClick(cellEdit_, Qt::Key_Escape);
        QVERIFY(escaped);
        QCOMPARE(Rows(), (QStringList{"A,1", "B,4"}));
    }

    void anEmptyOrClosedTableIgnoresTexts() {
        mgr_->LVSetItemText("X", 1, 0);
        QCOMPARE(Rows(), QStringList{});
        mgr_->AddLVI({"A", "1"});
        mgr_->LVEnabled(false);
        mgr_->LVSetItemText("X", 1, 0);
        QCOMPARE(Rows(), QStringList{"A,1"});
        QVERIFY(!addRow_->isEnabled() && !removeRow_->isEnabled() && !up_->isEnabled());
        mgr_->LVEnabled(true);
        mgr_->LVSetItemText("X", 1, 0);
        mgr_->LVSetItemText("7", 1, 1);
        QCOMPARE(Rows(), QStringList{"X,7"});
        QCOMPARE(mgr_->LVSelectAll(), 1);
        QCOMPARE(mgr_->LVDeselectAll(), 0);
    }
};

QTEST_MAIN(SeqListManagerTest)
#include "seq_list_manager_test.moc"
