// What the tests of a page share: a control of their own with a private store, the page host with
// all pages on it, the message boxes caught, and the user's gestures on lists and fields.
#pragma once

#include "../platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/panels/MessageBoxes.h"

#include <QApplication>
#include <QComboBox>
#include <QFileDialog>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTabWidget>
#include <QTest>
#include <QTimer>

namespace qzivi::test {

class PageBench {
public:
    // `asMade`: the control as it comes, not with every extension on and its exceptions off.
    explicit PageBench(bool asMade = false) {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        InstallQtMessageBoxes(); // before the scope, which then wins
        boxScope = std::make_unique<MessageBoxScope>(
            [this](const MessageBoxRequest& r) { boxes.push_back(r); });
        control = std::make_unique<QZIviFgen>();
        control->InitProperties();
        if (asMade) return;
        control->ExceptionOnError(false);
        control->Extensions(0x3FF);
    }
    ~PageBench() {
        host.reset();
        control.reset();
        boxScope.reset();
    }

    // The host with every page, showing the page of type T.
    template <typename T>
    T* Open() {
        host = std::make_unique<CPageHost>(std::vector<QZIviFgen*>{control.get()});
        host->AddStandardPages();
        host->show();
        T* page = Page<T>();
        host->Tabs().setCurrentWidget(page);
        return page;
    }
    template <typename T>
    T* Page() const {
        for (int i = 0; i < host->Tabs().count(); ++i)
            if (auto* page = qobject_cast<T*>(host->Page(i))) return page;
        return nullptr;
    }
    template <typename T>
    void Show() {
        host->Tabs().setCurrentWidget(Page<T>());
    }
    void Apply() { QTest::mouseClick(&host->ApplyButton(), Qt::LeftButton); }

    static void Type(QLineEdit* box, const QString& text) {
        box->selectAll();
        QTest::keyClicks(box, text);
    }
    // Typed and ended with Return, as a rename box takes it.
    static void Enter(QLineEdit* box, const QString& text) {
        Type(box, text);
        QTest::keyClick(box, Qt::Key_Return);
    }
    // Typed and left, as a user finishes a field (Return there would press the host's OK).
    static void Finish(QLineEdit* box, const QString& text) {
        Type(box, text);
        emit box->editingFinished();
    }
    static bool Choose(QComboBox* list, const QString& text) {
        const int at = list->findText(text);
        if (at >= 0) list->setCurrentIndex(at);
        return at >= 0;
    }
    static bool ChooseValue(QComboBox* list, int value) {
        const int at = list->findData(value);
        if (at >= 0) list->setCurrentIndex(at);
        return at >= 0;
    }
    // F2 on the entry, the text, Return.
    static void Rename(QListWidget* list, QLineEdit* box, int row, const QString& name) {
        list->setCurrentRow(row);
        list->setFocus();
        QTest::keyClick(list, Qt::Key_F2);
        Enter(box, name);
    }
    static void Click(QListWidget* list, int row) {
        QTest::mouseClick(list->viewport(), Qt::LeftButton, {},
                          list->visualItemRect(list->item(row)).center());
    }
    static QStringList Entries(const QListWidget* list) {
        QStringList names;
        for (int i = 0; i < list->count(); ++i)
            names << list->item(i)->text();
        return names;
    }
    // Answers the next file dialog with `path`.
    static void ChooseFile(const QString& path) {
        QTimer::singleShot(0, [path] {
            if (auto* dialog = qobject_cast<QFileDialog*>(QApplication::activeModalWidget())) {
                dialog->selectFile(path);
                QMetaObject::invokeMethod(dialog, "accept");
            }
        });
    }

    // The text of the boxes shown so far, for a failure message.
    std::string BoxTexts() const {
        std::string texts;
        for (const auto& box : boxes)
            texts += box.text + "\n";
        return texts;
    }

    StoreScope store;
    std::vector<MessageBoxRequest> boxes;
    std::unique_ptr<MessageBoxScope> boxScope;
    std::unique_ptr<QZIviFgen> control;
    std::unique_ptr<CPageHost> host;
};

// What each page's test class keeps: a bench made anew for every test, and the page it shows.
template <typename P>
class PageTest {
protected:
    using Bench = PageBench;
    QZIviFgen& Control() { return *bench_->control; }
    CPageHost& Host() { return *bench_->host; }
    void Open() { page_ = bench_->template Open<P>(); }

    std::unique_ptr<PageBench> bench_;
    P* page_ = nullptr;
};

} // namespace qzivi::test
