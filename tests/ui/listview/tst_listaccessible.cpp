// The icon list as a screen reader and a keyboard user meet it: its items through Qt's accessibility layer,
// the focus events arrow keys raise, and the focus mark.
#include "GamePictures.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QScrollBar>
#include <QSignalSpy>
#include <QTest>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QList<int> g_focusedChildren;

void recordFocus(QAccessibleEvent* event)
{
    if (event->type() == QAccessible::Focus && qobject_cast<SimpleListView*>(event->object()))
        g_focusedChildren.append(event->child());
}

// Three items to a row, shown and holding the keyboard focus.
std::unique_ptr<SimpleListView> focusedList(int items)
{
    auto list = std::make_unique<SimpleListView>();
    list->resize(240 + list->vbarWindow()->width(), 400);
    for (int i = 0; i < items; ++i)
        list->Add(GamePicture(QColor::fromHsv(i * 40, 160, 200), QChar(u'A' + i)), u"Game %1"_s.arg(i),
            u"/games/g%1/run.exe"_s.arg(i));
    list->show();
    list->activateWindow();
    list->setFocus();
    return QTest::qWaitForWindowActive(list.get()) ? std::move(list) : nullptr;
}

QAccessibleInterface* childOf(SimpleListView& list, int index)
{
    return QAccessible::queryAccessibleInterface(&list)->child(index);
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

} // namespace

class TestListAccessible : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase()
    {
        QAccessible::installUpdateHandler(&recordFocus);
        QTRY_VERIFY2(QAccessible::isActive(), "no accessibility bridge: run through accessibility-session.sh");
    }
    void init() { g_focusedChildren.clear(); }

    void itemsAreChildrenWithCaptionAndPath_data()
    {
        QTest::addColumn<int>("items");
        // An empty list keeps its hidden first element, which is no game.
        QTest::newRow("empty") << 0;
        QTest::newRow("one") << 1;
        QTest::newRow("two rows") << 5;
    }
    void itemsAreChildrenWithCaptionAndPath()
    {
        QFETCH(int, items);
        auto list = focusedList(items);
        QVERIFY(list);
        QAccessibleInterface* iface = QAccessible::queryAccessibleInterface(list.get());
        QCOMPARE(iface->role(), QAccessible::List);
        QCOMPARE(iface->childCount(), items);
        for (int i = 0; i < items; ++i) {
            QAccessibleInterface* item = iface->child(i);
            QCOMPARE(item->role(), QAccessible::ListItem);
            QCOMPARE(item->text(QAccessible::Name), u"Game %1"_s.arg(i));
            QCOMPARE(item->text(QAccessible::Description), u"/games/g%1/run.exe"_s.arg(i));
            QCOMPARE(item->parent()->object(), list.get());
            QCOMPARE(iface->indexOfChild(item), i);
            // Its rectangle on screen holds its icon and caption, and a reader's point there finds it.
            const QPoint icon = list->mapToGlobal(list->imgN(i).geometry().center().toPoint());
            const QPoint caption = list->mapToGlobal(list->labN(i).geometry().center().toPoint());
            QVERIFY(item->rect().contains(icon) && item->rect().contains(caption));
            QCOMPARE(iface->childAt(caption.x(), caption.y()), item);
        }
        QCOMPARE(iface->childAt(list->mapToGlobal(QPoint(2, 2)).x(), list->mapToGlobal(QPoint(2, 2)).y()), nullptr);
        list->RemoveAll();
        QCOMPARE(iface->childCount(), 0);
    }

    void statesFollowSelectionAndFocus()
    {
        auto list = focusedList(4);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, list->imgN(2).geometry().center().toPoint());
        QVERIFY(childOf(*list, 2)->state().selected && childOf(*list, 2)->state().focused);
        QVERIFY(!childOf(*list, 0)->state().selected && !childOf(*list, 0)->state().focused);
        QCOMPARE(QAccessible::queryAccessibleInterface(list.get())->focusChild(), childOf(*list, 2));
        list->clearFocus();
        QVERIFY(childOf(*list, 2)->state().selected && !childOf(*list, 2)->state().focused);
    }

    void arrowKeysRaiseFocusOnTheNewItem_data()
    {
        QTest::addColumn<int>("from");
        QTest::addColumn<int>("key");
        QTest::addColumn<QList<int>>("focused");
        QTest::newRow("right") << 0 << int(Qt::Key_Right) << QList<int> {1};
        QTest::newRow("down to the next row") << 1 << int(Qt::Key_Down) << QList<int> {4};
        QTest::newRow("left at the edge moves nothing") << 3 << int(Qt::Key_Left) << QList<int> {};
        QTest::newRow("enter stays") << 2 << int(Qt::Key_Return) << QList<int> {};
    }
    void arrowKeysRaiseFocusOnTheNewItem()
    {
        QFETCH(int, from);
        QFETCH(int, key);
        QFETCH(QList<int>, focused);
        auto list = focusedList(5);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, list->imgN(from).geometry().center().toPoint());
        g_focusedChildren.clear();
        QTest::keyClick(list.get(), Qt::Key(key));
        QCOMPARE(g_focusedChildren, focused);
    }

    void pressingAnItemStartsItsGame()
    {
        auto list = focusedList(3);
        QVERIFY(list);
        QStringList entered;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString& data) { entered << data; });
        QAccessibleActionInterface* action = childOf(*list, 2)->actionInterface();
        QVERIFY(action);
        QCOMPARE(action->actionNames().value(0), QAccessibleActionInterface::pressAction());
        action->doAction(QAccessibleActionInterface::pressAction());
        QCOMPARE(entered, QStringList {u"/games/g2/run.exe"_s});
        QCOMPARE(list->currentIndex(), 2);
    }

    void focusMarkShowsAfterKeyboardUseAndOutlastsTheHighlight_data()
    {
        QTest::addColumn<bool>("byKeyboard");
        QTest::newRow("mouse") << false;
        QTest::newRow("keyboard") << true;
    }
    void focusMarkShowsAfterKeyboardUseAndOutlastsTheHighlight()
    {
        QFETCH(bool, byKeyboard);
        auto list = focusedList(3);
        QVERIFY(list);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, list->imgN(0).geometry().center().toPoint());
        if (byKeyboard)
            QTest::keyClick(list.get(), Qt::Key_Right);
        else
            QTest::mouseClick(list.get(), Qt::LeftButton, {}, list->imgN(1).geometry().center().toPoint());
        // Dashes of black and white where the highlight has its grey border, before and after it fades.
        const QSet<QRgb> marked {0x000000, 0xFFFFFF};
        QCOMPARE(frameEdgeColours(*list), byKeyboard ? marked : QSet<QRgb> {qRgb(224, 224, 224) & 0xFFFFFF});
        list->Timer1()->start(1);
        QTRY_COMPARE(frameEdgeColours(*list), byKeyboard ? marked : QSet<QRgb> {qRgb(92, 120, 184) & 0xFFFFFF});
    }
};

QTEST_MAIN(TestListAccessible)
#include "tst_listaccessible.moc"
