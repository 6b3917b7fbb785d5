#include "icons/NumberedError.h"
#include "ui/listview/ListConstants.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include "ListTestIcons.h"
#include "TestEnvironment.h"

#include <QApplication>
#include <QMimeData>
#include <QScrollBar>
#include <QSignalSpy>
#include <QStyleOptionSlider>
#include <QTest>
#include <QTimer>
#include <QUrl>

#include <functional>
#include <memory>

using namespace Brimvault;

namespace {

const QColor FrameFill = QColor::fromRgb(ListGrid::FrameFillColor);
const QColor DefaultBack(92, 120, 184);

QString captionFor(int i)
{
    static const QStringList captions {QStringLiteral("Chess"), QStringLiteral("Solitaire Collection Deluxe"),
        QStringLiteral("Minesweeper"), QStringLiteral("Internet Reversi"), QStringLiteral("Hearts"),
        QStringLiteral("Mah Jongg Quest of the Dragon Empire")};
    return captions.at(i % captions.size());
}

QString dataFor(int i)
{
    return QStringLiteral("C:\\Games\\game%1.exe").arg(i);
}

// The events a real double click delivers: press, release, double click, release.
void doubleClick(QWidget* widget, Qt::MouseButton button, QPoint at)
{
    QTest::mouseClick(widget, button, {}, at);
    QTest::mouseDClick(widget, button, {}, at);
    QTest::mouseRelease(widget, button, {}, at);
}

void hover(QWidget* widget, QPoint at)
{
    QMouseEvent event(QEvent::MouseMove, at, widget->mapToGlobal(at), Qt::NoButton, Qt::NoButton, Qt::NoModifier);
    QApplication::sendEvent(widget, &event);
}

} // namespace

class TestSimpleListView : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_environment;

    // A shown list whose usable width (client width less the bar's width) is the given one.
    std::unique_ptr<SimpleListView> makeList(int usable, int height, int items)
    {
        auto list = std::make_unique<SimpleListView>();
        list->resize(usable + list->vbarWindow()->width(), height);
        for (int i = 0; i < items; ++i)
            list->Add(makeTestIcon(QColor::fromHsv((i * 37) % 360, 160, 200), QChar(u'A' + i % 26)), captionFor(i),
                dataFor(i));
        list->Refresh();
        list->show();
        if (!QTest::qWaitForWindowExposed(list.get()))
            return nullptr;
        return list;
    }

    QPoint iconCentre(SimpleListView& list, int index) { return list.imgN(index).geometry().center().toPoint(); }
    QPoint captionPoint(SimpleListView& list, int index)
    {
        return list.labN(index).geometry().topLeft().toPoint() + QPoint(10, 4);
    }

    QRect sliderRect(QScrollBar* bar)
    {
        QStyleOptionSlider option;
        option.initFrom(bar);
        option.orientation = bar->orientation();
        option.minimum = bar->minimum();
        option.maximum = bar->maximum();
        option.sliderPosition = bar->sliderPosition();
        option.sliderValue = bar->value();
        option.singleStep = bar->singleStep();
        option.pageStep = bar->pageStep();
        option.upsideDown = bar->invertedAppearance();
        return bar->style()->subControlRect(QStyle::CC_ScrollBar, &option, QStyle::SC_ScrollBarSlider, bar);
    }

private Q_SLOTS:
    void init() { m_environment = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_environment.reset(); }

    void emptyListStartsWithHiddenFirstElement()
    {
        SimpleListView list;
        QCOMPARE(list.loadedCount(), 1);
        QCOMPARE(list.layoutState().itemCount, 0);
        QVERIFY(!list.imgN(0).isVisible());
        QVERIFY(!list.labN(0).isVisible());
        QCOMPARE(list.GetCurrentCaption(), QStringLiteral("Label1"));
        QCOMPARE(list.GetCurrentData(), QString());
        QCOMPARE(list.BackColor(), DefaultBack);
        QCOMPARE(list.Timer1()->interval(), 2300);
    }

    void addingFillsCellsLeftToRight()
    {
        auto list = makeList(283, 400, 4);
        QVERIFY(list);
        QCOMPARE(list->loadedCount(), 4);
        const QList<qreal> lefts {24, 104, 184, 24};
        for (int i = 0; i < 4; ++i) {
            QCOMPARE(list->imgN(i).geometry().left(), lefts[i]);
            QCOMPARE(list->labN(i).geometry().left(), lefts[i] - 16);
            QCOMPARE(list->labN(i).geometry().width(), 64.0);
            QCOMPARE(list->labN(i).text(), captionFor(i));
            QCOMPARE(list->labN(i).tag(), dataFor(i));
            // Showing arranges the grid, which re-selects the current index, 0 before any choice.
            QCOMPARE(list->labN(i).foreColor(), QColor(i == 0 ? Qt::black : Qt::white));
        }
        QCOMPARE(list->selectionTag(), QStringLiteral("0"));
        QCOMPARE(list->imgN(0).geometry(), QRectF(24, 14, 32, 32));
        QCOMPARE(list->labN(0).geometry().top(), 53.0);
        // The fourth item wraps below the tallest caption of the first row.
        qreal lowest = 0;
        for (int i = 0; i < 3; ++i)
            lowest = std::max(lowest, list->labN(i).geometry().bottom());
        QCOMPARE(list->imgN(3).geometry().top(), lowest + 14);
        QCOMPARE(list->layoutState().rowTops, (QList<double> {0, lowest + 14}));
        QVERIFY(!list->vbarWindow()->isVisible());
    }

    void secondItemGoesToSecondCellAndAddExReturnsIndex()
    {
        SimpleListView list;
        list.resize(600, 400);
        QCOMPARE(list.AddEx(QStringLiteral("One"), QStringLiteral("a")), qint16(0));
        QCOMPARE(list.AddEx(QStringLiteral("Two"), QStringLiteral("b")), qint16(1));
        QCOMPARE(list.imgN(0).geometry().left(), 24.0);
        QCOMPARE(list.imgN(1).geometry().left(), 104.0);
        QCOMPARE(list.imgN(1).Data(), QStringLiteral("b"));
        QVERIFY(list.imgN(1).Picture().isNull());
    }

    void narrowListPutsOneItemPerRow()
    {
        auto list = makeList(70, 600, 3);
        QVERIFY(list);
        QCOMPARE(list->layoutState().rowTops.size(), 4);
        QCOMPARE(list->layoutState().rowTops.at(1), 14.0);
        for (int i = 0; i < 3; ++i)
            QCOMPARE(list->imgN(i).geometry().left(), 24.0);
        QCOMPARE(list->imgN(1).geometry().top(), list->labN(0).geometry().bottom() + 14);
    }

    void scrollBarAppearsOnlyWhenNeeded()
    {
        auto list = makeList(283, 200, 12);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        QVERIFY(bar->isVisible());
        qreal bottom = 0;
        for (int i = 0; i < 12; ++i)
            bottom = std::max(bottom, list->labN(i).geometry().bottom());
        QCOMPARE(bar->maximum(), qRound(bottom - 200 + 14));
        QCOMPARE(bar->singleStep(), 80);
        QCOMPARE(bar->pageStep(), 200);
        QCOMPARE(bar->geometry(), QRect(list->width() - bar->width(), 0, bar->width(), 200));

        bar->setValue(list->layoutState().rowTops.at(2));
        QCOMPARE(list->layoutState().scrollOffsetY, -list->layoutState().rowTops.at(2));
        // A row reached by scrolling starts at the very top.
        QCOMPARE(list->imgN(6).geometry().top(), 0.0);

        // Growing the list until everything fits hides the bar and scrolls back.
        list->resize(list->width(), 2000);
        QTRY_VERIFY(!bar->isVisible());
        QCOMPARE(bar->value(), 0);
        QCOMPARE(list->layoutState().scrollOffsetY, 0.0);
        QCOMPARE(list->imgN(0).geometry().top(), 14.0);
    }

    void releasingTheThumbSnapsToRowsButKeepsTheMaximum()
    {
        auto list = makeList(283, 200, 30);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        const QList<double> rowTops = list->layoutState().rowTops;

        // Drag the thumb to the very end: the maximum is kept.
        QRect thumb = sliderRect(bar);
        QTest::mousePress(bar, Qt::LeftButton, {}, thumb.center());
        QTest::mouseMove(bar, QPoint(thumb.center().x(), bar->height() + 50));
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->maximum()));
        QTest::mouseRelease(bar, Qt::LeftButton, {}, QPoint(thumb.center().x(), bar->height() + 50));
        QCOMPARE(bar->value(), bar->maximum());
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->maximum()));

        // Drag it back to somewhere in the middle: while dragging the items follow the thumb, on release
        // the list snaps to the nearest row start.
        thumb = sliderRect(bar);
        const QPoint start = thumb.center();
        const QPoint middle(start.x(), bar->height() / 2);
        QTest::mousePress(bar, Qt::LeftButton, {}, start);
        QTest::mouseMove(bar, middle);
        const int dragged = bar->sliderPosition();
        QCOMPARE(list->layoutState().scrollOffsetY, -double(dragged));
        QTest::mouseRelease(bar, Qt::LeftButton, {}, middle);
        double nearest = rowTops.first();
        for (double top : rowTops) {
            if (std::abs(top - dragged) < std::abs(nearest - dragged))
                nearest = top;
        }
        QVERIFY(nearest < bar->maximum());
        QCOMPARE(bar->value(), int(nearest));
        QCOMPARE(list->layoutState().scrollOffsetY, -nearest);
    }

    void selectionShowsFrameThenFades()
    {
        auto list = makeList(283, 400, 5);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 2));
        QCOMPARE(list->selectionTag(), QStringLiteral("2"));
        QVERIFY(list->isSelectionFrameVisible());
        QCOMPARE(list->imgN(2).BackColor(), FrameFill);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::black));
        const QRectF icon = list->imgN(2).geometry();
        const QRectF caption = list->labN(2).geometry();
        QCOMPARE(list->selectionFrameRect(),
            QRectF(caption.left() - 3, icon.top() - 3, caption.width() + 9, caption.bottom() - icon.top() + 9));
        QVERIFY(list->Timer1()->isActive());
        QCOMPARE(list->Timer1()->interval(), 2300);
        QCOMPARE(list->grab().toImage().pixelColor(int(caption.left()) - 1, int(icon.top())), FrameFill);

        // A new selection restores the old item.
        QTest::keyClick(list.get(), Qt::Key_Left);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(list->imgN(2).BackColor(), DefaultBack);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::white));

        // Let the highlight run out quickly: the frame goes, the caption stays black.
        list->Timer1()->setInterval(30);
        list->InitSelection();
        QCOMPARE(list->currentIndex(), 0);
        QTRY_VERIFY(!list->isSelectionFrameVisible());
        QVERIFY(!list->Timer1()->isActive());
        QCOMPARE(list->imgN(0).BackColor(), DefaultBack);
        QCOMPARE(list->labN(0).foreColor(), QColor(Qt::black));
        QCOMPARE(list->labN(1).foreColor(), QColor(Qt::white));
    }

    void arrowKeys_data()
    {
        QTest::addColumn<int>("start");
        QTest::addColumn<int>("key");
        QTest::addColumn<int>("expected");
        QTest::newRow("right") << 0 << int(Qt::Key_Right) << 1;
        QTest::newRow("right at the row end stays") << 2 << int(Qt::Key_Right) << 2;
        QTest::newRow("left") << 1 << int(Qt::Key_Left) << 0;
        QTest::newRow("down same column") << 1 << int(Qt::Key_Down) << 4;
        QTest::newRow("up") << 4 << int(Qt::Key_Up) << 1;
        QTest::newRow("down on the last row stays") << 6 << int(Qt::Key_Down) << 6;
        QTest::newRow("other keys do nothing") << 4 << int(Qt::Key_Home) << 4;
    }
    void arrowKeys()
    {
        QFETCH(int, start);
        QFETCH(int, key);
        QFETCH(int, expected);
        auto list = makeList(283, 600, 7);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, start));
        QCOMPARE(list->currentIndex(), start);
        QTest::keyClick(list.get(), Qt::Key(key));
        QCOMPARE(list->currentIndex(), expected);
    }

    void downFromScrolledOutItemStartsNearTheTop()
    {
        auto list = makeList(283, 250, 40);
        QVERIFY(list);
        list->setFocus();
        list->InitSelection();
        QScrollBar* bar = list->vbarWindow();
        bar->setValue(bar->maximum());
        QVERIFY(list->imgN(0).geometry().top() < 0);

        // The reference point becomes (24, 95): the nearest icon more than half an icon below it.
        int expected = -1;
        double best = 1e9;
        for (int i = 1; i < list->loadedCount(); ++i) {
            const QRectF icon = list->imgN(i).geometry();
            if (icon.top() <= 95 + 16)
                continue;
            const double distance = std::hypot(icon.left() - 24, icon.top() - 95);
            if (distance < best) {
                best = distance;
                expected = i;
            }
        }
        QVERIFY(expected > 0);
        QTest::keyClick(list.get(), Qt::Key_Down);
        QCOMPARE(list->currentIndex(), expected);
        QVERIFY(list->selectionFrameRect().top() >= 0);
        QVERIFY(list->selectionFrameRect().bottom() <= list->height());
    }

    void movingDownKeepsTheSelectionInView()
    {
        auto list = makeList(283, 250, 40);
        QVERIFY(list);
        list->InitSelection();
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Down);
        QCOMPARE(list->currentIndex(), 18);
        const QRectF frame = list->selectionFrameRect();
        QVERIFY(list->vbarWindow()->value() > 0);
        // Scrolled just far enough that the frame's bottom touches the bottom edge, without snapping.
        QCOMPARE(frame.top() + frame.height(), double(list->height()));
        // Going back up scrolls the frame back in at the top.
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Up);
        QCOMPARE(list->currentIndex(), 0);
        QCOMPARE(list->vbarWindow()->value(), 0);
        QCOMPARE(list->imgN(0).geometry().top(), 14.0);
    }

    void removingTheMiddleItemShiftsTheRest()
    {
        auto list = makeList(400, 400, 3);
        QVERIFY(list);
        const QPixmap lastPicture = list->imgN(2).Picture();
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 1));
        QVERIFY(!list->RemoveCurrentItem());
        QCOMPARE(list->loadedCount(), 2);
        QCOMPARE(list->layoutState().itemCount, 2);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(list->GetCurrentData(), dataFor(2));
        QCOMPARE(list->GetCurrentCaption(), captionFor(2));
        QCOMPARE(list->imgN(1).Picture().cacheKey(), lastPicture.cacheKey());
        QCOMPARE(list->imgN(1).BackColor(), FrameFill);
    }

    void removingTheLastItemSelectsThePrevious()
    {
        auto list = makeList(400, 400, 3);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 2));
        QVERIFY(!list->RemoveCurrentItem());
        QCOMPARE(list->loadedCount(), 2);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(list->GetCurrentData(), dataFor(1));
        QCOMPARE(list->labN(1).foreColor(), QColor(Qt::black));
    }

    void removingTheOnlyItemFails()
    {
        auto list = makeList(400, 400, 1);
        QVERIFY(list);
        list->InitSelection();
        const ListError error = list->RemoveCurrentItem();
        QVERIFY(error);
        QCOMPARE(error.number, 340);
        QCOMPARE(list->selectionTag(), QStringLiteral("-1"));
        QCOMPARE(list->loadedCount(), 1);
        QCOMPARE(list->layoutState().itemCount, 1);
        QVERIFY(list->imgN(0).isVisible());
        QVERIFY(list->labN(0).isVisible());
        QCOMPARE(list->GetCurrentData(), QString());
    }

    void removeAllKeepsTheFirstCaptionText()
    {
        auto list = makeList(400, 400, 5);
        QVERIFY(list);
        list->RemoveAll();
        QCOMPARE(list->loadedCount(), 1);
        QCOMPARE(list->layoutState().itemCount, 0);
        QCOMPARE(list->GetCurrentData(), QString());
        QCOMPARE(list->labN(0).tag(), QString());
        QCOMPARE(list->GetCurrentCaption(), captionFor(0));
        QVERIFY(!list->imgN(0).isVisible());
        QVERIFY(!list->vbarWindow()->isVisible());
        // The list fills again from the first cell.
        list->Add(QPixmap(), QStringLiteral("Again"), QStringLiteral("x"));
        list->Add(QPixmap(), QStringLiteral("And again"), QStringLiteral("y"));
        QCOMPARE(list->imgN(0).geometry().topLeft(), QPointF(24, 14));
        QCOMPARE(list->imgN(1).geometry().topLeft(), QPointF(104, 14));
    }

    void settingTheCaptionDoesNotRelayout()
    {
        auto list = makeList(283, 600, 6);
        QVERIFY(list);
        list->InitSelection();
        const QRectF fourth = list->imgN(3).geometry();
        const qreal oldHeight = list->labN(0).geometry().height();
        list->SetCurrentCaption(QStringLiteral("A much longer caption that wraps over several lines indeed"));
        QCOMPARE(
            list->GetCurrentCaption(), QStringLiteral("A much longer caption that wraps over several lines indeed"));
        QVERIFY(list->labN(0).geometry().height() > oldHeight);
        QCOMPARE(list->imgN(3).geometry(), fourth);
        list->resize(list->width() + 1, list->height());
        QVERIFY(list->imgN(3).geometry().top() > fourth.top());
    }

    void addingToAScrolledListUsesScrolledBottoms()
    {
        auto list = makeList(283, 200, 12);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        bar->setValue(bar->maximum());
        const double offset = list->layoutState().scrollOffsetY;
        QVERIFY(offset < 0);
        const double lowestBefore = list->layoutState().lowestBottom;
        list->Add(QPixmap(), QStringLiteral("Late"), QStringLiteral("late"));
        const QRectF caption = list->labN(12).geometry();
        // Shown where the next cell lies for the current scroll position.
        QCOMPARE(list->imgN(12).geometry().top(), offset + list->layoutState().rowTop);
        QCOMPARE(list->layoutState().lowestBottom, std::max(lowestBefore, caption.bottom()));
    }

    void enterAndDoubleClickRaiseEnterKey()
    {
        auto list = makeList(400, 400, 4);
        QVERIFY(list);
        QStringList enter;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString& data) { enter << data; });
        list->InitSelection();
        QTest::keyClick(list.get(), Qt::Key_Right);
        QTest::keyClick(list.get(), Qt::Key_Return);
        QCOMPARE(enter.count(), 1);
        QCOMPARE(enter.at(0), dataFor(1));
        QVERIFY(list->isSelectionFrameVisible());

        doubleClick(list.get(), Qt::LeftButton, captionPoint(*list, 3));
        QCOMPARE(enter.count(), 2);
        QCOMPARE(enter.at(1), dataFor(3));
        QCOMPARE(list->currentIndex(), 3);
        QTest::keyClick(list.get(), Qt::Key_Enter);
        QCOMPARE(enter.count(), 3);
        QTest::keyClick(list.get(), Qt::Key_A);
        QCOMPARE(enter.count(), 3);
    }

    void rightButtonRaisesMouseUpButNoEnter()
    {
        auto list = makeList(400, 400, 4);
        QVERIFY(list);
        int enter = 0;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString&) { ++enter; });
        QSignalSpy down(list.get(), &SimpleListView::MouseDown);
        QSignalSpy up(list.get(), &SimpleListView::MouseUp);
        const QRectF icon = list->imgN(2).geometry();
        QTest::mouseClick(list.get(), Qt::RightButton, Qt::ShiftModifier, icon.topLeft().toPoint() + QPoint(5, 6));
        QCOMPARE(list->currentIndex(), 2);
        QCOMPARE(down.count(), 1);
        QCOMPARE(up.count(), 1);
        QCOMPARE(up.at(0).at(0).toInt(), 2);
        QCOMPARE(up.at(0).at(1).toInt(), 1);
        QCOMPARE(up.at(0).at(2).toFloat(), 5.0f);
        QCOMPARE(up.at(0).at(3).toFloat(), 6.0f);
        QCOMPARE(list->layoutState().lastButton, 2);
        doubleClick(list.get(), Qt::RightButton, iconCentre(*list, 1));
        QCOMPARE(enter, 0);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(up.count(), 3);
        QCOMPARE(up.last().at(0).toInt(), 2);
    }

    void clicksFindItemsInAScrolledLongList()
    {
        auto list = makeList(283, 250, 300);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        bar->setValue(int(list->layoutState().rowTops.at(60)));
        for (int index : {180, 181, 182, 183}) {
            QVERIFY(list->imgN(index).geometry().top() < 250);
            QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, index));
            QCOMPARE(list->currentIndex(), index);
        }
        // A caption that grew after the last arrangement is still found below its old bottom.
        const QRectF before = list->labN(183).geometry();
        list->SetCurrentCaption(QStringLiteral("A caption long enough to wrap over many many lines of the grid"));
        const QRectF after = list->labN(183).geometry();
        QVERIFY(after.bottom() > before.bottom() + 20);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 181));
        // In the gap above the next row's icon, where only the grown caption lies.
        const qreal gap = list->imgN(186).geometry().top() - 5;
        QVERIFY(after.bottom() > gap);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(int(after.left()) + 2, int(gap)));
        QCOMPARE(list->currentIndex(), 183);
    }

    void clicksOnTheBackgroundSelectNothing()
    {
        auto list = makeList(400, 400, 2);
        QVERIFY(list);
        list->InitSelection();
        QSignalSpy down(list.get(), &SimpleListView::MouseDown);
        QSignalSpy move(list.get(), &SimpleListView::MouseMove);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(300, 300));
        hover(list.get(), QPoint(310, 300));
        QCOMPARE(down.count(), 0);
        QCOMPARE(move.count(), 0);
        QCOMPARE(list->currentIndex(), 0);
        hover(list.get(), captionPoint(*list, 1));
        QCOMPARE(move.count(), 1);
        QCOMPARE(move.at(0).at(2).toFloat(), 10.0f);
        QCOMPARE(list->currentIndex(), 0);
    }

    void wheelScrollsOneRowPerNotch()
    {
        auto list = makeList(283, 200, 30);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        const QList<double> rowTops = list->layoutState().rowTops;
        auto turn = [&](int delta) {
            const QPoint at(100, 100);
            QWheelEvent event(at, list->mapToGlobal(at), QPoint(), QPoint(0, delta), Qt::NoButton, Qt::NoModifier,
                Qt::NoScrollPhase, false);
            QApplication::sendEvent(list.get(), &event);
        };
        turn(-120);
        QCOMPARE(bar->value(), int(rowTops.at(1)));
        QCOMPARE(list->layoutState().scrollOffsetY, -rowTops.at(1));
        turn(-60);
        QCOMPARE(bar->value(), int(rowTops.at(1)));
        turn(-60);
        QCOMPARE(bar->value(), int(rowTops.at(2)));
        for (int i = 0; i < 40; ++i)
            turn(-120);
        QCOMPARE(bar->value(), bar->maximum());
        turn(120);
        QVERIFY(bar->value() < bar->maximum());
        QVERIFY(rowTops.contains(double(bar->value())));
        for (int i = 0; i < 40; ++i)
            turn(120);
        QCOMPARE(bar->value(), 0);
        QCOMPARE(list->imgN(0).geometry().top(), 14.0);
    }

    void droppedFilesReachTheHost()
    {
        auto list = makeList(400, 400, 2);
        QVERIFY(list);
        QList<QPointF> dropped;
        connect(list.get(), &SimpleListView::OLEDragDrop, this,
            [&](const QMimeData*, qint32&, qint16, qint16, float x, float y) { dropped << QPointF(x, y); });
        QList<int> over;
        connect(list.get(), &SimpleListView::OLEDragOver, this,
            [&](const QMimeData*, qint32&, qint16, qint16, float, float, qint16 state) { over << state; });
        QMimeData mime;
        mime.setUrls(
            {QUrl::fromLocalFile(QStringLiteral("/games/a.exe")), QUrl::fromLocalFile(QStringLiteral("/games/b.swf"))});

        QDropEvent refused(QPointF(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list.get(), &refused);
        QVERIFY(!refused.isAccepted());
        QCOMPARE(dropped.count(), 0);
        QVERIFY(!list->acceptDrops());

        QStringList received;
        connect(list.get(), &SimpleListView::OLEDragDrop, this,
            [&](const QMimeData* data, qint32&, qint16, qint16, float, float) {
                for (const QUrl& url : data->urls())
                    received << url.toLocalFile();
            });
        list->SetOLEDropMode(1);
        QVERIFY(list->acceptDrops());
        QDragEnterEvent enter(QPoint(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list.get(), &enter);
        QVERIFY(enter.isAccepted());
        QCOMPARE(over, QList<int> {0});
        QDropEvent drop(QPointF(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list.get(), &drop);
        QVERIFY(drop.isAccepted());
        QCOMPARE(dropped, QList<QPointF> {QPointF(50, 60)});
        QCOMPARE(received, (QStringList {QStringLiteral("/games/a.exe"), QStringLiteral("/games/b.swf")}));

        // A host that sets the effect to none refuses the drop.
        connect(list.get(), &SimpleListView::OLEDragDrop, this,
            [](const QMimeData*, qint32& effect, qint16, qint16, float, float) { effect = 0; });
        QDropEvent denied(QPointF(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list.get(), &denied);
        QVERIFY(!denied.isAccepted());
    }

    void dragRefusedByTheHostCompletesAtOnce()
    {
        SimpleListView list;
        QList<int> offered;
        connect(&list, &SimpleListView::OLEStartDrag, this, [&](QMimeData* data, qint32& allowed) {
            QVERIFY(data);
            offered << allowed;
            allowed = 0;
        });
        QSignalSpy completed(&list, &SimpleListView::OLECompleteDrag);
        list.OLEDrag();
        QCOMPARE(offered, QList<int> {int(Qt::CopyAction | Qt::MoveAction)});
        QCOMPARE(completed.count(), 1);
        QCOMPARE(completed.at(0).at(0).toInt(), 0);
    }

    void propertiesPersistOnlyWhenNotDefault()
    {
        SimpleListView list;
        QSignalSpy changed(&list, &SimpleListView::propertyChanged);
        QVERIFY(list.WriteProperties().isEmpty());
        list.SetBackColor(QColor(255, 0, 0));
        list.SetOLEDropMode(1);
        QCOMPARE(changed.count(), 2);
        QCOMPARE(changed.at(0).at(0).toString(), QStringLiteral("BackColor"));
        const QVariantMap saved = list.WriteProperties();
        QCOMPARE(saved.value(QStringLiteral("BackColor")).toUInt(), 0x000000FFu);
        QCOMPARE(saved.value(QStringLiteral("OLEDropMode")).toInt(), 1);

        SimpleListView restored;
        restored.ReadProperties(saved);
        QCOMPARE(restored.BackColor(), QColor(255, 0, 0));
        QCOMPARE(restored.OLEDropMode(), 1);
        QVERIFY(restored.acceptDrops());
        restored.ReadProperties({{QStringLiteral("BackColor"), QStringLiteral("garbage")}});
        QCOMPARE(restored.BackColor(), DefaultBack);
        QCOMPARE(restored.OLEDropMode(), 0);
        QVERIFY(restored.WriteProperties().isEmpty());
    }

    void itemCountStopsAtTheSixteenBitLimit()
    {
        SimpleListView list;
        list.resize(800, 600);
        for (int i = 0; i < ListGrid::MaxItems; ++i)
            list.AddEx(QStringLiteral("G"), QString());
        QCOMPARE(list.layoutState().itemCount, 32767);
        const auto raisesOverflow = [](const std::function<void()>& add) {
            try {
                add();
            } catch (const NumberedError& error) {
                return error.number() == 6 && error.message() == u"Overflow";
            }
            return false;
        };
        QVERIFY(raisesOverflow([&] { list.AddEx(QStringLiteral("One too many"), QString()); }));
        QVERIFY(raisesOverflow([&] { list.Add(QPixmap(), QStringLiteral("One too many"), QString()); }));
        QCOMPARE(list.loadedCount(), 32767);
    }

    void longLibraryScrollsToItsLastGame()
    {
        auto list = makeList(480, 400, 0);
        QVERIFY(list);
        for (int i = 0; i < 20000; ++i)
            list->AddEx(captionFor(i), dataFor(i));
        list->Refresh();
        QScrollBar* bar = list->vbarWindow();
        QVERIFY(bar->maximum() > 32767);
        bar->setValue(bar->maximum());
        const QRectF last = list->labN(19999).geometry();
        QVERIFY(last.top() > 0);
        QVERIFY(last.bottom() <= list->height());
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 19999));
        QCOMPARE(list->GetCurrentData(), dataFor(19999));
    }

    void iconBuilderFillsPicturesLater()
    {
        auto list = makeList(400, 400, 0);
        QVERIFY(list);
        const qint16 index = list->AddEx(QStringLiteral("Queued"), QStringLiteral("C:\\q.exe"));
        ListIcon icon = list->imgN(index);
        QCOMPARE(icon.Data(), QStringLiteral("C:\\q.exe"));
        const QPixmap picture = makeTestIcon(Qt::red, u'Q');
        icon.SetPicture(picture);
        QCOMPARE(list->imgN(index).Picture().cacheKey(), picture.cacheKey());
        const QImage shown = list->grab().toImage();
        QCOMPARE(shown.pixelColor(icon.geometry().center().toPoint()), picture.toImage().pixelColor(16, 16));
        QVERIFY(!list->imgN(5).isLoaded());
        list->imgN(5).SetPicture(picture); // ignored
    }
};

QTEST_MAIN(TestSimpleListView)

#include "tst_simplelistview.moc"
