// The front panel's knob editing and text entry: values between the knobs, the fields and the
// property tree, the driver's ranges and decades, and the focus rules of a typed value.
#include "qzivi/panels/XUIFgen1.h"

#include "PanelSteps.h"
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/panels/XUIFgen2.h"
#include "qzivi/panels/XWinLabel.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"
#include "qzivi/widgets/QZKnob.h"

#include <QComboBox>
#include <QKeyEvent>
#include <QLineEdit>

#include <cstdio>

namespace qzivi {

using namespace panel;

namespace {

const char* const kUnits[] = {"Hz", "V", "V", "%"};
constexpr int kDecimals[] = {6, 2, 2, 2};

} // namespace

// ---- Values ------------------------------------------------------------------------------------

double XUIFgen1::GetArbFrequency() const {
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    if (m_oProp->Extensions() & qzivifgenArbFrequencyExt) return channel.ArbFrequency();
    const std::int32_t size = Set(channel.ArbWaveform()).DataSize();
    if (size == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
    return m_oProp->ArbSampleRate() / size;
}

void XUIFgen1::SetArbFrequency(double value) {
    auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    if (m_oProp->Extensions() & qzivifgenArbFrequencyExt)
        channel.ArbFrequency(value);
    else
        m_oProp->ArbSampleRate(value * Set(channel.ArbWaveform()).DataSize());
}

// The property of a knob in the present mode.
void XUIFgen1::WriteValue(int index, double value) {
    auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    const bool function = m_oProp->OutputMode() == qzivifgenOutputFunc;
    switch (index) {
    case 0:
        function ? channel.FuncFrequency(value) : SetArbFrequency(value);
        break;
    case 1:
        function ? channel.FuncDCOffset(value) : channel.ArbOffset(value);
        break;
    case 2:
        function ? channel.FuncAmplitude(value) : channel.ArbGain(value);
        break;
    case 3:
        if (function) channel.FuncDutyCycleHigh(value);
        break;
    default:
        break;
    }
}

double XUIFgen1::PropertyOf(bool arbMode, int index) const {
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    switch (index) {
    case 0:
        return arbMode ? GetArbFrequency() : channel.FuncFrequency();
    case 1:
        return arbMode ? channel.ArbOffset() : channel.FuncDCOffset();
    case 2:
        return arbMode ? channel.ArbGain() : channel.FuncAmplitude();
    default:
        return channel.FuncDutyCycleHigh();
    }
}

void XUIFgen1::SetKnobAxis(int index, double minimum, double maximum) {
    knobFgen[index]->Minimum(minimum);
    knobFgen[index]->Maximum(maximum);
}

void XUIFgen1::UpdateRanges() {
    const bool arbMode = m_oProp->OutputMode() != qzivifgenOutputFunc;
    const std::string name = Set(m_oProp->Channels()->ActiveChannel()).Name();
    if (!arbMode) {
        m_vFreqRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_FUNC_FREQUENCY, "");
        m_vAmplitudeRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_FUNC_AMPLITUDE, name);
        m_vDutyRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, name);
        m_vDCOffsetRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_FUNC_DC_OFFSET, name);
    } else {
        m_vFreqRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_ARB_FREQUENCY, "");
        m_vArbGainRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_ARB_GAIN, name);
        m_vArbOffsetRange = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_ARB_OFFSET, name);
    }
    const double base = DecadeBase(PropertyOf(arbMode, 0));
    SetKnobAxis(0, base, base * 10);
    ShowDecadeLabels(base);
    ClampKnobToProperty(arbMode, 0, base, base * 10);
    ShowDecadeButtons(m_bDecadesOn);
    const auto apply = [&](int index, const std::vector<double>& range) {
        SetKnobAxis(index, range.at(0), range.at(1));
        ClampKnobToProperty(arbMode, index, range.at(0), range.at(1));
    };
    if (!arbMode) {
        apply(2, m_vAmplitudeRange);
        apply(3, m_vDutyRange);
        apply(1, m_vDCOffsetRange);
    } else {
        apply(2, m_vArbGainRange);
        apply(1, m_vArbOffsetRange);
    }
}

void XUIFgen1::ClampKnobToProperty(bool arbMode, int index, double minimum, double maximum) {
    const double property = PropertyOf(arbMode, index);
    knobFgen[index]->Value(property < minimum ? minimum : property <= maximum ? property : maximum);
    ShowValue(index, knobFgen[index]->Value());
}

void XUIFgen1::RefreshFromProperties() {
    const bool function = m_oProp->OutputMode() == qzivifgenOutputFunc;
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    knobFgen[0]->Value(function ? channel.FuncFrequency() : GetArbFrequency());
    const double base = DecadeBase(knobFgen[0]->Value());
    SetKnobAxis(0, base, 10 * base);
    if (function) {
        knobFgen[1]->Value(channel.FuncDCOffset());
        knobFgen[2]->Value(channel.FuncAmplitude());
        knobFgen[3]->Value(channel.FuncDutyCycleHigh());
        PressFunctionButton(channel.FuncWaveform());
    } else {
        knobFgen[1]->Value(channel.ArbOffset());
        knobFgen[2]->Value(channel.ArbGain());
        PressFunctionButton(m_oProp->OutputMode() == qzivifgenOutputArb ? 7 : 8);
    }
    ShowDecadeLabels(knobFgen[0]->Minimum());
    ShowDecadeButtons(m_bDecadesOn);
}

double XUIFgen1::DecadeBase(double value) {
    if (m_vFreqRange.size() < 2) UpdateRanges();
    double base = m_vFreqRange.at(0);
    if (value < base) return base;
    while (base * 10 < value && base * 10 < m_vFreqRange.at(1))
        base *= 10;
    return base;
}

double XUIFgen1::ClampFrequency(double value) {
    try {
        if (m_vFreqRange.size() < 2) UpdateRanges();
        if (value >= m_vFreqRange.at(1)) return m_vFreqRange.at(1);
        if (value <= m_vFreqRange.at(0)) return m_vFreqRange.at(0);
        return value;
    } catch (...) {
        HandleError("", 0, m_oErr.get());
        return 0;
    }
}

void XUIFgen1::ShowValue(int index, double value) {
    std::string text;
    double parsed = 0;
    if (index == 0) {
        text = m_oDisplay->GetFormattedReading(value);
    } else if (index == 2 && m_oProp->OutputMode() != qzivifgenOutputFunc) {
        char buffer[64];
        std::snprintf(buffer, sizeof buffer, "%.2f", value);
        text = buffer;
    } else {
        FormatValueWithUnit(text::FormatNumber(value), text, parsed, kUnits[index],
                            kDecimals[index]);
    }
    txtInput[index]->setText(QString::fromStdString(text));
    txtInput[index]->setCursorPosition(0); // a long reading shows its first digits
    QString tip = QString::fromStdString(text);
    if (index == 0 && m_oProp->OutputMode() != qzivifgenOutputFunc &&
        !(m_oProp->Extensions() & qzivifgenArbFrequencyExt))
        tip = "ArbFrequency = " + tip + "  (ArbFrequency = ArbSampleRate/ArbWaveformDataSize)";
    knobFgen[index]->setToolTip(tip);
}

void XUIFgen1::ShowDecadeLabels(double base) {
    lblFgen[4]->Caption(m_oDisplay->GetFormattedReading(base, true));
    lblFgen[5]->Caption(m_oDisplay->GetFormattedReading(base * 10, true));
}

// ---- Text entry --------------------------------------------------------------------------------

int XUIFgen1::FieldIndex(QObject* object) const {
    for (int i = 0; i < 4; ++i)
        if (object == txtInput[i]) return i;
    return -1;
}

bool XUIFgen1::eventFilter(QObject* watched, QEvent* event) {
    if (watched == m_oDisplay && event->type() == QEvent::FocusIn && m_bEditing) {
        txtInput[m_iEditIndex]->setFocus(); // the edit is not settled
        return false;
    }
    if ((watched == cmbArbWfmList || watched == cmbSeqWfmList) &&
        event->type() == QEvent::FocusOut) {
        const bool waveforms = watched == cmbArbWfmList;
        Quietly([&] {
            if ((waveforms ? m_oProp->Waveforms()->Count() : m_oProp->Sequences()->Count()) == 0)
                static_cast<QComboBox*>(watched)->setCurrentIndex(-1);
        });
        return false;
    }
    const int index = FieldIndex(watched);
    if (index < 0) return QWidget::eventFilter(watched, event);
    switch (event->type()) {
    case QEvent::FocusIn:
        m_sSavedText = txtInput[index]->text().toStdString();
        break;
    case QEvent::MouseButtonPress:
        if (m_sSavedText.empty()) m_sSavedText = txtInput[index]->text().toStdString();
        break;
    case QEvent::KeyPress: {
        const int key = static_cast<QKeyEvent*>(event)->key();
        FieldKey(index, key);
        if (key == Qt::Key_Return || key == Qt::Key_Enter) return true; // dropped
        if (key == Qt::Key_Escape) return true;
        break;
    }
    case QEvent::FocusOut:
        FieldLeft(index);
        break;
    default:
        break;
    }
    return false;
}

void XUIFgen1::FieldKey(int index, int key) {
    QLineEdit& field = *txtInput[index];
    if (!Ready()) {
        if (key == Qt::Key_Escape) {
            m_bTextDone = true;
            knobFgen[index]->setFocus();
        }
        return;
    }
    if (key == Qt::Key_Escape) {
        field.setText(QString::fromStdString(m_sSavedText));
        m_bTextDirty = false;
        m_bTextDone = true;
        knobFgen[index]->setFocus();
        return;
    }
    m_bTextDirty = true;
    m_bEditing = true;
    m_iEditIndex = index;
    if (key == Qt::Key_Return || key == Qt::Key_Enter) {
        m_bTextDone = true;
        m_bEditing = false;
        CommitField(index);
    }
}

// The focus has gone: a changed field without Enter takes it back until Enter or Esc.
void XUIFgen1::FieldLeft(int index) {
    QLineEdit& field = *txtInput[index];
    const std::string text = field.text().toStdString();
    if (m_bTextDirty && !m_bTextDone) {
        if (text != m_sSavedText) {
            m_bTextDone = false;
            field.setFocus();
            return;
        }
        if (!m_sSavedText.empty()) field.setText(QString::fromStdString(m_sSavedText));
        m_bTextDirty = false;
        m_bTextDone = true;
    }
    if (m_bEditing) {
        field.setText(QString::fromStdString(m_sSavedText));
        m_bEditing = false;
        m_bTextDirty = false;
        m_bTextDone = true;
        return;
    }
    if (!m_bTextDirty && !m_sSavedText.empty()) field.setText(QString::fromStdString(m_sSavedText));
    m_bTextDone = false;
    m_bTextDirty = false;
}

void XUIFgen1::CommitField(int index) {
    Act([&] {
        std::string text;
        double value = 0;
        FormatValueWithUnit(txtInput[index]->text().toStdString(), text, value, kUnits[index],
                            kDecimals[index]);
        QZKnob& knob = *knobFgen[index];
        if (index == 0) {
            const double clamped = ClampFrequency(value);
            knob.Value(clamped);
            KnobCommitted(0, clamped);
            const double base = DecadeBase(knob.Value());
            SetKnobAxis(0, base, 10 * base);
            ShowDecadeLabels(base);
            ShowDecadeButtons(m_bDecadesOn);
        } else {
            knob.Value(value);
            KnobCommitted(index, value);
        }
        ShowValue(index, knob.Value());
        m_sSavedText = txtInput[index]->text().toStdString();
        knob.setFocus();
    });
}

} // namespace qzivi
