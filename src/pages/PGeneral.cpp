#include "qzivi/pages/PGeneral.h"

#include "qzivi/model/QZIviFgenEnum.h"
#include "qzivi/pages/ListHelpers.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/text.h"

#include <QComboBox>
#include <QFormLayout>
#include <QLabel>
#include <QLineEdit>

namespace qzivi {

PGeneral::PGeneral(QWidget* parent) : PropertyPage(tr("General"), parent) {
    auto* layout = new QFormLayout(this);
    const auto row = [&](const char* name, const QString& caption, const QString& tip,
                         QWidget* field) {
        auto* label = new QLabel(caption, this);
        label->setObjectName(name);
        label->setToolTip(tip);
        label->setBuddy(field);
        field->setToolTip(tip);
        field->setAccessibleName(caption);
        layout->addRow(label, field);
    };
    // A failure of a change handler shows in a box.
    const auto guarded = [this] { Handled([&] { UserChanged(); }); };
    for (int i = 0; i < 2; ++i) {
        cmbGeneral[i] = new QComboBox(this);
        cmbGeneral[i]->setObjectName(QStringLiteral("cmbGeneral%1").arg(i));
        connect(cmbGeneral[i], &QComboBox::activated, this, guarded);
        connect(cmbGeneral[i], &QComboBox::currentTextChanged, this, guarded);
    }
    cmbGeneral[1]->setEditable(true); // only a selected entry counts
    txtGeneral = new QLineEdit(this);
    txtGeneral->setObjectName("txtGeneral0");
    connect(txtGeneral, &QLineEdit::textChanged, this, guarded);
    row("Label1", tr("Output mode:"), tr("Selects the output mode."), cmbGeneral[0]);
    row("Label2", tr("Ref clock source:"), tr("Selects the source of the reference clock."),
        cmbGeneral[1]);
    row("Label3", tr("Arb sample rate (Hz):"),
        tr("Changes the sample rate for arbitrary waveforms or sequences."), txtGeneral);
}

void PGeneral::Load() {
    CIviFgenPropImp& props = Props();
    const QZIviFgenEnum names;
    FillComboFromTable(*cmbGeneral[0], names.OutputModeNames(props.Extensions()), true);
    FillComboFromTable(*cmbGeneral[1], names.RefClockNames(), true);
    SelectComboEntry(*cmbGeneral[0], props.OutputMode(), true, true);
    SelectComboEntry(*cmbGeneral[1], props.RefClockSource(), true, true);
    txtGeneral->setText(QString::fromStdString(text::FormatNumber(props.ArbSampleRate())));
    Save();
}

void PGeneral::Save() {
    CIviFgenPropImp& props = Props();
    props.OutputMode(ComboValue(*cmbGeneral[0]).AsInt32());
    props.ArbSampleRate(ParseLeadingNumber(txtGeneral->text().toStdString()));
    props.RefClockSource(ComboValue(*cmbGeneral[1]).AsInt32());
}

QWidget* PGeneral::FirstControl() {
    return cmbGeneral[0];
}

} // namespace qzivi
