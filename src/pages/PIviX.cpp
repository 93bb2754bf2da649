#include "qzivi/pages/PIviX.h"

#include "qzivi/config_store.h"
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/model/QZIviFgenEnum.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/Pictures.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDesktopServices>
#include <QGridLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QToolButton>
#include <QUrl>

namespace qzivi {

namespace {

StoreEditor& Editor() {
    static StoreEditor editor = [](const QString& path) {
        return QDesktopServices::openUrl(QUrl::fromLocalFile(path));
    };
    return editor;
}

const char* const kChecks[][2] = {
    {"Enabled", "Enables user interaction on the control."},
    {"Exception on errors", "Raises exceptions when an error occurs."},
    {"Auto configure", "Configures the control automatically when it runs."},
    {"Auto stop/start",
     "Automates the stopping and starting of the control when the Configure method is called."},
};

} // namespace

StoreEditor SetStoreEditor(StoreEditor editor) {
    std::swap(Editor(), editor);
    return editor;
}

PIviX::PIviX(QWidget* parent) : PropertyPage(tr("QZ IVI"), parent) {
    const QString nameTip = tr("Changes the current logical name.");
    auto* label = new QLabel(tr("Device logical name:"), this);
    label->setObjectName("Label1");
    label->setToolTip(nameTip);
    cmbLogicalName = new QComboBox(this);
    cmbLogicalName->setObjectName("cmbLogicalName");
    cmbLogicalName->setEditable(true);
    cmbLogicalName->setToolTip(nameTip);
    cmbLogicalName->setAccessibleName(label->text());
    label->setBuddy(cmbLogicalName);
    cmdBMC = new QToolButton(this);
    cmdBMC->setObjectName("cmdBMC");
    cmdBMC->setToolTip(tr("Configures IVI with Benchmate Console."));
    cmdBMC->setAccessibleName(cmdBMC->toolTip());
    cmdBMC->setIconSize(QSize(24, 24));

    auto* layout = new QHBoxLayout(this);
    auto* left = new QGridLayout;
    layout->addLayout(left, 1);
    left->addWidget(label, 0, 0, 1, 2);
    left->addWidget(cmbLogicalName, 1, 0);
    left->addWidget(cmdBMC, 1, 1);
    for (int i = 0; i < 4; ++i) {
        chkIviX[i] = new QCheckBox(tr(kChecks[i][0]), this);
        chkIviX[i]->setObjectName(QStringLiteral("chkIviX%1").arg(i));
        chkIviX[i]->setToolTip(tr(kChecks[i][1]));
        connect(chkIviX[i], &QCheckBox::clicked, this, [this] { UserChanged(); });
        left->addWidget(chkIviX[i], 2 + i, 0, 1, 2);
    }
    auto* frame = new QGroupBox(tr("UI style"), this);
    frame->setObjectName("Frame1");
    cmbUIStyle = new QComboBox(frame);
    cmbUIStyle->setObjectName("cmbUIStyle");
    cmbUIStyle->setToolTip(tr("Changes the user interface style."));
    cmbUIStyle->setAccessibleName(frame->title());
    imgUIStyle = new QLabel(frame);
    imgUIStyle->setObjectName("imgUIStyle");
    imgUIStyle->setToolTip(tr("Shows a preview of the selected user interface style."));
    imgUIStyle->setFixedSize(160, 120);
    imgUIStyle->setAlignment(Qt::AlignCenter);
    auto* styleLayout = new QVBoxLayout(frame);
    styleLayout->addWidget(cmbUIStyle);
    styleLayout->addWidget(imgUIStyle, 0, Qt::AlignHCenter);
    left->setRowStretch(6, 1);
    left->setColumnStretch(0, 1);
    layout->addWidget(frame, 0, Qt::AlignTop);

    connect(cmbLogicalName, &QComboBox::editTextChanged, this, [this] {
        UserChanged();
        // Only the user's change of the name alerts the other pages; loading one does not.
        if (!Loading()) m_bLogicalNameAlert = true;
    });
    connect(cmbUIStyle, &QComboBox::activated, this, [this] {
        UserChanged();
        UpdatePreview();
    });
    connect(cmdBMC, &QToolButton::clicked, this, [this] { OpenConfigurationTool(); });
}

void PIviX::Created() {
    cmdBMC->setIcon(LoadPictureFromResource(120));
    FillComboFromTable(*cmbLogicalName, CIviErrorReport().GetLogicalNames("IVI::IviFgen"), true);
    FillComboFromTable(*cmbUIStyle, QZIviFgenEnum().UIStyleNames(), true);
}

void PIviX::Load() {
    CIviFgenPropImp& props = Props();
    cmbLogicalName->setEditText(QString::fromStdString(props.LogicalName()));
    SelectComboEntry(*cmbUIStyle, props.UIStyle(), true, true);
    UpdatePreview();
    chkIviX[1]->setChecked(props.ExceptionOnError());
    chkIviX[0]->setChecked(props.Enabled());
    chkIviX[2]->setChecked(props.AutoConfigure());
    chkIviX[3]->setChecked(props.AutoStopStart());
}

void PIviX::Save() {
    CIviFgenPropImp& props = Props();
    props.UIStyle(ComboValue(*cmbUIStyle, true).AsInt32());
    props.LogicalName(cmbLogicalName->currentText().toStdString());
    props.Enabled(chkIviX[0]->isChecked());
    props.ExceptionOnError(chkIviX[1]->isChecked());
    props.AutoStopStart(chkIviX[3]->isChecked());
    props.AutoConfigure(chkIviX[2]->isChecked());
}

void PIviX::Apply() {
    SaveQuietly();
    const bool alert = m_bLogicalNameAlert;
    m_bLogicalNameAlert = false;
    Link().ApplyChanges(alert);
}

QWidget* PIviX::FirstControl() {
    return cmbLogicalName;
}

void PIviX::UpdatePreview() {
    try {
        const QIcon picture = LoadPictureFromResource(2000 + ComboValue(*cmbUIStyle, -1).AsInt32());
        imgUIStyle->setPixmap(picture.pixmap(imgUIStyle->size(), devicePixelRatioF()));
    } catch (...) { // no entry selected: the picture stays
    }
}

// Our configuration tool is the store file itself, in the user's editor.
void PIviX::OpenConfigurationTool() {
    Handled([&] {
        const std::string path = ivi::EditableConfigStoreFile();
        if (!Editor()(QString::fromStdString(path)))
            ShowMessageBox({"Incorrect version of the Benchmate Console.  Please update to the "
                            "latest version for this functionality.",
                            "", "", 0, BoxIcon::None});
    });
}

} // namespace qzivi
