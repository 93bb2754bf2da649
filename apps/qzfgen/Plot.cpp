#include "Commands.h"

#ifdef QZFGEN_HAVE_QT
#include "qzivi/panels/MUiAndStringUtil.h"

#include <QGuiApplication>
#include <QImage>
#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cstdlib>
#endif

namespace qzfgen {

#ifdef QZFGEN_HAVE_QT

namespace {

QString Scale(double value, const char* unit) {
    return QString::fromStdString(qzivi::FormatScale(value, unit));
}

} // namespace

// A scope's look: black ground, a grid of 10 by 8, the trace in yellow, the scale in words.
bool WritePlot(const std::string& path, const std::vector<double>& volts, double rate,
               const std::string& title) {
    if (!qEnvironmentVariableIsSet("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString&) {
    }); // Qt's notes on its platform are no output of ours
    int argc = 1;
    char name[] = "qzfgen";
    char* argv[] = {name, nullptr};
    const QGuiApplication app(argc, argv);
    QImage image(900, 360, QImage::Format_RGB32);
    image.fill(Qt::black);
    QPainter painter(&image);
    painter.setRenderHint(QPainter::Antialiasing);
    const QRectF plot(70, 30, 810, 300);
    painter.setPen(QPen(QColor(70, 70, 70), 1));
    for (int i = 0; i <= 10; ++i)
        painter.drawLine(QPointF(plot.left() + plot.width() * i / 10, plot.top()),
                         QPointF(plot.left() + plot.width() * i / 10, plot.bottom()));
    for (int j = 0; j <= 8; ++j)
        painter.drawLine(QPointF(plot.left(), plot.top() + plot.height() * j / 8),
                         QPointF(plot.right(), plot.top() + plot.height() * j / 8));
    const auto [low, high] = std::minmax_element(volts.begin(), volts.end());
    const double top = std::max(*high, 0.0), bottom = std::min(*low, 0.0);
    const double span = (top - bottom > 0 ? top - bottom : 1) * 1.1; // a margin above and below
    const auto y = [&](double v) {
        return plot.bottom() - (v - bottom + span * 0.05 / 1.1) / span * plot.height();
    };
    QPainterPath trace;
    for (std::size_t k = 0; k < volts.size(); ++k) {
        const QPointF at(plot.left() +
                             plot.width() * static_cast<double>(k) /
                                 static_cast<double>(std::max<std::size_t>(1, volts.size() - 1)),
                         y(volts[k]));
        k == 0 ? trace.moveTo(at) : trace.lineTo(at);
    }
    painter.setPen(QPen(QColor(255, 221, 0), 1.5));
    painter.drawPath(trace);
    painter.setPen(Qt::lightGray);
    painter.drawText(QPointF(plot.left(), 20), QString::fromStdString(title));
    // The highest and lowest levels are marked where the trace has them, inside the margin.
    for (const double level : {top, bottom}) {
        const double at = y(level);
        painter.drawLine(QPointF(plot.left() - 4, at), QPointF(plot.left(), at));
        painter.drawText(QRectF(0, at - 10, plot.left() - 6, 20), Qt::AlignRight | Qt::AlignVCenter,
                         Scale(level, "V"));
    }
    const double seconds = static_cast<double>(volts.size()) / rate;
    painter.drawText(QRectF(plot.left(), plot.bottom() + 4, plot.width(), 24),
                     Qt::AlignLeft | Qt::AlignVCenter, Scale(seconds / 10, "s/div"));
    painter.drawText(QRectF(plot.left(), plot.bottom() + 4, plot.width(), 24),
                     Qt::AlignRight | Qt::AlignVCenter,
                     QString("%1 samples at %2").arg(volts.size()).arg(Scale(rate, "S/s")));
    painter.end();
    if (!image.save(QString::fromStdString(path), "PNG"))
        throw std::runtime_error("\"" + path + "\" cannot be written");
    return true;
}

#else

bool WritePlot(const std::string&, const std::vector<double>&, double, const std::string&) {
    return false;
}

#endif

} // namespace qzfgen
