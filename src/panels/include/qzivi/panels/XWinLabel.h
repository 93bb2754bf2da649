// XWinLabel: a label that passes its properties and events on, and keeps them in a property bag.
// Every set tells the host (PropertyChanged with the bag key); the caption is held apart: after a
// load it reads empty until the first set, while the label shows the stored text.
#pragma once

#include <QIcon>
#include <QLabel>
#include <QWidget>

#include <cstdint>
#include <string>

namespace qzivi {

class PropertyBag;

class XWinLabel : public QWidget {
    Q_OBJECT

public:
    static constexpr std::uint32_t kButtonFace = 0x8000000F;
    static constexpr std::uint32_t kButtonText = 0x80000012;

    explicit XWinLabel(QWidget* parent = nullptr);

    std::uint32_t BackColor() const { return m_lBackColor; }
    void BackColor(std::uint32_t value);
    std::uint32_t ForeColor() const { return m_lForeColor; }
    void ForeColor(std::uint32_t value);
    bool Enabled() const { return m_oLabel->isEnabled(); }
    void Enabled(bool value);
    QFont Font() const { return m_oLabel->font(); }
    void Font(const QFont& value);
    void Refresh() { m_oLabel->update(); }
    // The held text, not the label's.
    const std::string& Caption() const { return m_sCaption; }
    // An equal text does nothing.
    void Caption(const std::string& value);
    // 0 left, 1 right, 2 centre.
    std::int16_t Alignment() const { return m_nAlignment; }
    void Alignment(std::int16_t value);
    std::int16_t MousePointer() const { return m_nMousePointer; }
    void MousePointer(std::int16_t value);
    const QIcon& MouseIcon() const { return m_oMouseIcon; }
    void MouseIcon(const QIcon& value);
    std::string ToolTipText2() const { return m_oLabel->toolTip().toStdString(); }
    void ToolTipText2(const std::string& value);

    // The text the label shows.
    QString Shown() const { return m_oLabel->text(); }

    void ReadProperties(const PropertyBag& bag);
    void WriteProperties(PropertyBag& bag) const;

signals:
    void PropertyChanged(const QString& key);
    void Click();
    void DblClick();
    void MouseDown(int button, int shift, int x, int y);
    void MouseMove(int button, int shift, int x, int y);
    void MouseUp(int button, int shift, int x, int y);

protected:
    void resizeEvent(QResizeEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void ApplyColours();

    QLabel* m_oLabel;
    std::string m_sCaption;
    std::uint32_t m_lBackColor = kButtonFace;
    std::uint32_t m_lForeColor = kButtonText;
    std::int16_t m_nAlignment = 0;
    std::int16_t m_nMousePointer = 0;
    QIcon m_oMouseIcon;
};

} // namespace qzivi
