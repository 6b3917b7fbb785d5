#include "ui/listview/ListConstants.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include "ListTestIcons.h"
#include "TestEnvironment.h"

#include <QDir>
#include <QScrollBar>
#include <QTest>

using namespace Brimvault;

// Renders a list of about thirty games to a picture a person can look at.
class TestListViewScreenshot : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void rendersAPolishedGrid()
    {
        TestEnvironment environment;
        const QStringList captions {QStringLiteral("Chess"), QStringLiteral("Solitaire"), QStringLiteral("FreeCell"),
            QStringLiteral("Spider Solitaire"), QStringLiteral("Minesweeper"), QStringLiteral("Hearts"),
            QStringLiteral("Internet Reversi"), QStringLiteral("Internet Nardi"), QStringLiteral("Internet Shashki"),
            QStringLiteral("Mah Jongg Titans"), QStringLiteral("Purble Place"), QStringLiteral("Chess Titans"),
            QStringLiteral("Online games catalogue"), QStringLiteral("Pinball"), QStringLiteral("Tetris"),
            QStringLiteral("Sokoban Deluxe Edition"), QStringLiteral("Lines"),
            QStringLiteral("Supercalifr agilisticexp..."), QStringLiteral("Bubble Shooter"), QStringLiteral("Zuma"),
            QStringLiteral("Tower of Hanoi"), QStringLiteral("Checkers"), QStringLiteral("Go"),
            QStringLiteral("Backgammon Championship"), QStringLiteral("Sudoku"), QStringLiteral("Crossword"),
            QStringLiteral("Pac Runner"), QStringLiteral("Space Invaders Classic"), QStringLiteral("Snake"),
            QStringLiteral("Arkanoid")};

        SimpleListView list;
        list.resize(560, 380);
        for (int i = 0; i < captions.size(); ++i) {
            const QColor color = QColor::fromHsv((i * 47) % 360, 170, 210);
            list.Add(makeTestIcon(color, captions[i].at(0)), captions[i], QStringLiteral("/games/%1").arg(i));
        }
        list.Refresh();
        list.show();
        QVERIFY(QTest::qWaitForWindowExposed(&list));
        list.setFocus();
        list.InitSelection();
        QTest::keyClick(&list, Qt::Key_Right);
        QTest::keyClick(&list, Qt::Key_Down);
        QVERIFY(list.isSelectionFrameVisible());
        QVERIFY(list.vbarWindow()->isVisible());

        const QImage shot = list.grab().toImage();
        const QString folder = QStringLiteral(BRIMVAULT_SCREENSHOT_DIR);
        QVERIFY(QDir().mkpath(folder));
        const QString file = folder + QStringLiteral("/listview.png");
        QVERIFY(shot.save(file));
        qInfo("screenshot: %s", qPrintable(file));

        // What a person should see: the list colour around the icons, the light-blue frame behind the
        // current item with its black caption, and white captions elsewhere.
        const QRectF frame = list.selectionFrameRect();
        QCOMPARE(shot.pixelColor(2, 2), QColor(92, 120, 184));
        QCOMPARE(
            shot.pixelColor(int(frame.left()) + 2, int(frame.top()) + 2), QColor::fromRgb(ListGrid::FrameFillColor));
        int white = 0;
        int dark = 0;
        const QRect caption = list.labN(list.currentIndex()).geometry().toAlignedRect();
        for (int y = 0; y < shot.height(); ++y) {
            for (int x = 0; x < shot.width() - list.vbarWindow()->width(); ++x) {
                const QColor c = shot.pixelColor(x, y);
                if (c == QColor(Qt::white))
                    ++white;
                if (caption.contains(x, y) && c.lightness() < 60)
                    ++dark;
            }
        }
        QVERIFY(white > 200);
        QVERIFY(dark > 10);
    }
};

QTEST_MAIN(TestListViewScreenshot)

#include "tst_listviewscreenshot.moc"
