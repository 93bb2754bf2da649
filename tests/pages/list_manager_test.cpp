// The list manager on a real list: automatic names, silent and user's adds and removals, the
// selection after a removal, and renaming in place with its keys.
#include "qzivi/pages/CCollectionUIMgr.h"

#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTest>

using namespace qzivi;

class ListManagerTest : public QObject {
    Q_OBJECT

    std::unique_ptr<QWidget> page_;
    QListWidget* list_ = nullptr;
    QPushButton *add_ = nullptr, *remove_ = nullptr;
    QLineEdit* edit_ = nullptr;
    std::unique_ptr<CCollectionUIMgr> mgr_;
    QStringList events_;
    std::vector<Connection> connections_;

    QStringList Texts() const {
        QStringList texts;
        for (int i = 0; i < list_->count(); ++i)
            texts << list_->item(i)->text();
        return texts;
    }
    QPoint Centre(int row) const { return list_->visualItemRect(list_->item(row)).center(); }

private slots:
    void init() {
        page_ = std::make_unique<QWidget>();
        page_->resize(300, 200);
        list_ = new QListWidget(page_.get());
        list_->setGeometry(10, 10, 150, 150);
        add_ = new QPushButton("Add", page_.get());
        remove_ = new QPushButton("Remove", page_.get());
        edit_ = new QLineEdit(page_.get());
        mgr_ = std::make_unique<CCollectionUIMgr>();
        mgr_->Attach(list_, add_, remove_, edit_);
        events_.clear();
        connections_.clear();
        connections_.push_back(
            mgr_->BeforeAdd.Connect([&](std::string&) { events_ << "BeforeAdd"; }));
        connections_.push_back(mgr_->ItemAdded.Connect(
            [&](std::int32_t i) { events_ << QString("ItemAdded %1").arg(i); }));
        connections_.push_back(mgr_->BeforeRemove.Connect(
            [&](std::int32_t i) { events_ << QString("BeforeRemove %1").arg(i); }));
        connections_.push_back(mgr_->ItemRemoved.Connect(
            [&](std::int32_t i) { events_ << QString("ItemRemoved %1").arg(i); }));
        page_->show();
    }
    void cleanup() {
        connections_.clear();
        mgr_.reset();
        page_.reset();
    }

    void automaticNamesTakeTheLowestFreeNumber() {
        QCOMPARE(mgr_->BaseName(), std::string("Item"));
        QVERIFY(!remove_->isEnabled());
        add_->click();
        add_->click();
        QCOMPARE(Texts(), (QStringList{"Item1", "Item2"}));
        QCOMPARE(events_, (QStringList{"BeforeAdd", "ItemAdded 0", "BeforeAdd", "ItemAdded 1"}));
        list_->setCurrentRow(0);
        remove_->click();
        QCOMPARE(events_.mid(4), (QStringList{"BeforeRemove -1", "ItemRemoved 0"}));
        add_->click();
        QCOMPARE(Texts(), (QStringList{"Item2", "Item1"}));
        QCOMPARE(list_->currentRow(), 1);
    }

    void aNameFromTheHandlerOrFromAddWins() {
        const auto named = mgr_->BeforeAdd.Connect([](std::string& name) { name = "Sweep"; });
        add_->click();
        events_.clear();
        mgr_->Add("Given");
        QCOMPARE(Texts(), (QStringList{"Sweep", "Given"}));
        QCOMPARE(events_, QStringList{"ItemAdded 1"}); // no BeforeAdd for the public Add
        mgr_->Remove(-1);
        QCOMPARE(events_, QStringList{"ItemAdded 1"}); // nor any removal event
        QCOMPARE(Texts(), QStringList{"Sweep"});
    }

    void removalSelectsTheSameIndexOrTheLastAndTheLastLeavesNothing() {
        for (const char* name : {"a", "b", "c"})
            mgr_->Add(name);
        list_->setCurrentRow(2);
        remove_->click();
        QCOMPARE(list_->currentRow(), 1);
        list_->setCurrentRow(0);
        list_->setFocus();
        QTest::keyClick(list_, Qt::Key_Delete);
        QCOMPARE(Texts(), QStringList{"b"});
        QCOMPARE(list_->currentRow(), 0);
        remove_->click();
        QCOMPARE(list_->count(), 0);
        QVERIFY(!remove_->isEnabled());
        QVERIFY(add_->isEnabled());
    }

    void aSecondClickRenamesAndEscapeKeepsTheOldText() {
        mgr_->Add("Item1");
        mgr_->Add("Item2");
        QStringList validated;
        const auto validate =
            mgr_->Validate.Connect([&](std::int32_t& i, std::string& text, bool&) {
                validated << QString("%1 %2").arg(i).arg(QString::fromStdString(text));
            });
        QTest::mouseClick(list_->viewport(), Qt::LeftButton, {}, Centre(0));
        QVERIFY(edit_->isHidden());
        QTest::mouseClick(list_->viewport(), Qt::LeftButton, {}, Centre(0));
        QVERIFY(edit_->isVisible());
        QCOMPARE(edit_->text(), QStringLiteral("Item1"));
        QCOMPARE(edit_->selectedText(), QStringLiteral("Item1"));
        QVERIFY(edit_->geometry().left() == list_->geometry().left() + 2);
        QTest::keyClicks(edit_, "Carrier");
        QTest::keyClick(edit_, Qt::Key_Return);
        QCOMPARE(Texts().at(0), QStringLiteral("Carrier"));
        QVERIFY(edit_->isHidden());

        list_->setFocus();
        QTest::keyClick(list_, Qt::Key_F2);
        QTest::keyClicks(edit_, "Lost");
        QTest::keyClick(edit_, Qt::Key_Escape);
        QCOMPARE(Texts().at(0), QStringLiteral("Carrier"));
        QCOMPARE(validated, (QStringList{"0 Carrier", "0 Lost"}));

        // A handler that cancels keeps the old text too.
        const auto refuse = mgr_->Validate.Connect(
            [](std::int32_t&, std::string&, bool& cancel) { cancel = true; });
        QTest::keyClick(list_, Qt::Key_F2);
        QTest::keyClicks(edit_, "Other");
        QTest::keyClick(edit_, Qt::Key_Return);
        QCOMPARE(Texts().at(0), QStringLiteral("Carrier"));
    }

    void withoutAnEditBoxARenameAsksThePage() {
        mgr_->Attach(list_, add_, remove_);
        mgr_->Add("Item1");
        int asked = -1;
        const auto edit =
            mgr_->Edit.Connect([&](std::int32_t& left, std::int32_t&, std::int32_t& width,
                                   std::int32_t&, std::int32_t& index, std::string& text) {
                asked = index;
                QCOMPARE(text, std::string("Item1"));
                QCOMPARE(left, list_->geometry().left() + 2);
                QVERIFY(width <= list_->width() - 4);
            });
        list_->setCurrentRow(0);
        QTest::keyClick(list_, Qt::Key_F2);
        QCOMPARE(asked, 0);
    }
};

QTEST_MAIN(ListManagerTest)
#include "list_manager_test.moc"
