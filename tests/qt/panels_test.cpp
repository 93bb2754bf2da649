// The panels' support: the label that keeps its properties, off-screen painting with one copy,
// the pictures by resource id, the system's colours and the file dialogs' filters.
#include "qzivi/model/PropertyBag.h"
#include "qzivi/panels/CCommonDialog.h"
#include "qzivi/panels/CPaintFlickerFree.h"
#include "qzivi/panels/Pictures.h"
#include "qzivi/panels/XUILess.h"
#include "qzivi/panels/XWinLabel.h"

#include <QSignalSpy>
#include <QTest>

using namespace qzivi;

class PanelsTest : public QObject {
    Q_OBJECT

private slots:
    void aLabelShowsLblAndNoticesEachSetOnce() {
        XWinLabel label;
        QCOMPARE(label.Shown(), QStringLiteral("lbl"));
        QSignalSpy changes(&label, &XWinLabel::PropertyChanged);
        label.Caption("Frequency");
        label.Caption("Frequency");
        QCOMPARE(changes.count(), 1);
        QCOMPARE(changes.at(0).at(0).toString(), QStringLiteral("Caption"));
        label.ToolTipText2("The output frequency");
        QCOMPARE(changes.at(1).at(0).toString(), QStringLiteral("ToolTipText"));
        label.Alignment(2);
        label.BackColor(0x00336699);

        PropertyBag bag;
        label.WriteProperties(bag);
        XWinLabel loaded;
        loaded.ReadProperties(bag);
        QCOMPARE(loaded.Shown(), QStringLiteral("Frequency"));
        QCOMPARE(loaded.Caption(), std::string()); // held apart until the first set
        QSignalSpy none(&loaded, &XWinLabel::PropertyChanged);
        loaded.Caption("");
        QCOMPARE(none.count(), 0);
        QCOMPARE(loaded.Shown(), QStringLiteral("Frequency"));
        QCOMPARE(loaded.ToolTipText2(), std::string("The output frequency"));
        QCOMPARE(loaded.Alignment(), std::int16_t{2});
        QCOMPARE(loaded.BackColor(), 0x00336699u);
        PropertyBag again;
        loaded.WriteProperties(again);
        QVERIFY(again == bag);
        PropertyBag fresh;
        XWinLabel().WriteProperties(fresh);
        QCOMPARE(fresh.Size(), std::size_t{0}); // every value at its default
    }

    void aClickOnTheLabelIsAClickOfTheControl() {
        XWinLabel label;
        label.resize(80, 20);
        QSignalSpy clicks(&label, &XWinLabel::Click);
        QSignalSpy downs(&label, &XWinLabel::MouseDown);
        auto* inner = label.findChild<QLabel*>();
        QTest::mouseClick(inner, Qt::LeftButton, Qt::ShiftModifier, QPoint(10, 5));
        QCOMPARE(clicks.count(), 1);
        QCOMPARE(downs.count(), 1);
        QCOMPARE(downs.at(0).at(0).toInt(), 1);
        QCOMPARE(downs.at(0).at(1).toInt(), 1);
        QCOMPARE(downs.at(0).at(2).toInt(), 10);
    }

    void paintingOffScreenCopiesOnceAndErasesWithTheSystemColour() {
        QWidget widget;
        widget.resize(40, 30);
        QImage target(40, 30, QImage::Format_RGB32);
        target.fill(Qt::black);
        QPainter painter(&target);
        CPaintFlickerFree buffer;
        QPainter* hdc = buffer.BeginPainting(painter, widget);
        QVERIFY(hdc == buffer.hdc());
        buffer.EraseBackground(0x8000000F);
        hdc->fillRect(0, 0, 10, 10, Qt::red);
        QCOMPARE(target.pixel(20, 20), QColor(Qt::black).rgb()); // nothing on screen yet
        buffer.StopPainting();
        QVERIFY(buffer.hdc() == nullptr);
        painter.end();
        QCOMPARE(target.pixel(20, 20), widget.palette().color(QPalette::Button).rgb());
        QCOMPARE(target.pixel(2, 2), QColor(Qt::red).rgb());
        QCOMPARE(ResolveColor(0x00FF0000, widget.palette()), QColor(0, 0, 255));
        QCOMPARE(ResolveColor(0x80000012, widget.palette()),
                 widget.palette().color(QPalette::ButtonText));
    }

    void everyPictureOfTheSystemLoadsAndTheIconKeepsItsSize() {
        for (int id : {110,  117,  118,  120,  2000, 2001, 2002, 5001, 5002, 5003, 5004,
                       5005, 5006, 5051, 5052, 5053, 5054, 5055, 5056, 5100, 5101, 5150,
                       5151, 5152, 5153, 5154, 5155, 5156, 5157, 5158, 5159}) {
            QVERIFY2(!LoadPictureFromResource(id).isNull(), qPrintable(QString::number(id)));
            const QPixmap sharp = PictureFromHandle(id, QSize(20, 20), 2);
            QCOMPARE(sharp.size(), QSize(40, 40));
            QCOMPARE(sharp.deviceIndependentSize(), QSizeF(20, 20));
        }
        QVERIFY(LoadPictureFromResource(4242).isNull());
        XUILess icon;
        icon.Size(5000, 5000);
        QCOMPARE(icon.size(), QSize(29, 29));
        icon.UiState(6);
        QCOMPARE(icon.UiState(), 6);
    }

    void dialogFiltersAndDefaultExtensions() {
        QCOMPARE(CCommonDialog::NameFilters("Text files (*.txt)|*.txt|All files|*.*"),
                 (QStringList{"Text files (*.txt)", "All files (*)"}));
        QCOMPARE(CCommonDialog::NameFilters("Data|*.dat;*.bin"), QStringList{"Data (*.dat *.bin)"});
        QCOMPARE(CCommonDialog::WithDefaultExtension("/tmp/wave", "txt"),
                 QStringLiteral("/tmp/wave.txt"));
        QCOMPARE(CCommonDialog::WithDefaultExtension("/tmp/wave.dat", "txt"),
                 QStringLiteral("/tmp/wave.dat"));
    }
};

QTEST_MAIN(PanelsTest)
#include "panels_test.moc"
