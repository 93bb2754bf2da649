// XUIFgen1: the front panel of a function generator. An embedded XUIFgen2 shows what the
// instrument does; below it eight function keys, four knobs with their text fields, the decade
// buttons of the frequency and the lists of waveforms and sequences. An operator's change goes into
// the property tree and from there through Configure to the instrument: at once for a click or a
// typed value, at most twice a second while a knob is dragged, and once more at its release.
#pragma once

#include "qzivi/control/Panel.h"
#include "qzivi/panels/CUiSizingTool.h"
#include "qzivi/support/event.h"
#include "qzivi/support/timers.h"

#include <QIcon>
#include <QWidget>

#include <functional>
#include <memory>
#include <string>
#include <vector>

class QComboBox;
class QFrame;
class QLineEdit;
class QToolButton;

namespace qzivi {

class QZButton;
class QZKnob;
class SizedWidget;
class XUIFgen2;
class XWinLabel;

class XUIFgen1 : public QWidget, public IQZIviFgenPanel {
    Q_OBJECT

public:
    static constexpr int kDesignWidthTwips = 7785;
    static constexpr int kDesignHeightTwips = 6510;

    explicit XUIFgen1(QWidget* parent = nullptr);
    ~XUIFgen1() override;

    // ---- The panel contract ----
    void Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> propSet,
                   std::shared_ptr<CIviErrorReport> errorReport) override;
    void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) override;
    void Enabled(bool enabled) override;
    void Size(float width, float height) override;
    float Width() const override { return static_cast<float>(width()); }
    float Height() const override { return static_cast<float>(height()); }
    std::int32_t UiState() const override;
    void UiState(std::int32_t state) override;
    void Visible(bool visible) override { setVisible(visible); }
    void Move(float left, float top) override {
        move(static_cast<int>(left), static_cast<int>(top));
    }

    QSize sizeHint() const override;

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    // ---- Events of the collaborators (Part of the panel's behaviour) ----
    void OnInitialized();
    void OnConfigured();
    void OnError();
    void OnCollectionChanged();

    // ---- The operator's actions; a failure goes to HandleError and the action ends ----
    void Act(const std::function<void()>& action);
    void FunctionClick(int index);
    void KnobPressed();
    void KnobReleased();
    void KnobChanged(int index, double value);
    void KnobCommitted(int index, double value);
    void DecadeClick(int index);
    void ListPicked(bool waveforms);

    // ---- Controls by mode ----
    void EnableValidFunctions(bool keepStandard);
    void PressFunctionButton(int n);
    void ShowControlsForFunction(int n);
    void ResetModeControls();
    void UpdateModeControls(bool enable);
    void SetModeCaptions();
    void FillList(bool waveforms);
    void EnableActiveList();
    void ResetToNoChannels();
    void ShowDecadeButtons(bool on);

    // ---- Values (knob editing) ----
    void WriteValue(int index, double value);
    void UpdateRanges();
    void RefreshFromProperties();
    void ClampKnobToProperty(bool arbMode, int index, double minimum, double maximum);
    double PropertyOf(bool arbMode, int index) const;
    double DecadeBase(double value);
    double ClampFrequency(double value);
    void ShowValue(int index, double value);
    void ShowDecadeLabels(double base);
    double GetArbFrequency() const;
    void SetArbFrequency(double value);
    void SetKnobAxis(int index, double minimum, double maximum);

    // ---- Text entry ----
    bool Ready() const;
    bool HasOutputExtension() const;
    int FieldIndex(QObject* object) const;
    void FieldKey(int index, int key);
    void FieldLeft(int index);
    void CommitField(int index);

    CIviFgenIOImp* m_oIO = nullptr;
    std::shared_ptr<CIviFgenPropImp> m_oProp;
    std::shared_ptr<CIviErrorReport> m_oErr;
    Connection m_cConfigured, m_cError, m_cInitialized, m_cCollectionChanged, m_cTick;

    std::shared_ptr<CTimer> m_oConfigTimer;
    bool m_bConfigDue = false;
    bool m_bBusy = false;
    bool m_bResizing = false;
    bool m_bDecadesOn = true;
    std::vector<double> m_vFreqRange, m_vAmplitudeRange, m_vDCOffsetRange, m_vDutyRange,
        m_vArbGainRange, m_vArbOffsetRange;
    std::string m_sSavedText;
    int m_iEditIndex = 0;
    bool m_bEditing = false, m_bTextDirty = false, m_bTextDone = false;

    XUIFgen2* m_oDisplay;
    QZButton* qzbtnFunction[9] = {}; // 1 to 8
    QFrame *Frame1, *Frame2;
    XWinLabel* lblFgen[6];
    QZKnob* knobFgen[4];
    QLineEdit* txtInput[4];
    QToolButton* cmdMulFactor[2];
    XWinLabel *lblArbList, *lblSeqList;
    QComboBox *cmbArbWfmList, *cmbSeqWfmList;
    QIcon m_oArrows[4]; // grey right, grey left, black right, black left
    std::vector<std::unique_ptr<SizedWidget>> m_oSized;
    CUiSizingTool m_oSizing;
};

} // namespace qzivi
