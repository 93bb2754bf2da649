// The display panel's picture of a standard function: not the real signal but the shape, with
// more cycles for a higher frequency within its decade, on fixed scales. Pure arithmetic, so the
// tests reach it without a widget.
#pragma once

#include <cstdint>
#include <vector>

namespace qzivi {

struct Decade {
    double bottom;
    double top;
};

// The powers of ten around `frequency`: 1.5 kHz lies in 1 kHz to 10 kHz.
Decade FindDecade(double frequency);
// 1 to 5: the fifth of the decade that `frequency` falls in.
std::int32_t CyclesForFrequency(double frequency);

struct FunctionPreview {
    std::vector<double> points;
    double xMinimum = 0, xMaximum = 49;
    double yMinimum = -20, yMaximum = 20;
    bool xInverted = false;
};

// The preview of `waveform` (1 sine to 6 DC) of class `cycles`; a DC level shows at `dcValue`
// between the driver's limits. Another waveform gives no points.
FunctionPreview BuildFunctionPoints(std::int32_t waveform, std::int32_t cycles, double dcValue = 0,
                                    double dcMinimum = -10, double dcMaximum = 10);

} // namespace qzivi
