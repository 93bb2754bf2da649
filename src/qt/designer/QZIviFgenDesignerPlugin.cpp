#include "QZIviFgenDesignerPlugin.h"

#include "qzivi/pages/CPageHost.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/qt/QZIviFgenWidget.h"

#include <QtDesigner/QDesignerFormEditorInterface>
#include <QtDesigner/QDesignerFormWindowCursorInterface>
#include <QtDesigner/QDesignerFormWindowInterface>
#include <QtDesigner/QDesignerTaskMenuExtension>
#include <QtDesigner/QExtensionFactory>
#include <QtDesigner/QExtensionManager>

#include <QAction>

namespace qzivi {

namespace {

// "Edit Properties…": the pages on the control of the form; what they apply goes back to the form
// through its cursor, so that the form counts as changed and saves it.
class TaskMenu : public QObject, public QDesignerTaskMenuExtension {
    Q_OBJECT
    Q_INTERFACES(QDesignerTaskMenuExtension)

public:
    TaskMenu(QZIviFgenWidget* widget, QObject* parent)
        : QObject(parent), m_oWidget(widget), m_oEdit(new QAction(tr("Edit Properties…"), this)) {
        connect(m_oEdit, &QAction::triggered, this, &TaskMenu::Edit);
    }
    QAction* preferredEditAction() const override { return m_oEdit; }
    QList<QAction*> taskActions() const override { return {m_oEdit}; }

private:
    void Edit() {
        const QString before = m_oWidget->configuration();
        CPageHost host({&m_oWidget->Control()}, m_oWidget->window());
        host.AddStandardPages();
        host.exec();
        const QString after = m_oWidget->configuration();
        if (after == before) return;
        if (auto* form = QDesignerFormWindowInterface::findFormWindow(m_oWidget))
            form->cursor()->setProperty(QStringLiteral("configuration"), after);
    }

    QZIviFgenWidget* m_oWidget;
    QAction* m_oEdit;
};

class TaskMenuFactory : public QExtensionFactory {
public:
    explicit TaskMenuFactory(QExtensionManager* parent) : QExtensionFactory(parent) {}

protected:
    QObject* createExtension(QObject* object, const QString& iid, QObject* parent) const override {
        auto* widget = qobject_cast<QZIviFgenWidget*>(object);
        if (!widget || iid != Q_TYPEID(QDesignerTaskMenuExtension)) return nullptr;
        return new TaskMenu(widget, parent);
    }
};

} // namespace

QZIviFgenDesignerPlugin::QZIviFgenDesignerPlugin(QObject* parent) : QObject(parent) {}

QString QZIviFgenDesignerPlugin::name() const {
    return QStringLiteral("qzivi::QZIviFgenWidget");
}

QString QZIviFgenDesignerPlugin::group() const {
    return QStringLiteral("Instruments");
}

QString QZIviFgenDesignerPlugin::toolTip() const {
    return tr("QZIviFgen: a function generator by its IVI logical name");
}

QString QZIviFgenDesignerPlugin::whatsThis() const {
    return tr("The QZIviFgen instrument control. Its task menu's \"Edit Properties…\" opens the "
              "property pages; the form keeps the whole configuration.");
}

QString QZIviFgenDesignerPlugin::includeFile() const {
    return QStringLiteral("qzivi/qt/QZIviFgenWidget.h");
}

QIcon QZIviFgenDesignerPlugin::icon() const {
    return LoadPictureFromResource(2001);
}

QWidget* QZIviFgenDesignerPlugin::createWidget(QWidget* parent) {
    return new QZIviFgenWidget(parent, false); // design mode: the panel shows, nothing runs
}

void QZIviFgenDesignerPlugin::initialize(QDesignerFormEditorInterface* core) {
    if (m_bInitialized) return;
    if (core && core->extensionManager())
        core->extensionManager()->registerExtensions(new TaskMenuFactory(core->extensionManager()),
                                                     Q_TYPEID(QDesignerTaskMenuExtension));
    m_bInitialized = true;
}

QString QZIviFgenDesignerPlugin::domXml() const {
    return QStringLiteral(R"(<ui language="c++" displayname="QZIviFgen">
 <widget class="qzivi::QZIviFgenWidget" name="qzIviFgen">
  <property name="geometry">
   <rect><x>0</x><y>0</y><width>520</width><height>400</height></rect>
  </property>
 </widget>
</ui>
)");
}

} // namespace qzivi

#include "QZIviFgenDesignerPlugin.moc"
