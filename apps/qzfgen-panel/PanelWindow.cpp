#include "PanelWindow.h"

#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/pages/CPageHost.h"
#include "qzivi/panels/CCommonDialog.h"
#include "qzivi/qt/QZIviFgenWidget.h"
#include "qzivi/support/failure.h"

#include <QCloseEvent>
#include <QComboBox>
#include <QDateTime>
#include <QFileInfo>
#include <QHBoxLayout>
#include <QLabel>
#include <QMenuBar>
#include <QPlainTextEdit>
#include <QSettings>
#include <QSplitter>
#include <QStatusBar>
#include <QToolBar>
#include <QVBoxLayout>

namespace qzfgen {

namespace {

constexpr int kRecentFiles = 8;

QSettings Settings() {
    return QSettings(QStringLiteral("QZIviFgen"), QStringLiteral("qzfgen-panel"));
}

QString Q(const std::string& text) {
    return QString::fromStdString(text);
}

} // namespace

PanelWindow::PanelWindow(const QString& logicalName, QWidget* parent)
    : QMainWindow(parent), m_sName(logicalName) {
    setWindowTitle(tr("QZIviFgen front panel"));
    m_oForm = new qzivi::QZIviFgenWidget(this);
    m_oForm->setObjectName("control");
    qzivi::QZIviFgen& control = Control();
    control.ExceptionOnError(false); // failures come as IviError, into the log
    control.UIStyle(1);
    control.LogicalName(logicalName.isEmpty() ? "SampleFGen" : logicalName.toStdString());

    m_oScope = new ScopeView(this);
    m_oTimeBase = new QComboBox(this);
    m_oTimeBase->setObjectName("timeBase");
    m_oTimeBase->setToolTip(tr("The time of one division of the scope view"));
    m_oTimeBase->addItem(tr("Auto"), 0.0);
    for (double decade = 100e-9; decade < 2; decade *= 10)
        for (const double m : {1.0, 2.0, 5.0})
            if (m * decade <= 1.0)
                m_oTimeBase->addItem(tr("%1 s/div").arg(m * decade, 0, 'g', 3), m * decade);
    connect(m_oTimeBase, &QComboBox::currentIndexChanged, this, [this] { RefreshScope(); });
    m_oLog = new QPlainTextEdit(this);
    m_oLog->setObjectName("log");
    m_oLog->setReadOnly(true);
    m_oLog->setMaximumBlockCount(2000);
    m_oLog->setAccessibleName(tr("Log of errors and warnings"));
    m_oLog->setPlaceholderText(tr("Errors and warnings of the control appear here."));

    auto* scopeBox = new QWidget(this);
    auto* scopeLayout = new QVBoxLayout(scopeBox);
    scopeLayout->setContentsMargins(0, 0, 0, 0);
    auto* scopeBar = new QHBoxLayout;
    scopeBar->addWidget(new QLabel(tr("Scope:"), scopeBox));
    scopeBar->addWidget(m_oTimeBase);
    scopeBar->addStretch(1);
    scopeLayout->addLayout(scopeBar);
    scopeLayout->addWidget(m_oScope, 1);
    auto* right = new QSplitter(Qt::Vertical, this);
    right->addWidget(scopeBox);
    right->addWidget(m_oLog);
    right->setStretchFactor(0, 3);
    right->setStretchFactor(1, 1);
    m_oSplit = new QSplitter(Qt::Horizontal, this);
    m_oSplit->setObjectName("split");
    m_oSplit->addWidget(m_oForm);
    m_oSplit->addWidget(right);
    m_oSplit->setChildrenCollapsible(false);
    // The panel keeps its designed size, as on a bench; the scope gains and gives way first. The
    // split the user drags is kept with the window's geometry.
    m_oForm->setMinimumSize(m_oForm->sizeHint() / 2);
    m_oSplit->setStretchFactor(0, 0);
    m_oSplit->setStretchFactor(1, 1);
    setCentralWidget(m_oSplit);
    m_oState = new QLabel(this);
    m_oState->setObjectName("state");
    statusBar()->addPermanentWidget(m_oState);
    BuildMenus();

    connect(m_oForm, &qzivi::QZIviFgenWidget::IviError, this,
            [this](int code, const QString& source, const QString& text) {
                ++m_nErrors;
                Note(tr("Error %1: %2 (%3)").arg(code).arg(text, source));
            });
    connect(m_oForm, &qzivi::QZIviFgenWidget::IviWarning, this,
            [this](int code, const QString& source, const QString& text) {
                Note(tr("Warning %1: %2 (%3)").arg(code).arg(text, source));
            });
    connect(m_oForm, &qzivi::QZIviFgenWidget::Configured, this, [this] {
        m_oState->setText(tr("Configured"));
        RefreshScope();
    });
    connect(m_oForm, &qzivi::QZIviFgenWidget::Initialized, this,
            [this] { m_oState->setText(tr("Session open")); });
    m_oLive.setInterval(100);
    connect(&m_oLive, &QTimer::timeout, this, [this] { RefreshScope(); });

    QSettings settings = Settings();
    restoreGeometry(settings.value("geometry").toByteArray());
    m_oSplit->restoreState(settings.value("split").toByteArray());
    FillRecent();
    m_oState->setText(tr("No session"));
    m_oScope->Capture(control, 0);
}

PanelWindow::~PanelWindow() = default;

qzivi::QZIviFgen& PanelWindow::Control() {
    return m_oForm->Control();
}

// A dialog for .qzc files, starting at the file open now.
qzivi::CCommonDialog PanelWindow::FileDialog(const QString& title, int flags) const {
    qzivi::CCommonDialog dialog;
    dialog.DialogTitle = title;
    dialog.Filter = "QZ IVI Configurations (*.qzc)|*.qzc|All files|*.*";
    dialog.DefaultExt = "qzc";
    dialog.Flags = flags;
    dialog.FileName = m_sFile;
    return dialog;
}

void PanelWindow::BuildMenus() {
    QMenu* file = menuBar()->addMenu(tr("&File"));
    file->addAction(tr("&Open…"), QKeySequence::Open, this, [this] {
        auto dialog =
            FileDialog(tr("Open a configuration"), qzivi::CCommonDialog::cdlOFNFileMustExist);
        if (dialog.ShowOpen(this)) OpenFile(dialog.FileName);
    });
    m_oRecent = file->addMenu(tr("Open &Recent"));
    file->addAction(tr("&Save As…"), QKeySequence::SaveAs, this, [this] {
        auto dialog = FileDialog(tr("Save the configuration as"),
                                 qzivi::CCommonDialog::cdlOFNOverwritePrompt);
        if (dialog.ShowSave(this)) SaveFile(dialog.FileName);
    });
    file->addSeparator();
    file->addAction(tr("&Quit"), QKeySequence::Quit, this, &QWidget::close);

    QMenu* instrument = menuBar()->addMenu(tr("&Instrument"));
    QToolBar* bar = addToolBar(tr("Instrument"));
    bar->setObjectName("instrumentBar");
    const auto command = [&](const QString& text, const QKeySequence& key,
                             void (PanelWindow::*f)()) {
        QAction* action = instrument->addAction(text, key, this, [this, f] { (this->*f)(); });
        bar->addAction(action);
        return action;
    };
    command(tr("&Properties…"), QKeySequence(Qt::ALT | Qt::Key_Return),
            &PanelWindow::ShowProperties);
    instrument->addSeparator();
    bar->addSeparator();
    command(tr("&Init"), QKeySequence(Qt::CTRL | Qt::Key_I), &PanelWindow::Init);
    command(tr("&Configure"), QKeySequence(Qt::Key_F5), &PanelWindow::Configure);
    command(tr("I&nitiate"), QKeySequence(Qt::Key_F6), &PanelWindow::Initiate);
    command(tr("&Abort"), QKeySequence(Qt::Key_F7), &PanelWindow::Abort);
    command(tr("&Trigger"), QKeySequence(Qt::Key_F8), &PanelWindow::Trigger);
}

// A failure that the control raised after telling it as IviError is in the log already.
template <typename F>
bool PanelWindow::Command(const QString& what, F&& action) {
    const int errors = m_nErrors;
    try {
        action();
        return m_nErrors == errors;
    } catch (const qzivi::Failure& failure) {
        if (m_nErrors == errors)
            Note(tr("%1 failed: error %2: %3")
                     .arg(what)
                     .arg(failure.Number())
                     .arg(Q(failure.Description())));
    } catch (const std::exception& e) {
        Note(tr("%1 failed: %2").arg(what, QString::fromUtf8(e.what())));
    }
    return false;
}

void PanelWindow::Note(const QString& text) {
    m_oLog->appendPlainText(QTime::currentTime().toString("HH:mm:ss  ") + text);
    statusBar()->showMessage(text, 10000);
}

bool PanelWindow::OpenFile(const QString& path) {
    const bool done = Command(tr("Open"), [&] {
        auto& configurations = *Control().Configurations();
        const auto added = configurations.Add("file", path.toStdString());
        if (!added) return; // the error is in the log
        added->Load();
        configurations.Remove(configurations.Count());
        if (!m_sName.isEmpty()) Control().LogicalName(m_sName.toStdString()); // --name wins
    });
    if (!done) return false;
    m_sFile = path;
    setWindowTitle(tr("%1 – QZIviFgen front panel").arg(QFileInfo(path).fileName()));
    Remember(path);
    Note(tr("Opened %1").arg(path));
    return true;
}

bool PanelWindow::SaveFile(const QString& path) {
    const bool done = Command(tr("Save"), [&] {
        auto& configurations = *Control().Configurations();
        const auto added = configurations.Add("saved");
        if (!added) return;
        added->Export(path.toStdString());
        configurations.Remove(configurations.Count());
    });
    if (!done) return false;
    m_sFile = path;
    Remember(path);
    Note(tr("Saved %1").arg(path));
    return true;
}

void PanelWindow::Init() {
    Command(tr("Init"), [&] { Control().Init(); });
    RefreshScope();
}

void PanelWindow::Configure() {
    Command(tr("Configure"), [&] { Control().Configure(); });
}

void PanelWindow::Initiate() {
    if (!Command(tr("Initiate"), [&] { Control().Initiate(); })) return;
    m_oRunning.start();
    m_oLive.start();
    m_oState->setText(tr("Generating"));
}

void PanelWindow::Abort() {
    if (!Command(tr("Abort"), [&] { Control().Abort(); })) return; // it may generate still
    m_oLive.stop();
    m_oState->setText(tr("Stopped"));
}

void PanelWindow::Trigger() {
    Command(tr("Trigger"), [&] { Control().SendSoftwareTrigger(); });
}

void PanelWindow::ShowProperties() {
    qzivi::CPageHost host({&Control()}, this);
    host.AddStandardPages();
    host.exec();
}

void PanelWindow::RefreshScope() {
    double perDivision = m_oTimeBase->currentData().toDouble();
    if (perDivision <= 0) { // auto: about three periods of the first channel's function
        double frequency = 0;
        Command(tr("Scope"), [&] {
            if (Control().Channels()->Count() > 0 &&
                Control().OutputMode() == qzivi::qzivifgenOutputFunc)
                frequency = Control().Channels()->Item(1)->FuncFrequency();
        });
        perDivision = ScopeView::TimeBaseFor(frequency);
    }
    m_oScope->SecondsPerDivision(perDivision);
    const double now =
        m_oLive.isActive() ? static_cast<double>(m_oRunning.nsecsElapsed()) * 1e-9 : 0;
    m_oScope->Capture(Control(), now);
}

void PanelWindow::Remember(const QString& path) {
    QSettings settings = Settings();
    QStringList recent = settings.value("recentFiles").toStringList();
    recent.removeAll(path);
    recent.prepend(path);
    while (recent.size() > kRecentFiles)
        recent.removeLast();
    settings.setValue("recentFiles", recent);
    settings.setValue("lastFile", path);
    FillRecent();
}

void PanelWindow::FillRecent() {
    m_oRecent->clear();
    const QStringList recent = Settings().value("recentFiles").toStringList();
    for (const QString& path : recent)
        m_oRecent->addAction(QFileInfo(path).fileName(), this, [this, path] { OpenFile(path); })
            ->setToolTip(path);
    m_oRecent->setEnabled(!recent.isEmpty());
}

void PanelWindow::closeEvent(QCloseEvent* event) {
    if (isVisible()) { // a window never shown has no layout worth keeping
        QSettings settings = Settings();
        settings.setValue("geometry", saveGeometry());
        settings.setValue("split", m_oSplit->saveState());
    }
    m_oLive.stop();
    qzivi::Quietly([&] {
        if (Control().SessionHandle() != 0) Control().CloseSession();
    });
    event->accept();
}

} // namespace qzfgen
