#include "qzivi/panels/XUIFgen2.h"

#include "PanelSteps.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/panels/CPaintFlickerFree.h"
#include "qzivi/panels/FunctionPreview.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/panels/SizedWidget.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"
#include "qzivi/widgets/QZGraph.h"

#include <QEvent>
#include <QPainter>

#include <algorithm>
#include <cmath>

namespace qzivi {

using namespace panel;

namespace {

QString Q(const std::string& text) {
    return QString::fromStdString(text);
}

// The font of a label made smaller, down to half its size, until its text fits its width.
void FitText(QLabel* label, double designPoints) {
    QFont font = label->font();
    font.setPointSizeF(designPoints);
    for (double points = designPoints; points > designPoints / 2; points *= 0.92) {
        font.setPointSizeF(points);
        if (QFontMetricsF(font).horizontalAdvance(label->text()) <= label->width()) break;
    }
    label->setFont(font);
}

} // namespace

XUIFgen2::XUIFgen2(QWidget* parent) : QWidget(parent) {
    setAttribute(Qt::WA_OpaquePaintEvent);
    setAccessibleName(tr("Instrument display"));
    resize(Px(kDesignWidthTwips), Px(kDesignHeightTwips));
    lblDriver = AddLabel("lblDriver", 75, 60, 1335, 195, 9, 0x00FFFF, Qt::AlignLeft, false, "", 29);
    lblError =
        AddLabel("lblError", 1530, 60, 675, 195, 9, 0x0000FF, Qt::AlignLeft, false, "ERROR", 29);
    lblWaveform =
        AddLabel("lblWaveform", 2325, 60, 1200, 195, 9, 0x80FF80, Qt::AlignHCenter, true, "", 29);
    lblSimulated = AddLabel("lblSimulated", 3645, 60, 1125, 195, 9, 0xFFFF00, Qt::AlignRight, false,
                            "SIMULATED", 29);
    lblChannel = AddLabel("lblChannel", 360, 390, 2925, 360, 18, 0x00FF00, Qt::AlignLeft, true,
                          "< No Channels>", 915);
    lblReading =
        AddLabel("lblReading", 375, 855, 2910, 375, 18, 0x00FF00, Qt::AlignLeft, true, "OFF", 915);
    m_oPictures[0] = PictureFromHandle(5157, QSize(14, 13), 2);
    m_oPictures[1] = PictureFromHandle(5156, QSize(14, 13), 2);
    m_oPictures[2] = PictureFromHandle(5159, QSize(14, 13), 2);
    m_oPictures[3] = PictureFromHandle(5158, QSize(14, 13), 2);
    for (int i = 0; i < 2; ++i) {
        pictChangeChan[i] = new QLabel(this);
        pictChangeChan[i]->setObjectName(QStringLiteral("pictChangeChan%1").arg(i));
        pictChangeChan[i]->setGeometry(Px(150), Px(i == 0 ? 330 : 585), Px(210), Px(195));
        pictChangeChan[i]->setScaledContents(true);
        pictChangeChan[i]->setPixmap(m_oPictures[i]);
        pictChangeChan[i]->setCursor(Qt::PointingHandCursor);
        pictChangeChan[i]->setAccessibleName(i == 0 ? tr("Next channel") : tr("Previous channel"));
        pictChangeChan[i]->installEventFilter(this);
        m_oSized.push_back(
            std::make_unique<SizedWidget>(pictChangeChan[i], "pictChangeChan", i, 915));
    }
    lblChannel->installEventFilter(this);
    m_oGraph = new QZGraph(this);
    m_oGraph->setObjectName(QStringLiteral("qzgrphWaveform"));
    m_oGraph->ShowLabels(false); // a preview: the shape, not the scale
    m_oGraph->setGeometry(Px(3375), Px(390), Px(1410), Px(840));
    m_oSized.push_back(std::make_unique<SizedWidget>(m_oGraph, "qzgrphWaveform", -1, 31));
    std::vector<ISizedControl*> controls;
    for (const auto& c : m_oSized)
        controls.push_back(c.get());
    m_oSizing.Store(controls, height(), width());
}

XUIFgen2::~XUIFgen2() = default;

QLabel* XUIFgen2::AddLabel(const char* name, int left, int top, int width, int height,
                           double points, std::uint32_t bgr, Qt::Alignment alignment, bool visible,
                           const char* text, int tag) {
    auto* label = new QLabel(QString::fromUtf8(text), this);
    label->setObjectName(QString::fromUtf8(name));
    label->setGeometry(Px(left), Px(top), Px(width), Px(height));
    QFont font(QStringLiteral("Arial"));
    font.setPointSizeF(points);
    label->setFont(font);
    QPalette palette = label->palette();
    palette.setColor(QPalette::WindowText, ResolveColor(bgr, palette));
    palette.setColor(QPalette::Window, Qt::black);
    label->setPalette(palette);
    label->setAlignment(alignment | Qt::AlignVCenter);
    label->setVisible(visible);
    m_oSized.push_back(std::make_unique<SizedWidget>(label, name, -1, tag));
    return label;
}

// The channel and the reading in their large font, scaled with the panel, smaller where a long
// text would not fit.
void XUIFgen2::FitLargeTexts() {
    const double scale = std::min(static_cast<double>(height()) / Px(kDesignHeightTwips),
                                  static_cast<double>(width()) / Px(kDesignWidthTwips));
    FitText(lblChannel, 18 * scale);
    FitText(lblReading, 18 * scale);
}

QSize XUIFgen2::sizeHint() const {
    return {Px(kDesignWidthTwips), Px(kDesignHeightTwips)};
}

// ---- The contract ------------------------------------------------------------------------------

void XUIFgen2::Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> propSet,
                         std::shared_ptr<CIviErrorReport> errorReport) {
    m_oIO = io;
    m_oErr = std::move(errorReport);
    SetNewPropSet(std::move(propSet));
    m_cConfigured = m_oIO->Configured.Connect([this] { OnConfigured(); });
    m_cInitialized = m_oErr->Initialized.Connect([this] { OnInitialized(); });
    m_cAllError = m_oErr->AllError.Connect(
        [this](std::int32_t number, const std::string&, const std::string& description) {
            OnAllError(number, description);
        });
}

void XUIFgen2::SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) {
    m_oProp = std::move(propSet);
    m_cCollectionChanged = m_oProp->CollectionChanged.Connect(
        [this](const std::string& name, const Variant&, std::int32_t, const Variant&,
               const Variant&) { OnCollectionChanged(name); });
}

void XUIFgen2::Enabled(bool enabled) {
    for (const auto& c : m_oSized)
        c->Widget()->setEnabled(enabled);
    Quietly([&] { UpdateChannelArrows(); });
}

void XUIFgen2::Size(float w, float h) {
    resize(static_cast<int>(w), static_cast<int>(h));
}

void XUIFgen2::resizeEvent(QResizeEvent* event) {
    std::vector<ISizedControl*> controls;
    for (const auto& c : m_oSized)
        controls.push_back(c.get());
    Quietly([&] { m_oSizing.Resize(controls, height(), width()); });
    FitLargeTexts();
    QWidget::resizeEvent(event);
}

void XUIFgen2::UiState(std::int32_t state) {
    m_lUiState = state;
    if (state & 1) {
        m_bRunMode = false;
        return;
    }
    m_bRunMode = true;
    // A panel made in the middle of a session shows at once what the old one showed.
    if (state & 4) OnInitialized();
    if (m_lUiState & 8) OnConfigured();
    if (state & 2)
        OnAllError(m_oErr ? m_oErr->LastErrorNumber() : 0,
                   m_oErr ? m_oErr->LastErrorDescription() : std::string());
}

void XUIFgen2::paintEvent(QPaintEvent*) {
    QPainter target(this);
    CPaintFlickerFree buffer;
    QPainter* p = buffer.BeginPainting(target, *this);
    buffer.EraseBackground(0x000000);
    // A sunken edge all round.
    const QRectF r = QRectF(rect()).adjusted(0.5, 0.5, -0.5, -0.5);
    p->setPen(QColor(0x80, 0x80, 0x80));
    p->drawLine(r.topLeft(), r.topRight());
    p->drawLine(r.topLeft(), r.bottomLeft());
    p->setPen(QColor(0xe0, 0xe0, 0xe0));
    p->drawLine(r.bottomLeft(), r.bottomRight());
    p->drawLine(r.topRight(), r.bottomRight());
    buffer.StopPainting();
}

bool XUIFgen2::eventFilter(QObject* watched, QEvent* event) {
    const bool click =
        event->type() == QEvent::MouseButtonRelease || event->type() == QEvent::MouseButtonDblClick;
    if (click && m_oProp) {
        Quietly([&] {
            if (watched == pictChangeChan[0] && pictChangeChan[0]->isEnabled()) StepChannel(false);
            if (watched == pictChangeChan[1] && pictChangeChan[1]->isEnabled()) StepChannel(true);
            if (watched == lblChannel && m_oProp->Channels()->Count() >= 1) StepChannel(false);
        });
    }
    return QWidget::eventFilter(watched, event);
}

// ---- Events ------------------------------------------------------------------------------------

bool XUIFgen2::HasOutputExtension() const {
    return m_oProp && (m_oProp->Extensions() &
                       (qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt));
}

void XUIFgen2::ShowDriver() {
    Quietly([&] {
        lblDriver->setText(Q(
            m_oIO->GetAttributeVi(AttrType::String, IVI_ATTR_SPECIFIC_DRIVER_PREFIX, "").AsText()));
    });
    Quietly([&] {
        lblSimulated->setVisible(
            m_oIO->GetAttributeVi(AttrType::Boolean, IVI_ATTR_SIMULATE, "").AsInt32() != 0);
    });
}

void XUIFgen2::OnInitialized() {
    if (!HasOutputExtension()) return;
    lblError->setVisible(false);
    lblDriver->setVisible(true);
    ShowDriver();
    m_lUiState = (m_lUiState & ~2) | 4;
}

void XUIFgen2::OnConfigured() {
    if (!HasOutputExtension()) return;
    Quietly([&] { UpdateChannelArrows(); });
    Quietly([&] { lblChannel->setText(Q(Set(m_oProp->Channels()->ActiveChannel()).Name())); });
    lblError->setVisible(false);
    ShowDriver();
    Quietly([&] { lblWaveform->setText(Q(GetWaveformName())); });
    Quietly([&] { lblReading->setText(Q(GetReadingText())); });
    FitLargeTexts();
    if (lblWaveform->text() == QLatin1String("DC"))
        Quietly([&] {
            const auto range = m_oIO->IviFgenGetRanges(IVIFGEN_ATTR_FUNC_DC_OFFSET, "");
            m_vDCRange[0] = range[0];
            m_vDCRange[1] = range[1];
        });
    Quietly([&] { DrawPreview(true); });
    m_lUiState = (m_lUiState & ~2) | 8;
}

void XUIFgen2::OnAllError(std::int32_t number, const std::string& description) {
    if (!(m_lUiState & 1) && m_bRunMode) {
        lblError->setToolTip(QStringLiteral("Error %1:  %2").arg(number).arg(Q(description)));
        lblError->setVisible(true);
    }
    m_lUiState |= 2;
}

void XUIFgen2::OnCollectionChanged(const std::string& name) {
    Quietly([&] {
        if (name == "QZIviFgenSequence" || m_oProp->DraggingKnob()) {
            // No preview on each step of a knob.
            if (m_lUiState != 0) UpdateChannelInfo();
            return;
        }
        if (!m_oErr || m_oErr->state() != IviStateConfigured) return;
        if (m_oProp->Channels()->Count() > 0) {
            Quietly([&] { DrawPreview(false); });
            UpdateChannelInfo();
            if (m_oProp->Channels()->Count() == 1) UpdateChannelArrows();
        } else {
            ShowNoChannels();
        }
    });
}

// ---- What it shows -----------------------------------------------------------------------------

void XUIFgen2::UpdateChannelInfo() {
    lblChannel->setText(Q(Set(m_oProp->Channels()->ActiveChannel()).Name()));
    lblReading->setText(Q(GetReadingText()));
    FitLargeTexts();
    lblWaveform->setText(Q(GetWaveformName()));
}

std::string XUIFgen2::GetFormattedReading(double value, bool noDecimals) const {
    std::string out;
    double parsed = 0;
    FormatValueWithUnit(text::FormatNumber(value), out, parsed, "Hz", noDecimals ? 0 : 6);
    return out;
}

std::string XUIFgen2::GetWaveformName() const {
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    switch (m_oProp->OutputMode()) {
    case qzivifgenOutputFunc: {
        static const char* const kNames[] = {"Sine",    "Square",    "Triangle",
                                             "Ramp Up", "Ramp Down", "DC"};
        const std::int32_t w = channel.FuncWaveform();
        return w >= 1 && w <= 6 ? kNames[w - 1] : "";
    }
    case qzivifgenOutputArb:
        return Set(channel.ArbWaveform()).Name();
    case qzivifgenOutputSeq:
        return Set(channel.Sequence()).Name();
    default:
        return "";
    }
}

std::string XUIFgen2::GetReadingText() const {
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    switch (m_oProp->OutputMode()) {
    case qzivifgenOutputFunc:
        if (channel.FuncWaveform() == qzivifgenWaveformDC) {
            std::string out;
            double value = 0;
            FormatValueWithUnit(text::FormatNumber(channel.FuncDCOffset()), out, value, "V", 2);
            return out;
        }
        return GetFormattedReading(channel.FuncFrequency());
    case qzivifgenOutputArb:
    case qzivifgenOutputSeq: {
        if (m_oProp->Extensions() & qzivifgenArbFrequencyExt)
            return GetFormattedReading(channel.ArbFrequency());
        const std::int32_t size = Set(channel.ArbWaveform()).DataSize();
        if (size == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
        return GetFormattedReading(m_oProp->ArbSampleRate() / size);
    }
    default:
        return "";
    }
}

// About one point of the preview for each pixel of the graph.
std::int32_t XUIFgen2::PreviewInterval(std::int64_t size) const {
    const double pixels = std::max(1, m_oGraph->width());
    return static_cast<std::int32_t>(
        std::max<std::int64_t>(1, std::llround(static_cast<double>(size) / pixels)));
}

void XUIFgen2::DrawPreview(bool checkExtensions) {
    const std::int32_t ext = checkExtensions ? m_oProp->Extensions() : -1;
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    switch (m_oProp->OutputMode()) {
    case qzivifgenOutputFunc:
        if (ext & qzivifgenStdFuncExt) PlotFunction(CyclesForFrequency(channel.FuncFrequency()));
        break;
    case qzivifgenOutputArb:
        if (ext & qzivifgenArbWfmExt) {
            auto& waveform = Set(channel.ArbWaveform());
            // A held waveform is shown whole: the graph reduces its points to its columns.
            PlotArbData(waveform.Source() != qzivifgenpersisted
                            ? waveform.GetDataSample(0, PreviewInterval(waveform.DataSize()), -1)
                            : waveform.Data());
        }
        break;
    case qzivifgenOutputSeq:
        if (ext & qzivifgenArbSeqExt) PlotSequenceData();
        break;
    default:
        break;
    }
}

void XUIFgen2::PlotFunction(std::int32_t cycles) {
    const auto& channel = Set(m_oProp->Channels()->ActiveChannel());
    double dc = 0;
    if (channel.FuncWaveform() == qzivifgenWaveformDC) {
        std::string out;
        FormatValueWithUnit(GetReadingText(), out, dc, "V", 3); // the value shown
    }
    const FunctionPreview preview =
        BuildFunctionPoints(channel.FuncWaveform(), cycles, dc, m_vDCRange[0], m_vDCRange[1]);
    QZGraph& g = *m_oGraph;
    g.XAxis().Inverted(preview.xInverted);
    g.XAxis().Minimum(preview.xMinimum);
    g.XAxis().Maximum(preview.xMaximum);
    g.YAxis().Minimum(preview.yMinimum);
    g.YAxis().Maximum(preview.yMaximum);
    g.PlotY(preview.points);
}

void XUIFgen2::PlotArbData(std::shared_ptr<const std::vector<double>> data) {
    if (!data || data->empty()) RaiseRuntime(runtime::kWrongType, "Type mismatch: no points.");
    const auto [low, high] = std::minmax_element(data->begin(), data->end());
    QZGraph& g = *m_oGraph;
    g.XAxis().Inverted(false);
    g.ClearData();
    g.XAxis().Minimum(0);
    g.XAxis().Maximum(static_cast<double>(data->size() - 1));
    g.YAxis().Minimum(std::min(0.0, *low)); // both limits include 0
    g.YAxis().Maximum(std::max(0.0, *high));
    g.PlotY(std::move(data));
}

void XUIFgen2::PlotSequenceData() {
    auto& sequence = Set(Set(m_oProp->Channels()->ActiveChannel()).Sequence());
    sequence.CollapseIterations(true); // each item once
    const auto blocks = sequence.GetDataSample(0, PreviewInterval(sequence.PreviewDataSize()), -1);
    auto points = std::make_shared<std::vector<double>>();
    for (const auto& block : blocks)
        if (block) points->insert(points->end(), block->begin(), block->end());
    double low = 0, high = 0;
    for (double v : *points) {
        low = std::min(low, v);
        high = std::max(high, v);
    }
    QZGraph& g = *m_oGraph;
    g.ClearData();
    g.XAxis().Inverted(false);
    g.XAxis().Minimum(0);
    g.XAxis().Maximum(static_cast<double>(points->size()));
    g.YAxis().Minimum(low);
    g.YAxis().Maximum(high);
    g.PlotY(std::shared_ptr<const std::vector<double>>(std::move(points)));
}

void XUIFgen2::StepChannel(bool previous) {
    auto& channels = *m_oProp->Channels();
    std::int32_t i = channels.IndexOfObject(&Set(channels.ActiveChannel()));
    if (previous)
        i = i - 1 < 1 ? channels.Count() : i - 1;
    else
        i = i + 1 > channels.Count() ? 1 : i + 1;
    channels.ActiveChannel(channels.Item(i));
}

void XUIFgen2::UpdateChannelArrows() {
    const bool several = m_oProp && m_oProp->Channels()->Count() >= 2;
    for (int i = 0; i < 2; ++i) {
        pictChangeChan[i]->setPixmap(m_oPictures[several ? i : i + 2]);
        pictChangeChan[i]->setEnabled(several);
    }
}

void XUIFgen2::ShowNoChannels() {
    lblReading->setText(QStringLiteral("Off"));
    lblChannel->setText(QStringLiteral("<No Channels>"));
    FitLargeTexts();
    lblWaveform->clear();
    lblDriver->clear();
    lblSimulated->setVisible(false);
    m_oGraph->ClearData();
    UpdateChannelArrows();
}

} // namespace qzivi
