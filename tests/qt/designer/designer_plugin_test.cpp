// The Qt Designer plugin as Designer and uic use it: loaded with QPluginLoader, the control made
// through it in design mode, a form saved to a .ui file and loaded again, and a form compiled by
// uic that brings its whole configuration along.
#include "platform/test_support.h"
#include "qzivi/model/Channels.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "ui_bench_form.h"

#include <QBuffer>
#include <QPluginLoader>
#include <QTest>
#include <QUiLoader>
#include <QVBoxLayout>
#include <QtDesigner/QFormBuilder>
#include <QtUiPlugin/QDesignerCustomWidgetInterface>

using qzivi::QZIviFgenWidget;

class DesignerPluginTest : public QObject {
    Q_OBJECT

    std::unique_ptr<qzivi::test::StoreScope> store_;
    QPluginLoader loader_{QStringLiteral(QZIVI_DESIGNER_PLUGIN)};

    QDesignerCustomWidgetInterface* Plugin() {
        return qobject_cast<QDesignerCustomWidgetInterface*>(loader_.instance());
    }

private slots:
    void init() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        store_ = std::make_unique<qzivi::test::StoreScope>();
    }
    void cleanup() { store_.reset(); }

    void thePluginOffersTheControlInDesignMode() {
        QDesignerCustomWidgetInterface* plugin = Plugin();
        QVERIFY2(plugin, qPrintable(loader_.errorString()));
        QCOMPARE(plugin->name(), QString("qzivi::QZIviFgenWidget"));
        QCOMPARE(plugin->includeFile(), QString("qzivi/qt/QZIviFgenWidget.h"));
        QVERIFY(plugin->domXml().contains(R"(class="qzivi::QZIviFgenWidget")"));
        QVERIFY(!plugin->icon().isNull());
        QWidget form;
        std::unique_ptr<QWidget> made(plugin->createWidget(&form));
        QVERIFY(made);
        // The plugin holds its own copy of the class, so the meta-object speaks for it, as it
        // does to Designer.
        QCOMPARE(made->metaObject()->className(), "qzivi::QZIviFgenWidget");
        QCOMPARE(made->property("userMode").toBool(), false);
        QVERIFY(made->property("configuration").toString().size() > 0);
        plugin->initialize(nullptr); // outside Designer: no task menu to register, no failure
        QVERIFY(plugin->isInitialized());
    }

    void aFormRoundTripsThroughAUiFile() {
        QZIviFgenWidget source;
        source.Control().LogicalName("Bench7");
        source.Control().Extensions(0x3FF);
        source.Control().Channels()->Add("Channel1")->FuncFrequency(2500);
        source.Control().Channels()->Add("Channel2")->FuncAmplitude(3.5);

        QWidget form;
        form.setObjectName("Bench");
        auto* layout = new QVBoxLayout(&form);
        QWidget* control = Plugin()->createWidget(&form);
        QVERIFY(control);
        control->setObjectName("fgen");
        layout->addWidget(control);
        control->setProperty("configuration", source.configuration());

        QBuffer ui;
        ui.open(QIODevice::WriteOnly);
        QFormBuilder().save(&ui, &form);
        QVERIFY(ui.data().contains("<property name=\"configuration\""));

        QUiLoader loader;
        loader.addPluginPath(QFileInfo(QStringLiteral(QZIVI_DESIGNER_PLUGIN)).absolutePath());
        QVERIFY(loader.availableWidgets().contains("qzivi::QZIviFgenWidget"));
        ui.close();
        ui.open(QIODevice::ReadOnly);
        std::unique_ptr<QWidget> loaded(loader.load(&ui));
        QVERIFY2(loaded, qPrintable(loader.errorString()));
        QWidget* again = loaded->findChild<QWidget*>("fgen");
        QVERIFY(again);
        QCOMPARE(again->metaObject()->className(), "qzivi::QZIviFgenWidget");
        QZIviFgenWidget check;
        check.setConfiguration(again->property("configuration").toString());
        QCOMPARE(check.PropertyBagContents(), source.PropertyBagContents());
        QCOMPARE(check.Control().Channels()->Item(2)->FuncAmplitude(), 3.5);
        QCOMPARE(check.Control().LogicalName(), std::string("Bench7"));
    }

    void aFormCompiledByUicBringsItsConfiguration() {
        QWidget form;
        Ui::BenchForm ui;
        ui.setupUi(&form);
        qzivi::QZIviFgen& control = ui.fgen->Control();
        QCOMPARE(control.LogicalName(), std::string("SampleFGen"));
        QCOMPARE(control.Channels()->Count(), 2);
        QCOMPARE(control.Channels()->Item(1)->FuncFrequency(), 1000.0);
        QCOMPARE(control.Channels()->Item(2)->FuncWaveform(), qzivi::qzivifgenWaveformSquare);
        QCOMPARE(control.UIStyle(), 1);
    }
};

QTEST_MAIN(DesignerPluginTest)
#include "designer_plugin_test.moc"
