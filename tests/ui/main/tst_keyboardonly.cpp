// The main window driven by the keyboard alone: each menu opens from its keys at a sensible place with every
// command reached by the arrow keys.
#include "MainWindowFixture.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/frmMain.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QAction>
#include <QKeyEvent>
#include <QMenu>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestKeyboardOnly : public QObject {
    Q_OBJECT

    TestEnvironment m_env;
    ProgramFolderFixture m_program {true};
    PromptRecorder m_prompts;
    std::unique_ptr<frmMain> m_window;

    SimpleListView* list() const { return m_window->ListView1(); }

    void press(const QString& keys)
    {
        if (keys.startsWith(u"Alt"_s)) {
            QKeyEvent altDown(QEvent::KeyPress, Qt::Key_Alt, Qt::AltModifier);
            QApplication::sendEvent(list(), &altDown);
            if (keys == u"Alt+Left"_s)
                QTest::keyClick(list(), Qt::Key_Left, Qt::AltModifier);
            QKeyEvent altUp(QEvent::KeyRelease, Qt::Key_Alt, Qt::NoModifier);
            QApplication::sendEvent(list(), &altUp);
        } else {
            const QKeyCombination combination = QKeySequence(keys)[0];
            QTest::keyClick(list(), combination.key(), combination.keyboardModifiers());
        }
    }

private Q_SLOTS:
    void initTestCase() { BuildSampleLibrary(m_env); }

    void init()
    {
        m_window = OpenFilledWindow<frmMain>();
        m_window->activateWindow();
        QVERIFY(QTest::qWaitForWindowActive(m_window.get()));
        list()->setFocus();
        list()->InitSelection();
        QTest::keyClick(list(), Qt::Key_Right);
    }

    void cleanup() { m_window.reset(); }

    void keysOpenAMenuWhoseCommandsTheArrowsReach_data()
    {
        const QStringList actions {u"mnuAddFile"_s, u"mnuAddFolder"_s, u"mnuInstall"_s, u"mnuOrder"_s,
            u"mnuGetMoreGames"_s, u"mnuActionRemoveFile"_s, u"mnuActionRemoveAllFiles"_s, u"mnuLanguage"_s,
            u"mnuHelp"_s, u"mnuAbout"_s};
        const QStringList item {u"mnuOpenGame"_s, u"mnuRenameGame"_s, u"mnuRemoveFile"_s};
        QTest::addColumn<QString>("keys");
        QTest::addColumn<QStringList>("commands");
        QTest::newRow("F10") << u"F10"_s << actions;
        QTest::newRow("Alt alone") << u"Alt"_s << actions;
        QTest::newRow("Alt with an arrow") << u"Alt+Left"_s << QStringList();
        QTest::newRow("Shift+F10") << u"Shift+F10"_s << item;
        QTest::newRow("menu key") << u"Menu"_s << item;
    }
    void keysOpenAMenuWhoseCommandsTheArrowsReach()
    {
        QFETCH(QString, keys);
        QFETCH(QStringList, commands);
        press(keys);
        QMenu* actions = m_window->mnuActions();
        QCOMPARE(actions->isVisible(), commands.value(0) == u"mnuAddFile"_s);
        QCOMPARE(m_window->mnuItemPopup()->isVisible(), commands.value(0) == u"mnuOpenGame"_s);
        if (commands.isEmpty())
            return;
        QMenu* shown = actions->isVisible() ? actions : m_window->mnuItemPopup();
        // The Actions menu hangs under its button (moved left if it would leave the screen); the game's menu
        // opens on the current game's icon.
        const QPoint at = shown == actions
            ? m_window->imgActions()->mapToGlobal(QPoint(0, m_window->imgActions()->height()))
            : list()->mapToGlobal(list()->imgN(1).geometry().center().toPoint());
        QCOMPARE(shown->pos().y(), at.y());
        QVERIFY(shown->pos().x() <= at.x() && shown->geometry().right() >= at.x());
        QStringList reached;
        while (shown->activeAction() && !reached.contains(shown->activeAction()->objectName())) {
            reached << shown->activeAction()->objectName();
            QTest::keyClick(shown, Qt::Key_Down);
        }
        QCOMPARE(reached, commands);
        QTest::keyClick(shown, Qt::Key_Escape);
        QVERIFY(!shown->isVisible());
    }

    void actionsButtonIsNamedAndPressable()
    {
        QAccessibleInterface* button = QAccessible::queryAccessibleInterface(m_window->imgActions());
        QCOMPARE(button->role(), QAccessible::Button);
        QCOMPARE(button->text(QAccessible::Name), u"Actions"_s);
        button->actionInterface()->doAction(QAccessibleActionInterface::pressAction());
        QVERIFY(m_window->mnuActions()->isVisible());
    }
};

BV_REGISTER_TEST(TestKeyboardOnly);

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}

#include "tst_keyboardonly.moc"
