// The real main window over a temporary library, driven with the mouse, the keyboard and its menus.
#include "MainWindowFixture.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"

#include "i18n/ApplyLanguage.h"
#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/frmMain.h"

#include <QAction>
#include <QComboBox>
#include <QDir>
#include <QFileDialog>
#include <QLabel>
#include <QMenu>
#include <QMimeData>
#include <QPointer>
#include <QPushButton>
#include <QSignalSpy>
#include <QTest>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QString setting(const QString& section, const QString& key)
{
    return GetSetting(AppTitle(), section, key);
}

QStringList captionsOf(SimpleListView* list)
{
    QStringList captions;
    for (int i = 0; i < list->layoutState().itemCount; ++i)
        captions << list->labN(i).text();
    return captions;
}

bool samePicture(const QPixmap& a, const QPixmap& b)
{
    return !a.isNull()
        && a.toImage().convertToFormat(QImage::Format_ARGB32) == b.toImage().convertToFormat(QImage::Format_ARGB32);
}

// The names of a menu's items in order, "-" for a separator.
QString menuLayout(QMenu* menu)
{
    QStringList names;
    for (QAction* action : menu->actions())
        names << (action->isSeparator() ? u"-"_s : action->objectName());
    return names.join(u' ');
}

// What a file dialog showed when it opened.
struct DialogSeen {
    QString title;
    QString folder;
    QStringList filters;
};

} // namespace

class TestFrmMain : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    std::unique_ptr<PromptRecorder> m_prompts;

    // Shows a new window and waits until discovery has filled its list.
    std::unique_ptr<frmMain> openWindow()
    {
        auto window = std::make_unique<frmMain>();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        window->show();
        if (!rebuilt.wait(10000))
            qWarning("the list was not filled");
        return window;
    }

    // Triggers a menu item whose command opens a file dialog, chooses `path` in it (cancels for an empty
    // path) and returns what the dialog showed.
    DialogSeen throughFileDialog(frmMain* window, const QString& item, const QString& path)
    {
        DialogSeen seen;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            seen = {dialog->windowTitle(), dialog->directory().absolutePath(), dialog->nameFilters()};
            if (path.isEmpty())
                dialog->reject();
            else
                ChooseInFileDialog(dialog, path);
        });
        window->menuItem(item)->trigger();
        return seen;
    }

    void chooseLanguage(frmMain* window, int entry)
    {
        WhenModalShows([entry](QWidget* modal) {
            auto* dialog = qobject_cast<frmLanguages*>(modal);
            QVERIFY(dialog);
            dialog->cbLanguages()->setCurrentIndex(entry);
            QTest::mouseClick(dialog->cmdOK(), Qt::LeftButton);
        });
        window->menuItem(u"mnuLanguage"_s)->trigger();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(true);
        QVERIFY(RegisterQuillet());
        modLocalizer::UseBuiltInLanguage();
        m_prompts = std::make_unique<PromptRecorder>(PromptAnswer::No);
    }
    void cleanup()
    {
        m_prompts.reset();
        modLocalizer::UseBuiltInLanguage();
        m_program.reset();
        m_env.reset();
    }

    void menusOpenFromTheirButtonsAndOnRightClick()
    {
        BuildSampleLibrary(*m_env);
        auto window = openWindow();
        for (const char* button : {"labActions", "imgActions"}) {
            QTest::mouseClick(window->findChild<ClickLabel*>(QString::fromLatin1(button)), Qt::LeftButton);
            QTRY_VERIFY(window->mnuActions()->isVisible());
            window->mnuActions()->hide();
        }
        QCOMPARE(menuLayout(window->mnuActions()),
            u"mnuAddFile mnuAddFolder mnuInstall - mnuOrder - mnuGetMoreGames - mnuActionRemoveFile "
            "mnuActionRemoveAllFiles - mnuLanguage - mnuHelp - mnuAbout"_s);
        QCOMPARE(menuLayout(window->mnuItemPopup()), u"mnuOpenGame - mnuRenameGame mnuRemoveFile"_s);

        // A right click selects the item and opens the item menu after a short timer; a left click opens nothing.
        SimpleListView* list = window->ListView1();
        QTest::mouseClick(list, Qt::RightButton, {}, list->imgN(2).geometry().center().toPoint());
        QCOMPARE(list->currentIndex(), 2);
        QVERIFY(!window->mnuItemPopup()->isVisible());
        QTRY_VERIFY(window->mnuItemPopup()->isVisible());
        window->mnuItemPopup()->hide();
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(1).geometry().center().toPoint());
        QTest::qWait(150);
        QVERIFY(!window->mnuItemPopup()->isVisible());
    }

    void listFilledFromTheLibrary()
    {
        const QString added = BuildSampleLibrary(*m_env);
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        QCOMPARE(list->layoutState().itemCount, 14);
        QCOMPARE(list->currentIndex(), 0);
        QCOMPARE(list->labN(0).text(), u"Online games"_s);
        QCOMPARE(list->labN(0).tag(), u"http://127.0.0.1:9/online-games-catalog.asp"_s);
        QVERIFY(samePicture(list->imgN(0).Picture(), window->imgOnLine()->Picture()));
        QCOMPARE(list->labN(13).text(), u"My Puzzle"_s);
        QCOMPARE(list->labN(13).tag(), added);
        const QStringList captions = captionsOf(list);
        // Names from information files, an icon beside the game, an icon from the cache.
        for (const QString& name : {u"Color Lines"_s, u"Happy Farm"_s, u"My Puzzle"_s}) {
            const int at = int(captions.indexOf(name));
            QVERIFY2(at > 0 && !list->imgN(at).Picture().isNull(), qPrintable(name));
        }
        QVERIFY(
            samePicture(list->imgN(int(captions.indexOf(u"Bubble Shooter"_s))).Picture(), window->imgSWF()->Picture()));
        // The game without an icon waits for the icon cache builder, which gives it the no-icon picture.
        QTRY_COMPARE_WITH_TIMEOUT(window->pendingIcons(), 0, 10000);
        QVERIFY(samePicture(list->imgN(int(captions.indexOf(u"snake"_s))).Picture(), window->imgNoIcon()->Picture()));
        QVERIFY(!window->tmrIcons()->isActive());
    }

    void addFileThroughTheDialog()
    {
        const QString folder = m_env->path(u"personal/Games"_s);
        const QString game = folder + u"/chess.exe"_s;
        QVERIFY(WriteFile(game));
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int before = list->layoutState().itemCount;
        const DialogSeen seen = throughFileDialog(window.get(), u"mnuAddFile"_s, game);
        QCOMPARE(seen.title, u"Add game file"_s);
        QCOMPARE(seen.folder, m_env->path(u"personal"_s));
        QCOMPARE(
            seen.filters, QStringList({u"All files (*.exe *.swf)"_s, u"EXE files (*.exe)"_s, u"SWF files (*.swf)"_s}));
        QCOMPARE(QStringList({setting(u"Files"_s, u"Count"_s), setting(u"Files"_s, u"File1"_s)}),
            QStringList({u"1"_s, game}));
        QCOMPARE(list->layoutState().itemCount, before + 1);
        QCOMPARE(list->labN(before).text(), u"chess"_s);
        QCOMPARE(window->lastAddFileFolder(), folder + u'/');

        // The same file again: the dialog opens where the last one was chosen, and nothing is added.
        QCOMPARE(throughFileDialog(window.get(), u"mnuAddFile"_s, game).folder, folder);
        QCOMPARE(setting(u"Files"_s, u"Count"_s), u"1"_s);
        // Cancelled: nothing changes.
        throughFileDialog(window.get(), u"mnuAddFile"_s, QString());
        QCOMPARE(list->layoutState().itemCount, before + 1);
        QCOMPARE(window->lastAddFileFolder(), folder + u'/');
    }

    void addFolderThroughTheDialog()
    {
        const QString root = m_env->path(u"personal/Pack"_s);
        for (const char* file : {"arcade.exe", "setup.exe", "readme.txt", "Sub/racer.exe", "Sub/Deeper/movie.swf"})
            QVERIFY(WriteFile(root + u'/' + QString::fromLatin1(file)));
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int before = list->layoutState().itemCount;
        QCOMPARE(throughFileDialog(window.get(), u"mnuAddFolder"_s, root).title, u"Add games from folder"_s);
        QCOMPARE(setting(u"Files"_s, u"Count"_s), u"3"_s);
        QStringList stored;
        for (int i = 1; i <= 3; ++i) {
            const QString recorded = setting(u"Files"_s, u"File%1"_s.arg(i));
            // Each added game is shown at once, in the order it was recorded.
            QCOMPARE(list->labN(before + i - 1).tag(), recorded);
            stored << QDir::cleanPath(recorded);
        }
        stored.sort();
        QCOMPARE(stored,
            QStringList({root + u"/Sub/Deeper/movie.swf"_s, root + u"/Sub/racer.exe"_s, root + u"/arcade.exe"_s}));
        const int movie = before + int(captionsOf(list).mid(before).indexOf(u"movie"_s));
        QVERIFY(samePicture(list->imgN(movie).Picture(), window->imgSWF()->Picture()));
    }

    void droppedExecutablesAreAdded()
    {
        const QString first = m_env->path(u"personal/Drop/first.exe"_s);
        const QString movie = m_env->path(u"personal/Drop/movie.swf"_s);
        const QString second = m_env->path(u"personal/Drop/second.EXE"_s);
        for (const QString& file : {first, movie, second})
            QVERIFY(WriteFile(file));
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int before = list->layoutState().itemCount;
        QMimeData mime;
        mime.setUrls({QUrl::fromLocalFile(first), QUrl::fromLocalFile(movie), QUrl::fromLocalFile(second)});
        QDragEnterEvent enter(QPoint(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list, &enter);
        QDropEvent drop(QPointF(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list, &drop);
        QVERIFY(drop.isAccepted());

        QCOMPARE(QStringList({setting(u"Files"_s, u"Count"_s), setting(u"Files"_s, u"File1"_s),
                     setting(u"Files"_s, u"File2"_s)}),
            QStringList({u"2"_s, first, second}));
        QCOMPARE(captionsOf(list).mid(before), QStringList({u"first"_s, u"second"_s}));
        // Their icons wait for the icon timer's next run: a drop does not start it.
        QCOMPARE(window->pendingIcons(), 2);
        QVERIFY(!window->tmrIcons()->isActive());
    }

    void languageDialogSwitchesWindowAndGameNames()
    {
        BuildSampleLibrary(*m_env);
        auto window = openWindow();
        const auto captions = [&] {
            QStringList texts {window->windowTitle(), window->mnuActions()->title()};
            for (const char* label : {"labActions", "Label2", "Label3", "Label4"})
                texts << window->findChild<QLabel*>(QString::fromLatin1(label))->text();
            for (const char* item : {"mnuAddFile", "mnuAddFolder", "mnuInstall", "mnuGetMoreGames",
                     "mnuActionRemoveFile", "mnuActionRemoveAllFiles", "mnuLanguage", "mnuHelp", "mnuAbout",
                     "mnuOpenGame", "mnuRenameGame", "mnuRemoveFile"})
                texts << window->menuItem(QString::fromLatin1(item))->text();
            return texts;
        };
        const QStringList english {u"Brimvault"_s, u"Actions"_s, u"Actions"_s, u"Brimvault"_s, u"Brimvault"_s,
            u"Copyright © Brimvault Games. All rights reserved."_s, u"Add game file..."_s,
            u"Add games from folder..."_s, u"Install game..."_s, u"Get more games..."_s, u"Remove game..."_s,
            u"Remove all added games..."_s, u"Language..."_s, u"Help..."_s, u"About..."_s, u"Open game offline"_s,
            u"Rename game"_s, u"Remove game..."_s};
        QCOMPARE(captions(), english);
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        chooseLanguage(window.get(), 2);
        // The translations themselves belong to the language files; here every caption must follow.
        const QStringList russian = captions();
        for (qsizetype i = 1; i < english.size(); ++i)
            QVERIFY2(i == 3 || i == 4 || russian.at(i) != english.at(i), qPrintable(english.at(i)));
        QStringList names = captionsOf(window->ListView1());
        QCOMPARE(names.value(0), u"Онлайн-игры"_s);
        // Names from the games' information files, and the publisher's own names by file title.
        QVERIFY(names.contains(u"Цветные линии"_s) && names.contains(u"Змейка"_s));
        QVERIFY(!names.contains(u"Color Lines"_s));

        chooseLanguage(window.get(), 0);
        QCOMPARE(captions(), english);
        names = captionsOf(window->ListView1());
        QVERIFY(names.contains(u"Color Lines"_s) && names.contains(u"snake"_s));
        QCOMPARE(rebuilt.count(), 2);
        QVERIFY(m_prompts->prompts.isEmpty());
    }

    void languageDialogWithoutFilesStillRebuildsTheList()
    {
        m_program = std::make_unique<ProgramFolderFixture>(false);
        auto window = openWindow();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        window->menuItem(u"mnuLanguage"_s)->trigger();
        QCOMPARE(m_prompts->prompts.size(), 1);
        QCOMPARE(rebuilt.count(), 1);
    }

    void addressesOpenInTheBrowser()
    {
        auto window = openWindow();
        UrlCatcher catcher;
        window->ListView1()->setFocus();
        QTest::keyClick(window->ListView1(), Qt::Key_Return);
        window->menuItem(u"mnuGetMoreGames"_s)->trigger();
        window->menuItem(u"mnuHelp"_s)->trigger();
        // The help page follows the language.
        modLocalizer::SwitchLanguage(m_program->path() + u"/Brimvault_Russian.lng"_s);
        window->menuItem(u"mnuHelp"_s)->trigger();
        QCOMPARE(catcher.opened,
            QList<QUrl>({QUrl(u"http://127.0.0.1:9/online-games-catalog.asp"_s),
                QUrl(u"http://127.0.0.1:9/more-games.asp?product=Brimvault"_s),
                QUrl::fromLocalFile(m_program->builtInHelpFile()),
                QUrl::fromLocalFile(m_program->path() + u"/Brimvault_Russian.html"_s)}));
    }

    void aboutThroughTheDialogLibrary()
    {
        frmMain window;
        QStringList shown;
        WhenModalShows([&](QWidget* modal) {
            for (const char* name : {"labCaption", "labVersion", "labCopyright"})
                shown << modal->findChild<QLabel*>(QString::fromLatin1(name))->text();
            qobject_cast<QDialog*>(modal)->accept();
        });
        window.menuItem(u"mnuAbout"_s)->trigger();
        QCOMPARE(shown,
            QStringList({u"Brimvault"_s, QStringLiteral("Version " BRIMVAULT_VERSION),
                u"Copyright © Brimvault Games. All rights reserved."_s}));
    }

    void itemMenuRenamesAndRemovesTheClickedGame()
    {
        const QString added = BuildSampleLibrary(*m_env);
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int index = int(captionsOf(list).indexOf(u"My Puzzle"_s));
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(index).geometry().center().toPoint());
        m_prompts->inputText = u"Evening Puzzle"_s;
        window->menuItem(u"mnuRenameGame"_s)->trigger();
        QCOMPARE(m_prompts->inputs.size(), 1);
        QCOMPARE(m_prompts->inputs.first().defaultText, u"My Puzzle"_s);
        QCOMPARE(list->labN(index).text(), u"Evening Puzzle"_s);
        QCOMPARE(setting(u"FilesNames"_s, u"FileName1"_s), u"Evening Puzzle"_s);

        const int before = list->layoutState().itemCount;
        window->menuItem(u"mnuRemoveFile"_s)->trigger();
        QCOMPARE(m_prompts->texts(), QStringList {u"Remove Evening Puzzle?"_s});
        QCOMPARE(m_prompts->prompts.first().buttons, PromptButtons::YesNo);
        QCOMPARE(list->layoutState().itemCount, before); // answered No
        m_prompts->answer = PromptAnswer::Yes;
        window->menuItem(u"mnuRemoveFile"_s)->trigger();
        QCOMPARE(list->layoutState().itemCount, before - 1);
        QVERIFY(!captionsOf(list).contains(u"Evening Puzzle"_s));
        QVERIFY(setting(u"Files"_s, u"File1"_s).isEmpty());
        QVERIFY(QFileInfo::exists(added));
    }

    void serviceSignalRebuildsTheList()
    {
        auto window = openWindow();
        const int before = window->ListView1()->layoutState().itemCount;
        QVERIFY(WriteFile(m_env->path(u"commonappdata/Brimvault/Fresh/fresh.exe"_s)));
        SaveSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s, u"1"_s);
        QTRY_COMPARE_WITH_TIMEOUT(window->ListView1()->layoutState().itemCount, before + 1, 8000);
        QCOMPARE(setting(u"Commands"_s, u"NewGameInstalled"_s), u"0"_s);
        QVERIFY(captionsOf(window->ListView1()).contains(u"fresh"_s));
    }

    void installWithoutTheServiceReportsTheFailure()
    {
        const QString package = m_env->path(u"personal/Downloads/racer.bvxpak"_s);
        QVERIFY(WriteFile(package, "PK"));
        auto window = openWindow();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        const DialogSeen seen = throughFileDialog(window.get(), u"mnuInstall"_s, package);
        QCOMPARE(QStringList({seen.title, seen.folder}), QStringList({u"Install game"_s, m_env->path(u"personal"_s)}));
        QCOMPARE(seen.filters, QStringList {u"BVXPAK files (*.bvxpak)"_s});
        QCOMPARE(m_prompts->texts(), QStringList {u"There was an error! The game isn't installed!"_s});
        QCOMPARE(m_prompts->prompts.first().icon, PromptIcon::Critical);
        QCOMPARE(rebuilt.count(), 0);
    }

    void closingStopsTheIconBuilder()
    {
        for (int i = 0; i < 300; ++i)
            QVERIFY(WriteFile(m_env->path(u"commonappdata/Brimvault/Many/game%1.exe"_s.arg(i))));
        auto window = openWindow();
        QVERIFY(window->pendingIcons() > 0);
        window->close();
        QVERIFY(window->isClosing());
        QVERIFY(!window->tmrIcons()->isActive());
        const qsizetype pending = window->pendingIcons();
        QTest::qWait(100);
        QCOMPARE(window->pendingIcons(), pending);
    }

    void closingBeforeDiscoveryLeavesTheListAlone()
    {
        BuildSampleLibrary(*m_env);
        QPointer<frmMain> window = new frmMain;
        window->setAttribute(Qt::WA_DeleteOnClose);
        QSignalSpy closing(window.data(), &frmMain::closing);
        window->show();
        // Queued behind the window's own loading: it arrives while loading lets events run.
        QTimer::singleShot(0, window.data(), [&] { window->close(); });
        QTRY_VERIFY(window.isNull());
        QCOMPARE(closing.count(), 1);
    }

    void screenshots()
    {
        BuildSampleLibrary(*m_env);
        auto window = openWindow();
        QTRY_COMPARE_WITH_TIMEOUT(window->pendingIcons(), 0, 10000);
        const int dpi = window->logicalDpiX();
        // Whatever the screen, the title keeps its designed pixels and the list its margins in twips.
        QCOMPARE(window->Label3()->geometry(), QRect(76, 8, 380, 44));
        QCOMPARE(window->ListView1()->geometry().topLeft(), dpi == 120 ? QPoint(17, 105) : QPoint(13, 84));
        QTest::mouseClick(
            window->ListView1(), Qt::LeftButton, {}, window->ListView1()->imgN(3).geometry().center().toPoint());

        const QString folder = QStringLiteral(BRIMVAULT_SCREENSHOT_DIR);
        QVERIFY(QDir().mkpath(folder));
        const QString file = folder + u"/main-%1.png"_s.arg(dpi);
        QVERIFY(window->grab().save(file));
        QCOMPARE(QImage(file).size(), window->size() * window->devicePixelRatio());
        for (const char* item : {"mnuLanguage", "mnuAbout"}) {
            WhenModalShows([&](QWidget* modal) {
                modal->grab().save(folder + u"/%1-%2.png"_s.arg(QString::fromLatin1(item + 3).toLower()).arg(dpi));
                qobject_cast<QDialog*>(modal)->reject();
            });
            window->menuItem(QString::fromLatin1(item))->trigger();
        }
        window->ShowActionsMenu();
        QTRY_VERIFY(window->mnuActions()->isVisible());
        QVERIFY(window->mnuActions()->grab().save(folder + u"/actions-menu-%1.png"_s.arg(dpi)));
        window->mnuActions()->hide();
        modLocalizer::SwitchLanguage(m_program->path() + u"/Brimvault_Russian.lng"_s);
        window->RebuildList();
        QTRY_COMPARE_WITH_TIMEOUT(window->pendingIcons(), 0, 10000);
        QVERIFY(window->grab().save(folder + u"/main-%1-russian.png"_s.arg(dpi)));
    }
};

QTEST_MAIN(TestFrmMain)
#include "tst_frmmain.moc"
