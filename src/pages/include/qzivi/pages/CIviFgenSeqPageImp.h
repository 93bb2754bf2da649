// CIviFgenSeqPageImp: a list of named things (the list side, as CCollectionUIMgr has it) and, for
// the entry selected, a table of rows: add and remove buttons with automatic cell texts, up and
// down buttons that move the selected row, and editing of one cell in place (a second click on the
// cell, a double click, or F2). Rows count from 1; columns in the events count from 0, the row's
// first cell being 0.
#pragma once

#include "qzivi/pages/CCollectionUIMgr.h"

#include <optional>
#include <vector>

class QTreeWidget;

namespace qzivi {

class CIviFgenSeqPageImp : public CCollectionUIMgr {
    Q_OBJECT

public:
    CIviFgenSeqPageImp();
    ~CIviFgenSeqPageImp() override;

    // The cells of a new row; "Column1", "Column2"... for the columns while unset.
    std::vector<std::string> BaseNamesLV() const;
    void BaseNamesLV(std::vector<std::string> names) { m_vBaseNames = std::move(names); }
    bool LVEnabled() const { return m_bLVEnabled; }
    void LVEnabled(bool enabled);
    // The selected row, 0 for none.
    std::int32_t LVIndex() const;
    void LVIndex(std::int32_t row);

    // The table's controls follow the list's; any of the edit boxes and move buttons may be null.
    void Attach(QListWidget* list, QTreeWidget* table, QAbstractButton* addButton,
                QAbstractButton* removeButton, QAbstractButton* addRowButton,
                QAbstractButton* removeRowButton, QLineEdit* editBox, QLineEdit* cellEditBox,
                QAbstractButton* upButton, QAbstractButton* downButton,
                QAbstractButton* rowUpButton, QAbstractButton* rowDownButton);
    void Detach();
    // Before Attach it is ignored.
    void SetLVHeaderInfo(const std::vector<std::string>& headers);
    // Each row goes, with LVBeforeRemove and no LVItemRemoved; only while the list side is
    // enabled.
    void ClearLV();
    // A row of these cells, whatever BeforeAddLVItem gives.
    void AddLVI(std::vector<std::string> values);
    void AutosizeColumns();
    // Only with rows present and the table enabled. A column below 1 is the row's first cell.
    void LVSetItemText(const std::string& text, std::int32_t row, std::int32_t column);
    std::int32_t LVSelectAll();
    std::int32_t LVDeselectAll();
    std::int32_t LVGetSelectedCount() const;
    // Ends a cell edit in progress as leaving the edit box does.
    void CommitCellEdit() { EndCellEdit(false); }

    Event<std::int32_t> LVListItemSelected;
    Event<std::vector<std::string>&> BeforeAddLVItem;
    Event<std::int32_t> LVBeforeRemove;
    Event<std::int32_t> LVItemAdded;
    Event<std::int32_t> LVItemRemoved;
    // left, top, width, height, row, column, text: for a page that edits cells itself.
    Event<std::int32_t&, std::int32_t&, std::int32_t&, std::int32_t&, std::int32_t&, std::int32_t&,
          std::string&>
        LVEdit;
    Event<std::int32_t, std::int32_t, std::string&, bool&> LVValidate;

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void AddRow();
    void RemoveRow();
    void Move(int by);
    void RowClicked();
    void UpdateMoveButtons(std::int32_t row);
    void StartCellEdit();
    void EndCellEdit(bool cancel);

    QTreeWidget* m_oTable = nullptr;
    QAbstractButton *m_oAddRow = nullptr, *m_oRemoveRow = nullptr, *m_oRowUp = nullptr,
                    *m_oRowDown = nullptr;
    QLineEdit* m_oCellEdit = nullptr;
    std::vector<std::string> m_vBaseNames;
    std::vector<std::string> m_vHeaders;
    std::optional<std::vector<std::string>> m_vPending;
    bool m_bLVEnabled = false;
    bool m_bSilent = false;
    bool m_bEditing = false;
    bool m_bEnding = false;
    bool m_bCellPressed = false;
    std::int32_t m_lCurrentRow = 0;
    std::int32_t m_lPressRow = 0, m_lPressColumn = 0;
    std::int32_t m_lLastRow = 0, m_lLastColumn = 0;
    std::vector<QMetaObject::Connection> m_vConnections;
};

} // namespace qzivi
