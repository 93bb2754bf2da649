// A Qt form with the control, made in Qt Designer (bench_form.ui) and compiled by uic: the form
// brings the whole configuration of the control along. Init and Configure run at the start.
#include "qzivi/control/QZIviFgen.h"
#include "ui_bench_form.h"

#include <QApplication>

int main(int argc, char** argv) {
    QApplication app(argc, argv);
    QWidget form;
    Ui::BenchForm ui;
    ui.setupUi(&form);
    qzivi::QZIviFgen& control = ui.fgen->Control();
    control.Init();
    control.Configure();
    form.show();
    return QApplication::exec();
}
