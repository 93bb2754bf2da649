#include "qzivi/panels/XUIFgen1.h"

#include "PanelSteps.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/panels/CPaintFlickerFree.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/panels/SizedWidget.h"
#include "qzivi/panels/XUIFgen2.h"
#include "qzivi/panels/XWinLabel.h"
#include "qzivi/support/failure.h"
#include "qzivi/widgets/QZButton.h"
#include "qzivi/widgets/QZKnob.h"

#include <QComboBox>
#include <QFrame>
#include <QLineEdit>
#include <QPainter>
#include <QToolButton>

#include <cmath>

namespace qzivi {

using namespace panel;

namespace {

// A flag held for the length of a scope, cleared on every way out.
struct Hold {
    explicit Hold(bool& flag) : flag(flag) { flag = true; }
    ~Hold() { flag = false; }
    bool& flag;
};

struct Place {
    int left, top, width, height;
};

const char* const kFunctionTips[] = {
    "Sine wave", "Square wave", "Triangular wave",     "Ramp up",
    "Ramp down", "DC output",   "Arbritrary waveform", "Sequence waveform"};
constexpr int kFunctionLefts[] = {120, 1092, 2064, 3030, 4008, 4980, 5952, 6930};
constexpr int kOffPictures[] = {5001, 5002, 5003, 5004, 5005, 5006, 5100, 5150};
constexpr int kOnPictures[] = {5051, 5052, 5053, 5054, 5055, 5056, 5101, 5151};
constexpr Place kLabels[] = {{600, 3960, 1110, 255},  {1890, 3960, 1215, 255},
                             {3270, 3960, 1080, 255}, {4545, 3960, 1200, 255},
                             {225, 5580, 870, 210},   {1215, 5580, 870, 225}};
const char* const kCaptions[] = {"Frequency", "DC Offset", "Amplitude", "Duty Cycle", "", ""};
constexpr Place kKnobs[] = {
    {645, 4275, 1050, 930}, {2130, 4245, 810, 735}, {3420, 4260, 810, 735}, {4740, 4260, 810, 735}};
constexpr int kKnobTags[] = {15, 31, 31, 31};
constexpr Place kFields[] = {
    {315, 5835, 1680, 330}, {2040, 5160, 990, 375}, {3405, 5160, 840, 375}, {4710, 5160, 855, 375}};
const char* const kFieldTexts[] = {"0.000000 Hz", "0.00 V", "1.00 V", "0.00 %"};

} // namespace

XUIFgen1::XUIFgen1(QWidget* parent) : QWidget(parent) {
    setAccessibleName(tr("Function generator front panel"));
    resize(Px(kDesignWidthTwips), Px(kDesignHeightTwips));
    QFont font(QStringLiteral("Arial"));
    font.setPointSizeF(11.25);
    setFont(font);
    auto sized = [&](QWidget* w, const char* name, int index, Place p, int tag) {
        w->setObjectName(index < 0
                             ? QString::fromUtf8(name)
                             : QStringLiteral("%1%2").arg(QString::fromUtf8(name)).arg(index));
        w->setGeometry(Px(p.left), Px(p.top), Px(p.width), Px(p.height));
        m_oSized.push_back(std::make_unique<SizedWidget>(w, name, index, tag));
    };
    Frame1 = new QFrame(this);
    Frame2 = new QFrame(this);
    for (QFrame* frame : {Frame1, Frame2})
        frame->setFrameStyle(QFrame::StyledPanel | QFrame::Sunken);
    sized(Frame1, "Frame1", -1, {120, 3645, 5700, 2790}, 31);
    sized(Frame2, "Frame2", -1, {5895, 3645, 1815, 2790}, 31);

    m_oDisplay = new XUIFgen2(this);
    sized(m_oDisplay, "XUIFgen2", -1, {120, 135, 7575, 2865}, 15);
    m_oDisplay->installEventFilter(this);

    for (int i = 1; i <= 8; ++i) {
        auto* button = new QZButton(this);
        button->Index(i);
        button->setToolTip(QString::fromUtf8(kFunctionTips[i - 1]));
        button->setAccessibleName(button->toolTip());
        button->OffPicture(LoadPictureFromResource(kOffPictures[i - 1]));
        button->OnPicture(LoadPictureFromResource(kOnPictures[i - 1]));
        sized(button, "qzbtnFunction", i, {kFunctionLefts[i - 1], 3120, 765, 465}, 31);
        connect(button, &QZButton::Click, this, [this](int index) { FunctionClick(index); });
        qzbtnFunction[i] = button;
    }
    for (int i = 0; i < 6; ++i) {
        lblFgen[i] = new XWinLabel(this);
        lblFgen[i]->Caption(kCaptions[i]);
        if (i >= 4) {
            QFont small = font;
            small.setPointSizeF(9);
            lblFgen[i]->setFont(small); // the sizing tool scales it with the panel
            lblFgen[i]->Alignment(i == 4 ? 0 : 1);
        }
        sized(lblFgen[i], "lblFgen", i, kLabels[i], 31);
    }
    for (int i = 0; i < 4; ++i) {
        auto* knob = new QZKnob(this);
        knob->Index(i);
        knob->Minimum(1);
        knob->Maximum(10);
        knob->setAccessibleName(QString::fromUtf8(kCaptions[i]));
        sized(knob, "knobFgen", i, kKnobs[i], kKnobTags[i]);
        connect(knob, &QZKnob::Pressed, this, [this] { KnobPressed(); });
        connect(knob, &QZKnob::Released, this, [this] { KnobReleased(); });
        connect(knob, &QZKnob::ValueChanged, this,
                [this](int index, double value) { KnobChanged(index, value); });
        connect(knob, &QZKnob::ValueCommitted, this,
                [this](int index, double value) { KnobCommitted(index, value); });
        knobFgen[i] = knob;

        auto* field = new QLineEdit(QString::fromUtf8(kFieldTexts[i]), this);
        field->setAccessibleName(QString::fromUtf8(kCaptions[i]));
        field->installEventFilter(this);
        if (i == 0) { // room for a reading of nine digits and its unit
            QFont reading = font;
            reading.setPointSizeF(10);
            field->setFont(reading);
        }
        sized(field, "txtInput", i, kFields[i], 31);
        txtInput[i] = field;
    }
    m_oArrows[0] = LoadPictureFromResource(5152);
    m_oArrows[1] = LoadPictureFromResource(5153);
    m_oArrows[2] = LoadPictureFromResource(5154);
    m_oArrows[3] = LoadPictureFromResource(5155);
    for (int i = 0; i < 2; ++i) {
        auto* button = new QToolButton(this);
        button->setAutoRaise(true);
        button->setAccessibleName(i == 0 ? tr("One decade up") : tr("One decade down"));
        button->setToolTip(button->accessibleName());
        sized(button, "cmdMulFactor", i, {i == 0 ? 1290 : 900, 5235, 165, 255}, 31);
        connect(button, &QToolButton::clicked, this, [this, i] { DecadeClick(i); });
        cmdMulFactor[i] = button;
    }
    ShowDecadeButtons(true);
    // The decade labels name the ends of the frequency knob's axis from the start, as they do
    // once a session sets it; left to themselves they would show the bare "lbl".
    ShowDecadeLabels(knobFgen[0]->Minimum());
    auto list = [&](XWinLabel*& label, QComboBox*& combo, const char* labelName,
                    const char* comboName, const char* caption, const char* tip, Place labelAt,
                    Place comboAt, bool waveforms) {
        label = new XWinLabel(this);
        label->Caption(caption);
        label->ToolTipText2(tip);
        sized(label, labelName, -1, labelAt, 31);
        combo = new QComboBox(this);
        combo->setPlaceholderText(QStringLiteral("None"));
        combo->setToolTip(QString::fromUtf8(tip));
        combo->setAccessibleName(QString::fromUtf8(caption).trimmed());
        combo->installEventFilter(this);
        sized(combo, comboName, -1, comboAt, 31);
        connect(combo, &QComboBox::activated, this, [this, waveforms] { ListPicked(waveforms); });
    };
    list(lblArbList, cmbArbWfmList, "lblArbList", "cmbArbWfmList", " Waveforms",
         "Lists the arbitrary waveforms", {5985, 3960, 1395, 255}, {6030, 4290, 1620, 375}, true);
    list(lblSeqList, cmbSeqWfmList, "lblSeqList", "cmbSeqWfmList", " Sequences",
         "Lists the sequences of aribtrary waveforms", {5985, 4845, 1515, 300},
         {6030, 5160, 1620, 375}, false);

    std::vector<ISizedControl*> controls;
    for (const auto& c : m_oSized)
        controls.push_back(c.get());
    m_oSizing.Store(controls, height(), width());

    m_oConfigTimer = CTimer::Create();
    m_oConfigTimer->Interval(500);
    m_cTick = m_oConfigTimer->Timer.Connect([this] { m_bConfigDue = true; });
}

XUIFgen1::~XUIFgen1() {
    Quietly([&] { m_oConfigTimer->Enabled(false); });
}

QSize XUIFgen1::sizeHint() const {
    return {Px(kDesignWidthTwips), Px(kDesignHeightTwips)};
}

// ---- The contract ------------------------------------------------------------------------------

void XUIFgen1::Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> propSet,
                         std::shared_ptr<CIviErrorReport> errorReport) {
    m_oIO = io;
    m_oErr = errorReport;
    m_oDisplay->Construct(io, propSet, errorReport);
    SetNewPropSet(std::move(propSet));
    m_cConfigured = m_oIO->Configured.Connect([this] { OnConfigured(); });
    m_cError = m_oIO->Error.Connect(
        [this](std::int32_t, const std::string&, const std::string&) { OnError(); });
    m_cInitialized = m_oErr->Initialized.Connect([this] { OnInitialized(); });
}

void XUIFgen1::SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) {
    m_oProp = std::move(propSet);
    if (m_oIO) m_oDisplay->SetNewPropSet(m_oProp);
    m_cCollectionChanged = m_oProp->CollectionChanged.Connect(
        [this](const std::string&, const Variant&, std::int32_t, const Variant&, const Variant&) {
            OnCollectionChanged();
        });
}

void XUIFgen1::Enabled(bool enabled) {
    for (const auto& c : m_oSized)
        c->Widget()->setEnabled(enabled);
    ShowDecadeButtons(enabled);
    qzbtnFunction[7]->setEnabled(true);
    qzbtnFunction[8]->setEnabled(true);
}

void XUIFgen1::Size(float w, float h) {
    resize(static_cast<int>(w), static_cast<int>(h));
}

std::int32_t XUIFgen1::UiState() const {
    return m_oDisplay->UiState();
}

void XUIFgen1::UiState(std::int32_t state) {
    if (state & 1) {
        m_oDisplay->UiState(state);
        return;
    }
    if (state & 4) OnInitialized();
    if (state & 8) OnConfigured();
    m_oDisplay->UiState(state);
}

void XUIFgen1::resizeEvent(QResizeEvent* event) {
    QWidget::resizeEvent(event);
    if (m_bResizing) return;
    const Hold hold(m_bResizing);
    // Below 1500 by 500 twips the text fields make room for the knobs.
    const bool room = width() > Px(1500) && height() > Px(500);
    for (int i : {1, 2, 0})
        txtInput[i]->setVisible(room);
    txtInput[3]->setVisible(room && !knobFgen[3]->isHidden()); // the duty cycle has its mode
    std::vector<ISizedControl*> controls;
    for (const auto& c : m_oSized)
        controls.push_back(c.get());
    Quietly([&] { m_oSizing.Resize(controls, height(), width()); });
}

void XUIFgen1::paintEvent(QPaintEvent*) {
    QPainter target(this);
    CPaintFlickerFree buffer;
    QPainter* p = buffer.BeginPainting(target, *this);
    buffer.EraseBackground(0x8000000F);
    // A raised edge all round.
    const QRectF r = QRectF(rect()).adjusted(0.5, 0.5, -0.5, -0.5);
    p->setPen(palette().color(QPalette::Light));
    p->drawLine(r.topLeft(), r.topRight());
    p->drawLine(r.topLeft(), r.bottomLeft());
    p->setPen(palette().color(QPalette::Dark));
    p->drawLine(r.bottomLeft(), r.bottomRight());
    p->drawLine(r.topRight(), r.bottomRight());
    buffer.StopPainting();
}

// ---- Events ------------------------------------------------------------------------------------

bool XUIFgen1::HasOutputExtension() const {
    return m_oProp && (m_oProp->Extensions() &
                       (qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt));
}

bool XUIFgen1::Ready() const {
    return m_oErr && m_oErr->state() == IviStateConfigured && HasOutputExtension();
}

void XUIFgen1::OnInitialized() {
    if (!HasOutputExtension()) return;
    const Hold hold(m_bBusy);
    Quietly([&] { EnableValidFunctions(false); });
    Quietly([&] { UpdateModeControls(true); });
}

void XUIFgen1::OnConfigured() {
    if (!HasOutputExtension()) return;
    const Hold hold(m_bBusy);
    Quietly([&] { EnableValidFunctions(true); });
    Quietly([&] { UpdateRanges(); });
    Quietly([&] {
        const std::int32_t mode = m_oProp->OutputMode(), ext = m_oProp->Extensions();
        const bool channels = m_oProp->Channels()->Count() > 0;
        if (mode == qzivifgenOutputFunc && (ext & qzivifgenStdFuncExt)) {
            const int n = Set(m_oProp->Channels()->ActiveChannel()).FuncWaveform();
            PressFunctionButton(n);
            ShowControlsForFunction(n);
            if (m_oProp->Waveforms()->Count() > 0)
                FillList(true);
            else
                cmbArbWfmList->setCurrentIndex(-1);
            if (m_oProp->Sequences()->Count() > 0)
                FillList(false);
            else
                cmbSeqWfmList->setCurrentIndex(-1);
        } else if (mode == qzivifgenOutputArb && (ext & qzivifgenArbWfmExt)) {
            FillList(true);
            PressFunctionButton(channels ? 7 : 0);
            ShowControlsForFunction(channels ? 7 : 0);
        } else if (mode == qzivifgenOutputSeq && (ext & qzivifgenArbSeqExt)) {
            FillList(true);
            FillList(false);
            PressFunctionButton(channels ? 8 : 0);
            ShowControlsForFunction(channels ? 8 : 0);
        }
    });
}

void XUIFgen1::OnError() {
    const Hold hold(m_bBusy);
    for (int i = 1; i <= 8; ++i)
        qzbtnFunction[i]->Value(false);
}

void XUIFgen1::OnCollectionChanged() {
    if (m_bBusy) return;
    const Hold hold(m_bBusy);
    if (!m_oErr || m_oErr->state() != IviStateConfigured) return;
    Quietly([&] {
        if (m_oProp->Channels()->Count() < 1) {
            ResetToNoChannels();
            return;
        }
        const std::int32_t mode = m_oProp->OutputMode(), ext = m_oProp->Extensions();
        const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
        if (mode == qzivifgenOutputFunc && (ext & qzivifgenStdFuncExt)) {
            PressFunctionButton(channel.FuncWaveform());
            ShowControlsForFunction(channel.FuncWaveform());
        } else if (mode == qzivifgenOutputArb && (ext & qzivifgenArbWfmExt)) {
            PressFunctionButton(7);
            ShowControlsForFunction(7);
            cmbArbWfmList->setCurrentText(
                QString::fromStdString(Set(channel.ArbWaveform()).Name()));
        } else if (mode == qzivifgenOutputSeq && (ext & qzivifgenArbSeqExt)) {
            PressFunctionButton(8);
            ShowControlsForFunction(8);
            cmbSeqWfmList->setCurrentText(QString::fromStdString(Set(channel.Sequence()).Name()));
        }
        RefreshFromProperties();
    });
}

// ---- Operator's actions ------------------------------------------------------------------------

void XUIFgen1::Act(const std::function<void()>& action) {
    try {
        action();
    } catch (...) {
        HandleError("", 0, m_oErr.get());
    }
}

void XUIFgen1::FunctionClick(int index) {
    Act([&] {
        PressFunctionButton(index);
        if (m_oProp->Channels()->Count() < 1 || !Ready()) return;
        if (!m_bBusy) {
            const Hold hold(m_bBusy);
            double f = 0;
            auto& channel = Set(m_oProp->Channels()->ActiveChannel());
            if (index == 7 || index == 8) {
                FillList(index == 7);
                m_oProp->OutputMode(index == 7 ? qzivifgenOutputArb : qzivifgenOutputSeq);
                m_oIO->Configure(false);
                UpdateRanges();
                f = GetArbFrequency();
            } else {
                m_oProp->OutputMode(qzivifgenOutputFunc);
                channel.FuncWaveform(index);
                m_oIO->Configure(false);
                UpdateRanges();
                f = channel.FuncFrequency();
            }
            ShowValue(0, f);
        }
        ShowControlsForFunction(index);
    });
}

void XUIFgen1::KnobPressed() {
    Act([&] {
        m_oConfigTimer->Enabled(true);
        m_oProp->DraggingKnob(true);
    });
}

void XUIFgen1::KnobReleased() {
    Act([&] {
        m_oConfigTimer->Enabled(false);
        m_oProp->DraggingKnob(false);
    });
}

void XUIFgen1::KnobChanged(int index, double value) {
    Act([&] {
        if (!m_oErr || m_oErr->state() != IviStateConfigured || m_oProp->Channels()->Count() < 1)
            return;
        WriteValue(index, value);
        m_oDisplay->UpdateChannelInfo();
        ShowValue(index, value);
        if (!m_bBusy && m_bConfigDue) {
            m_bConfigDue = false;
            m_oIO->Configure(false);
        }
    });
}

void XUIFgen1::KnobCommitted(int index, double value) {
    Act([&] {
        if (!m_oErr || m_oProp->Channels()->Count() < 1) return;
        // The first change after Init, or after a Configure that failed, configures too.
        const std::int32_t state = m_oErr->state();
        if ((state == IviStateConfigured && !m_bBusy) || state == IviStateInitialized) {
            WriteValue(index, value);
            ShowValue(index, value);
            m_oIO->Configure(false);
        }
    });
}

void XUIFgen1::DecadeClick(int index) {
    Act([&] {
        if (m_oProp->Channels()->Count() < 1 || !Ready()) return;
        QZKnob& knob = *knobFgen[0];
        const double old = knob.Value(), low = knob.Minimum(), high = knob.Maximum();
        double next = 0;
        if (index == 1) {
            const bool atLimit = low / 10 <= m_vFreqRange.at(0);
            SetKnobAxis(0, low / 10, low);
            next = ClampFrequency(atLimit ? m_vFreqRange.at(0) : old / 10);
        } else {
            const bool atLimit = 10 * high >= m_vFreqRange.at(1);
            SetKnobAxis(0, atLimit ? high : low * 10, atLimit ? 10 * high : low * 100);
            next = ClampFrequency(atLimit ? m_vFreqRange.at(1) : old * 10);
        }
        ShowDecadeButtons(m_bDecadesOn);
        ShowDecadeLabels(knob.Minimum());
        knob.Value(next);
        KnobCommitted(0, next);
    });
}

void XUIFgen1::ListPicked(bool waveforms) {
    Act([&] {
        QComboBox& combo = waveforms ? *cmbArbWfmList : *cmbSeqWfmList;
        if ((!waveforms || m_oProp->Channels()->Count() >= 1) && !m_bBusy) {
            const Hold hold(m_bBusy);
            auto& channel = Set(m_oProp->Channels()->ActiveChannel());
            const std::string name = combo.currentText().toStdString();
            if (waveforms)
                channel.ArbWaveform(m_oProp->Waveforms()->Item(name));
            else
                channel.Sequence(m_oProp->Sequences()->Item(name));
            m_oIO->Configure(false);
        }
        if (waveforms && m_oProp->Waveforms()->Count() < 1) combo.setCurrentIndex(-1);
    });
}

} // namespace qzivi
