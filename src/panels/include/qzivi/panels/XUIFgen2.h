// XUIFgen2: the display panel, the strip of an instrument's display. It shows the driver, an error
// lamp whose tool tip holds the message, the simulation mark, the channel, its reading and a
// preview of the output (the shape of a standard function, the points of a waveform or of a
// sequence), and lets the operator step through the channels. It reads the tree and the driver;
// it writes only ActiveChannel.
#pragma once

#include "qzivi/control/Panel.h"
#include "qzivi/panels/CUiSizingTool.h"
#include "qzivi/support/event.h"

#include <QLabel>
#include <QPixmap>
#include <QWidget>

#include <memory>
#include <vector>

namespace qzivi {

class QZGraph;
class SizedWidget;

class XUIFgen2 : public QWidget, public IQZIviFgenPanel {
    Q_OBJECT

public:
    static constexpr int kDesignWidthTwips = 4815;
    static constexpr int kDesignHeightTwips = 1410;

    explicit XUIFgen2(QWidget* parent = nullptr);
    ~XUIFgen2() override;

    // ---- The panel contract ----
    void Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> propSet,
                   std::shared_ptr<CIviErrorReport> errorReport) override;
    void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) override;
    void Enabled(bool enabled) override;
    void Size(float width, float height) override;
    float Width() const override { return static_cast<float>(width()); }
    float Height() const override { return static_cast<float>(height()); }
    std::int32_t UiState() const override { return m_lUiState; }
    void UiState(std::int32_t state) override;
    void Visible(bool visible) override { setVisible(visible); }
    void Move(float left, float top) override {
        move(static_cast<int>(left), static_cast<int>(top));
    }

    // ---- For XUIFgen1 ----
    void UpdateChannelInfo();
    std::string GetFormattedReading(double value, bool noDecimals = false) const;

    QZGraph& Graph() { return *m_oGraph; }
    QSize sizeHint() const override;

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    QLabel* AddLabel(const char* name, int left, int top, int width, int height, double points,
                     std::uint32_t bgr, Qt::Alignment alignment, bool visible, const char* text,
                     int tag);
    void OnInitialized();
    void OnConfigured();
    void OnAllError(std::int32_t number, const std::string& description);
    void OnCollectionChanged(const std::string& name);
    void DrawPreview(bool checkExtensions);
    void PlotFunction(std::int32_t cycles);
    void PlotArbData(std::shared_ptr<const std::vector<double>> data);
    void PlotSequenceData();
    std::string GetWaveformName() const;
    std::string GetReadingText() const;
    void StepChannel(bool previous);
    void UpdateChannelArrows();
    void ShowNoChannels();
    void ShowDriver();
    void FitLargeTexts();
    bool HasOutputExtension() const;
    std::int32_t PreviewInterval(std::int64_t size) const;

    CIviFgenIOImp* m_oIO = nullptr;
    std::shared_ptr<CIviFgenPropImp> m_oProp;
    std::shared_ptr<CIviErrorReport> m_oErr;
    Connection m_cConfigured, m_cInitialized, m_cAllError, m_cCollectionChanged;
    std::int32_t m_lUiState = 0;
    bool m_bRunMode = false;
    double m_vDCRange[2] = {-10, 10};

    QLabel *lblDriver, *lblError, *lblWaveform, *lblSimulated, *lblChannel, *lblReading;
    QLabel* pictChangeChan[2];
    QZGraph* m_oGraph;
    QPixmap m_oPictures[4]; // green up, green down, grey up, grey down
    std::vector<std::unique_ptr<SizedWidget>> m_oSized;
    CUiSizingTool m_oSizing;
};

} // namespace qzivi
