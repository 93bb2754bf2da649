// A two-second drag of the front panel's frequency knob against the simulator, in real time: a
// mouse move every 10 ms, the throttle's timers ticking on the Qt event loop. Reports the longest
// time one turn of the event loop took (the longest the operator waits for the panel to answer)
// and how many Configure runs the drag made.
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/widgets/QZKnob.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QMouseEvent>
#include <QThread>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <numbers>

namespace {

void Send(QWidget* target, QEvent::Type type, QPointF at) {
    const Qt::MouseButtons buttons =
        type == QEvent::MouseButtonRelease ? Qt::NoButton : Qt::LeftButton;
    QMouseEvent event(type, at, target->mapToGlobal(at), Qt::LeftButton, buttons, Qt::NoModifier);
    QApplication::sendEvent(target, &event);
}

void BM_KnobDragTwoSeconds(benchmark::State& state) {
    qputenv("QZIVI_SESSION_MANAGER", "none");
    qzivi::QZIviFgenWidget form;
    form.setProperty("UIStyle", 1);
    form.Control().ExceptionOnError(false);
    form.Control().Channels()->Add();
    form.Control().Configure();
    form.show();
    auto* knob = form.findChild<qzivi::QZKnob*>(QStringLiteral("knobFgen0"));
    const QPointF centre = QRectF(knob->rect()).center();
    const double radius = knob->width() / 4.0;
    const auto at = [&](double degrees) {
        const double a = degrees * std::numbers::pi / 180;
        return centre + QPointF(radius * std::cos(a), -radius * std::sin(a));
    };
    int runs = 0;
    const auto counted = form.Control().Configured.Connect([&] { ++runs; });
    double longest = 0;
    for (auto _ : state) {
        runs = 0;
        QElapsedTimer clock;
        clock.start();
        const auto turn = [&](auto&& step) {
            QElapsedTimer one;
            one.start();
            step();
            QApplication::processEvents();
            longest = std::max(longest, static_cast<double>(one.nsecsElapsed()) / 1e6);
        };
        turn([&] { Send(knob, QEvent::MouseButtonPress, at(200)); });
        for (int step = 1; step <= 200; ++step) {
            while (clock.elapsed() < step * 10) { // idle turns of the loop between moves
                QThread::usleep(200);
                turn([] {});
            }
            turn([&] { Send(knob, QEvent::MouseMove, at(200 - step)); });
        }
        turn([&] { Send(knob, QEvent::MouseButtonRelease, at(-10)); });
        state.counters["configure_runs"] = runs;
    }
    state.counters["longest_turn_ms"] = longest;
}

BENCHMARK(BM_KnobDragTwoSeconds)->Unit(benchmark::kMillisecond)->Iterations(3);

} // namespace

int main(int argc, char** argv) {
    qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
