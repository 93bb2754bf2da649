#include "qzivi/pages/PInternal.h"

#include "qzivi/model/QZIviFgenEnum.h"
#include "qzivi/model/QZIviFgenInternalConfig.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/support/text.h"

#include <QComboBox>
#include <QFormLayout>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QVBoxLayout>

namespace qzivi {

namespace {

struct Row {
    const char* caption;
    const char* tip;
    const char* fieldTip; // the list's own tip where it differs
    std::int32_t bit;
};

constexpr Row kRows[7] = {
    {"Internal trigger rate:     (triggers/second)", "Changes the rate of internal triggering.",
     nullptr, qzivifgenInternalTriggerExt},
    {"Internal depth (%):", "Changes the internal depth for amplitude modulation.", nullptr,
     qzivifgenModulateAMExt},
    {"Internal waveform: ", "Changes the internal waveform for amplitude modulation.",
     "Selects the internal waveform for amplitude modulation.", qzivifgenModulateAMExt},
    {"Internal frequency (Hz):", "Changes the internal frequency for amplitude modulation.",
     nullptr, qzivifgenModulateAMExt},
    {"Internal deviation (%):", "Changes the internal depth for frequency modulation.", nullptr,
     qzivifgenModulateFMExt},
    {"Internal waveform:", "Changes the internal waveform for frequency modulation.",
     "Selects the internal waveform for frequency modulation.", qzivifgenModulateFMExt},
    {"Internal frequency (Hz):", "Changes the internal frequency for frequency modulation.",
     nullptr, qzivifgenModulateFMExt},
};

bool IsList(int row) {
    return row == 2 || row == 5;
}

// The strict conversion: anything that is not wholly a number fails (13).
double Strict(const QLineEdit& field) {
    return Variant(field.text().toStdString()).AsDouble();
}

} // namespace

PInternal::PInternal(QWidget* parent) : PropertyPage(tr("Internal"), parent) {
    auto* layout = new QVBoxLayout(this);
    auto* top = new QFormLayout;
    layout->addLayout(top);
    QFormLayout* forms[2];
    const char* const titles[] = {"AM Modulation", "FM Modulation"};
    for (int f = 0; f < 2; ++f) {
        fraInternal[f] = new QGroupBox(tr(titles[f]), this);
        fraInternal[f]->setObjectName(QStringLiteral("fraInternal%1").arg(f));
        forms[f] = new QFormLayout(fraInternal[f]);
        layout->addWidget(fraInternal[f]);
    }
    layout->addStretch(1);
    for (int i = 0; i < 7; ++i) {
        QWidget* owner = i == 0 ? static_cast<QWidget*>(this) : fraInternal[i < 4 ? 0 : 1];
        lblInternal[i] = new QLabel(tr(kRows[i].caption), owner);
        lblInternal[i]->setObjectName(QStringLiteral("lblInternal%1").arg(i));
        lblInternal[i]->setToolTip(tr(kRows[i].tip));
        QWidget* field;
        if (IsList(i)) {
            cmbWaveform[i] = new QComboBox(owner); // fixed: nothing can be typed
            cmbWaveform[i]->setObjectName(QStringLiteral("cmbWaveform%1").arg(i));
            cmbWaveform[i]->setToolTip(tr(kRows[i].fieldTip));
            connect(cmbWaveform[i], &QComboBox::activated, this, [this] { FieldChanged(); });
            field = cmbWaveform[i];
        } else {
            txtInternal[i] = new QLineEdit(owner);
            txtInternal[i]->setObjectName(QStringLiteral("txtInternal%1").arg(i));
            txtInternal[i]->setToolTip(tr(kRows[i].tip));
            connect(txtInternal[i], &QLineEdit::textChanged, this, [this] { FieldChanged(); });
            field = txtInternal[i];
        }
        field->setAccessibleName(lblInternal[i]->text().simplified());
        lblInternal[i]->setBuddy(field);
        (i == 0 ? top : forms[i < 4 ? 0 : 1])->addRow(lblInternal[i], field);
    }
}

void PInternal::FieldChanged() {
    Handled([&] { UserChanged(); });
}

void PInternal::Load() {
    const QZIviFgenEnum names;
    CIviFgenPropImp& props = Props();
    const std::int32_t extensions = props.Extensions();
    FillComboFromTable(*cmbWaveform[2], names.AMInternalWaveformNames(extensions), true);
    FillComboFromTable(*cmbWaveform[5], names.FMInternalWaveformNames(extensions), true);
    fraInternal[0]->setEnabled(extensions & qzivifgenModulateAMExt);
    fraInternal[1]->setEnabled(extensions & qzivifgenModulateFMExt);
    for (int i = 0; i < 7; ++i) {
        const bool open = extensions & kRows[i].bit;
        lblInternal[i]->setEnabled(open);
        (IsList(i) ? static_cast<QWidget*>(cmbWaveform[i]) : txtInternal[i])->setEnabled(open);
    }
    const auto& internal = *props.Internal();
    const double values[7] = {internal.InternalTriggerRate(), internal.AMInternalDepth(),     0,
                              internal.AMInternalFrequency(), internal.FMInternalDeviation(), 0,
                              internal.FMInternalFrequency()};
    for (int i = 0; i < 7; ++i)
        if (!IsList(i))
            txtInternal[i]->setText(txtInternal[i]->isEnabled()
                                        ? QString::fromStdString(text::FormatNumber(values[i]))
                                        : QString());
    SelectComboEntry(*cmbWaveform[2], internal.AMInternalWaveform(), true, true);
    SelectComboEntry(*cmbWaveform[5], internal.FMInternalWaveform(), true, true);
}

// In the order of the rows; a closed field is skipped, and a field that holds no number stops it.
void PInternal::Save() {
    auto& internal = *Props().Internal();
    const auto open = [](const QWidget* field) { return field->isEnabled(); };
    const auto listOpen = [&](const QComboBox* list) { return open(list) && list->count() > 0; };
    if (open(txtInternal[0])) internal.InternalTriggerRate(Strict(*txtInternal[0]));
    if (open(txtInternal[1])) internal.AMInternalDepth(Strict(*txtInternal[1]));
    if (listOpen(cmbWaveform[2])) internal.AMInternalWaveform(ComboNumber(*cmbWaveform[2]));
    if (open(txtInternal[3])) internal.AMInternalFrequency(Strict(*txtInternal[3]));
    if (open(txtInternal[4])) internal.FMInternalDeviation(Strict(*txtInternal[4]));
    if (listOpen(cmbWaveform[5])) internal.FMInternalWaveform(ComboNumber(*cmbWaveform[5]));
    if (open(txtInternal[6])) internal.FMInternalFrequency(Strict(*txtInternal[6]));
}

// The last open group wins.
QWidget* PInternal::FirstControl() {
    const std::int32_t extensions = Props().Extensions();
    QWidget* first = nullptr;
    if (extensions & qzivifgenInternalTriggerExt) first = txtInternal[0];
    if (extensions & qzivifgenModulateAMExt) first = txtInternal[1];
    if (extensions & qzivifgenModulateFMExt) first = txtInternal[4];
    return first;
}

} // namespace qzivi
