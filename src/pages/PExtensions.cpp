#include "qzivi/pages/PExtensions.h"

#include "qzivi/model/QZIviFgenTypes.h"

#include <QCheckBox>
#include <QGridLayout>
#include <QGroupBox>
#include <QLabel>
#include <QVBoxLayout>

namespace qzivi {

namespace {

struct Box {
    const char* caption;
    std::int32_t bit;
    const char* tip;
    int frame;
};

constexpr Box kBoxes[11] = {
    {},
    {"Standard function", qzivifgenStdFuncExt, "Enables the standard function extension.", 0},
    {"Arb waveform", qzivifgenArbWfmExt, "Enables the arbitrary waveform extension.", 0},
    {"Arb frequency", qzivifgenArbFrequencyExt,
     "Enables the frequency extension for arbitrary waveforms and sequences.", 2},
    {"Arb sequence", qzivifgenArbSeqExt, "Enables the arbitrary sequence extension.", 0},
    {"Trigger", qzivifgenTriggerExt, "Enables the trigger extension.", 1},
    {"Internal trigger", qzivifgenInternalTriggerExt, "Enables the internal trigger extension.", 1},
    {"Software trigger", qzivifgenSoftwareTriggerExt, "Enables the software trigger extension.", 1},
    {"Burst", qzivifgenBurstExt, "Enables the burst extension.", 1},
    {"Modulate AM", qzivifgenModulateAMExt, "Enables the amplitude modulation extension.", 2},
    {"Modulate FM", qzivifgenModulateFMExt, "Enables the frequency modulation extension.", 2},
};

} // namespace

std::int32_t FixedOutputMode(std::int32_t mask, std::int32_t mode) {
    switch (mask) {
    case 0:
    case 1:
        return qzivifgenOutputFunc;
    case 2:
        return qzivifgenOutputArb;
    case 3:
        return mode == qzivifgenOutputSeq ? qzivifgenOutputArb : mode;
    case 10:
        return mode == qzivifgenOutputFunc ? qzivifgenOutputArb : mode;
    default: // 11 allows every mode; 8 and 9 cannot arise
        return mode;
    }
}

PExtensions::PExtensions(QWidget* parent) : PropertyPage(tr("Extensions"), parent) {
    auto* layout = new QVBoxLayout(this);
    auto* label =
        new QLabel(tr("Check to enable configuration using specified extension of IviFgen."), this);
    label->setObjectName("Label1");
    label->setWordWrap(true);
    layout->addWidget(label);
    auto* frames = new QGridLayout;
    layout->addLayout(frames);
    layout->addStretch(1);
    QGroupBox* frame[3];
    const char* const titles[] = {"Output mode extensions", "Triggering", "Miscellaneous"};
    for (int f = 0; f < 3; ++f) {
        frame[f] = new QGroupBox(tr(titles[f]), this);
        frame[f]->setObjectName(QStringLiteral("Frame%1").arg(f + 1));
        new QVBoxLayout(frame[f]);
    }
    frames->addWidget(frame[0], 0, 0);
    frames->addWidget(frame[1], 0, 1);
    frames->addWidget(frame[2], 1, 0, 1, 2);
    for (int i = 1; i <= 10; ++i) {
        auto* box = new QCheckBox(tr(kBoxes[i].caption), frame[kBoxes[i].frame]);
        box->setObjectName(QStringLiteral("chkExtension%1").arg(i));
        box->setToolTip(tr(kBoxes[i].tip));
        frame[kBoxes[i].frame]->layout()->addWidget(box);
        connect(box, &QCheckBox::clicked, this, [this] { Clicked(); });
        chkExtension[i] = box;
    }
}

void PExtensions::Clicked() {
    Handled([&] {
        UserChanged();
        EnableTriggerOptions(chkExtension[5]->isChecked());
        EnableArbSequence(chkExtension[2]->isChecked());
    });
}

void PExtensions::Load() {
    const std::int32_t extensions = Props().Extensions();
    for (int i = 1; i <= 10; ++i)
        chkExtension[i]->setChecked(extensions & kBoxes[i].bit);
    EnableTriggerOptions(chkExtension[5]->isChecked());
    EnableArbSequence(chkExtension[2]->isChecked());
}

void PExtensions::EnableTriggerOptions(bool on) {
    for (int i : {6, 7, 8}) {
        chkExtension[i]->setEnabled(on);
        if (!on) chkExtension[i]->setChecked(false);
    }
}

void PExtensions::EnableArbSequence(bool on) {
    chkExtension[4]->setEnabled(on);
    if (!on) chkExtension[4]->setChecked(false);
}

// The apply's steps: the value from the boxes alone, the mode fixed, then the value stored.
void PExtensions::Save() {
    std::int32_t extensions = 0;
    for (int i = 1; i <= 10; ++i)
        if (chkExtension[i]->isChecked()) extensions |= kBoxes[i].bit;
    FixOutputMode();
    Props().Extensions(extensions);
}

void PExtensions::FixOutputMode() {
    const std::int32_t mask = (chkExtension[1]->isChecked() ? 1 : 0) |
                              (chkExtension[2]->isChecked() ? 2 : 0) |
                              (chkExtension[4]->isChecked() ? 8 : 0);
    CIviFgenPropImp& props = Props();
    const std::int32_t mode = FixedOutputMode(mask, props.OutputMode());
    if (mode != props.OutputMode()) props.OutputMode(mode);
}

QWidget* PExtensions::FirstControl() {
    return chkExtension[1];
}

} // namespace qzivi
