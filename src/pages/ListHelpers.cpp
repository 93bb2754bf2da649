#include "qzivi/pages/ListHelpers.h"

#include "qzivi/panels/MUiAndStringUtil.h"

#include <QComboBox>
#include <QLineEdit>

namespace qzivi {

bool FillComboFromTable(QComboBox& list, const Variant& table, bool clear) {
    if (!table.IsArray()) return true;
    if (clear) list.clear();
    if (table.Rows() < 2) {
        for (const Variant& item : table.Items())
            if (const std::string text = item.AsText(); !text.empty())
                list.addItem(QString::fromStdString(text));
        return true;
    }
    for (std::size_t c = 0; c < table.Columns(); ++c)
        if (const std::string text = table.At(0, c).AsText(); !text.empty())
            list.addItem(QString::fromStdString(text), table.At(1, c).AsInt32());
    return true;
}

Variant ComboValue(const QComboBox& list, const Variant& fallback) {
    if (list.currentIndex() < 0) return fallback;
    return list.currentData().toInt();
}

bool SelectComboEntry(QComboBox& list, const Variant& value, bool asNumbers, bool firstAsFallback) {
    std::vector<ComboEntry> entries;
    entries.reserve(static_cast<std::size_t>(list.count()));
    for (int i = 0; i < list.count(); ++i) {
        const QVariant data = list.itemData(i);
        entries.push_back(
            {list.itemText(i).toStdString(),
             data.isValid() ? std::optional<std::int32_t>(data.toInt()) : std::nullopt});
    }
    const ComboChoice choice = SelectComboEntry(entries, value, asNumbers, firstAsFallback);
    if (choice.select >= 0) {
        list.setCurrentIndex(choice.select);
        return true;
    }
    if (!list.isEditable()) return false; // a fixed list takes no text
    list.setCurrentIndex(-1);
    list.setEditText(QString::fromStdString(choice.text.value_or("")));
    return true;
}

std::int32_t ComboNumber(const QComboBox& list) {
    return ComboValue(list, ParseLeadingNumber(list.currentText().toStdString())).AsInt32();
}

void ClearCombo(QComboBox& list) {
    list.setCurrentIndex(-1);
    if (list.isEditable()) list.setEditText(QString());
}

bool RenameRefused(const std::string& text, std::int32_t indexOfName) {
    return text.find_first_not_of(' ') == std::string::npos || indexOfName != -1;
}

void ForceRedrawControls(QWidget& page) {
    for (QWidget* control : page.findChildren<QWidget*>(Qt::FindDirectChildrenOnly)) {
        const bool visible = !control->isHidden();
        control->setVisible(false);
        control->setVisible(visible);
    }
}

} // namespace qzivi
