// The list helpers of every page, over Qt's combo box: filled from a name table, read back by item
// data, an entry selected by value, and a page's controls drawn anew.
#pragma once

#include "qzivi/support/variant.h"

#include <QString>

#include <cstdint>
#include <string>

class QComboBox;
class QWidget;

namespace qzivi {

// A table that is no array leaves the list alone. One dimension: each text that isn't "" becomes
// an entry. Two (row 0 texts, row 1 values): each column with a text becomes an entry whose item
// data is its value, so the columns of switched-off extensions drop out. Returns true.
bool FillComboFromTable(QComboBox& list, const Variant& table, bool clear);

// The item data of the selected entry, else `fallback` (missing by default, which the receiver
// of the value then refuses).
Variant ComboValue(const QComboBox& list, const Variant& fallback = Variant::Missing());

// Selects the entry of `value` (by item data when `asNumbers`, else by text) or, failing that,
// the first entry when `firstAsFallback`, or sets an editable list's text. False when it could do
// neither: a fixed list without entries.
bool SelectComboEntry(QComboBox& list, const Variant& value, bool asNumbers, bool firstAsFallback);

// The value a page writes from a list: its item data, else the number its text starts with (0 for
// none).
std::int32_t ComboNumber(const QComboBox& list);

// An editable list to an empty text, a fixed one to no selection.
void ClearCombo(QComboBox& list);

// A rename of a list entry is refused when the text is blank or already the exact name of a
// member (`indexOfName` is the collection's answer for the text, -1 for none).
bool RenameRefused(const std::string& text, std::int32_t indexOfName);

// A control of a page, named as its field and with its tool tip (none when empty).
template <typename T>
T* Made(T* control, const char* name, const QString& tip = {}) {
    control->setObjectName(name);
    if (!tip.isEmpty()) control->setToolTip(tip);
    return control;
}

// Each child control of the page, in order, hidden and shown again as it was.
void ForceRedrawControls(QWidget& page);

} // namespace qzivi
