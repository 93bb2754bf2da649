// PIviX, "QZ IVI": which instrument the control drives, how it behaves at run time, and which
// panel it shows. Only a change of the logical name makes the other pages reload.
#pragma once

#include "qzivi/pages/PropertyPage.h"
#include "qzivi/support/scoped_hook.h"

#include <functional>

class QCheckBox;
class QComboBox;
class QLabel;
class QToolButton;

namespace qzivi {

// Opens a file in the user's editor; false when none could be started.
using StoreEditor = std::function<bool(const QString& path)>;
StoreEditor SetStoreEditor(StoreEditor editor);
using StoreEditorScope = ScopedHook<StoreEditor, &SetStoreEditor>;

class PIviX : public PropertyPage {
    Q_OBJECT

public:
    explicit PIviX(QWidget* parent = nullptr);

    QComboBox* cmbLogicalName;
    QToolButton* cmdBMC;
    QCheckBox* chkIviX[4];
    QComboBox* cmbUIStyle;
    QLabel* imgUIStyle;

protected:
    void Created() override;
    void Load() override;
    void Save() override;
    void Apply() override;
    QWidget* FirstControl() override;

private:
    void UpdatePreview();
    void OpenConfigurationTool();

    bool m_bLogicalNameAlert = false;
};

} // namespace qzivi
