#include "qzivi/widgets/QZAxis.h"

#include <algorithm>
#include <cmath>

namespace qzivi {

double QZAxis::Fraction(double value) const {
    const double span = m_dMaximum - m_dMinimum;
    double f = span != 0 && std::isfinite(span) ? (value - m_dMinimum) / span : 0;
    if (!std::isfinite(f)) f = 0;
    f = std::clamp(f, 0.0, 1.0);
    return m_bInverted ? 1 - f : f;
}

double QZAxis::ValueAt(double fraction) const {
    fraction = std::clamp(fraction, 0.0, 1.0);
    if (m_bInverted) fraction = 1 - fraction;
    return m_dMinimum + fraction * (m_dMaximum - m_dMinimum);
}

QString AxisLabel(double value) {
    if (value == 0 || !std::isfinite(value)) return QStringLiteral("0");
    static const struct {
        double scale;
        const char* prefix;
    } kPrefixes[] = {{1e9, "G"},  {1e6, "M"},       {1e3, "k"}, {1, ""},
                     {1e-3, "m"}, {1e-6, "\u00b5"}, {1e-9, "n"}};
    const double magnitude = std::fabs(value);
    for (const auto& p : kPrefixes)
        if (magnitude >= p.scale * 0.9995 || p.scale == 1e-9)
            return QString::number(value / p.scale, 'g', 3) + QString::fromUtf8(p.prefix);
    return QString::number(value, 'g', 3);
}

} // namespace qzivi
