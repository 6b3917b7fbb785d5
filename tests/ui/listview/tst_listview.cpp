// The icon list as a user meets it: real widgets, real mouse, keyboard and wheel input.
#include "GamePictures.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

#include "icons/NumberedError.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QScrollBar>
#include <QSignalSpy>
#include <QStyleOptionSlider>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

const QColor FrameFill(190, 209, 237);
const QColor ListBack(92, 120, 184);

QString captionFor(int i)
{
    return QStringList {u"Chess"_s, u"Solitaire Collection Deluxe"_s, u"Mah Jongg Quest of the Dragon"_s}.at(i % 3);
}

QString dataFor(int i)
{
    return u"C:\\Games\\game%1.exe"_s.arg(i);
}

std::unique_ptr<SimpleListView> shownList(int usable, int height, int items)
{
    auto list = std::make_unique<SimpleListView>();
    list->resize(usable + list->vbarWindow()->width(), height);
    for (int i = 0; i < items; ++i)
        list->Add(GamePicture(QColor::fromHsv(i * 37 % 360, 160, 200), u'G'), captionFor(i), dataFor(i));
    list->Refresh();
    list->show();
    return QTest::qWaitForWindowExposed(list.get()) ? std::move(list) : nullptr;
}

QPoint iconAt(SimpleListView& list, int index, QPoint offset = {16, 16})
{
    return list.imgN(index).geometry().topLeft().toPoint() + offset;
}

void doubleClick(QWidget* widget, Qt::MouseButton button, QPoint at)
{
    QTest::mouseClick(widget, button, {}, at);
    QTest::mouseDClick(widget, button, {}, at);
    QTest::mouseRelease(widget, button, {}, at);
}

void dragThumb(QScrollBar* bar, int toY)
{
    QStyleOptionSlider option;
    option.initFrom(bar);
    option.orientation = Qt::Vertical;
    option.maximum = bar->maximum();
    option.sliderPosition = bar->sliderPosition();
    option.pageStep = bar->pageStep();
    const QPoint thumb
        = bar->style()->subControlRect(QStyle::CC_ScrollBar, &option, QStyle::SC_ScrollBarSlider, bar).center();
    QTest::mousePress(bar, Qt::LeftButton, {}, thumb);
    QTest::mouseMove(bar, QPoint(thumb.x(), toY));
    QTest::mouseRelease(bar, Qt::LeftButton, {}, QPoint(thumb.x(), toY));
}

} // namespace

class TestListView : public QObject {
    Q_OBJECT

    TestEnvironment m_environment;

private Q_SLOTS:
    void scrollBarShowsOnlyWhenNeededAndSnapsToRows()
    {
        auto list = shownList(283, 200, 30);
        QVERIFY(list);
        QScrollBar* bar = list->vbarWindow();
        QCOMPARE(bar->geometry(), QRect(list->width() - bar->width(), 0, bar->width(), 200));
        dragThumb(bar, bar->height() / 2);
        QVERIFY2(list->layoutState().rowTops.contains(bar->value()), qPrintable(QString::number(bar->value())));
        QVERIFY(bar->value() > 0 && bar->value() < bar->maximum());
        QCOMPARE(list->layoutState().scrollOffsetY, -double(bar->value()));
        list->resize(list->width(), 20000);
        QTRY_VERIFY(!bar->isVisible());
        QCOMPARE(bar->value(), 0);
        QCOMPARE(list->imgN(0).geometry().top(), 14.0);
    }

    void wheelScrollsOneRowPerNotch()
    {
        auto list = shownList(283, 200, 30);
        QVERIFY(list);
        const auto turn = [&](int delta) {
            QWheelEvent wheel({100, 100}, list->mapToGlobal(QPointF(100, 100)), {}, {0, delta}, Qt::NoButton, {},
                Qt::NoScrollPhase, false);
            QApplication::sendEvent(list.get(), &wheel);
            return list->vbarWindow()->value();
        };
        const QList<double> rowTops = list->layoutState().rowTops;
        QCOMPARE(turn(-120), int(rowTops.at(1)));
        QCOMPARE(turn(-60), int(rowTops.at(1))); // half a notch waits for the other half
        QCOMPARE(turn(-60), int(rowTops.at(2)));
    }

    void selectionShowsFrameThenFades()
    {
        auto list = shownList(283, 400, 5);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 2));
        QCOMPARE(list->selectionTag(), u"2"_s);
        QVERIFY(list->isSelectionFrameVisible() && list->Timer1()->isActive());
        QCOMPARE(list->Timer1()->interval(), 2300);
        QCOMPARE(list->imgN(2).BackColor(), FrameFill);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::black));
        // The frame lies behind the icon, whose picture is drawn over it with its transparent corners.
        const QImage shown = list->grab().toImage();
        const QPoint icon = list->imgN(2).geometry().topLeft().toPoint();
        QCOMPARE(QList<QColor>({shown.pixelColor(icon), shown.pixelColor(icon + QPoint(16, 28))}),
            QList<QColor>({FrameFill, list->imgN(2).Picture().toImage().pixelColor(16, 28)}));
        QTest::keyClick(list.get(), Qt::Key_Left);
        QCOMPARE(list->currentIndex(), 1);
        QCOMPARE(list->imgN(2).BackColor(), ListBack);
        QCOMPARE(list->labN(2).foreColor(), QColor(Qt::white));
        // When the highlight runs out the frame goes and the caption stays black.
        list->Timer1()->setInterval(30);
        list->InitSelection();
        QTRY_VERIFY(!list->isSelectionFrameVisible());
        QCOMPARE(list->imgN(0).BackColor(), ListBack);
        QCOMPARE(list->labN(0).foreColor(), QColor(Qt::black));
    }

    void movingDownKeepsTheSelectionInView()
    {
        auto list = shownList(283, 250, 40);
        QVERIFY(list);
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

    void removingTheCurrentItem_data()
    {
        QTest::addColumn<int>("items");
        QTest::addColumn<int>("clicked");
        QTest::addColumn<int>("nowShown"); // the item now current, by its original index; -1: nothing removed
        QTest::newRow("middle: the next one moves up") << 3 << 1 << 2;
        QTest::newRow("last: the one before") << 3 << 2 << 1;
        QTest::newRow("the only one stays") << 1 << 0 << -1;
    }
    void removingTheCurrentItem()
    {
        QFETCH(int, items);
        QFETCH(int, clicked);
        QFETCH(int, nowShown);
        auto list = shownList(400, 400, items);
        QVERIFY(list);
        const qint64 picture = list->imgN(std::max(nowShown, 0)).Picture().cacheKey();
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, clicked));
        QCOMPARE(list->RemoveCurrentItem().number, nowShown < 0 ? 340 : 0);
        if (nowShown < 0) {
            QCOMPARE(list->selectionTag(), u"-1"_s);
            QCOMPARE(list->layoutState().itemCount, 1);
            return;
        }
        QCOMPARE(QList<int>({list->loadedCount(), list->layoutState().itemCount, list->currentIndex()}),
            QList<int>({2, 2, 1}));
        QCOMPARE(QStringList({list->GetCurrentData(), list->GetCurrentCaption()}),
            QStringList({dataFor(nowShown), captionFor(nowShown)}));
        QCOMPARE(list->imgN(1).Picture().cacheKey(), picture);
        QCOMPARE(list->imgN(1).BackColor(), FrameFill);
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
        doubleClick(list.get(), Qt::LeftButton, list->labN(3).geometry().topLeft().toPoint() + QPoint(10, 4));
        QTest::keyClick(list.get(), Qt::Key_Enter);
        QTest::keyClick(list.get(), Qt::Key_Home); // other keys do nothing
        QCOMPARE(list->currentIndex(), 3);
        doubleClick(list.get(), Qt::RightButton, iconAt(*list, 1));
        QCOMPARE(entered, QStringList({dataFor(1), dataFor(3), dataFor(3)}));
        QCOMPARE(list->currentIndex(), 1);
    }

    void mouseEventsCarryButtonShiftAndPlaceInTheItem()
    {
        auto list = shownList(400, 400, 4);
        QVERIFY(list);
        QSignalSpy down(list.get(), &SimpleListView::MouseDown);
        QSignalSpy up(list.get(), &SimpleListView::MouseUp);
        QSignalSpy move(list.get(), &SimpleListView::MouseMove);
        QTest::mouseClick(list.get(), Qt::RightButton, Qt::ShiftModifier, iconAt(*list, 2, {5, 6}));
        QCOMPARE(list->currentIndex(), 2);
        QCOMPARE(down.value(0), (QVariantList {qint16(2), qint16(1), 5.0f, 6.0f}));
        QCOMPARE(up.value(0), down.value(0));
        // A press on the background belongs to the list until released, even when it ends on an icon.
        QTest::mousePress(list.get(), Qt::LeftButton, {}, QPoint(200, 350));
        QTest::mouseMove(list.get(), iconAt(*list, 0));
        QTest::mouseRelease(list.get(), Qt::LeftButton, {}, iconAt(*list, 0));
        QCOMPARE(QList<qsizetype>({list->currentIndex(), down.count(), move.count(), up.count()}),
            QList<qsizetype>({2, 1, 0, 1}));
    }

    void longListFindsEveryClickAndScrollsToItsLastGame()
    {
        auto list = shownList(283, 900, 0);
        QVERIFY(list);
        for (int i = 0; i < 20000; ++i)
            list->AddEx(captionFor(i), dataFor(i));
        list->Refresh();
        QScrollBar* bar = list->vbarWindow();
        bar->setValue(int(list->layoutState().rowTops.at(60)));
        for (int index : {180, 181, 182, 183}) {
            QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, index));
            QCOMPARE(list->currentIndex(), index);
        }
        // A caption that grew taller than a band is found at its far end, while the grid stays as it was.
        const qreal nextRow = list->imgN(186).geometry().top();
        list->SetCurrentCaption(u"word "_s.repeated(60));
        QCOMPARE(list->imgN(186).geometry().top(), nextRow);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 181));
        const QRectF grown = list->labN(183).geometry();
        QVERIFY(grown.height() > 300);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, QPoint(int(grown.left()) + 2, int(grown.bottom()) - 2));
        QCOMPARE(list->currentIndex(), 183);
        bar->setValue(bar->maximum());
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, iconAt(*list, 19999));
        QCOMPARE(list->GetCurrentData(), dataFor(19999));
    }

    void itemCountStopsAtTheSixteenBitLimit()
    {
        SimpleListView list;
        for (int i = 0; i < 32767; ++i)
            list.AddEx(u"G"_s, QString());
        QVERIFY_THROWS_EXCEPTION(NumberedError, list.AddEx(u"One too many"_s, QString()));
        QCOMPARE(list.layoutState().itemCount, 32767);
    }
};

BV_REGISTER_TEST(TestListView);

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
#include "tst_listview.moc"
