// The icon list as a user meets it: real widgets, real mouse, keyboard and wheel input.
#include "MainWindowFixture.h"
#include "TestSuite.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QScrollBar>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

const QColor FrameFill(190, 209, 237);
const QColor ListBack(92, 120, 184);

QPoint iconAt(SimpleListView& list, int index, QPoint offset = {16, 16})
{
    return list.imgN(index).geometry().topLeft().toPoint() + offset;
}

// The colours along the top edge of the selection frame, as painted.
QSet<QRgb> frameEdgeColours(SimpleListView& list)
{
    const QImage shown = list.grab().toImage();
    const QRect frame = list.selectionFrameRect().toAlignedRect();
    QSet<QRgb> colours;
    for (int x = frame.left() + 1; x < frame.right() - 1; ++x)
        colours.insert(shown.pixel(x, frame.top()) & 0xFFFFFF);
    return colours;
}

void doubleClick(QWidget* widget, Qt::MouseButton button, QPoint at)
{
    QTest::mouseClick(widget, button, {}, at);
    QTest::mouseDClick(widget, button, {}, at);
    QTest::mouseRelease(widget, button, {}, at);
}

} // namespace

class TestListView : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void scrollingSnapsToRowsAndTheWheelMovesOneRowPerNotch()
    {
        auto list = ShownList<SimpleListView>(283, 200, 30);
        QScrollBar* bar = list->vbarWindow();
        QCOMPARE(bar->geometry(), QRect(list->width() - bar->width(), 0, bar->width(), 200));
        const QList<double> rowTops = list->layoutState().rowTops;
        const auto turn = [&](int delta) {
            QWheelEvent wheel({100, 100}, list->mapToGlobal(QPointF(100, 100)), {}, {0, delta}, Qt::NoButton, {},
                Qt::NoScrollPhase, false);
            QApplication::sendEvent(list.get(), &wheel);
            return bar->value();
        };
        QCOMPARE(turn(-60), 0); // half a notch waits for the other half
        QCOMPARE(turn(-60), int(rowTops.at(1)));
        bar->setValue(int(rowTops.at(4)) - 20);
        QCOMPARE(bar->value(), int(rowTops.at(4)));
        list->resize(list->width(), 20000);
        QTRY_VERIFY(!bar->isVisible());
        QCOMPARE(bar->value(), 0);
    }

    void selectionFrameAndFocusMark_data()
    {
        QTest::addColumn<bool>("byKeyboard");
        QTest::newRow("mouse") << false;
        QTest::newRow("keyboard") << true;
    }
    // The frame lies behind the icon, drawn over with its transparent corners; after keyboard use its border is
    // a mark of black and white dashes that outlasts the highlight.
    void selectionFrameAndFocusMark()
    {
        QFETCH(bool, byKeyboard);
        auto list = ShownList<SimpleListView>(283, 400, 5);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, byKeyboard ? 1 : 2));
        if (byKeyboard)
            QTest::keyClick(list.get(), Qt::Key_Right);
        QCOMPARE(list->selectionTag(), u"2"_s);
        QVERIFY(list->Timer1()->isActive());
        QCOMPARE(list->Timer1()->interval(), 2300);
        QCOMPARE(QList<QColor>({list->imgN(1).BackColor(), list->labN(1).foreColor(), list->imgN(2).BackColor(),
                     list->labN(2).foreColor()}),
            QList<QColor>({ListBack, Qt::white, FrameFill, Qt::black}));
        const QImage shown = list->grab().toImage();
        const QPoint icon = list->imgN(2).geometry().topLeft().toPoint();
        QCOMPARE(QList<QColor>({shown.pixelColor(icon), shown.pixelColor(icon + QPoint(16, 28))}),
            QList<QColor>({FrameFill, list->imgN(2).Picture().toImage().pixelColor(16, 28)}));
        const QSet<QRgb> marked {0x000000, 0xFFFFFF};
        QCOMPARE(frameEdgeColours(*list), byKeyboard ? marked : QSet<QRgb> {0xE0E0E0});
        // When the highlight runs out the frame goes, a mark stays and the caption stays black.
        list->Timer1()->start(1);
        QTRY_COMPARE(frameEdgeColours(*list), byKeyboard ? marked : QSet<QRgb> {ListBack.rgb() & 0xFFFFFF});
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::black));
    }

    void movingDownKeepsTheSelectionInView()
    {
        auto list = ShownList<SimpleListView>(283, 250, 40);
        list->InitSelection();
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Down);
        QCOMPARE(list->currentIndex(), 18);
        // Scrolled just far enough that the frame's bottom touches the bottom edge, without snapping.
        QCOMPARE(list->selectionFrameRect().bottom(), 250.0);
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Up);
        QCOMPARE(QList<int>({list->currentIndex(), list->vbarWindow()->value()}), QList<int>({0, 0}));
    }

    // The last game goes: the one before it becomes current and takes the frame.
    void removingTheLastItem()
    {
        auto list = ShownList<SimpleListView>(400, 400, 3);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 2));
        QCOMPARE(list->RemoveCurrentItem().number, 0);
        QCOMPARE(QList<int>({list->loadedCount(), list->layoutState().itemCount, list->currentIndex()}),
            QList<int>({2, 2, 1}));
        QCOMPARE(QStringList({list->GetCurrentData(), list->GetCurrentCaption()}),
            QStringList({SamplePath(1), SampleCaption(1)}));
        QCOMPARE(list->imgN(1).BackColor(), FrameFill);
    }

    // A long list makes a picture only when its item is painted or asked for; removal moves the picture still
    // to be made with its item.
    void picturesMadeWhenFirstNeeded()
    {
        auto list = ShownList<SimpleListView>(400, 400, 0);
        QList<QPixmap> pictures;
        int made = 0;
        for (int i = 0; i < 200; ++i) {
            pictures << QPixmap(32, 32);
            pictures.last().fill(QColor::fromHsv(i, 200, 200));
            list->Add([&made, &pictures, i] { return ++made, pictures.at(i); }, SampleCaption(i), SamplePath(i));
        }
        list->Refresh();
        list->grab();
        QVERIFY(made > 0 && made < 50);
        const int madeOnScreen = made;
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 0));
        QCOMPARE(list->RemoveCurrentItem().number, 0);
        QCOMPARE(made, madeOnScreen);
        QCOMPARE(list->imgN(150).Picture().cacheKey(), pictures.at(151).cacheKey());
        QCOMPARE(made, madeOnScreen + 1);
    }

    void enterAndLeftDoubleClickRaiseEnterKey()
    {
        auto list = ShownList<SimpleListView>(400, 400, 4);
        QStringList entered;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString& data) { entered << data; });
        list->InitSelection();
        QTest::keyClick(list.get(), Qt::Key_Right);
        QTest::keyClick(list.get(), Qt::Key_Return);
        doubleClick(list.get(), Qt::LeftButton, list->labN(3).geometry().topLeft().toPoint() + QPoint(10, 4));
        QTest::keyClick(list.get(), Qt::Key_Enter);
        QTest::keyClick(list.get(), Qt::Key_Home); // other keys do nothing
        QCOMPARE(list->currentIndex(), 3);
        doubleClick(list.get(), Qt::RightButton, iconAt(*list, 1));
        QCOMPARE(entered, QStringList({SamplePath(1), SamplePath(3), SamplePath(3)}));
        QCOMPARE(list->currentIndex(), 1);
    }

    void longListFindsEveryClickAndScrollsToItsLastGame()
    {
        auto list = ShownList<SimpleListView>(283, 900, 0);
        for (int i = 0; i < 20000; ++i)
            list->AddEx(SampleCaption(i), SamplePath(i));
        list->Refresh();
        QScrollBar* bar = list->vbarWindow();
        bar->setValue(int(list->layoutState().rowTops.at(60)));
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 183));
        // A caption that grew taller than a band is found at its far end, while the grid stays as it was.
        const qreal nextRow = list->imgN(186).geometry().top();
        list->SetCurrentCaption(u"word "_s.repeated(60));
        QCOMPARE(list->imgN(186).geometry().top(), nextRow);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 181));
        QCOMPARE(list->currentIndex(), 181);
        const QRectF grown = list->labN(183).geometry();
        QVERIFY(grown.height() > 300);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(int(grown.left()) + 2, int(grown.bottom()) - 2));
        QCOMPARE(list->currentIndex(), 183);
        bar->setValue(bar->maximum());
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 19999));
        QCOMPARE(list->GetCurrentData(), SamplePath(19999));
    }
};

BV_REGISTER_TEST(TestListView);

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
#include "tst_listview.moc"
