// QZIviFgenWidget: the control on a Qt form. It hosts one QZIviFgen and serves it as its host
// (user mode, display name, size, the panel made by class name, visibility, the Tab key, the
// About box). The root's values are properties of the widget, made from the root's property table,
// and the whole tree is one more property: `propertyBag` holds the bag's bytes for code, and
// `configuration` the same as text, which a .ui file keeps. The control's events are Qt signals.
#pragma once

#include "qzivi/control/Host.h"
#include "qzivi/control/QZIviFgen.h"

#include <QByteArray>
#include <QWidget>

#include <functional>
#include <map>
#include <memory>

namespace qzivi {

class QZIviFgenWidget : public QWidget, private IQZIviFgenHost {
    Q_OBJECT
    Q_PROPERTY(QByteArray propertyBag READ PropertyBagContents WRITE SetPropertyBagContents
                   DESIGNABLE false STORED false)
    // The same bytes as base64 text, which a .ui file can hold and uic code gives back.
    Q_PROPERTY(QString configuration READ configuration WRITE setConfiguration)
    Q_PROPERTY(bool userMode READ InUserMode WRITE SetUserMode DESIGNABLE false STORED false)

public:
    // `userMode` false: the control is on a form being designed.
    explicit QZIviFgenWidget(QWidget* parent = nullptr, bool userMode = true);
    ~QZIviFgenWidget() override;

    QZIviFgen& Control() { return *m_oControl; }
    bool InUserMode() const { return m_bUserMode; }
    void SetUserMode(bool userMode);

    // The whole tree as the bag's bytes; a write loads it as a stored instance.
    QByteArray PropertyBagContents() const;
    void SetPropertyBagContents(const QByteArray& contents);
    QString configuration() const { return QString::fromLatin1(PropertyBagContents().toBase64()); }
    void setConfiguration(const QString& text) {
        SetPropertyBagContents(QByteArray::fromBase64(text.toLatin1()));
    }

    // Panels by class name ("QZIviFgenLib.XUIFgen1"): what AddChild makes.
    using PanelMaker = std::function<QWidget*(QWidget* parent)>;
    static void RegisterPanel(const std::string& className, PanelMaker maker);

    QSize sizeHint() const override;

signals:
    void IviError(int code, const QString& source, const QString& description);
    void IviWarning(int code, const QString& source, const QString& description);
    void Configured();
    void Initialized();
    void PropertyChanged(const QString& name);

protected:
    bool event(QEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void focusInEvent(QFocusEvent* event) override;

private:
    // ---- IQZIviFgenHost ----
    bool UserMode() const override { return m_bUserMode; }
    std::string DisplayName() const override;
    float Width() const override { return static_cast<float>(width()); }
    float Height() const override { return static_cast<float>(height()); }
    void SetSize(float width, float height) override;
    std::shared_ptr<IQZIviFgenPanel> AddChild(const std::string& className,
                                              const std::string& key) override;
    void RemoveChild(const std::string& key) override;
    bool FormEntryVisible() const override { return !isHidden(); }
    void SetFormEntryVisible(bool visible) override { setVisible(visible); }
    void PropertyChanged(const std::string& name) override;
    void SendTab() override { focusNextChild(); }
    void ShowAboutBox() override;

    // The root's values as dynamic properties of this widget, both ways.
    void PublishRootProperty(const std::string& name);
    void TakeRootProperty(const QByteArray& name);

    bool m_bUserMode;
    bool m_bPublishing = false;
    QWidget* m_oPanelWidget = nullptr;
    std::unique_ptr<QZIviFgen> m_oControl;
    Connection m_cError, m_cWarning, m_cConfigured, m_cInitialized;
};

} // namespace qzivi
