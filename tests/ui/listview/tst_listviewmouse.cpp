// Mouse input that starts away from the items: a press on the list's empty background, a pointer hovering
// over an image control.
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include "TestEnvironment.h"

#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;

class TestListViewMouse : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

private Q_SLOTS:
    void pressOnTheBackgroundSelectsNothing_data()
    {
        QTest::addColumn<Qt::MouseButton>("button");
        QTest::newRow("left button") << Qt::LeftButton;
        QTest::newRow("right button, a drag onto an icon") << Qt::RightButton;
    }
    void pressOnTheBackgroundSelectsNothing()
    {
        QFETCH(Qt::MouseButton, button);
        SimpleListView list;
        list.resize(400, 300);
        for (const char* name : {"Chess", "Lines", "Mahjong"})
            list.AddEx(QString::fromLatin1(name), QString::fromLatin1(name));
        list.show();
        QVERIFY(QTest::qWaitForWindowExposed(&list));
        list.InitSelection();
        QSignalSpy down(&list, &SimpleListView::MouseDown);
        QSignalSpy move(&list, &SimpleListView::MouseMove);
        QSignalSpy up(&list, &SimpleListView::MouseUp);

        const QPoint icon = list.imgN(2).geometry().center().toPoint();
        QTest::mousePress(&list, button, {}, QPoint(200, 250));
        QTest::mouseMove(&list, QPoint(icon.x(), 200));
        QTest::mouseMove(&list, icon);
        QTest::mouseRelease(&list, button, {}, icon);
        QCOMPARE(list.currentIndex(), 0);
        QCOMPARE(down.count(), 0);
        QCOMPARE(move.count(), 0);
        QCOMPARE(up.count(), 0);

        // Once the button is up the items hear the mouse again.
        QTest::mouseClick(&list, button, {}, icon);
        QCOMPARE(list.currentIndex(), 2);
        QCOMPARE(up.count(), 1);
    }

    void imageCtrlRaisesMouseMoveOnHover()
    {
        ImageCtrl control;
        control.show();
        QVERIFY(QTest::qWaitForWindowExposed(&control));
        QSignalSpy move(&control, &ImageCtrl::MouseMove);
        QTest::mouseMove(&control, QPoint(7, 9));
        QCOMPARE(move.count(), 1);
        QCOMPARE(move.at(0), (QVariantList {qint16(0), qint16(0), 7.0f, 9.0f}));
    }
};

QTEST_MAIN(TestListViewMouse)
#include "tst_listviewmouse.moc"
