// The front panel's controls by output mode: which function keys, knobs, fields and lists are
// open, shown and pressed for the mode and extensions of the property tree.
#include "qzivi/panels/XUIFgen1.h"

#include "PanelSteps.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/panels/XWinLabel.h"
#include "qzivi/widgets/QZButton.h"
#include "qzivi/widgets/QZKnob.h"

#include <QComboBox>
#include <QLineEdit>
#include <QToolButton>

namespace qzivi {

using namespace panel;

// ---- Controls by mode --------------------------------------------------------------------------

void XUIFgen1::EnableValidFunctions(bool keepStandard) {
    const auto valid = m_oIO->IVIFgenGetValidFunctions(keepStandard);
    bool any = false;
    for (int i = 1; i <= 8; ++i) {
        const bool on = valid[static_cast<std::size_t>(i - 1)].AsInt32() != 0;
        qzbtnFunction[i]->setEnabled(on);
        any = any || on;
    }
    UpdateModeControls(any);
}

void XUIFgen1::PressFunctionButton(int n) {
    for (int i = 1; i <= 8; ++i)
        qzbtnFunction[i]->Value(i == n);
}

// A decade button works while the knob's decade has another beyond it within the driver's range.
void XUIFgen1::ShowDecadeButtons(bool on) {
    m_bDecadesOn = on;
    const bool known = m_vFreqRange.size() >= 2;
    constexpr double kSlack = 1e-9; // decades are stepped by tens and may miss the limit by an ulp
    const bool top = known && knobFgen[0]->Maximum() >= m_vFreqRange[1] * (1 - kSlack);
    const bool bottom = known && knobFgen[0]->Minimum() <= m_vFreqRange[0] * (1 + kSlack);
    for (int i = 0; i < 2; ++i) {
        const bool enabled = on && !(i == 0 ? top : bottom);
        cmdMulFactor[i]->setEnabled(enabled);
        cmdMulFactor[i]->setIcon(m_oArrows[(enabled ? 2 : 0) + i]);
    }
}

void XUIFgen1::ShowControlsForFunction(int n) {
    for (int i = 0; i < 6; ++i) {
        lblFgen[i]->setVisible(true);
        lblFgen[i]->Enabled(true);
    }
    for (int i = 0; i < 4; ++i) {
        knobFgen[i]->setEnabled(true);
        knobFgen[i]->setVisible(true);
        txtInput[i]->setEnabled(true);
    }
    ResetModeControls();
    switch (n) {
    case 2: // only the square wave has a duty cycle
        knobFgen[3]->setEnabled(true);
        lblFgen[3]->Enabled(true);
        txtInput[3]->setEnabled(true);
        break;
    case 6: // DC leaves the offset
        for (int i : {0, 2, 3})
            knobFgen[i]->setEnabled(false);
        for (int i = 0; i < 4; ++i) {
            txtInput[i]->setEnabled(false);
            lblFgen[i]->Enabled(false);
        }
        lblFgen[1]->Enabled(true);
        txtInput[1]->setEnabled(true);
        ShowDecadeButtons(false);
        lblFgen[4]->Enabled(false);
        lblFgen[5]->Enabled(false);
        break;
    case 7:
    case 8: {
        const bool waveforms = n == 7;
        const std::int32_t count =
            waveforms ? m_oProp->Waveforms()->Count() : m_oProp->Sequences()->Count();
        if (count < 1) {
            UpdateModeControls(false);
        } else {
            (waveforms ? lblArbList : lblSeqList)->Enabled(true);
            (waveforms ? cmbArbWfmList : cmbSeqWfmList)->setEnabled(true);
            UpdateModeControls(m_oProp->Channels()->Count() > 0);
        }
        break;
    }
    default:
        break;
    }
}

void XUIFgen1::ResetModeControls() {
    txtInput[3]->setVisible(m_oProp->OutputMode() == qzivifgenOutputFunc);
    lblFgen[3]->Enabled(false);
    knobFgen[3]->setEnabled(false);
    txtInput[3]->setEnabled(false);
    lblArbList->Enabled(false);
    lblSeqList->Enabled(false);
    cmbArbWfmList->setEnabled(false);
    cmbSeqWfmList->setEnabled(false);
    ShowDecadeButtons(true);
}

void XUIFgen1::UpdateModeControls(bool enable) {
    const std::int32_t mode = m_oProp->OutputMode(), ext = m_oProp->Extensions();
    const bool modeOk = (mode == qzivifgenOutputFunc && (ext & qzivifgenStdFuncExt)) ||
                        (mode == qzivifgenOutputArb && (ext & qzivifgenArbWfmExt)) ||
                        (mode == qzivifgenOutputSeq && (ext & qzivifgenArbSeqExt));
    if (mode == qzivifgenOutputArb) {
        cmbSeqWfmList->setEnabled(false);
        lblSeqList->Enabled(false);
    } else if (mode == qzivifgenOutputSeq) {
        cmbArbWfmList->setEnabled(false);
        lblArbList->Enabled(false);
    }
    SetModeCaptions();
    if (m_oProp->Channels()->Count() < 1) {
        for (QComboBox* combo : {cmbArbWfmList, cmbSeqWfmList}) {
            combo->setCurrentIndex(-1);
            combo->setEnabled(false);
        }
        lblArbList->Enabled(false);
        lblSeqList->Enabled(false);
    }
    const bool on = enable && modeOk;
    for (int i = 0; i < 4; ++i) {
        knobFgen[i]->setEnabled(on);
        txtInput[i]->setEnabled(on);
    }
    for (int i = 0; i < 6; ++i)
        lblFgen[i]->Enabled(on);
    const bool duty = mode == qzivifgenOutputFunc && on;
    lblFgen[3]->setVisible(duty);
    knobFgen[3]->setVisible(duty);
    txtInput[3]->setVisible(duty);
    ShowDecadeButtons(on);
}

void XUIFgen1::SetModeCaptions() {
    switch (m_oProp->OutputMode()) {
    case qzivifgenOutputFunc:
        lblFgen[0]->Caption("Frequency");
        lblFgen[1]->Caption("DC Offset");
        lblFgen[2]->Caption("Amplitude");
        lblFgen[3]->Caption(" Duty Cycle");
        break;
    case qzivifgenOutputArb:
    case qzivifgenOutputSeq:
        lblFgen[0]->Caption("Frequency");
        lblFgen[1]->Caption("Arb Offset");
        lblFgen[2]->Caption(" Arb Gain");
        break;
    default:
        break;
    }
}

void XUIFgen1::FillList(bool waveforms) {
    QComboBox& combo = waveforms ? *cmbArbWfmList : *cmbSeqWfmList;
    XWinLabel& label = waveforms ? *lblArbList : *lblSeqList;
    combo.clear();
    auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    const std::int32_t count =
        waveforms ? m_oProp->Waveforms()->Count() : m_oProp->Sequences()->Count();
    if (count > 0) {
        combo.setVisible(true);
        label.setVisible(true);
        for (std::int32_t i = 1; i <= count; ++i)
            combo.addItem(QString::fromStdString(waveforms ? m_oProp->Waveforms()->At(i)->Name()
                                                           : m_oProp->Sequences()->At(i)->Name()));
        const bool none = waveforms ? !channel.ArbWaveform() : !channel.Sequence();
        if (none) {
            combo.setCurrentIndex(0);
            const std::string name = combo.currentText().toStdString();
            if (waveforms)
                channel.ArbWaveform(m_oProp->Waveforms()->Item(name));
            else
                channel.Sequence(m_oProp->Sequences()->Item(name));
        } else {
            combo.setCurrentText(QString::fromStdString(waveforms ? channel.ArbWaveform()->Name()
                                                                  : channel.Sequence()->Name()));
        }
    } else {
        combo.setCurrentIndex(-1);
    }
    EnableActiveList();
}

void XUIFgen1::EnableActiveList() {
    if (m_oProp->Channels()->Count() < 1) return;
    const std::int32_t mode = m_oProp->OutputMode(), ext = m_oProp->Extensions();
    if ((ext & qzivifgenArbWfmExt) && mode == qzivifgenOutputArb) {
        cmbArbWfmList->setEnabled(true);
    } else if ((ext & qzivifgenArbSeqExt) && mode == qzivifgenOutputSeq) {
        cmbSeqWfmList->setEnabled(true);
    } else if (mode == qzivifgenOutputArb && (ext & qzivifgenStdFuncExt)) {
        cmbArbWfmList->setEnabled(false);
        cmbSeqWfmList->setEnabled(false);
    }
}

void XUIFgen1::ResetToNoChannels() {
    for (int i : {0, 2, 1, 3})
        ShowValue(i, 0);
    const double base = DecadeBase(1.0);
    SetKnobAxis(0, base, 10 * base);
    ShowDecadeLabels(base);
    for (int i : {2, 1, 3})
        knobFgen[i]->Value(0);
    for (QComboBox* combo : {cmbArbWfmList, cmbSeqWfmList}) {
        combo->setEnabled(true);
        combo->setCurrentIndex(-1);
    }
    PressFunctionButton(99);
    Enabled(true);
}

} // namespace qzivi
