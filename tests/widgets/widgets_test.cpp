// The closed controls as the panels use them: the knob's events on a drag, the wheel and the keys;
// the toggle's click only from the operator; the plot's column reduction and what it paints.
#include "qzivi/widgets/QZButton.h"
#include "qzivi/widgets/QZGraph.h"
#include "qzivi/widgets/QZKnob.h"

#include <QSignalSpy>
#include <QTest>
#include <QWheelEvent>

#include <cmath>
#include <numbers>

using namespace qzivi;

class WidgetsTest : public QObject {
    Q_OBJECT

private:
    // The point of the knob's face at a fraction of its scale.
    static QPoint AtFraction(const QZKnob& knob, double fraction) {
        const double degrees = 225 - 270 * fraction;
        const QPointF c(knob.width() / 2.0, knob.height() / 2.0);
        const double a = degrees * std::numbers::pi / 180;
        return (c + QPointF(20 * std::cos(a), -20 * std::sin(a))).toPoint();
    }

private slots:
    void knobDragFiresChangesThenOneCommit() {
        QZKnob knob;
        knob.resize(140, 124);
        knob.Index(2);
        knob.Minimum(0);
        knob.Maximum(100);
        QSignalSpy changed(&knob, &QZKnob::ValueChanged);
        QSignalSpy committed(&knob, &QZKnob::ValueCommitted);
        QSignalSpy pressed(&knob, &QZKnob::Pressed);
        QSignalSpy released(&knob, &QZKnob::Released);
        QTest::mousePress(&knob, Qt::LeftButton, {}, AtFraction(knob, 0.1));
        for (double f = 0.2; f <= 0.75; f += 0.1)
            QTest::mouseMove(&knob, AtFraction(knob, f));
        QTest::mouseRelease(&knob, Qt::LeftButton, {}, AtFraction(knob, 0.75));
        QCOMPARE(pressed.count(), 1);
        QCOMPARE(released.count(), 1);
        QVERIFY(changed.count() >= 6);
        QCOMPARE(committed.count(), 1);
        QCOMPARE(committed.at(0).at(0).toInt(), 2);
        QVERIFY(std::fabs(committed.at(0).at(1).toDouble() - 75) < 2);
        QCOMPARE(knob.Value(), committed.at(0).at(1).toDouble());
        // Past the end of the scale the pointer stops there.
        QTest::mousePress(&knob, Qt::LeftButton, {}, AtFraction(knob, 0.5));
        QTest::mouseMove(&knob, AtFraction(knob, 1.08));
        QTest::mouseRelease(&knob, Qt::LeftButton, {}, AtFraction(knob, 1.08));
        QCOMPARE(knob.Value(), 100.0);
    }

    void knobWheelAndKeysStepAndCommitEachChange() {
        QZKnob knob;
        knob.resize(70, 62);
        knob.Minimum(-5);
        knob.Maximum(5);
        knob.Value(0);
        QSignalSpy changed(&knob, &QZKnob::ValueChanged);
        QSignalSpy committed(&knob, &QZKnob::ValueCommitted);
        QWheelEvent wheel(QPointF(35, 31), knob.mapToGlobal(QPointF(35, 31)), QPoint(),
                          QPoint(0, 240), Qt::NoButton, Qt::NoModifier, Qt::NoScrollPhase, false);
        QApplication::sendEvent(&knob, &wheel);
        QCOMPARE(knob.Value(), 0.2);
        QCOMPARE(committed.count(), 1);
        QTest::keyClick(&knob, Qt::Key_Down);
        QTest::keyClick(&knob, Qt::Key_Down);
        QVERIFY(std::fabs(knob.Value()) < 1e-12);
        QTest::keyClick(&knob, Qt::Key_PageUp);
        QVERIFY(std::fabs(knob.Value() - 1) < 1e-12);
        QTest::keyClick(&knob, Qt::Key_End);
        QCOMPARE(knob.Value(), 5.0);
        QTest::keyClick(&knob, Qt::Key_Up);
        QCOMPARE(knob.Value(), 5.0);
        QCOMPARE(committed.count(), 6); // one commit a key, even at the end
        QCOMPARE(changed.count(), 5);   // no change at the end
        knob.Value(3);
        QCOMPARE(changed.count(), 5); // a put fires nothing
        QCOMPARE(knob.focusPolicy(), Qt::StrongFocus);
    }

    void buttonClicksOnlyForTheOperator() {
        QZButton button;
        button.resize(51, 31);
        button.Index(4);
        QSignalSpy clicks(&button, &QZButton::Click);
        button.Value(true);
        QCOMPARE(clicks.count(), 0);
        QTest::mouseClick(&button, Qt::LeftButton);
        QCOMPARE(clicks.count(), 1);
        QCOMPARE(clicks.at(0).at(0).toInt(), 4);
        QCOMPARE(button.Value(), false);
        QTest::keyClick(&button, Qt::Key_Space);
        QCOMPARE(clicks.count(), 2);
        QCOMPARE(button.Value(), true);
        // Pressed here, let go elsewhere: no click.
        QTest::mousePress(&button, Qt::LeftButton, {}, QPoint(5, 5));
        QTest::mouseRelease(&button, Qt::LeftButton, {}, QPoint(200, 200));
        QCOMPARE(clicks.count(), 2);
        button.setEnabled(false);
        QTest::mouseClick(&button, Qt::LeftButton);
        QCOMPARE(clicks.count(), 2);
    }

    void graphReducesLargeDataOncePerChange() {
        QZGraph graph;
        graph.resize(1000, 400);
        auto points = std::make_shared<std::vector<double>>(10'000'000);
        for (std::size_t i = 0; i < points->size(); ++i)
            (*points)[i] = std::sin(static_cast<double>(i) * 1e-5);
        (*points)[5'000'000] = 3;
        graph.XAxis().Minimum(0);
        graph.XAxis().Maximum(static_cast<double>(points->size() - 1));
        graph.YAxis().Minimum(-4);
        graph.YAxis().Maximum(4);
        graph.PlotY(std::shared_ptr<const std::vector<double>>(points));
        QCOMPARE(graph.Data().get(), points.get()); // shared, not copied
        const auto& columns = graph.Columns();
        QCOMPARE(static_cast<int>(columns.size()), static_cast<int>(graph.PlotArea().width()));
        const double highest =
            std::max_element(columns.begin(), columns.end(), [](auto& a, auto& b) {
                return a.high < b.high;
            })->high;
        QCOMPARE(highest, 3.0);
        QImage image(graph.size(), QImage::Format_RGB32);
        graph.render(&image);
        const auto* before = graph.Columns().data();
        graph.render(&image);
        QCOMPARE(graph.Columns().data(), before); // a repaint reduces nothing again
        // The trace is drawn in the plot, and the ground is black.
        int lit = 0;
        for (int x = 100; x < 900; ++x)
            for (int y = 0; y < 350; ++y)
                lit += qRed(image.pixel(x, y)) > 200 && qGreen(image.pixel(x, y)) > 180;
        QVERIFY(lit > 800);
        QCOMPARE(image.pixel(999, 0) & 0xFFFFFF, 0u);

        graph.PlotY(std::vector<double>{0, 1, 0, -1});
        QVERIFY(graph.Columns().empty()); // a few points: a line through each
        graph.ClearData();
        QVERIFY(!graph.Data());
    }
};

QTEST_MAIN(WidgetsTest)
#include "widgets_test.moc"
