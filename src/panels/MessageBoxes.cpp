#include "qzivi/panels/MessageBoxes.h"

#include "qzivi/driver/ErrorModule.h"

#include <QApplication>
#include <QMessageBox>

namespace qzivi {

void InstallQtMessageBoxes() {
    static const bool installed = [] {
        SetMessageBoxHandler([](const MessageBoxRequest& request) {
            static constexpr QMessageBox::Icon kIcons[] = {
                QMessageBox::NoIcon, QMessageBox::Critical, QMessageBox::Warning,
                QMessageBox::Information};
            QMessageBox box(kIcons[static_cast<int>(request.icon)],
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
