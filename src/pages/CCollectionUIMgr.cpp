#include "qzivi/pages/CCollectionUIMgr.h"

#include "qzivi/support/scoped_hook.h"

#include <QAbstractButton>
#include <QKeyEvent>
#include <QLineEdit>
#include <QListWidget>
#include <QMouseEvent>
#include <QScrollBar>

namespace qzivi {

namespace {

constexpr int kCheckBoxWidth = 15; // pixels of an entry's check box

} // namespace

CCollectionUIMgr::CCollectionUIMgr() = default;

CCollectionUIMgr::~CCollectionUIMgr() {
    Detach();
}

std::string CCollectionUIMgr::BaseName() {
    if (m_sBaseName.empty()) m_sBaseName = "Item";
    return m_sBaseName;
}

void CCollectionUIMgr::BaseName(const std::string& name) {
    m_sBaseName = name;
}

void CCollectionUIMgr::Enabled(bool enabled) {
    m_bEnabled = enabled;
    UpdateButtons(enabled);
}

void CCollectionUIMgr::Attach(QListWidget* list, QAbstractButton* addButton,
                              QAbstractButton* removeButton, QLineEdit* editBox,
                              QAbstractButton* upButton, QAbstractButton* downButton) {
    Detach();
    m_oList = list;
    m_oAdd = addButton;
    m_oRemove = removeButton;
    m_oEditBox = editBox;
    m_oUp = upButton;
    m_oDown = downButton;
    m_cAdd = connect(m_oAdd, &QAbstractButton::clicked, this, [this] { UserAdd(""); });
    m_cRemove = connect(m_oRemove, &QAbstractButton::clicked, this, [this] { Removal(-1); });
    m_cItemChanged = connect(m_oList, &QListWidget::itemChanged, this, [this](QListWidgetItem* i) {
        m_bItemCheck = i->checkState() != Qt::Checked; // the state before the user's change
    });
    m_oList->installEventFilter(this);
    m_oList->viewport()->installEventFilter(this);
    if (m_oEditBox) {
        m_oEditBox->hide();
        m_oEditBox->installEventFilter(this);
    }
    Enabled(true);
}

void CCollectionUIMgr::Detach() {
    disconnect(m_cAdd);
    disconnect(m_cRemove);
    disconnect(m_cItemChanged);
    if (m_oList) {
        m_oList->removeEventFilter(this);
        m_oList->viewport()->removeEventFilter(this);
    }
    if (m_oEditBox) m_oEditBox->removeEventFilter(this);
    m_oList = nullptr;
    m_oAdd = m_oRemove = m_oUp = m_oDown = nullptr;
    m_oEditBox = nullptr;
}

void CCollectionUIMgr::Add(const std::string& name) {
    const FlagHold silent(m_bSilent);
    UserAdd(name);
}

void CCollectionUIMgr::Remove(std::int32_t index) {
    const FlagHold silent(m_bSilent);
    Removal(index);
}

void CCollectionUIMgr::SetItemText(const std::string& text, std::int32_t index) {
    if (QListWidgetItem* item = m_oList->item(index)) item->setText(QString::fromStdString(text));
}

std::string CCollectionUIMgr::NextFreeName() const {
    const std::string base = const_cast<CCollectionUIMgr*>(this)->BaseName();
    for (int n = 1;; ++n) {
        const QString name = QString::fromStdString(base + std::to_string(n));
        bool taken = false;
        for (int i = 0; i < m_oList->count() && !taken; ++i)
            taken = m_oList->item(i)->text() == name;
        if (!taken) return name.toStdString();
    }
}

void CCollectionUIMgr::UserAdd(std::string name) {
    const FlagHold busy(m_bBusy);
    m_oList->setEnabled(true);
    if (!m_bSilent) BeforeAdd(name);
    if (name.empty()) name = NextFreeName();
    auto* item = new QListWidgetItem(QString::fromStdString(name), m_oList);
    m_oList->setCurrentItem(item);
    UpdateButtons(true);
    std::int32_t index = m_oList->row(item);
    ItemAdded(index);
    if (m_bCheckList) {
        item->setFlags(item->flags() | Qt::ItemIsUserCheckable);
        item->setCheckState(Qt::Checked);
    }
}

void CCollectionUIMgr::Removal(std::int32_t index) {
    const FlagHold busy(m_bBusy);
    if (!m_bSilent) BeforeRemove(-1);
    if (index == -1) index = m_oList->currentRow();
    if (index < 0 || index >= m_oList->count()) return;
    delete m_oList->takeItem(index);
    if (m_oList->count() > 0) m_oList->setCurrentRow(std::min(index, m_oList->count() - 1));
    UpdateButtons(true);
    if (m_bCheckList && m_oList->count() > 0) {
        std::int32_t current = m_oList->currentRow();
        ListItemSelected(current);
    }
    if (!m_bSilent) ItemRemoved(index);
}

void CCollectionUIMgr::UpdateButtons(bool enabled) {
    if (!m_oList) return;
    const bool some = enabled && m_oList->count() > 0;
    if (m_oAdd) m_oAdd->setEnabled(enabled);
    m_oList->setEnabled(some);
    if (m_oRemove) m_oRemove->setEnabled(some);
    if (m_oEditBox) m_oEditBox->setEnabled(some);
    if (m_oUp) m_oUp->setEnabled(some);
    if (m_oDown) m_oDown->setEnabled(some);
}

bool CCollectionUIMgr::PressRightOfBox() const {
    return !m_bCheckList || m_lPressX > kCheckBoxWidth;
}

void CCollectionUIMgr::ListClicked() {
    m_lCurrent = m_oList->currentRow();
    if (!m_bBusy) {
        if (m_bMousePressed && m_lLastSelected == m_lCurrent) {
            if (PressRightOfBox()) StartRename();
        } else if (m_lCurrent >= 0) {
            m_lLastSelected = m_lCurrent;
        } else {
            m_bMousePressed = false;
        }
    }
    std::int32_t index = m_oList->currentRow();
    ListItemSelected(index);
}

void CCollectionUIMgr::StartRename() {
    if (!m_oList->isEnabled() || m_lLastSelected < 0) return;
    QListWidgetItem* item = m_oList->item(m_lLastSelected);
    if (!item) return;
    const QRect entry = m_oList->visualItemRect(item);
    const QRect at = m_oList->geometry();
    std::int32_t left = at.left() + 2, top = at.top() + entry.top() + 2, width = at.width() - 4,
                 height = entry.height();
    if (m_bCheckList) {
        left += kCheckBoxWidth;
        width -= kCheckBoxWidth;
        const QSignalBlocker quiet(m_oList);
        item->setCheckState(m_bItemCheck ? Qt::Checked : Qt::Unchecked);
    }
    if (m_oList->verticalScrollBar()->isVisible()) width -= 16;
    std::string text = item->text().toStdString();
    if (!m_oEditBox) {
        std::int32_t index = m_lLastSelected;
        Edit(left, top, width, height, index, text);
        return;
    }
    m_lEditIndex = m_lLastSelected;
    m_oEditBox->setGeometry(left, top, width, height);
    m_oEditBox->setText(item->text());
    m_oEditBox->selectAll();
    m_oEditBox->show();
    m_oEditBox->raise();
    m_oEditBox->setFocus();
    m_bRenaming = true;
}

void CCollectionUIMgr::EndRename(bool cancel) {
    if (m_bEnding || !m_bRenaming) return;
    const FlagHold ending(m_bEnding);
    m_bRenaming = false;
    std::int32_t index = m_lEditIndex;
    std::string text = m_oEditBox->text().toStdString();
    Validate(index, text, cancel);
    if (!cancel) SetItemText(text, index);
    m_oEditBox->hide();
    m_oList->setFocus();
}

bool CCollectionUIMgr::eventFilter(QObject* watched, QEvent* event) {
    if (m_oEditBox && watched == m_oEditBox)
        return EndsEdit(event, [this](bool cancel) { EndRename(cancel); });
    if (!m_oList) return false;
    if (watched == m_oList && event->type() == QEvent::KeyPress) {
        const int key = static_cast<QKeyEvent*>(event)->key();
        if (key == Qt::Key_Delete && m_oList->count() > 0) {
            m_lLastSelected = -1;
            Removal(-1);
            return true;
        }
        if (key == Qt::Key_F2) { // the keyboard's way to rename
            m_lLastSelected = m_oList->currentRow();
            StartRename();
            return true;
        }
        return false;
    }
    if (watched != m_oList->viewport()) return false;
    switch (event->type()) {
    case QEvent::MouseButtonPress: {
        const auto* mouse = static_cast<QMouseEvent*>(event);
        m_lCurrent = m_oList->indexAt(mouse->position().toPoint()).row();
        m_bMousePressed = true;
        m_lPressX = mouse->position().toPoint().x();
        m_lPressY = mouse->position().toPoint().y();
        break;
    }
    case QEvent::MouseButtonRelease: // the list took the press as its selection already
        ListClicked();
        break;
    case QEvent::MouseButtonDblClick:
        if (m_bMousePressed && PressRightOfBox()) {
            m_lLastSelected = m_oList->currentRow();
            StartRename();
        }
        break;
    case QEvent::Leave:
        m_bMousePressed = false;
        break;
    default:
        break;
    }
    return false;
}

} // namespace qzivi
