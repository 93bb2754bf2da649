#include "qzivi/panels/XWinLabel.h"

#include "qzivi/model/PropertyBag.h"
#include "qzivi/panels/Pictures.h"

#include <QBuffer>
#include <QMouseEvent>

namespace qzivi {

namespace {

Qt::Alignment AlignmentOf(std::int16_t alignment) {
    const Qt::Alignment across = alignment == 1   ? Qt::AlignRight
                                 : alignment == 2 ? Qt::AlignHCenter
                                                  : Qt::AlignLeft;
    return across | Qt::AlignTop;
}

int ShiftOf(Qt::KeyboardModifiers modifiers) {
    return (modifiers & Qt::ShiftModifier ? 1 : 0) | (modifiers & Qt::ControlModifier ? 2 : 0) |
           (modifiers & Qt::AltModifier ? 4 : 0);
}

int ButtonOf(Qt::MouseButtons buttons) {
    return (buttons & Qt::LeftButton ? 1 : 0) | (buttons & Qt::RightButton ? 2 : 0) |
           (buttons & Qt::MiddleButton ? 4 : 0);
}

} // namespace

XWinLabel::XWinLabel(QWidget* parent) : QWidget(parent), m_oLabel(new QLabel(this)) {
    m_oLabel->setText(QStringLiteral("lbl"));
    m_oLabel->setAutoFillBackground(true);
    m_oLabel->setAlignment(AlignmentOf(0));
    m_oLabel->installEventFilter(this);
    ApplyColours();
}

void XWinLabel::ApplyColours() {
    QPalette palette = m_oLabel->palette();
    palette.setColor(QPalette::Window, ResolveColor(m_lBackColor, this->palette()));
    palette.setColor(QPalette::WindowText, ResolveColor(m_lForeColor, this->palette()));
    m_oLabel->setPalette(palette);
}

void XWinLabel::BackColor(std::uint32_t value) {
    m_lBackColor = value;
    ApplyColours();
    emit PropertyChanged(QStringLiteral("BackColor"));
}

void XWinLabel::ForeColor(std::uint32_t value) {
    m_lForeColor = value;
    ApplyColours();
    emit PropertyChanged(QStringLiteral("ForeColor"));
}

void XWinLabel::Enabled(bool value) {
    m_oLabel->setEnabled(value);
    emit PropertyChanged(QStringLiteral("Enabled"));
}

void XWinLabel::Font(const QFont& value) {
    m_oLabel->setFont(value);
    emit PropertyChanged(QStringLiteral("Font"));
}

void XWinLabel::Caption(const std::string& value) {
    if (value == m_sCaption) return;
    m_sCaption = value;
    m_oLabel->setText(QString::fromStdString(value));
    emit PropertyChanged(QStringLiteral("Caption"));
}

void XWinLabel::Alignment(std::int16_t value) {
    m_nAlignment = value;
    m_oLabel->setAlignment(AlignmentOf(value));
    emit PropertyChanged(QStringLiteral("Alignment"));
}

void XWinLabel::MousePointer(std::int16_t value) {
    m_nMousePointer = value;
    m_oLabel->setCursor(value == 99 && !m_oMouseIcon.isNull() ? QCursor(m_oMouseIcon.pixmap(32, 32))
                                                              : QCursor(Qt::ArrowCursor));
    emit PropertyChanged(QStringLiteral("MousePointer"));
}

void XWinLabel::MouseIcon(const QIcon& value) {
    m_oMouseIcon = value;
    emit PropertyChanged(QStringLiteral("MouseIcon"));
}

void XWinLabel::ToolTipText2(const std::string& value) {
    m_oLabel->setToolTip(QString::fromStdString(value));
    emit PropertyChanged(QStringLiteral("ToolTipText"));
}

void XWinLabel::resizeEvent(QResizeEvent* event) {
    m_oLabel->setGeometry(0, 0, width(), height());
    QWidget::resizeEvent(event);
}

bool XWinLabel::eventFilter(QObject* watched, QEvent* event) {
    if (watched != m_oLabel) return QWidget::eventFilter(watched, event);
    const QEvent::Type type = event->type();
    if (type != QEvent::MouseButtonPress && type != QEvent::MouseMove &&
        type != QEvent::MouseButtonRelease && type != QEvent::MouseButtonDblClick)
        return false;
    const auto* mouse = static_cast<QMouseEvent*>(event);
    const QPoint at = mouse->position().toPoint();
    const int button = ButtonOf(type == QEvent::MouseMove ? mouse->buttons() : mouse->button());
    const int shift = ShiftOf(mouse->modifiers());
    switch (type) {
    case QEvent::MouseButtonPress:
        emit MouseDown(button, shift, at.x(), at.y());
        break;
    case QEvent::MouseMove:
        emit MouseMove(button, shift, at.x(), at.y());
        break;
    case QEvent::MouseButtonRelease:
        emit MouseUp(button, shift, at.x(), at.y());
        if (m_oLabel->rect().contains(at)) emit Click();
        break;
    default:
        emit DblClick();
        break;
    }
    return false;
}

// The keys in their order, each with its default; a value at its default is not kept.
void XWinLabel::ReadProperties(const PropertyBag& bag) {
    m_lBackColor = static_cast<std::uint32_t>(
        bag.ReadInt32("BackColor", static_cast<std::int32_t>(kButtonFace)));
    m_lForeColor = static_cast<std::uint32_t>(
        bag.ReadInt32("ForeColor", static_cast<std::int32_t>(kButtonText)));
    ApplyColours();
    m_oLabel->setEnabled(bag.ReadBool("Enabled", true));
    QFont font = parentWidget() ? parentWidget()->font() : QWidget::font();
    const std::string fontText = bag.ReadText("Font", "");
    if (!fontText.empty()) font.fromString(QString::fromStdString(fontText));
    m_oLabel->setFont(font);
    m_oLabel->setText(QString::fromStdString(bag.ReadText("Caption", "lbl")));
    m_nAlignment = static_cast<std::int16_t>(bag.ReadInt32("Alignment", 0));
    m_oLabel->setAlignment(AlignmentOf(m_nAlignment));
    m_nMousePointer = static_cast<std::int16_t>(bag.ReadInt32("MousePointer", 0));
    const Bytes icon = bag.ReadBytes("MouseIcon");
    QPixmap pixmap;
    if (!icon.empty() && pixmap.loadFromData(icon.data(), static_cast<uint>(icon.size())))
        m_oMouseIcon = QIcon(pixmap);
    m_oLabel->setToolTip(QString::fromStdString(bag.ReadText("ToolTipText", "")));
}

void XWinLabel::WriteProperties(PropertyBag& bag) const {
    bag.WriteInt32("BackColor", static_cast<std::int32_t>(m_lBackColor),
                   static_cast<std::int32_t>(kButtonFace));
    bag.WriteInt32("ForeColor", static_cast<std::int32_t>(m_lForeColor),
                   static_cast<std::int32_t>(kButtonText));
    bag.WriteBool("Enabled", m_oLabel->isEnabled(), true);
    const QFont ambient = parentWidget() ? parentWidget()->font() : QWidget::font();
    bag.WriteText("Font",
                  m_oLabel->font() == ambient ? std::string()
                                              : m_oLabel->font().toString().toStdString(),
                  "");
    bag.WriteText("Caption", m_oLabel->text().toStdString(), "lbl");
    bag.WriteInt32("Alignment", m_nAlignment, 0);
    bag.WriteInt32("MousePointer", m_nMousePointer, 0);
    if (!m_oMouseIcon.isNull()) {
        QByteArray png;
        QBuffer buffer(&png);
        buffer.open(QIODevice::WriteOnly);
        m_oMouseIcon.pixmap(32, 32).save(&buffer, "PNG");
        bag.WriteBytes("MouseIcon", Bytes(png.begin(), png.end()));
    }
    bag.WriteText("ToolTipText", m_oLabel->toolTip().toStdString(), "");
}

} // namespace qzivi
