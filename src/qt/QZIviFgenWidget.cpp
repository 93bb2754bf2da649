#include "qzivi/qt/QZIviFgenWidget.h"

#include "qzivi/control/Panel.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/panels/MessageBoxes.h"
#include "qzivi/panels/XUIFgen1.h"
#include "qzivi/panels/XUIFgen2.h"
#include "qzivi/panels/XUILess.h"
#include "qzivi/qt/QtTickSource.h"
#include "qzivi/support/failure.h"

#include <QDynamicPropertyChangeEvent>
#include <QMessageBox>

namespace qzivi {

namespace {

std::map<std::string, QZIviFgenWidget::PanelMaker>& Panels() {
    static std::map<std::string, QZIviFgenWidget::PanelMaker> panels = {
        {"QZIviFgenLib.XUILess", [](QWidget* parent) { return new XUILess(parent); }},
        {"QZIviFgenLib.XUIFgen1", [](QWidget* parent) { return new XUIFgen1(parent); }},
        {"QZIviFgenLib.XUIFgen2", [](QWidget* parent) { return new XUIFgen2(parent); }},
    };
    return panels;
}

const PropertyRow<CIviFgenPropImp>* RootRow(std::string_view name) {
    for (const auto& row : CIviFgenPropImp::Properties())
        if (row.name == name) return &row;
    return nullptr;
}

QVariant ToVariant(const PropertyValue& value) {
    return std::visit(
        [](const auto& v) -> QVariant {
            using T = std::decay_t<decltype(v)>;
            if constexpr (std::is_same_v<T, std::string>)
                return QString::fromStdString(v);
            else
                return QVariant::fromValue(v);
        },
        value);
}

PropertyValue FromVariant(const QVariant& value, PropertyKind kind) {
    switch (kind) {
    case PropertyKind::Double:
        return value.toDouble();
    case PropertyKind::Bool:
        return value.toBool();
    case PropertyKind::Text:
        return value.toString().toStdString();
    default:
        return static_cast<std::int32_t>(value.toInt());
    }
}

QString Q(const std::string& text) {
    return QString::fromStdString(text);
}

} // namespace

void QZIviFgenWidget::RegisterPanel(const std::string& className, PanelMaker maker) {
    Panels()[className] = std::move(maker);
}

QZIviFgenWidget::QZIviFgenWidget(QWidget* parent, bool userMode)
    : QWidget(parent), m_bUserMode(userMode) {
    QtTickSource::Install();
    InstallQtMessageBoxes();
    setFocusPolicy(Qt::StrongFocus);
    m_oControl = std::make_unique<QZIviFgen>(static_cast<IQZIviFgenHost*>(this));
    m_cError = m_oControl->IviError.Connect(
        [this](std::int32_t code, const std::string& source, const std::string& text) {
            emit IviError(code, Q(source), Q(text));
        });
    m_cWarning = m_oControl->IviWarning.Connect(
        [this](std::int32_t code, const std::string& source, const std::string& text) {
            emit IviWarning(code, Q(source), Q(text));
        });
    m_cConfigured = m_oControl->Configured.Connect([this] { emit Configured(); });
    m_cInitialized = m_oControl->Initialized.Connect([this] { emit Initialized(); });
    connect(this, &QObject::objectNameChanged, this,
            [this] { m_oControl->AmbientChanged("DisplayName"); });
    m_oControl->InitProperties();
    PublishRootProperty("");
}

QZIviFgenWidget::~QZIviFgenWidget() {
    m_oControl.reset(); // it removes its panel while this widget still stands
}

void QZIviFgenWidget::SetUserMode(bool userMode) {
    m_bUserMode = userMode;
    m_oControl->AmbientChanged("UserMode");
}

std::string QZIviFgenWidget::DisplayName() const {
    return objectName().toStdString();
}

void QZIviFgenWidget::SetSize(float w, float h) {
    resize(static_cast<int>(w), static_cast<int>(h));
}

std::shared_ptr<IQZIviFgenPanel> QZIviFgenWidget::AddChild(const std::string& className,
                                                           const std::string&) {
    RemoveChild("UI");
    const auto maker = Panels().find(className);
    if (maker == Panels().end()) return nullptr; // a panel of another build: none
    m_oPanelWidget = maker->second(this);
    // A control that no form has sized yet takes the panel's design size.
    if (width() <= 1 || height() <= 1) resize(m_oPanelWidget->sizeHint());
    auto* panel = dynamic_cast<IQZIviFgenPanel*>(m_oPanelWidget);
    // The widget belongs to this form; the control only points at it until RemoveChild.
    return std::shared_ptr<IQZIviFgenPanel>(std::shared_ptr<void>(), panel);
}

void QZIviFgenWidget::RemoveChild(const std::string&) {
    delete m_oPanelWidget;
    m_oPanelWidget = nullptr;
}

QSize QZIviFgenWidget::sizeHint() const {
    return m_oPanelWidget ? m_oPanelWidget->sizeHint() : QSize(29, 29); // as the panel was drawn
}

void QZIviFgenWidget::PropertyChanged(const std::string& name) {
    PublishRootProperty(name);
    emit PropertyChanged(Q(name));
}

void QZIviFgenWidget::PublishRootProperty(const std::string& name) {
    if (name.empty()) { // "some": every row, as after an apply from the pages
        for (const auto& each : CIviFgenPropImp::Properties())
            PublishRootProperty(std::string(each.name));
        return;
    }
    const auto* row = RootRow(name);
    if (!row || !m_oControl) return;
    m_bPublishing = true;
    setProperty(row->name.data(), ToVariant(m_oControl->Property(name)));
    m_bPublishing = false;
}

void QZIviFgenWidget::TakeRootProperty(const QByteArray& name) {
    const auto* row = RootRow(name.toStdString());
    if (!row) return;
    try {
        m_oControl->Property(name.toStdString(), FromVariant(property(name), row->kind));
    } catch (const Failure&) { // reported through IviError; the property shows the value kept
    }
    PublishRootProperty(name.toStdString());
}

bool QZIviFgenWidget::event(QEvent* event) {
    if (event->type() == QEvent::DynamicPropertyChange && !m_bPublishing)
        TakeRootProperty(static_cast<QDynamicPropertyChangeEvent*>(event)->propertyName());
    return QWidget::event(event);
}

void QZIviFgenWidget::resizeEvent(QResizeEvent* event) {
    QWidget::resizeEvent(event);
    m_oControl->Resized();
}

void QZIviFgenWidget::focusInEvent(QFocusEvent* event) {
    QWidget::focusInEvent(event);
    m_oControl->GotFocus();
}

QByteArray QZIviFgenWidget::PropertyBagContents() const {
    PropertyBag bag;
    m_oControl->WriteProperties(bag);
    const Bytes bytes = bag.Contents();
    return QByteArray(reinterpret_cast<const char*>(bytes.data()),
                      static_cast<qsizetype>(bytes.size()));
}

void QZIviFgenWidget::SetPropertyBagContents(const QByteArray& contents) {
    PropertyBag bag;
    try {
        bag.SetContents(std::span(reinterpret_cast<const std::uint8_t*>(contents.constData()),
                                  static_cast<std::size_t>(contents.size())));
    } catch (const Failure& f) { // a damaged form: the tree stays as it was, and says why
        emit IviError(-31609, QStringLiteral("propertyBag"), Q(f.Description()));
        return;
    }
    m_oControl->ReadProperties(bag);
    PublishRootProperty("");
}

void QZIviFgenWidget::ShowAboutBox() {
    QString driver =
        tr("No session is open; the logical name is \"%1\".").arg(Q(m_oControl->LogicalName()));
    if (m_oControl->SessionHandle() != 0) try {
            auto& engine = m_oControl->Engine();
            const auto text = [&](ViAttr attribute) {
                return Q(engine.GetAttributeVi(AttrType::String, attribute, "").AsText());
            };
            driver = tr("Logical name \"%1\": %2 (%3), %4.")
                         .arg(Q(m_oControl->LogicalName()), text(IVI_ATTR_SPECIFIC_DRIVER_PREFIX),
                              text(IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION),
                              text(IVI_ATTR_INSTRUMENT_MODEL));
        } catch (const Failure&) { // a driver that cannot tell: the name alone
        }
    QMessageBox::about(this, tr("About QZIviFgen"),
                       tr("<b>QZIviFgen %1</b><p>An instrument control for function generators.</p>"
                          "<p>%2</p>")
                           .arg(QStringLiteral(QZIVI_VERSION), driver.toHtmlEscaped()));
}

} // namespace qzivi
