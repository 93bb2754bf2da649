#include "qzivi/panels/CCommonDialog.h"

#include <QFileDialog>
#include <QFileInfo>

namespace qzivi {

QStringList CCommonDialog::NameFilters(const QString& filter) {
    const QStringList parts = filter.split(QLatin1Char('|'));
    QStringList filters;
    // "*.*" means every file where the filter comes from; here it would miss names without a dot.
    const auto local = [](QString text) { return text.replace(QStringLiteral("*.*"), "*"); };
    for (qsizetype i = 0; i + 1 < parts.size(); i += 2) {
        const QString patterns = QString(parts[i + 1]).replace(QLatin1Char(';'), QLatin1Char(' '));
        // "Text files (*.txt)" already names its patterns; "All files" gets them added.
        filters << local(parts[i].contains(QLatin1Char('(')) ? parts[i]
                                                             : parts[i] + " (" + patterns + ")");
    }
    return filters;
}

QString CCommonDialog::WithDefaultExtension(const QString& name, const QString& extension) {
    if (name.isEmpty() || extension.isEmpty() || !QFileInfo(name).suffix().isEmpty()) return name;
    return name + QLatin1Char('.') + extension;
}

bool CCommonDialog::ShowOpen(QWidget* parent) {
    QFileDialog dialog(parent, DialogTitle, FileName);
    dialog.setAcceptMode(QFileDialog::AcceptOpen);
    dialog.setFileMode((Flags & cdlOFNFileMustExist) ? QFileDialog::ExistingFile
                                                     : QFileDialog::AnyFile);
    dialog.setOption(QFileDialog::ReadOnly, Flags & cdlOFNReadOnly);
    dialog.setNameFilters(NameFilters(Filter));
    dialog.setDefaultSuffix(DefaultExt);
    if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return false;
    FileName = dialog.selectedFiles().front();
    return true;
}

bool CCommonDialog::ShowSave(QWidget* parent) {
    QFileDialog dialog(parent, DialogTitle, FileName);
    dialog.setAcceptMode(QFileDialog::AcceptSave);
    dialog.setNameFilters(NameFilters(Filter));
    dialog.setDefaultSuffix(DefaultExt);
    dialog.setOption(QFileDialog::DontConfirmOverwrite, !(Flags & cdlOFNOverwritePrompt));
    if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return false;
    FileName = WithDefaultExtension(dialog.selectedFiles().front(), DefaultExt);
    return true;
}

} // namespace qzivi
