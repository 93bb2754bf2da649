// PIviConfigurations: the control's stored configurations: add, rename, remove, load, store,
// reset to defaults, export and import, and a check of the present settings on the instrument.
#pragma once

#include "qzivi/pages/CCollectionUIMgr.h"
#include "qzivi/pages/PropertyPage.h"

#include <memory>
#include <vector>

class QLabel;
class QLineEdit;
class QListWidget;
class QPushButton;
class QToolButton;

namespace qzivi {

class QZIviConfiguration;

class PIviConfigurations : public PropertyPage {
    Q_OBJECT

public:
    explicit PIviConfigurations(QWidget* parent = nullptr);

    QToolButton* cmdVerifyConfig;
    QPushButton *cmdStore, *cmdDefaults, *cmdDel, *cmdLoad, *cmdAdd;
    QToolButton *cmdExport, *cmdImport;
    QLineEdit* txtRename;
    QListWidget* lstConfigs;

protected:
    void Load() override;
    void Save() override {}
    void Apply() override;
    QWidget* FirstControl() override;

private:
    void UpdateButtons(bool on);
    std::shared_ptr<QZIviConfiguration> Selected();
    void Verify();
    void Validate(std::int32_t index, std::string& text, bool& cancel);

    CCollectionUIMgr m_oLUI;
    std::vector<Connection> m_vEvents;
    bool m_bUpdating = false;
    std::int32_t m_lSelected = -1;
};

} // namespace qzivi
