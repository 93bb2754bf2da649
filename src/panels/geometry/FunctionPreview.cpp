#include "qzivi/panels/FunctionPreview.h"

#include "qzivi/panels/MUiAndStringUtil.h"

#include <algorithm>
#include <cmath>

namespace qzivi {

Decade FindDecade(double frequency) {
    const double top = std::pow(10.0, std::floor(Log10Abs(frequency, true)) + 1);
    return {top / 10, top};
}

std::int32_t CyclesForFrequency(double frequency) {
    const Decade decade = FindDecade(frequency);
    const double d = decade.top - decade.bottom;
    for (std::int32_t cls = 1; cls <= 4; ++cls)
        if (cls * d / 5 > frequency) return cls;
    return 5;
}

namespace {

std::vector<double> Sine(std::int32_t cls) {
    std::vector<double> y(50);
    for (int i = 0; i < 50; ++i)
        y[static_cast<std::size_t>(i)] = 20 * std::sin(((cls * i) / 20.0) * 1.8);
    return y;
}

std::vector<double> Square(std::int32_t cls) {
    static constexpr int kHalf[] = {20, 16, 12, 8, 4};
    const int half = kHalf[std::clamp(cls, 1, 5) - 1];
    std::vector<double> y(50);
    bool upper = true;
    for (int i = 1; i <= 50; ++i) {
        if (i % half == 0) upper = !upper;
        y[static_cast<std::size_t>(i - 1)] = upper ? 20 : -20;
    }
    return y;
}

std::vector<double> Triangle(std::int32_t cls) {
    static constexpr int kStep[] = {1, 2, 4, 5, 10};
    const int step = kStep[std::clamp(cls, 1, 5) - 1];
    std::vector<double> y(50);
    int value = 0, direction = -1;
    for (int i = 0; i < 50; ++i) {
        if (value == 0 || value == 40) direction = -direction;
        value += direction * step;
        y[static_cast<std::size_t>(i)] = value;
    }
    return y;
}

std::vector<double> Ramp(std::int32_t cls) {
    static constexpr int kPeriod[] = {40, 30, 20, 15, 10};
    static constexpr int kScale[] = {1, 2, 4, 5, 8};
    const int k = std::clamp(cls, 1, 5) - 1;
    std::vector<double> y(50);
    for (int i = 0; i < 50; ++i)
        y[static_cast<std::size_t>(i)] = (i % kPeriod[k]) * kScale[k];
    return y;
}

} // namespace

FunctionPreview BuildFunctionPoints(std::int32_t waveform, std::int32_t cycles, double dcValue,
                                    double dcMinimum, double dcMaximum) {
    FunctionPreview p;
    switch (waveform) {
    case 1:
        p.points = Sine(cycles);
        break;
    case 2:
        p.points = Square(cycles);
        break;
    case 3:
        p.points = Triangle(cycles);
        p.yMinimum = 0;
        p.yMaximum = 40;
        break;
    case 4:
    case 5:
        p.points = Ramp(cycles);
        p.xInverted = waveform == 5; // the ramp down is the ramp up, mirrored
        p.yMinimum = 0;
        p.yMaximum = *std::max_element(p.points.begin(), p.points.end());
        break;
    case 6:
        p.points.assign(100, dcValue);
        p.yMinimum = dcMinimum;
        p.yMaximum = dcMaximum;
        break;
    default:
        break;
    }
    return p;
}

} // namespace qzivi
