// Renders the widgets as a person sees them, at one and two device pixels a pixel, into PNG files
// of the folder given: grab_widgets docs/images
#include "PanelWindow.h"
#include "qzivi/model/Channels.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/pages/PArb.h"
#include "qzivi/pages/PChannels.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/panels/XUILess.h"
#include "qzivi/panels/XWinLabel.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/widgets/QZButton.h"
#include "qzivi/widgets/QZGraph.h"
#include "qzivi/widgets/QZKnob.h"

#include <QApplication>
#include <QDir>
#include <QHBoxLayout>
#include <QListWidget>
#include <QMouseEvent>
#include <QPainter>
#include <QPixmap>
#include <QTabBar>
#include <QTabWidget>
#include <QTimer>

#include <cmath>
#include <fstream>
#include <random>

using namespace qzivi;

namespace {

void Save(QWidget& widget, const QString& folder, const QString& name) {
    widget.ensurePolished();
    for (const int ratio : {1, 2}) {
        QPixmap pixmap(widget.size() * ratio);
        pixmap.setDevicePixelRatio(ratio);
        pixmap.fill(widget.palette().color(QPalette::Window));
        widget.render(&pixmap);
        pixmap.save(QDir(folder).filePath(QStringLiteral("%1@%2x.png").arg(name).arg(ratio)));
    }
}

// A click of the left button, as the mouse gives it.
void Click(QWidget& widget, QPoint at) {
    for (const QEvent::Type type : {QEvent::MouseButtonPress, QEvent::MouseButtonRelease}) {
        QMouseEvent event(type, at, widget.mapToGlobal(at), Qt::LeftButton,
                          type == QEvent::MouseButtonPress ? Qt::LeftButton : Qt::NoButton,
                          Qt::NoModifier);
        QApplication::sendEvent(&widget, &event);
    }
}

} // namespace

int main(int argc, char** argv) {
    QApplication app(argc, argv);
    const QString folder = argc > 1 ? argv[1] : QStringLiteral(".");
    QDir().mkpath(folder);

    QWidget knobs;
    knobs.setPalette(QPalette(QColor(0x2b, 0x2e, 0x33)));
    knobs.setAutoFillBackground(true);
    auto* row = new QHBoxLayout(&knobs);
    const double values[] = {2.5e3, 7.5, -3};
    const double ranges[][2] = {{1e-6, 10e3}, {0, 10}, {-5, 5}};
    for (int i = 0; i < 3; ++i) {
        auto* knob = new QZKnob(&knobs);
        knob->setFixedSize(i == 0 ? 100 : 80, i == 0 ? 88 : 72);
        knob->Minimum(ranges[i][0]);
        knob->Maximum(ranges[i][1]);
        knob->Value(values[i]);
        row->addWidget(knob);
    }
    knobs.resize(320, 110);
    Save(knobs, folder, "qzknob");

    // The eight function keys of the front panel, the sine pressed.
    QWidget buttons;
    buttons.setPalette(QPalette(QColor(0x2b, 0x2e, 0x33)));
    buttons.setAutoFillBackground(true);
    auto* line = new QHBoxLayout(&buttons);
    const int off[] = {5001, 5002, 5003, 5004, 5005, 5006, 5100, 5150};
    const int onPictures[] = {5051, 5052, 5053, 5054, 5055, 5056, 5101, 5151};
    for (int i = 0; i < 8; ++i) {
        auto* button = new QZButton(&buttons);
        button->setFixedSize(51, 31);
        button->OffPicture(LoadPictureFromResource(off[i]));
        button->OnPicture(LoadPictureFromResource(onPictures[i]));
        button->Value(i == 0);
        line->addWidget(button);
    }
    buttons.resize(480, 52);
    Save(buttons, folder, "qzbutton");

    QWidget labels;
    auto* labelRow = new QHBoxLayout(&labels);
    auto* label = new XWinLabel(&labels);
    label->Caption("Frequency");
    label->setFixedSize(90, 20);
    auto* icon = new XUILess(&labels);
    labelRow->addWidget(label);
    labelRow->addWidget(icon);
    labels.resize(150, 44);
    Save(labels, folder, "xwinlabel-xuiless");

    QZGraph sine;
    sine.resize(420, 240);
    std::vector<double> points(500);
    for (std::size_t i = 0; i < points.size(); ++i)
        points[i] = 15 * std::sin(2 * M_PI * static_cast<double>(i) / 250);
    sine.XAxis().Maximum(499);
    sine.PlotY(points);
    Save(sine, folder, "qzgraph-sine");

    QZGraph noise;
    noise.resize(420, 240);
    std::vector<double> big(10'000'000);
    std::mt19937 random(1);
    std::normal_distribution<double> gauss(0, 0.15);
    for (std::size_t i = 0; i < big.size(); ++i)
        big[i] = 0.5 * std::sin(2 * M_PI * static_cast<double>(i) / 2.5e6) + gauss(random);
    noise.XAxis().Maximum(static_cast<double>(big.size() - 1));
    noise.YAxis().Minimum(-1.5);
    noise.YAxis().Maximum(1.5);
    noise.PlotY(std::move(big));
    Save(noise, folder, "qzgraph-noise-10M");

    // The display panel and the front panel in each output mode, and with an error lit.
    qputenv("QZIVI_SESSION_MANAGER", "none");
    for (const int style : {2, 1}) {
        const QString name = QStringLiteral("xuifgen%1-").arg(style);
        QZIviFgenWidget display;
        display.setProperty("UIStyle", style);
        auto& c = display.Control();
        c.ExceptionOnError(false);
        c.Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt);
        const auto channel = c.Channels()->Add("Channel1");
        channel->FuncFrequency(2500);
        c.Configure();
        Save(display, folder, name + "sine");
        channel->FuncWaveform(qzivifgenWaveformSquare);
        c.Configure();
        Save(display, folder, name + "square");
        channel->FuncWaveform(qzivifgenWaveformDC);
        channel->FuncDCOffset(-1.25);
        c.Configure();
        Save(display, folder, name + "dc");
        std::vector<double> ramp(4096);
        for (std::size_t i = 0; i < ramp.size(); ++i)
            ramp[i] = std::sin(2 * M_PI * static_cast<double>(i) / 4096) *
                      std::exp(-static_cast<double>(i) / 2000.0);
        const auto decay = c.Waveforms()->Add("Decay");
        decay->Data(ramp);
        channel->ArbWaveform(decay);
        c.OutputMode(qzivifgenOutputArb);
        c.Configure();
        Save(display, folder, name + "arbitrary");
        std::vector<double> steps(1024);
        for (std::size_t i = 0; i < steps.size(); ++i)
            steps[i] = i < 512 ? 0.5 : -0.25;
        const auto step = c.Waveforms()->Add("Step");
        step->Data(steps);
        const auto sequence = c.Sequences()->Add("Burst");
        sequence->Add(decay, 2);
        sequence->Add(step, 1);
        c.OutputMode(qzivifgenOutputSeq);
        c.Configure();
        Save(display, folder, name + "sequence");
        c.LogicalName("NoSuchGenerator");
        c.Configure();
        Save(display, folder, name + "error");
        display.resize(display.size() * 2);
        Save(display, folder, name + "error-twice-the-size");
    }

    // Each property page in the page host, on a tree with two channels, three waveforms (two from
    // files, one held) and a sequence; the channels page on each tab and in each output mode.
    {
        const QString data = QDir(folder).filePath("pages-data");
        QDir().mkpath(data);
        const std::string ramp = QDir(data).filePath("ramp.txt").toStdString();
        const std::string burst = QDir(data).filePath("burst.txt").toStdString();
        {
            std::ofstream r(ramp), b(burst);
            for (int i = 0; i < 400; ++i) {
                r << (i % 100) / 50.0 - 1 << "\n";
                b << std::sin(i * 0.2) * std::exp(-((i - 200) * (i - 200)) / 6000.0) << "\n";
            }
        }
        QZIviFgenWidget form;
        QZIviFgen& c = form.Control();
        c.Extensions(0x3FF);
        c.UIStyle(1);
        auto& waveforms = *c.Waveforms();
        waveforms.Add("Ramp", qzivifgenASCIIFile, ramp);
        waveforms.Add("Burst", qzivifgenASCIIFile, burst);
        std::vector<double> held(256);
        for (std::size_t i = 0; i < held.size(); ++i)
            held[i] = i < 128 ? std::sin(static_cast<double>(i) * 0.05) : 0.3;
        waveforms.Add("Held")->Data(held);
        auto& sequence = *c.Sequences()->Add("Chirp train");
        sequence.Add(waveforms.Item(1), 3);
        sequence.Add(waveforms.Item(2), 1);
        sequence.Add(waveforms.Item(3), 12);
        for (const char* name : {"CH1", "CH2"}) {
            auto& channel = *c.Channels()->Add(name);
            channel.FuncWaveform(qzivifgenWaveformSquare);
            channel.FuncAmplitude(2);
            channel.FuncFrequency(1000);
            channel.FuncDutyCycleHigh(25);
            channel.AMEnabled(true);
        }
        c.Channels()->Item(2)->OutputEnabled(false);
        c.Configurations()->Add("Bench");
        c.Configurations()->Add("Sweep 1 kHz to 1 MHz");
        for (int mode = 0; mode < 3; ++mode) {
            c.OutputMode(mode);
            CPageHost host({&c});
            host.AddStandardPages();
            host.resize(620, 420);
            host.show();
            const char* const names[] = {"page-control",  "page-general",       "page-extensions",
                                         "page-channels", "page-waveforms",     "page-sequences",
                                         "page-internal", "page-configurations"};
            for (int i = 0; i < host.Tabs().count(); ++i) {
                host.Tabs().setCurrentIndex(i);
                if (mode > 0 && i != 3) continue;
                if (i != 3) {
                    Save(host, folder, names[i]);
                    if (auto* arb = qobject_cast<PArb*>(host.Page(i))) { // the held points too
                        QListWidget& list = *arb->lstWaveforms;
                        Click(*list.viewport(), list.visualItemRect(list.item(2)).center());
                        Save(host, folder, "page-waveforms-held");
                    }
                    continue;
                }
                auto* channels = static_cast<PChannels*>(host.Page(i));
                const char* const tabs[] = {"-output", "-operation", "-modulation"};
                const char* const modes[] = {"", "-arb", "-sequence"};
                for (int t = 0; t < (mode == 0 ? 3 : 1); ++t) {
                    channels->tabChan->setCurrentIndex(t);
                    Save(host, folder, QString(names[i]) + tabs[t] + modes[mode]);
                }
                channels->tabChan->setCurrentIndex(0);
            }
            host.reject();
        }
        QDir(data).removeRecursively();
    }

    // The front panel program on the example configuration, generating.
    {
        const QString example = QStringLiteral(QZIVI_SOURCE_DIR "/examples/two-channels.qzc");
        qzfgen::PanelWindow window("SampleFGen");
        window.resize(1180, 560);
        window.show();
        window.OpenFile(example);
        window.Init();
        window.Configure();
        window.Initiate();
        window.RefreshScope();
        Save(window, folder, "qzfgen-panel");
        window.close();
    }

    // The About box of a control with a session on the simulator, grabbed while it is open.
    QZIviFgenWidget control;
    control.Control().Init();
    QTimer::singleShot(200, [&] {
        if (QWidget* about = QApplication::activeModalWidget()) {
            Save(*about, folder, "about-box");
            about->close();
        }
    });
    control.Control().AboutBox();
    return 0;
}
