// The control on a Qt form: its properties from the root's table, the tree kept in one property
// so that a form saved and loaded again gives the same tree, the panel of design time, the events
// as signals, and the start-up configure on Qt's event loop.
#include "qzivi/control/PageLink.h"
#include "qzivi/panels/XUILess.h"
#include "qzivi/qt/QZIviFgenWidget.h"

#include <QSignalSpy>
#include <QTest>

#include <cstdlib>

using namespace qzivi;

class HostTest : public QObject {
    Q_OBJECT

private slots:
    void initTestCase() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        ::unsetenv("QZIVI_CONFIG_STORE");
    }

    void aFormSavedAndLoadedAgainGivesTheSameTree() {
        QZIviFgenWidget saved;
        saved.setObjectName("Fgen1");
        QVERIFY(saved.setProperty("LogicalName", "Bench") == false); // a dynamic property
        QCOMPARE(saved.Control().LogicalName(), std::string("Bench"));
        saved.setProperty("ArbSampleRate", 2.5e6);
        saved.setProperty("Extensions", 0x3FF);
        const auto channel = saved.Control().Channels()->Add("Channel1");
        channel->FuncFrequency(1234.5);
        saved.Control().Waveforms()->Add("Ramp")->Data({-1, 0, 1, 0.5});
        saved.Control().Configurations()->Add("Snapshot");
        const QByteArray bag = saved.property("propertyBag").toByteArray();
        QVERIFY(bag.startsWith("QZPB"));

        QZIviFgenWidget loaded;
        loaded.setProperty("propertyBag", bag);
        QCOMPARE(loaded.property("propertyBag").toByteArray(), bag);
        QCOMPARE(loaded.property("LogicalName").toString(), QStringLiteral("Bench"));
        QCOMPARE(loaded.property("ArbSampleRate").toDouble(), 2.5e6);
        QCOMPARE(loaded.Control().Channels()->Item(1)->FuncFrequency(), 1234.5);
        QCOMPARE(loaded.Control().Configurations()->Count(), 1);
        // A put through the control shows in the widget's property.
        loaded.Control().OutputMode(2);
        QCOMPARE(loaded.property("OutputMode").toInt(), 2);
    }

    void aRefusedValueKeepsTheOldOneAndSaysWhy() {
        QZIviFgenWidget widget;
        widget.Control().ExceptionOnError(false);
        QSignalSpy errors(&widget, &QZIviFgenWidget::IviError);
        widget.setProperty("UIStyle", 7);
        QCOMPARE(widget.property("UIStyle").toInt(), 1);
        QCOMPARE(errors.count(), 1);
        QCOMPARE(errors.at(0).at(0).toInt(), -30002);

        const QByteArray before = widget.PropertyBagContents();
        widget.setProperty("propertyBag", QByteArray("QZPB\x01garbage"));
        QCOMPARE(errors.count(), 2);
        QCOMPARE(errors.at(1).at(0).toInt(), -31609);
        QCOMPARE(widget.PropertyBagContents(), before);
    }

    void anApplyFromThePagesRepublishesEveryProperty() {
        QZIviFgenWidget widget;
        CPPObjWrapper page;
        page.SelectionChanged(widget.Control());
        page.Props()->ArbSampleRate(2e6);
        page.Props()->AutoConfigure(true);
        QCOMPARE(widget.property("ArbSampleRate").toDouble(), widget.Control().ArbSampleRate());
        QSignalSpy changed(&widget, qOverload<const QString&>(&QZIviFgenWidget::PropertyChanged));
        page.ApplyChanges(true);
        QCOMPARE(widget.property("ArbSampleRate").toDouble(), 2e6);
        QCOMPARE(widget.property("AutoConfigure").toBool(), true);
        QCOMPARE(changed.last().at(0).toString(), QString());
    }

    void atDesignTimeStyleZeroShowsTheIconAndAtRunTimeNothing() {
        QZIviFgenWidget designed(nullptr, false);
        designed.setProperty("UIStyle", 0);
        const auto* icon = designed.findChild<XUILess*>();
        QVERIFY(icon != nullptr);
        QCOMPARE(designed.size(), QSize(29, 29));
        designed.show();
        designed.resize(500, 500);
        QCOMPARE(designed.size(), QSize(29, 29)); // the panel has the last word
        QCOMPARE(icon->UiState() & 1, 1);

        QZIviFgenWidget running;
        running.show();
        running.setProperty("UIStyle", 0);
        QVERIFY(running.findChild<XUILess*>() == nullptr);
        QVERIFY(running.isHidden());
        QCOMPARE(running.size(), QSize(0, 0));
    }

    void eventsBecomeSignalsAndTheStartUpConfigureRunsOnTheEventLoop() {
        QZIviFgenWidget widget;
        QSignalSpy errors(&widget, &QZIviFgenWidget::IviError);
        QSignalSpy configured(&widget, &QZIviFgenWidget::Configured);
        widget.Control().ExceptionOnError(false);
        widget.Control().Configure();
        QCOMPARE(errors.count(), 1);
        QCOMPARE(errors.at(0).at(0).toInt(), -31620);

        QZIviFgenWidget source;
        source.Control().Channels()->Add("Channel1");
        source.setProperty("AutoConfigure", true);
        QZIviFgenWidget loaded;
        QSignalSpy started(&loaded, &QZIviFgenWidget::Configured);
        loaded.setProperty("propertyBag", source.PropertyBagContents());
        QCOMPARE(started.count(), 0); // not during the load
        QVERIFY(started.wait(2000));
        QCOMPARE(started.count(), 1);
        QVERIFY(loaded.Control().SessionHandle() != 0);
    }
};

QTEST_MAIN(HostTest)
#include "host_test.moc"
