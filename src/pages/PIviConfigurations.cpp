#include "qzivi/pages/PIviConfigurations.h"

#include "qzivi/control/QZIviFgen.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/CCommonDialog.h"
#include "qzivi/panels/Pictures.h"

#include <QGridLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QToolButton>
#include <QVBoxLayout>

#include <algorithm>

namespace qzivi {

namespace {

// The dialogs of export and import: a configuration file, with its extension added.
CCommonDialog FileDialog(const QString& title, int flags) {
    CCommonDialog dialog;
    dialog.DialogTitle = title;
    dialog.Filter = "QZ IVI Configurations (*.qzc)|*.qzc";
    dialog.DefaultExt = "qzc";
    dialog.Flags = flags;
    return dialog;
}

// Made, with the tip as the accessible name where the control has none of its own.
template <typename T>
T* Described(T* control, const char* name, const QString& tip) {
    Made(control, name, tip);
    if (control->accessibleName().isEmpty()) control->setAccessibleName(tip);
    return control;
}

} // namespace

PIviConfigurations::PIviConfigurations(QWidget* parent)
    : PropertyPage(tr("Configurations"), parent) {
    const QString verifyTip =
        tr("Ensures that the current property set is valid for the instrument.");
    cmdVerifyConfig = Described(new QToolButton(this), "cmdVerifyConfig", verifyTip);
    cmdVerifyConfig->setIcon(LoadPictureFromResource(120));
    cmdVerifyConfig->setIconSize(QSize(24, 24));
    auto* frame = new QGroupBox(tr("Configuration sets"), this);
    frame->setObjectName("Frame1");
    cmdStore = Described(new QPushButton(tr("Store"), frame), "cmdStore",
                         tr("Stores the current property set into the selected configuration."));
    txtRename = Described(new QLineEdit(frame), "txtRename", tr("Rename the configuration."));
    cmdExport = Described(new QToolButton(frame), "cmdExport",
                          tr("Exports the selected configuration to a file."));
    cmdExport->setIcon(LoadPictureFromResource(117));
    cmdImport =
        Described(new QToolButton(frame), "cmdImport",
                  tr("Imports a configuration from a file into the selected configuration."));
    cmdImport->setIcon(LoadPictureFromResource(118));
    cmdDefaults = Described(new QPushButton(tr("Set to default"), frame), "cmdDefaults",
                            tr("Sets all properties to their default values."));
    cmdDel =
        Described(new QPushButton(tr("Remove"), frame), "cmdDel", tr("Removes a configuration."));
    cmdLoad = Described(new QPushButton(tr("Load"), frame), "cmdLoad",
                        tr("Loads the selected configuration into the current property set."));
    cmdAdd = Described(new QPushButton(tr("Add"), frame), "cmdAdd", tr("Adds a configuration."));
    lstConfigs = Described(new QListWidget(frame), "lstConfigs", tr("Selects a configuration."));
    auto* label =
        Described(new QLabel(tr("Verify current configuration"), this), "Label1", verifyTip);
    label->setBuddy(cmdVerifyConfig);

    auto* buttons = new QVBoxLayout;
    for (QWidget* b : {static_cast<QWidget*>(cmdAdd), static_cast<QWidget*>(cmdDel),
                       static_cast<QWidget*>(cmdLoad), static_cast<QWidget*>(cmdStore),
                       static_cast<QWidget*>(cmdDefaults)})
        buttons->addWidget(b);
    auto* files = new QHBoxLayout;
    files->addWidget(cmdImport);
    files->addWidget(cmdExport);
    files->addStretch(1);
    buttons->addLayout(files);
    buttons->addStretch(1);
    auto* inner = new QHBoxLayout(frame);
    inner->addWidget(lstConfigs, 1);
    inner->addLayout(buttons);
    auto* verify = new QHBoxLayout;
    verify->addWidget(cmdVerifyConfig);
    verify->addWidget(label, 1);
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(frame, 1);
    layout->addLayout(verify);
    setTabOrder(cmdVerifyConfig, cmdStore);

    m_oLUI.Attach(lstConfigs, cmdAdd, cmdDel, txtRename);
    m_oLUI.BaseName("NewConfig");
    m_vEvents.push_back(m_oLUI.BeforeAdd.Connect([this](std::string&) {
        if (m_bUpdating) return;
        if (lstConfigs->count() > 0) m_oLUI.CommitRename();
    }));
    m_vEvents.push_back(m_oLUI.ItemAdded.Connect([this](std::int32_t index) {
        if (m_bUpdating) return;
        Handled([&] {
            Changed(true);
            Props().Configurations()->Add(lstConfigs->item(index)->text().toStdString());
            UpdateButtons(true);
        });
    }));
    m_vEvents.push_back(m_oLUI.ItemRemoved.Connect([this](std::int32_t index) {
        if (m_bUpdating) return;
        Handled([&] {
            Changed(true);
            Props().Configurations()->Remove(index + 1);
            UpdateButtons(true);
            Link().AlertChanges();
        });
    }));
    m_vEvents.push_back(m_oLUI.ListItemSelected.Connect([this](std::int32_t& index) {
        if (!m_bUpdating) m_lSelected = index;
    }));
    m_vEvents.push_back(
        m_oLUI.Validate.Connect([this](std::int32_t& index, std::string& text, bool& cancel) {
            if (!m_bUpdating) Validate(index, text, cancel);
        }));

    connect(cmdLoad, &QPushButton::clicked, this, [this] {
        Handled([&] {
            Selected()->Load();
            Link().ApplyChanges(true);
        });
    });
    connect(cmdStore, &QPushButton::clicked, this, [this] {
        Handled([&] {
            Selected()->Store();
            Changed(true);
        });
    });
    connect(cmdDefaults, &QPushButton::clicked, this, [this] {
        Handled([&] {
            Props().InitProperties();
            Link().AlertChanges();
            Changed(true);
        });
    });
    connect(cmdExport, &QToolButton::clicked, this, [this] {
        Handled([&] {
            CCommonDialog dialog = FileDialog(tr("Export QZ IVI Configuration as ..."),
                                              CCommonDialog::cdlOFNOverwritePrompt);
            if (dialog.ShowSave(this)) Selected()->Export(dialog.FileName.toStdString());
        });
    });
    connect(cmdImport, &QToolButton::clicked, this, [this] {
        Handled([&] {
            CCommonDialog dialog = FileDialog(tr("Import QZ IVI Configuration..."),
                                              CCommonDialog::cdlOFNFileMustExist);
            const bool chosen = dialog.ShowOpen(this);
            Changed(true);
            if (chosen) Selected()->Import(dialog.FileName.toStdString());
        });
    });
    connect(cmdVerifyConfig, &QToolButton::clicked, this, [this] { Handled([&] { Verify(); }); });
}

void PIviConfigurations::Load() {
    const bool was = m_bUpdating;
    m_bUpdating = true;
    try {
        lstConfigs->clear();
        for (const auto& configuration : *Props().Configurations())
            m_oLUI.Add(configuration->Name());
        if (lstConfigs->count() > 0) lstConfigs->setCurrentRow(0);
        m_lSelected = lstConfigs->currentRow();
        UpdateButtons(true);
    } catch (...) {
        m_bUpdating = was;
        throw;
    }
    m_bUpdating = was;
}

// A rename still open ends first, and the apply then takes it along: OK must not lose it.
void PIviConfigurations::Apply() {
    m_oLUI.CommitRename();
    Link().ApplyChanges(false);
}

QWidget* PIviConfigurations::FirstControl() {
    return lstConfigs->count() > 0 ? static_cast<QWidget*>(lstConfigs) : cmdAdd;
}

void PIviConfigurations::UpdateButtons(bool on) {
    const bool some = on && lstConfigs->count() > 0;
    for (QWidget* b : {static_cast<QWidget*>(cmdLoad), static_cast<QWidget*>(cmdStore),
                       static_cast<QWidget*>(cmdImport), static_cast<QWidget*>(cmdExport),
                       static_cast<QWidget*>(cmdDel)})
        b->setEnabled(some);
}

std::shared_ptr<QZIviConfiguration> PIviConfigurations::Selected() {
    QListWidgetItem* item = lstConfigs->currentItem();
    return Props().Configurations()->Item(item ? item->text().toStdString() : std::string());
}

void PIviConfigurations::Validate(std::int32_t index, std::string& text, bool& cancel) {
    Handled([&] {
        auto& configurations = *Props().Configurations();
        const auto named =
            std::find_if(configurations.begin(), configurations.end(),
                         [&](const auto& configuration) { return configuration->Name() == text; });
        if (!cancel && !RenameRefused(text, named == configurations.end() ? -1 : 0)) {
            configurations.Item(index + 1)->SetName(text);
            Link().AlertChanges();
        } else {
            cancel = true;
        }
    });
    Changed(true);
}

// Tries the settings on the instrument through the control itself, and leaves no session open.
void PIviConfigurations::Verify() {
    QZIviFgen& control = *SelectedControls().at(0);
    std::string failure;
    const auto heard = control.IviError.Connect(
        [&](std::int32_t, const std::string&, const std::string& description) {
            if (failure.empty()) failure = description;
        });
    try {
        control.Init();
        if (failure.empty()) control.Configure();
    } catch (const std::exception& e) {
        if (failure.empty()) failure = e.what();
    }
    if (failure.empty())
        ShowMessageBox({"Configuration Verified!", "", "", 0, BoxIcon::Information});
    else
        ShowMessageBox(
            {"Verification Failed!\r\nPlease investigate the following problem:\r\n\r\n" + failure,
             "", "", 0, BoxIcon::Exclamation});
    if (control.SessionHandle() != 0) control.CloseSession();
}

} // namespace qzivi
