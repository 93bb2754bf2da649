#include "qzivi/pages/CIviFgenSeqPageImp.h"

#include "qzivi/support/scoped_hook.h"

#include <QAbstractButton>
#include <QHeaderView>
#include <QKeyEvent>
#include <QLineEdit>
#include <QMouseEvent>
#include <QTreeWidget>

#include <algorithm>

namespace qzivi {

namespace {

void Enable(QAbstractButton* button, bool on) {
    if (button) button->setEnabled(on);
}

} // namespace

CIviFgenSeqPageImp::CIviFgenSeqPageImp() = default;

CIviFgenSeqPageImp::~CIviFgenSeqPageImp() {
    Detach();
}

std::vector<std::string> CIviFgenSeqPageImp::BaseNamesLV() const {
    if (!m_vBaseNames.empty()) return m_vBaseNames;
    std::vector<std::string> names;
    const int columns = m_oTable ? m_oTable->columnCount() : 0;
    for (int c = 1; c <= columns; ++c)
        names.push_back("Column" + std::to_string(c));
    return names;
}

void CIviFgenSeqPageImp::Attach(QListWidget* list, QTreeWidget* table, QAbstractButton* addButton,
                                QAbstractButton* removeButton, QAbstractButton* addRowButton,
                                QAbstractButton* removeRowButton, QLineEdit* editBox,
                                QLineEdit* cellEditBox, QAbstractButton* upButton,
                                QAbstractButton* downButton, QAbstractButton* rowUpButton,
                                QAbstractButton* rowDownButton) {
    Detach();
    CCollectionUIMgr::Attach(list, addButton, removeButton, editBox, upButton, downButton);
    m_oTable = table;
    m_oAddRow = addRowButton;
    m_oRemoveRow = removeRowButton;
    m_oCellEdit = cellEditBox;
    m_oRowUp = rowUpButton;
    m_oRowDown = rowDownButton;
    m_oTable->setRootIsDecorated(false);
    m_oTable->setSelectionMode(QAbstractItemView::SingleSelection);
    m_oTable->setEditTriggers(QAbstractItemView::NoEditTriggers);
    m_oTable->installEventFilter(this);
    m_oTable->viewport()->installEventFilter(this);
    m_vConnections.push_back(
        connect(m_oAddRow, &QAbstractButton::clicked, this, [this] { AddRow(); }));
    m_vConnections.push_back(
        connect(m_oRemoveRow, &QAbstractButton::clicked, this, [this] { RemoveRow(); }));
    if (m_oRowUp)
        m_vConnections.push_back(
            connect(m_oRowUp, &QAbstractButton::clicked, this, [this] { Move(-1); }));
    if (m_oRowDown)
        m_vConnections.push_back(
            connect(m_oRowDown, &QAbstractButton::clicked, this, [this] { Move(1); }));
    if (m_oCellEdit) {
        m_oCellEdit->hide();
        m_oCellEdit->installEventFilter(this);
    }
}

void CIviFgenSeqPageImp::Detach() {
    for (const auto& connection : m_vConnections)
        disconnect(connection);
    m_vConnections.clear();
    if (m_oTable) {
        m_oTable->removeEventFilter(this);
        m_oTable->viewport()->removeEventFilter(this);
    }
    if (m_oCellEdit) m_oCellEdit->removeEventFilter(this);
    m_oTable = nullptr;
    m_oAddRow = m_oRemoveRow = m_oRowUp = m_oRowDown = nullptr;
    m_oCellEdit = nullptr;
    CCollectionUIMgr::Detach();
}

void CIviFgenSeqPageImp::SetLVHeaderInfo(const std::vector<std::string>& headers) {
    if (!m_oTable) return;
    m_vHeaders = headers;
    QStringList labels;
    for (const std::string& header : headers)
        labels << QString::fromStdString(header);
    m_oTable->setColumnCount(static_cast<int>(headers.size()));
    m_oTable->setHeaderLabels(labels);
}

void CIviFgenSeqPageImp::AddLVI(std::vector<std::string> values) {
    const FlagHold silent(m_bSilent);
    m_vPending = std::move(values);
    AddRow();
}

void CIviFgenSeqPageImp::AddRow() {
    if (!m_oTable) return;
    m_oTable->setEnabled(true);
    std::vector<std::string> values;
    BeforeAddLVItem(values);
    if (values.empty()) values = BaseNamesLV();
    if (m_vPending) {
        values = std::move(*m_vPending);
        m_vPending.reset();
    }
    auto* row = new QTreeWidgetItem(m_oTable);
    for (std::size_t c = 0; c < values.size(); ++c)
        row->setText(static_cast<int>(c), QString::fromStdString(values[c]));
    const std::int32_t index = m_oTable->indexOfTopLevelItem(row) + 1;
    LVIndex(index);
    Enable(m_oRemoveRow, true);
    LVItemAdded(index);
}

void CIviFgenSeqPageImp::RemoveRow() {
    if (!m_oTable || m_oTable->topLevelItemCount() == 0) return;
    const std::int32_t index = LVIndex();
    if (index < 1) return;
    LVBeforeRemove(index);
    delete m_oTable->takeTopLevelItem(index - 1);
    const int rows = m_oTable->topLevelItemCount();
    if (rows > 0) {
        m_lCurrentRow = std::min(index, rows);
        m_oTable->setCurrentItem(m_oTable->topLevelItem(m_lCurrentRow - 1));
        UpdateMoveButtons(m_lCurrentRow);
    } else {
        Enable(m_oRemoveRow, false);
        Enable(m_oRowUp, false);
        Enable(m_oRowDown, false);
        m_oTable->setEnabled(false);
    }
    if (!m_bSilent) LVItemRemoved(index);
}

void CIviFgenSeqPageImp::ClearLV() {
    if (!m_oTable || !Enabled()) return;
    const FlagHold silent(m_bSilent);
    while (m_oTable->topLevelItemCount() > 0)
        RemoveRow();
}

std::int32_t CIviFgenSeqPageImp::LVIndex() const {
    if (!m_oTable || !m_oTable->currentItem()) return 0;
    return m_oTable->indexOfTopLevelItem(m_oTable->currentItem()) + 1;
}

void CIviFgenSeqPageImp::LVIndex(std::int32_t row) {
    if (!m_oTable) return;
    QTreeWidgetItem* item = m_oTable->topLevelItem(row - 1);
    if (!item) return;
    m_oTable->setCurrentItem(item);
    m_oTable->scrollToItem(item);
    m_lCurrentRow = row;
    UpdateMoveButtons(row);
    LVListItemSelected(row);
}

void CIviFgenSeqPageImp::UpdateMoveButtons(std::int32_t row) {
    const int rows = m_oTable->topLevelItemCount();
    const bool up = row >= 2, down = row < rows;
    const bool upFocused = m_oRowUp && m_oRowUp->hasFocus(),
               downFocused = m_oRowDown && m_oRowDown->hasFocus();
    Enable(m_oRowUp, up);
    Enable(m_oRowDown, down);
    // The focus leaves a button that goes off for the one that can go on.
    if (upFocused && !up && m_oRowDown && down) m_oRowDown->setFocus();
    if (downFocused && !down && m_oRowUp && up) m_oRowUp->setFocus();
}

void CIviFgenSeqPageImp::RowClicked() {
    const std::int32_t row = LVIndex();
    if (row < 1) return;
    m_lCurrentRow = row;
    UpdateMoveButtons(row);
    LVListItemSelected(row);
}

// The selected row trades all its cells with its neighbour, and the neighbour's place is selected.
void CIviFgenSeqPageImp::Move(int by) {
    const std::int32_t row = LVIndex();
    const std::int32_t other = row + by;
    if (row < 1 || other < 1 || other > m_oTable->topLevelItemCount()) return;
    QTreeWidgetItem* a = m_oTable->topLevelItem(row - 1);
    QTreeWidgetItem* b = m_oTable->topLevelItem(other - 1);
    for (int c = 0; c < m_oTable->columnCount(); ++c) {
        const QString text = a->text(c);
        a->setText(c, b->text(c));
        b->setText(c, text);
    }
    LVIndex(other);
}

void CIviFgenSeqPageImp::LVEnabled(bool enabled) {
    m_bLVEnabled = enabled;
    if (!m_oTable) return;
    const bool rows = m_oTable->topLevelItemCount() > 0;
    m_oTable->setEnabled(enabled && rows);
    Enable(m_oAddRow, enabled);
    Enable(m_oRemoveRow, enabled && rows);
    Enable(m_oRowUp, enabled && rows);
    Enable(m_oRowDown, enabled && rows);
    if (enabled && rows) LVIndex(std::clamp(m_lCurrentRow, 1, m_oTable->topLevelItemCount()));
}

void CIviFgenSeqPageImp::AutosizeColumns() {
    if (!m_oTable) return;
    for (int c = 0; c < m_oTable->columnCount(); ++c)
        m_oTable->resizeColumnToContents(c);
}

void CIviFgenSeqPageImp::LVSetItemText(const std::string& text, std::int32_t row,
                                       std::int32_t column) {
    if (!m_oTable || m_oTable->topLevelItemCount() == 0 || !m_oTable->isEnabled()) return;
    if (QTreeWidgetItem* item = m_oTable->topLevelItem(row - 1))
        item->setText(std::max(0, column), QString::fromStdString(text));
}

std::int32_t CIviFgenSeqPageImp::LVSelectAll() {
    if (m_oTable) m_oTable->selectAll();
    return LVGetSelectedCount();
}

std::int32_t CIviFgenSeqPageImp::LVDeselectAll() {
    if (m_oTable) m_oTable->clearSelection();
    return LVGetSelectedCount();
}

std::int32_t CIviFgenSeqPageImp::LVGetSelectedCount() const {
    return m_oTable ? static_cast<std::int32_t>(m_oTable->selectedItems().size()) : 0;
}

void CIviFgenSeqPageImp::StartCellEdit() {
    if (m_lLastRow < 1 || m_lLastColumn < 1 || !m_oTable->isEnabled()) return;
    QTreeWidgetItem* item = m_oTable->topLevelItem(m_lLastRow - 1);
    if (!item) return;
    const QRect cell = m_oTable->visualItemRect(item);
    const int column = m_lLastColumn - 1;
    const QRect at = m_oTable->geometry();
    const QPoint origin = m_oTable->viewport()->mapTo(m_oTable, QPoint(0, 0));
    std::int32_t left =
                     at.left() + origin.x() + m_oTable->header()->sectionViewportPosition(column),
                 top = at.top() + origin.y() + cell.top(),
                 width = std::min(m_oTable->columnWidth(column),
                                  m_oTable->viewport()->width() -
                                      m_oTable->header()->sectionViewportPosition(column)),
                 height = cell.height();
    std::string text = item->text(column).toStdString();
    if (!m_oCellEdit) {
        std::int32_t row = m_lLastRow, eventColumn = column;
        LVEdit(left, top, width, height, row, eventColumn, text);
        return;
    }
    m_oCellEdit->setGeometry(left, top, width, height);
    m_oCellEdit->setText(QString::fromStdString(text));
    m_oCellEdit->selectAll();
    m_oCellEdit->show();
    m_oCellEdit->raise();
    m_oCellEdit->setFocus();
    m_bEditing = true;
}

void CIviFgenSeqPageImp::EndCellEdit(bool cancel) {
    if (m_bEnding || !m_bEditing) return;
    const FlagHold ending(m_bEnding);
    m_bEditing = false;
    std::string text = m_oCellEdit->text().toStdString();
    if (m_oTable->topLevelItemCount() > 0 && m_oTable->isEnabled()) {
        LVValidate(m_lLastRow, m_lLastColumn - 1, text, cancel);
        if (!cancel) LVSetItemText(text, m_lLastRow, m_lLastColumn - 1);
    }
    m_oCellEdit->hide();
    m_oTable->setFocus();
}

bool CIviFgenSeqPageImp::eventFilter(QObject* watched, QEvent* event) {
    if (m_oCellEdit && watched == m_oCellEdit)
        return EndsEdit(event, [this](bool cancel) { EndCellEdit(cancel); });
    if (!m_oTable || (watched != m_oTable && watched != m_oTable->viewport()))
        return CCollectionUIMgr::eventFilter(watched, event);
    if (watched == m_oTable && event->type() == QEvent::KeyPress) {
        const int key = static_cast<QKeyEvent*>(event)->key();
        if (key == Qt::Key_Delete && m_oTable->topLevelItemCount() > 0) {
            m_lLastRow = -1;
            RemoveRow();
            return true;
        }
        if (key == Qt::Key_F2) { // the keyboard's way to edit: the cell last edited, or the first
            m_lLastRow = LVIndex();
            if (m_lLastColumn < 1) m_lLastColumn = 1;
            StartCellEdit();
            return true;
        }
        if (key == Qt::Key_Up || key == Qt::Key_Down) { // the keys select as a click does
            LVIndex(std::clamp(LVIndex() + (key == Qt::Key_Up ? -1 : 1), 1,
                               m_oTable->topLevelItemCount()));
            return true;
        }
        return false;
    }
    if (watched != m_oTable->viewport()) return false;
    switch (event->type()) {
    case QEvent::MouseButtonPress: {
        const QPoint at = static_cast<QMouseEvent*>(event)->position().toPoint();
        const QModelIndex hit = m_oTable->indexAt(at);
        m_lPressRow = hit.isValid() ? hit.row() + 1 : 0;
        m_lPressColumn = hit.isValid() ? hit.column() + 1 : 0;
        break;
    }
    case QEvent::MouseButtonRelease: // the table took the press as its selection already
        if (m_bCellPressed && m_lLastRow == m_lPressRow && m_lLastColumn == m_lPressColumn) {
            StartCellEdit();
        } else if (m_lPressRow > 0 && m_lPressColumn > 0) {
            m_bCellPressed = true;
            m_lLastRow = m_lPressRow;
            m_lLastColumn = m_lPressColumn;
        } else {
            m_bCellPressed = false;
        }
        if (m_lPressRow > 0) RowClicked();
        break;
    case QEvent::MouseButtonDblClick:
        if (m_bCellPressed) StartCellEdit();
        break;
    default:
        break;
    }
    return false;
}

} // namespace qzivi
