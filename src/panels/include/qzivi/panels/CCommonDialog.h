// CCommonDialog: the open and save dialogs of the pages, over Qt's file dialogs: a title, a filter
// in the system's "Text files (*.txt)|*.txt|All files|*.*" form, a default extension that a name
// without one gets, and the question before a file is overwritten.
#pragma once

#include <QString>
#include <QStringList>

class QWidget;

namespace qzivi {

class CCommonDialog {
public:
    enum Flags : int {
        cdlOFNReadOnly = 0x1,
        cdlOFNOverwritePrompt = 0x2,
        cdlOFNFileMustExist = 0x1000,
    };

    QString DialogTitle;
    QString Filter;
    QString DefaultExt; // without the dot
    QString FileName;
    int Flags = 0;

    // True with FileName set when the user chose a file; false when the user cancelled.
    bool ShowOpen(QWidget* parent);
    bool ShowSave(QWidget* parent);

    // The filter as Qt's name filters: "Text files (*.txt)" for each pair of the system's form.
    static QStringList NameFilters(const QString& filter);
    // `name` with the default extension when it has none.
    static QString WithDefaultExtension(const QString& name, const QString& extension);
};

} // namespace qzivi
