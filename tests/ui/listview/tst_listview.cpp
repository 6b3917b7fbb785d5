// The icon list and the image control as a user meets them: real widgets, real mouse, keyboard and wheel
// input. The grid arithmetic itself is pinned by tst_listlayout.
#include "GamePictures.h"
#include "TestEnvironment.h"

#include "icons/NumberedError.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QApplication>
#include <QDir>
#include <QMimeData>
#include <QScrollBar>
#include <QSignalSpy>
#include <QStyleOptionSlider>
#include <QTest>
#include <QTimer>
#include <QUrl>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

const QColor FrameFill(190, 209, 237);
const QColor ListBack(92, 120, 184);

QString captionFor(int i)
{
    static const QStringList captions {u"Chess"_s, u"Solitaire Collection Deluxe"_s, u"Minesweeper"_s,
        u"Internet Reversi"_s, u"Hearts"_s, u"Mah Jongg Quest of the Dragon Empire"_s};
    return captions.at(i % captions.size());
}

QString dataFor(int i)
{
    return u"C:\\Games\\game%1.exe"_s.arg(i);
}

// A shown list whose usable width (client width less the bar's width) is the given one.
std::unique_ptr<SimpleListView> shownList(int usable, int height, int items)
{
    auto list = std::make_unique<SimpleListView>();
    list->resize(usable + list->vbarWindow()->width(), height);
    for (int i = 0; i < items; ++i)
        list->Add(
            GamePicture(QColor::fromHsv((i * 37) % 360, 160, 200), QChar(u'A' + i % 26)), captionFor(i), dataFor(i));
    list->Refresh();
    list->show();
    return QTest::qWaitForWindowExposed(list.get()) ? std::move(list) : nullptr;
}

QPoint iconCentre(SimpleListView& list, int index)
{
    return list.imgN(index).geometry().center().toPoint();
}

QPoint onCaption(SimpleListView& list, int index)
{
    return list.labN(index).geometry().topLeft().toPoint() + QPoint(10, 4);
}

// The events a real double click delivers: press, release, double click, release.
void doubleClick(QWidget* widget, Qt::MouseButton button, QPoint at)
{
    QTest::mouseClick(widget, button, {}, at);
    QTest::mouseDClick(widget, button, {}, at);
    QTest::mouseRelease(widget, button, {}, at);
}

void send(QWidget* widget, QEvent&& event)
{
    QApplication::sendEvent(widget, &event);
}

QPoint thumbCentre(QScrollBar* bar)
{
    QStyleOptionSlider option;
    option.initFrom(bar);
    option.orientation = bar->orientation();
    option.minimum = bar->minimum();
    option.maximum = bar->maximum();
    option.sliderPosition = bar->sliderPosition();
    option.pageStep = bar->pageStep();
    return bar->style()->subControlRect(QStyle::CC_ScrollBar, &option, QStyle::SC_ScrollBarSlider, bar).center();
}

QColor shownAt(QWidget& widget, int x, int y)
{
    return widget.grab().toImage().pixelColor(x, y);
}

} // namespace

class TestListView : public QObject {
    Q_OBJECT

    TestEnvironment m_environment;

private Q_SLOTS:
    void emptyListStartsWithHiddenFirstElement()
    {
        SimpleListView list;
        QCOMPARE(list.loadedCount(), 1);
        QCOMPARE(list.layoutState().itemCount, 0);
        QVERIFY(!list.imgN(0).isVisible() && !list.labN(0).isVisible());
        QCOMPARE(list.GetCurrentCaption(), u"Label1"_s);
        QCOMPARE(list.GetCurrentData(), QString());
        QCOMPARE(list.Timer1()->interval(), 2300);
    }

    void addedItemsCarryCaptionDataAndColours()
    {
        auto list = shownList(283, 400, 3);
        QVERIFY(list);
        for (int i = 0; i < 3; ++i) {
            QCOMPARE(
                QStringList({list->labN(i).text(), list->labN(i).tag()}), QStringList({captionFor(i), dataFor(i)}));
            // Showing arranges the grid, which re-selects the current index, 0 before any choice.
            QCOMPARE(list->labN(i).foreColor(), QColor(i == 0 ? Qt::black : Qt::white));
        }
        QCOMPARE(list->AddEx(u"Four"_s, u"d"_s), qint16(3));
        QVERIFY(list->imgN(3).Picture().isNull());
        QVERIFY(!list->vbarWindow()->isVisible());
    }

    void scrollBarAppearsOnlyWhenNeeded()
    {
        auto list = shownList(283, 200, 12);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        QVERIFY(bar->isVisible());
        QCOMPARE(bar->geometry(), QRect(list->width() - bar->width(), 0, bar->width(), 200));
        // At the maximum the lowest caption ends 14 above the bottom edge.
        bar->setValue(bar->maximum());
        qreal bottom = 0;
        for (int i = 0; i < 12; ++i)
            bottom = std::max(bottom, list->labN(i).geometry().bottom());
        QVERIFY2(qAbs(bottom - (200 - 14)) <= 0.5, qPrintable(QString::number(bottom)));
        // Growing the list until everything fits hides the bar and scrolls back.
        list->resize(list->width(), 2000);
        QTRY_VERIFY(!bar->isVisible());
        QCOMPARE(bar->value(), 0);
        QCOMPARE(list->imgN(0).geometry().top(), 14.0);
    }

    void releasingTheThumbSnapsToRowsButKeepsTheMaximum()
    {
        auto list = shownList(283, 200, 30);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        const QPoint end(thumbCentre(bar).x(), bar->height() + 50);
        QTest::mousePress(bar, Qt::LeftButton, {}, thumbCentre(bar));
        QTest::mouseMove(bar, end);
        QTest::mouseRelease(bar, Qt::LeftButton, {}, end);
        QCOMPARE(bar->value(), bar->maximum());
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->maximum()));

        // While dragging the items follow the thumb; on release the list snaps to a row start.
        const QPoint middle(end.x(), bar->height() / 2);
        QTest::mousePress(bar, Qt::LeftButton, {}, thumbCentre(bar));
        QTest::mouseMove(bar, middle);
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->sliderPosition()));
        QTest::mouseRelease(bar, Qt::LeftButton, {}, middle);
        QVERIFY2(list->layoutState().rowTops.contains(double(bar->value())), qPrintable(QString::number(bar->value())));
        QVERIFY(bar->value() > 0 && bar->value() < bar->maximum());
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->value()));
    }

    void wheelScrollsOneRowPerNotch()
    {
        auto list = shownList(283, 200, 30);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        const QList<double> rowTops = list->layoutState().rowTops;
        const auto turn = [&](int delta, int times = 1) {
            for (int i = 0; i < times; ++i)
                send(list.get(),
                    QWheelEvent(QPointF(100, 100), list->mapToGlobal(QPointF(100, 100)), QPoint(), QPoint(0, delta),
                        Qt::NoButton, Qt::NoModifier, Qt::NoScrollPhase, false));
        };
        turn(-120);
        QCOMPARE(list->layoutState().scrollOffsetY, -rowTops.at(1));
        turn(-60); // half a notch waits for the other half
        QCOMPARE(bar->value(), int(rowTops.at(1)));
        turn(-60);
        QCOMPARE(bar->value(), int(rowTops.at(2)));
        turn(-120, 40);
        QCOMPARE(bar->value(), bar->maximum());
        turn(120, 40);
        QCOMPARE(bar->value(), 0);
    }

    void selectionShowsFrameThenFades()
    {
        auto list = shownList(283, 400, 5);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 2));
        QCOMPARE(list->selectionTag(), u"2"_s);
        QVERIFY(list->isSelectionFrameVisible());
        QCOMPARE(list->imgN(2).BackColor(), FrameFill);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::black));
        QVERIFY(list->Timer1()->isActive());
        QCOMPARE(
            shownAt(*list, int(list->labN(2).geometry().left()) - 1, int(list->imgN(2).geometry().top())), FrameFill);

        // A new selection restores the old item.
        QTest::keyClick(list.get(), Qt::Key_Left);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(list->imgN(2).BackColor(), ListBack);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::white));

        // When the highlight runs out the frame goes and the caption stays black.
        list->Timer1()->setInterval(30);
        list->InitSelection();
        QCOMPARE(list->currentIndex(), 0);
        QTRY_VERIFY(!list->isSelectionFrameVisible());
        QCOMPARE(list->imgN(0).BackColor(), ListBack);
        QCOMPARE(list->labN(0).foreColor(), QColor(Qt::black));
        QCOMPARE(list->labN(1).foreColor(), QColor(Qt::white));
    }

    void movingDownKeepsTheSelectionInView()
    {
        auto list = shownList(283, 250, 40);
        QVERIFY(list);
        list->InitSelection();
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Down);
        QCOMPARE(list->currentIndex(), 18);
        QVERIFY(list->vbarWindow()->value() > 0);
        // Scrolled just far enough that the frame's bottom touches the bottom edge, without snapping.
        QCOMPARE(list->selectionFrameRect().bottom(), 250.0);
        for (int i = 0; i < 6; ++i)
            QTest::keyClick(list.get(), Qt::Key_Up);
        QCOMPARE(list->currentIndex(), 0);
        QCOMPARE(list->vbarWindow()->value(), 0);
    }

    void removingTheCurrentItem_data()
    {
        QTest::addColumn<int>("clicked");
        QTest::addColumn<int>("nowShown"); // the item now current, by its original index
        QTest::newRow("middle: the next one moves up") << 1 << 2;
        QTest::newRow("last: the one before") << 2 << 1;
    }
    void removingTheCurrentItem()
    {
        QFETCH(int, clicked);
        QFETCH(int, nowShown);
        auto list = shownList(400, 400, 3);
        QVERIFY(list);
        const qint64 picture = list->imgN(nowShown).Picture().cacheKey();
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, clicked));
        QVERIFY(!list->RemoveCurrentItem());
        QCOMPARE(QList<int>({list->loadedCount(), list->layoutState().itemCount, list->currentIndex()}),
            QList<int>({2, 2, 1}));
        QCOMPARE(QStringList({list->GetCurrentData(), list->GetCurrentCaption()}),
            QStringList({dataFor(nowShown), captionFor(nowShown)}));
        QCOMPARE(list->imgN(1).Picture().cacheKey(), picture);
        QCOMPARE(list->imgN(1).BackColor(), FrameFill);
        QCOMPARE(list->labN(1).foreColor(), QColor(Qt::black));
    }

    void removingTheOnlyItemFailsAndChangesOnlyTheTag()
    {
        auto list = shownList(400, 400, 1);
        QVERIFY(list);
        list->InitSelection();
        const ListError error = list->RemoveCurrentItem();
        QCOMPARE(error.number, 340);
        QCOMPARE(list->selectionTag(), u"-1"_s);
        QCOMPARE(QList<int>({list->loadedCount(), list->layoutState().itemCount}), QList<int>({1, 1}));
        QVERIFY(list->imgN(0).isVisible());
    }

    void removeAllKeepsTheFirstCaptionText()
    {
        auto list = shownList(400, 400, 5);
        QVERIFY(list);
        list->RemoveAll();
        QCOMPARE(QList<int>({list->loadedCount(), list->layoutState().itemCount}), QList<int>({1, 0}));
        QCOMPARE(QStringList({list->GetCurrentData(), list->labN(0).tag(), list->GetCurrentCaption()}),
            QStringList({u""_s, u""_s, captionFor(0)}));
        QVERIFY(!list->imgN(0).isVisible());
        // The list fills again from the first cell.
        list->Add(QPixmap(), u"Again"_s, u"x"_s);
        list->Add(QPixmap(), u"And again"_s, u"y"_s);
        QCOMPARE(list->imgN(1).geometry().topLeft(), QPointF(104, 14));
    }

    void enterAndLeftDoubleClickRaiseEnterKey()
    {
        auto list = shownList(400, 400, 4);
        QVERIFY(list);
        QStringList entered;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString& data) { entered << data; });
        list->InitSelection();
        QTest::keyClick(list.get(), Qt::Key_Right);
        QTest::keyClick(list.get(), Qt::Key_Return);
        doubleClick(list.get(), Qt::LeftButton, onCaption(*list, 3));
        QCOMPARE(list->currentIndex(), 3);
        QTest::keyClick(list.get(), Qt::Key_Enter);
        QTest::keyClick(list.get(), Qt::Key_A); // other keys do nothing
        QTest::keyClick(list.get(), Qt::Key_Home);
        QCOMPARE(list->currentIndex(), 3);
        doubleClick(list.get(), Qt::RightButton, iconCentre(*list, 1));
        QCOMPARE(entered, QStringList({dataFor(1), dataFor(3), dataFor(3)}));
        QCOMPARE(list->currentIndex(), 1);
    }

    void mouseEventsCarryButtonShiftAndPosition()
    {
        auto list = shownList(400, 400, 4);
        QVERIFY(list);
        QSignalSpy down(list.get(), &SimpleListView::MouseDown);
        QSignalSpy up(list.get(), &SimpleListView::MouseUp);
        QSignalSpy move(list.get(), &SimpleListView::MouseMove);
        const QPoint at = list->imgN(2).geometry().topLeft().toPoint() + QPoint(5, 6);
        QTest::mouseClick(list.get(), Qt::RightButton, Qt::ShiftModifier, at);
        QCOMPARE(list->currentIndex(), 2);
        QCOMPARE(down.value(0), (QVariantList {qint16(2), qint16(1), 5.0f, 6.0f}));
        QCOMPARE(up.value(0), down.value(0));

        // Nothing happens over the background.
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(300, 300));
        send(list.get(),
            QMouseEvent(QEvent::MouseMove, QPointF(310, 300), list->mapToGlobal(QPointF(310, 300)), Qt::NoButton,
                Qt::NoButton, Qt::NoModifier));
        QCOMPARE(QList<qsizetype>({down.count(), move.count()}), QList<qsizetype>({1, 0}));
        QCOMPARE(list->currentIndex(), 2);
        const QPointF caption = onCaption(*list, 1);
        send(list.get(),
            QMouseEvent(
                QEvent::MouseMove, caption, list->mapToGlobal(caption), Qt::NoButton, Qt::NoButton, Qt::NoModifier));
        QCOMPARE(move.count(), 1);
        QCOMPARE(move.at(0).at(2).toFloat(), 10.0f);
    }

    void clicksFindItemsInAScrolledLongList()
    {
        auto list = shownList(283, 250, 300);
        QVERIFY(list);
        list->vbarWindow()->setValue(int(list->layoutState().rowTops.at(60)));
        for (int index : {180, 181, 182, 183}) {
            QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, index));
            QCOMPARE(list->currentIndex(), index);
        }
        // A new caption does not re-arrange the grid, and one that grew is still found below its old bottom,
        // in the gap above the next row's icon.
        const qreal nextRow = list->imgN(186).geometry().top();
        list->SetCurrentCaption(u"A caption long enough to wrap over many many lines of the grid"_s);
        QCOMPARE(list->imgN(186).geometry().top(), nextRow);
        const QRectF grown = list->labN(183).geometry();
        const qreal gap = nextRow - 5;
        QVERIFY(grown.bottom() > gap);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 181));
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(int(grown.left()) + 2, int(gap)));
        QCOMPARE(list->currentIndex(), 183);
    }

    void droppedFilesReachTheHostOnlyWhenDropsAreOn()
    {
        auto list = shownList(400, 400, 2);
        QVERIFY(list);
        QStringList received;
        QList<int> over;
        connect(list.get(), &SimpleListView::OLEDragDrop, this,
            [&](const QMimeData* data, qint32&, qint16, qint16, float x, float y) {
                received << u"%1,%2"_s.arg(x).arg(y);
                for (const QUrl& url : data->urls())
                    received << url.toLocalFile();
            });
        connect(list.get(), &SimpleListView::OLEDragOver, this,
            [&](const QMimeData*, qint32&, qint16, qint16, float, float, qint16 state) { over << state; });
        QMimeData mime;
        mime.setUrls({QUrl::fromLocalFile(u"/games/a.exe"_s), QUrl::fromLocalFile(u"/games/b.swf"_s)});
        const auto drop = [&] {
            QDropEvent event(QPointF(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
            QApplication::sendEvent(list.get(), &event);
            return event.isAccepted();
        };
        QVERIFY(!list->acceptDrops());
        QVERIFY(!drop());
        QVERIFY(received.isEmpty());

        list->SetOLEDropMode(1);
        QVERIFY(list->acceptDrops());
        QDragEnterEvent enter(QPoint(50, 60), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list.get(), &enter);
        QVERIFY(enter.isAccepted());
        QCOMPARE(over, QList<int> {0});
        QVERIFY(drop());
        QCOMPARE(received, QStringList({u"50,60"_s, u"/games/a.exe"_s, u"/games/b.swf"_s}));
        // A host that sets the effect to none refuses the drop.
        connect(list.get(), &SimpleListView::OLEDragDrop, this,
            [](const QMimeData*, qint32& effect, qint16, qint16, float, float) { effect = 0; });
        QVERIFY(!drop());
    }

    void dragRefusedByTheHostCompletesAtOnce()
    {
        SimpleListView list;
        QList<int> offered;
        connect(&list, &SimpleListView::OLEStartDrag, this, [&](QMimeData*, qint32& allowed) {
            offered << allowed;
            allowed = 0;
        });
        QSignalSpy completed(&list, &SimpleListView::OLECompleteDrag);
        list.OLEDrag();
        QCOMPARE(offered, QList<int> {int(Qt::CopyAction | Qt::MoveAction)});
        QCOMPARE(completed.value(0), QVariantList {0});
    }

    void propertiesPersistOnlyWhenNotDefault()
    {
        SimpleListView list;
        QSignalSpy changed(&list, &SimpleListView::propertyChanged);
        QVERIFY(list.WriteProperties().isEmpty());
        list.SetBackColor(QColor(255, 0, 0));
        list.SetOLEDropMode(1);
        QCOMPARE(changed.count(), 2);
        QCOMPARE(changed.at(0).at(0).toString(), u"BackColor"_s);
        const QVariantMap saved = list.WriteProperties();
        QCOMPARE(saved.value(u"BackColor"_s).toUInt(), 0x000000FFu);
        QCOMPARE(saved.value(u"OLEDropMode"_s).toInt(), 1);

        SimpleListView restored;
        restored.ReadProperties(saved);
        QCOMPARE(restored.BackColor(), QColor(255, 0, 0));
        QVERIFY(restored.OLEDropMode() == 1 && restored.acceptDrops());
        restored.ReadProperties({{u"BackColor"_s, u"garbage"_s}});
        QCOMPARE(restored.BackColor(), ListBack);
        QCOMPARE(restored.OLEDropMode(), 0);
        QVERIFY(restored.WriteProperties().isEmpty());
    }

    void itemCountStopsAtTheSixteenBitLimit()
    {
        SimpleListView list;
        list.resize(800, 600);
        for (int i = 0; i < 32767; ++i)
            list.AddEx(u"G"_s, QString());
        QCOMPARE(list.layoutState().itemCount, 32767);
        const auto raisesOverflow = [](const std::function<void()>& add) {
            try {
                add();
            } catch (const NumberedError& error) {
                return error.number() == 6 && error.message() == u"Overflow";
            }
            return false;
        };
        QVERIFY(raisesOverflow([&] { list.AddEx(u"One too many"_s, QString()); }));
        QVERIFY(raisesOverflow([&] { list.Add(QPixmap(), u"One too many"_s, QString()); }));
        QCOMPARE(list.loadedCount(), 32767);
    }

    void longLibraryScrollsToItsLastGame()
    {
        auto list = shownList(480, 400, 0);
        QVERIFY(list);
        for (int i = 0; i < 20000; ++i)
            list->AddEx(captionFor(i), dataFor(i));
        list->Refresh();
        QScrollBar* bar = list->vbarWindow();
        QVERIFY(bar->maximum() > 32767);
        bar->setValue(bar->maximum());
        const QRectF last = list->labN(19999).geometry();
        QVERIFY(last.top() > 0 && last.bottom() <= list->height());
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconCentre(*list, 19999));
        QCOMPARE(list->GetCurrentData(), dataFor(19999));
    }

    void imageCtrlDrawsItsPictureOverItsBackColor()
    {
        ImageCtrl control;
        QCOMPARE(control.size(), QSize(32, 32));

        const QPixmap picture = GamePicture(QColor(200, 40, 40), u'C');
        const QColor body = picture.toImage().pixelColor(16, 28);
        control.SetBackColor(ListBack);
        control.SetPicture(picture);
        QCOMPARE(shownAt(control, 0, 0), ListBack); // transparent corner
        QCOMPARE(shownAt(control, 16, 28), body);
        // A new colour redraws at once.
        control.SetBackColor(FrameFill);
        QCOMPARE(shownAt(control, 0, 0), FrameFill);
        QCOMPARE(shownAt(control, 16, 28), body);
        // An empty picture leaves the surface as it is until the colour changes.
        control.SetPicture(QPixmap());
        QVERIFY(control.Picture().isNull());
        QCOMPARE(shownAt(control, 16, 28), body);
        control.SetBackColor(QColor(10, 20, 30));
        QCOMPARE(shownAt(control, 16, 28), QColor(10, 20, 30));
        // Larger pictures are drawn at icon size.
        QPixmap big(64, 64);
        big.fill(Qt::red);
        control.SetPicture(big);
        QCOMPARE(shownAt(control, 31, 31), QColor(Qt::red));
    }

    void imageCtrlPassesMouseEventsOn()
    {
        ImageCtrl control;
        control.show();
        QVERIFY(QTest::qWaitForWindowExposed(&control));
        QSignalSpy down(&control, &ImageCtrl::MouseDown);
        QSignalSpy up(&control, &ImageCtrl::MouseUp);
        QSignalSpy click(&control, &ImageCtrl::Click);
        QSignalSpy doubleClick(&control, &ImageCtrl::DblClick);
        QTest::mouseClick(&control, Qt::RightButton, Qt::ControlModifier, QPoint(7, 9));
        QCOMPARE(down.value(0), (QVariantList {qint16(2), qint16(2), 7.0f, 9.0f}));
        QCOMPARE(QList<qsizetype>({up.count(), click.count()}), QList<qsizetype>({1, 1}));
        QTest::mouseDClick(&control, Qt::LeftButton, {}, QPoint(3, 3));
        QTest::mouseRelease(&control, Qt::LeftButton, {}, QPoint(3, 3));
        QCOMPARE(doubleClick.count(), 1);
    }

    // A list of thirty games rendered to a picture a person can look at.
    void screenshot()
    {
        auto list = shownList(560 - 17, 380, 30);
        QVERIFY(list);
        list->setFocus();
        list->InitSelection();
        QTest::keyClick(list.get(), Qt::Key_Right);
        QTest::keyClick(list.get(), Qt::Key_Down);
        const QImage shot = list->grab().toImage();
        QVERIFY(QDir().mkpath(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR)));
        QVERIFY(shot.save(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR "/listview.png")));

        // The list colour around the icons and the light-blue frame behind the current item.
        QCOMPARE(shot.pixelColor(2, 2), ListBack);
        const QRectF frame = list->selectionFrameRect();
        QCOMPARE(shot.pixelColor(int(frame.left()) + 2, int(frame.top()) + 2), FrameFill);
    }
};

QTEST_MAIN(TestListView)
#include "tst_listview.moc"
