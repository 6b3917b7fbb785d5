// The icon list as a screen reader meets it: its items through Qt's accessibility layer and the focus events
// arrow keys raise.
#include "MainWindowFixture.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QScrollBar>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QList<int> g_focusedChildren;

void recordFocus(QAccessibleEvent* event)
{
    if (event->type() == QAccessible::Focus && qobject_cast<SimpleListView*>(event->object()))
        g_focusedChildren.append(event->child());
}

QAccessibleInterface* childOf(SimpleListView& list, int index)
{
    return QAccessible::queryAccessibleInterface(&list)->child(index);
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

    void itemsAreChildrenWithCaptionAndPath()
    {
        const int items = 5;
        auto list = ShownList<SimpleListView>(240, 400, items);
        QAccessibleInterface* iface = QAccessible::queryAccessibleInterface(list.get());
        QCOMPARE(iface->role(), QAccessible::List);
        QCOMPARE(iface->childCount(), items);
        for (int i = 0; i < items; ++i) {
            QAccessibleInterface* item = iface->child(i);
            QCOMPARE(item->role(), QAccessible::ListItem);
            QCOMPARE(item->text(QAccessible::Name), SampleCaption(i));
            QCOMPARE(item->text(QAccessible::Description), SamplePath(i));
            QCOMPARE(item->parent()->object(), list.get());
            QCOMPARE(iface->indexOfChild(item), i);
            // Its rectangle on screen holds its icon and caption, and a reader's point there finds it.
            const QPoint icon = list->mapToGlobal(list->imgN(i).geometry().center().toPoint());
            const QPoint caption = list->mapToGlobal(list->labN(i).geometry().center().toPoint());
            QVERIFY(item->rect().contains(icon) && item->rect().contains(caption));
            QCOMPARE(iface->childAt(caption.x(), caption.y()), item);
        }
        QCOMPARE(iface->childAt(list->mapToGlobal(QPoint(2, 2)).x(), list->mapToGlobal(QPoint(2, 2)).y()), nullptr);
        // Emptied, the list keeps its hidden first element, which is no game.
        list->RemoveAll();
        QCOMPARE(iface->childCount(), 0);
    }

    void statesAndFocusEventsFollowTheSelectionAndPressStartsTheGame()
    {
        auto list = ShownList<SimpleListView>(240, 400, 5);
        QTest::mouseClick(list.get(), Qt::LeftButton, {}, list->imgN(2).geometry().center().toPoint());
        QVERIFY(childOf(*list, 2)->state().selected && childOf(*list, 2)->state().focused);
        QVERIFY(!childOf(*list, 0)->state().selected && !childOf(*list, 0)->state().focused);
        QCOMPARE(QAccessible::queryAccessibleInterface(list.get())->focusChild(), childOf(*list, 2));
        list->clearFocus();
        QVERIFY(childOf(*list, 2)->state().selected && !childOf(*list, 2)->state().focused);
        QStringList entered;
        connect(list.get(), &SimpleListView::EnterKey, this, [&](QString& data) { entered << data; });
        QAccessibleActionInterface* action = childOf(*list, 3)->actionInterface();
        QCOMPARE(action->actionNames().value(0), QAccessibleActionInterface::pressAction());
        action->doAction(QAccessibleActionInterface::pressAction());
        QCOMPARE(entered, QStringList {SamplePath(3)});
        QCOMPARE(list->currentIndex(), 3);
        // Keys that move the selection tell the reader the new item; Enter and a key against the edge do not.
        list->setFocus();
        g_focusedChildren.clear();
        for (Qt::Key key : {Qt::Key_Left, Qt::Key_Return, Qt::Key_Right, Qt::Key_Up})
            QTest::keyClick(list.get(), key);
        QCOMPARE(g_focusedChildren, QList<int>({4, 1}));
    }
};

QTEST_MAIN(TestListAccessible)
#include "tst_listaccessible.moc"
