// The plot of a 10-million-point waveform at 1000 pixels wide: PlotY and the first paint (which
// reduces the points to columns), and a repaint alone (which draws the columns again).
#include "qzivi/widgets/QZGraph.h"

#include <QApplication>
#include <QImage>

#include <benchmark/benchmark.h>

#include <cmath>
#include <memory>

namespace {

std::shared_ptr<const std::vector<double>> Points() {
    static const auto points = [] {
        auto p = std::make_shared<std::vector<double>>(10'000'000);
        for (std::size_t i = 0; i < p->size(); ++i)
            (*p)[i] =
                std::sin(static_cast<double>(i) * 2e-6) + 0.1 * std::sin(static_cast<double>(i));
        return std::shared_ptr<const std::vector<double>>(p);
    }();
    return points;
}

struct Plot {
    qzivi::QZGraph graph;
    QImage image{1000, 400, QImage::Format_RGB32};
    Plot() {
        graph.resize(image.size());
        graph.XAxis().Maximum(1e7 - 1);
        graph.YAxis().Minimum(-1.5);
        graph.YAxis().Maximum(1.5);
        graph.render(&image); // polished, so that the font and the plot area stay
    }
};

void BM_PlotYAndPaint10M(benchmark::State& state) {
    Plot plot;
    const auto points = Points();
    for (auto _ : state) {
        plot.graph.PlotY(points);
        plot.graph.render(&plot.image);
    }
}

void BM_Repaint10M(benchmark::State& state) {
    Plot plot;
    plot.graph.PlotY(Points());
    plot.graph.render(&plot.image);
    for (auto _ : state)
        plot.graph.render(&plot.image);
}

BENCHMARK(BM_PlotYAndPaint10M)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Repaint10M)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char** argv) {
    qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
