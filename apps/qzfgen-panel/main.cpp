// qzfgen-panel: the control as a bench instrument's front panel, on "SampleFGen" unless --name
// names another generator; a .qzc given opens at once, else the last one opened.
#include "PanelWindow.h"

#include <QApplication>
#include <QCommandLineParser>
#include <QFileInfo>
#include <QSettings>

int main(int argc, char** argv) {
    QApplication app(argc, argv);
    QApplication::setApplicationName("qzfgen-panel");
    QApplication::setOrganizationName("QZIviFgen");
    QCommandLineParser parser;
    parser.setApplicationDescription("The QZIviFgen front panel on a function generator.");
    parser.addHelpOption();
    const QCommandLineOption name("name", "The logical name of the generator (default SampleFGen).",
                                  "LOGICAL");
    parser.addOption(name);
    parser.addPositionalArgument("file", "A saved configuration (.qzc) to open.", "[FILE.qzc]");
    parser.process(app);
    qzfgen::PanelWindow window(parser.value(name)); // none given: the file's, or SampleFGen
    QString file = parser.positionalArguments().value(0);
    if (file.isEmpty()) file = QSettings("QZIviFgen", "qzfgen-panel").value("lastFile").toString();
    if (!file.isEmpty() && QFileInfo::exists(file)) window.OpenFile(file);
    window.show();
    return QApplication::exec();
}
