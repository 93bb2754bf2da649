// The front panel program's window: the control in the style of a bench generator on a logical
// name, its configuration files, the page host, the session's commands, a log of its errors and
// warnings as they come, and a scope view of the simulator's outputs that follows each Configure
// and runs live while the outputs are on.
#pragma once

#include "ScopeView.h"

#include "qzivi/panels/CCommonDialog.h"

#include <QElapsedTimer>
#include <QMainWindow>
#include <QTimer>

class QComboBox;
class QLabel;
class QMenu;
class QPlainTextEdit;
class QSplitter;

namespace qzivi {
class QZIviFgen;
class QZIviFgenWidget;
} // namespace qzivi

namespace qzfgen {

class PanelWindow : public QMainWindow {
    Q_OBJECT

public:
    // An empty name: "SampleFGen", or the name a configuration file opened holds.
    explicit PanelWindow(const QString& logicalName, QWidget* parent = nullptr);
    ~PanelWindow() override;

    qzivi::QZIviFgen& Control();
    qzivi::QZIviFgenWidget& Form() { return *m_oForm; }
    ScopeView& Scope() { return *m_oScope; }
    QPlainTextEdit& Log() { return *m_oLog; }
    QString FileName() const { return m_sFile; }

    // False, with the reason in the log, when the file does not load.
    bool OpenFile(const QString& path);
    bool SaveFile(const QString& path);
    // The commands of the Instrument menu.
    void Init();
    void Configure();
    void Initiate();
    void Abort();
    void Trigger();
    void ShowProperties();
    // Renders the outputs now, at the present time of the generation.
    void RefreshScope();

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void BuildMenus();
    qzivi::CCommonDialog FileDialog(const QString& title, int flags) const;
    void Note(const QString& text);
    void Remember(const QString& path);
    void FillRecent();
    // Runs one of the user's commands; false when it failed, with the failure in the log.
    template <typename F>
    bool Command(const QString& what, F&& action);

    qzivi::QZIviFgenWidget* m_oForm;
    QSplitter* m_oSplit;
    ScopeView* m_oScope;
    QPlainTextEdit* m_oLog;
    QComboBox* m_oTimeBase;
    QLabel* m_oState;
    QMenu* m_oRecent = nullptr;
    QTimer m_oLive;
    QElapsedTimer m_oRunning;
    QString m_sName;
    QString m_sFile;
    int m_nErrors = 0;
};

} // namespace qzfgen
