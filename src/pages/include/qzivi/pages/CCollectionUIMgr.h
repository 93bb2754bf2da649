// CCollectionUIMgr: a plain list on a page made an editable list of named things: an add button
// with automatic names, a remove button and the Delete key, renaming in place (a second click on
// the selected entry, a double click or F2), and events by which the page keeps its collection in
// step. It knows nothing of what the names stand for.
#pragma once

#include "qzivi/support/event.h"

#include <QKeyEvent>
#include <QObject>

#include <cstdint>
#include <string>

class QAbstractButton;
class QLineEdit;
class QListWidget;

namespace qzivi {

class CCollectionUIMgr : public QObject {
    Q_OBJECT

public:
    CCollectionUIMgr();
    ~CCollectionUIMgr() override;

    // The first part of automatic names; "Item" when empty, and then kept so.
    std::string BaseName();
    void BaseName(const std::string& name);
    bool Enabled() const { return m_bEnabled; }
    void Enabled(bool enabled);
    // A list whose entries carry check boxes, as the channels' outputs do.
    void CheckBoxes(bool on) { m_bCheckList = on; }

    // Connects the controls; the edit box and the move buttons may be null. Enabled becomes true.
    void Attach(QListWidget* list, QAbstractButton* addButton, QAbstractButton* removeButton,
                QLineEdit* editBox = nullptr, QAbstractButton* upButton = nullptr,
                QAbstractButton* downButton = nullptr);
    void Detach();
    // Silent: no BeforeAdd; ItemAdded still fires.
    void Add(const std::string& name);
    // Silent: neither BeforeRemove nor ItemRemoved; -1 is the current entry.
    void Remove(std::int32_t index);
    void SetItemText(const std::string& text, std::int32_t index);
    // Ends a rename in progress as leaving the edit box does: validated, and kept unless refused.
    void CommitRename() { EndRename(false); }

    Event<std::int32_t&> ListItemSelected;
    Event<std::string&> BeforeAdd;
    Event<std::int32_t> BeforeRemove;
    Event<std::int32_t> ItemAdded;
    Event<std::int32_t> ItemRemoved;
    Event<std::int32_t&, std::int32_t&, std::int32_t&, std::int32_t&, std::int32_t&, std::string&>
        Edit;
    Event<std::int32_t&, std::string&, bool&> Validate;

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;
    // How an event on an edit box in place ends the edit: Return or Enter keep, Escape cancels
    // (both keys are consumed), leaving the box keeps. Calls `end(cancel)` and returns whether
    // the event is consumed.
    template <typename End>
    static bool EndsEdit(QEvent* event, End&& end);

private:
    void UserAdd(std::string name);
    void Removal(std::int32_t index);
    void ListClicked();
    bool PressRightOfBox() const;
    void StartRename();
    void EndRename(bool cancel);
    void UpdateButtons(bool enabled);
    std::string NextFreeName() const;

    QListWidget* m_oList = nullptr;
    QAbstractButton *m_oAdd = nullptr, *m_oRemove = nullptr, *m_oUp = nullptr, *m_oDown = nullptr;
    QLineEdit* m_oEditBox = nullptr;
    std::string m_sBaseName;
    bool m_bEnabled = false;
    bool m_bSilent = false;
    bool m_bBusy = false;
    bool m_bCheckList = false;
    std::int32_t m_lCurrent = -1;
    std::int32_t m_lLastSelected = -1;
    std::int32_t m_lEditIndex = -1;
    bool m_bMousePressed = false;
    int m_lPressX = 0, m_lPressY = 0;
    bool m_bItemCheck = false;
    bool m_bEnding = false;
    bool m_bRenaming = false;
    QMetaObject::Connection m_cAdd, m_cRemove, m_cItemChanged;
};

template <typename End>
bool CCollectionUIMgr::EndsEdit(QEvent* event, End&& end) {
    if (event->type() == QEvent::FocusOut) {
        end(false);
        return false;
    }
    if (event->type() != QEvent::KeyPress) return false;
    const int key = static_cast<QKeyEvent*>(event)->key();
    if (key != Qt::Key_Return && key != Qt::Key_Enter && key != Qt::Key_Escape) return false;
    end(key == Qt::Key_Escape);
    return true;
}

} // namespace qzivi
