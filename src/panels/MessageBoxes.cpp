#include "qzivi/panels/MessageBoxes.h"

#include "qzivi/driver/ErrorModule.h"

#include <QApplication>
#include <QMessageBox>

namespace qzivi {

void InstallQtMessageBoxes() {
    static const bool installed = [] {
        SetMessageBoxHandler([](const MessageBoxRequest& request) {
            QMessageBox box(request.critical ? QMessageBox::Critical : QMessageBox::NoIcon,
                            QString::fromStdString(request.title),
                            QString::fromStdString(request.text), QMessageBox::Ok,
                            QApplication::activeWindow());
            box.exec();
        });
        return true;
    }();
    (void)installed;
}

} // namespace qzivi
