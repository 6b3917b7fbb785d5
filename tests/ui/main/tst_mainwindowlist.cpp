// The main window's list after a removal or once full: the rest of the list stays as the user left it.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "support/UserPrompt.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QAction>
#include <QApplication>
#include <QFileInfo>
#include <QMimeData>
#include <QScrollBar>
#include <QSignalSpy>
#include <QTest>
#include <QUrl>

using namespace Brimvault;

namespace {

int indexOfData(SimpleListView* list, const QString& data)
{
    for (int i = 0; i < list->layoutState().itemCount; ++i) {
        if (list->labN(i).tag().compare(data, Qt::CaseInsensitive) == 0)
            return i;
    }
    return -1;
}

void dropFile(SimpleListView* list, const QString& file)
{
    QMimeData mime;
    mime.setUrls({QUrl::fromLocalFile(file)});
    QDragEnterEvent enter(QPoint(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(list, &enter);
    QDropEvent drop(QPointF(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
    QApplication::sendEvent(list, &drop);
}

} // namespace

class TestMainWindowList : public QObject {
    Q_OBJECT

    TestEnvironment m_env;
    ProgramFolderFixture m_program {false};

private Q_SLOTS:
    void initTestCase()
    {
        SetPromptHandler([](const PromptRequest&) { return PromptAnswer::Yes; });
    }

    void removingOneGameLeavesTheRestAsItWas()
    {
        for (int i = 0; i < 120; ++i)
            QVERIFY(WriteFile(m_env.path(QStringLiteral("commonappdata/Brimvault/Game%1/game%1.exe").arg(i))));
        const QString solitaire = m_env.path(QStringLiteral("windows/sol.exe"));
        QVERIFY(WriteFile(solitaire));
        frmMain window;
        QSignalSpy rebuilt(&window, &frmMain::listRebuilt);
        window.show();
        QVERIFY(rebuilt.wait(20000));
        SimpleListView* list = window.ListView1();
        // Sizing the window arranges the list and shows its scroll bar.
        window.resize(760, 560);
        QScrollBar* bar = list->vbarWindow();
        QVERIFY(bar->isVisible());
        QAction* remove = window.menuItem(QStringLiteral("mnuRemoveFile"));

        // A Windows game is neither installed nor added: it goes from the list, its file stays.
        const int windowsGame = indexOfData(list, solitaire);
        QVERIFY(windowsGame >= 0);
        while (list->imgN(windowsGame).geometry().bottom() > list->height() && bar->value() < bar->maximum())
            bar->triggerAction(QAbstractSlider::SliderSingleStepAdd);
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(windowsGame).geometry().center().toPoint());
        QCOMPARE(list->currentIndex(), windowsGame);
        const int count = list->layoutState().itemCount;
        remove->trigger();
        QCOMPARE(list->layoutState().itemCount, count - 1);
        QCOMPARE(indexOfData(list, solitaire), -1);
        QVERIFY(QFileInfo::exists(solitaire));
        // Its path is no longer known, so it can be added again.
        dropFile(list, solitaire);
        QCOMPARE(indexOfData(list, solitaire), count - 1);

        // An item in the middle of a scrolled list: the next one takes its place, selected, and the bar stays.
        bar->setValue(0);
        bar->triggerAction(QAbstractSlider::SliderPageStepAdd);
        const int scrolled = bar->value();
        QVERIFY(scrolled > 0);
        int middle = 0;
        while (list->imgN(middle).geometry().top() < list->height() / 2)
            ++middle;
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(middle).geometry().center().toPoint());
        QCOMPARE(list->currentIndex(), middle);
        const QString removed = list->labN(middle).tag();
        const QString next = list->labN(middle + 1).tag();
        remove->trigger();
        QCOMPARE(indexOfData(list, removed), -1);
        QCOMPARE(list->layoutState().itemCount, count - 1);
        QCOMPARE(list->currentIndex(), middle);
        QCOMPARE(list->labN(middle).tag(), next);
        QCOMPARE(bar->value(), scrolled);
        QCOMPARE(rebuilt.count(), 1);
    }

    void fullListKeepsTheWindowUsable()
    {
        const QString extra = m_env.path(QStringLiteral("personal/Drop/extra.exe"));
        QVERIFY(WriteFile(extra));
        frmMain window;
        QSignalSpy rebuilt(&window, &frmMain::listRebuilt);
        window.show();
        QVERIFY(rebuilt.wait(20000));
        SimpleListView* list = window.ListView1();
        while (list->layoutState().itemCount < 32767)
            list->AddEx(QStringLiteral("Game"), QString());

        dropFile(list, extra);
        QCOMPARE(list->layoutState().itemCount, 32767);
        QCOMPARE(indexOfData(list, extra), -1);
        list->setFocus();
        QTest::keyClick(list, Qt::Key_Right);
        QCOMPARE(list->currentIndex(), 1);
    }
};

BV_REGISTER_TEST(TestMainWindowList);
#include "tst_mainwindowlist.moc"
