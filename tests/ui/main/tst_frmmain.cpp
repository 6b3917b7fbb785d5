// The real main window over a temporary library, driven with the mouse, the keyboard and its menus.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "i18n/ApplyLanguage.h"
#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/MainWindowDesign.h"
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

namespace {

QStringList names(std::initializer_list<const char*> list)
{
    QStringList result;
    for (const char* name : list)
        result << QString::fromLatin1(name);
    return result;
}

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

int indexOfCaption(SimpleListView* list, const QString& caption)
{
    return int(captionsOf(list).indexOf(caption));
}

bool samePicture(const QPixmap& a, const QPixmap& b)
{
    return !a.isNull()
        && a.toImage().convertToFormat(QImage::Format_ARGB32) == b.toImage().convertToFormat(QImage::Format_ARGB32);
}

// The names of a menu's items in order, "-" for a separator.
QStringList menuLayout(QMenu* menu)
{
    QStringList names;
    for (QAction* action : menu->actions())
        names << (action->isSeparator() ? QStringLiteral("-") : action->objectName());
    return names;
}

QString captionOf(frmMain* window, const QString& name)
{
    if (name == u"frmMain")
        return window->windowTitle();
    if (name == u"mnuActions")
        return window->mnuActions()->title();
    if (auto* action = window->menuItem(name))
        return action->text();
    return window->findChild<QLabel*>(name)->text();
}

} // namespace

class TestFrmMain : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    QList<PromptRequest> m_prompts;

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

    static void waitForIcons(frmMain* window) { QTRY_COMPARE_WITH_TIMEOUT(window->pendingIcons(), 0, 10000); }

    void switchTo(const QString& fileName)
    {
        modLocalizer::SwitchLanguage(fileName.isEmpty() ? QString() : m_program->path() + u'/' + fileName);
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(true);
        QVERIFY(RegisterQuillet());
        modLocalizer::UseBuiltInLanguage();
        m_prompts.clear();
        SetPromptHandler([this](const PromptRequest& request) {
            m_prompts.append(request);
            return PromptAnswer::Ok;
        });
    }
    void cleanup()
    {
        SetPromptHandler({});
        modLocalizer::UseBuiltInLanguage();
        m_program.reset();
        m_env.reset();
    }

    void captionsFollowTheLanguage_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("english");
        QTest::addColumn<QString>("russian");
        const auto row = [](const char* name, const char* english, const char* russian) {
            QTest::newRow(name) << QString::fromLatin1(name) << QString::fromUtf8(english)
                                << QString::fromUtf8(russian);
        };
        row("frmMain", "Brimvault", "Brimvault");
        row("labActions", "Actions", "Действия");
        row("Label2", "Brimvault", "Brimvault");
        row("Label3", "Brimvault", "Brimvault");
        row("Label4", "Copyright © Brimvault Games. All rights reserved.", "© Brimvault Games. Все права защищены.");
        row("mnuActions", "Actions", "Действия");
        row("mnuAddFile", "Add game file...", "Добавить файл игры...");
        row("mnuAddFolder", "Add games from folder...", "Добавить игры из папки...");
        row("mnuInstall", "Install game...", "Установить игру...");
        row("mnuGetMoreGames", "Get more games...", "Больше игр...");
        row("mnuActionRemoveFile", "Remove game...", "Удалить игру...");
        row("mnuActionRemoveAllFiles", "Remove all added games...", "Удалить все добавленные игры...");
        row("mnuLanguage", "Language...", "Язык...");
        row("mnuHelp", "Help...", "Справка...");
        row("mnuAbout", "About...", "О программе...");
        row("mnuOpenGame", "Open game offline", "Открыть игру без Интернета");
        row("mnuRenameGame", "Rename game", "Переименовать игру");
        row("mnuRemoveFile", "Remove game...", "Удалить игру...");
    }
    void captionsFollowTheLanguage()
    {
        QFETCH(QString, name);
        QFETCH(QString, english);
        QFETCH(QString, russian);
        frmMain window;
        QCOMPARE(captionOf(&window, name), english);
        switchTo(QStringLiteral("Brimvault_Russian.lng"));
        QCOMPARE(captionOf(&window, name), russian);
        switchTo(QString());
        QCOMPARE(captionOf(&window, name), english);
    }

    void actionsButtonOpensTheActionsMenu_data()
    {
        QTest::addColumn<QString>("button");
        QTest::newRow("label") << "labActions";
        QTest::newRow("image") << "imgActions";
    }
    void actionsButtonOpensTheActionsMenu()
    {
        QFETCH(QString, button);
        auto window = openWindow();
        QVERIFY(!window->mnuActions()->isVisible());
        QTest::mouseClick(window->findChild<ClickLabel*>(button), Qt::LeftButton);
        QTRY_VERIFY(window->mnuActions()->isVisible());
        QCOMPARE(menuLayout(window->mnuActions()),
            names({"mnuAddFile", "mnuAddFolder", "mnuInstall", "-", "mnuGetMoreGames", "-", "mnuActionRemoveFile",
                "mnuActionRemoveAllFiles", "-", "mnuLanguage", "-", "mnuHelp", "-", "mnuAbout"}));
        window->mnuActions()->hide();
    }

    void rightClickOpensTheItemMenuOnTheClickedItem()
    {
        BuildSampleLibrary(*m_env);
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        QCOMPARE(menuLayout(window->mnuItemPopup()), names({"mnuOpenGame", "-", "mnuRenameGame", "mnuRemoveFile"}));
        QTest::mouseClick(list, Qt::RightButton, {}, list->imgN(2).geometry().center().toPoint());
        QCOMPARE(list->currentIndex(), 2);
        QVERIFY(!window->mnuItemPopup()->isVisible());
        QTRY_VERIFY(window->mnuItemPopup()->isVisible());
        window->mnuItemPopup()->hide();
        // A left click opens nothing.
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(1).geometry().center().toPoint());
        QTest::qWait(150);
        QVERIFY(!window->mnuItemPopup()->isVisible());
    }

    void listKeepsItsMarginsOnResize()
    {
        auto window = openWindow();
        if (window->logicalDpiX() != 96)
            QSKIP("the margins are checked at 96 dots per inch");
        window->resize(760, 552);
        QCOMPARE(window->ListView1()->geometry(), QRect(13, 84, 743, 464));
        window->resize(500, 400);
        QCOMPARE(window->ListView1()->geometry(), QRect(13, 84, 483, 312));
        // Narrower than 260 twips: the list keeps its last place and stays visible.
        window->resize(17, 400);
        QCOMPARE(window->ListView1()->geometry(), QRect(13, 84, 483, 312));
        QVERIFY(window->ListView1()->isVisible());
    }

    void listFilledFromTheLibrary()
    {
        const SampleLibrary library = BuildSampleLibrary(*m_env);
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        QCOMPARE(list->layoutState().itemCount, 14);
        QCOMPARE(list->currentIndex(), 0);

        QCOMPARE(list->labN(0).text(), QStringLiteral("Online games"));
        QCOMPARE(list->labN(0).tag(), QStringLiteral("http://127.0.0.1:9/online-games-catalog.asp"));
        QVERIFY(samePicture(list->imgN(0).Picture(), window->imgOnLine()->Picture()));

        const QStringList captions = captionsOf(list);
        QCOMPARE(captions.last(), QStringLiteral("My Puzzle"));
        QCOMPARE(list->labN(13).tag(), library.addedGame);
        QVERIFY(!list->imgN(13).Picture().isNull());
        for (const char* name : {"Color Lines", "Mahjong Garden", "Sudoku Master", "Chess 3D", "Klondike Solitaire",
                 "Aquarium", "Street Racer", "Jewel Match", "Air Hockey", "Happy Farm"}) {
            const int index = indexOfCaption(list, QString::fromLatin1(name));
            QVERIFY2(index > 0, qPrintable(captions.join(u'|')));
            QVERIFY2(!list->imgN(index).Picture().isNull(), name);
        }
        const int movie = indexOfCaption(list, QStringLiteral("Bubble Shooter"));
        QVERIFY(movie > 0);
        QVERIFY(samePicture(list->imgN(movie).Picture(), window->imgSWF()->Picture()));

        // The game without an icon waits for the icon cache builder, which gives it the no-icon picture.
        const int snake = indexOfCaption(list, QStringLiteral("snake"));
        QVERIFY(snake > 0);
        waitForIcons(window.get());
        QVERIFY(samePicture(list->imgN(snake).Picture(), window->imgNoIcon()->Picture()));
        QVERIFY(!window->tmrIcons()->isActive());
    }

    void addFileThroughTheDialog()
    {
        const QString folder = m_env->path(QStringLiteral("personal/Games"));
        const QString game = folder + QStringLiteral("/chess.exe");
        QVERIFY(WriteFile(game));
        auto window = openWindow();
        const int before = window->ListView1()->layoutState().itemCount;

        QString title;
        QString directory;
        QStringList filters;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            title = dialog->windowTitle();
            directory = dialog->directory().absolutePath();
            filters = dialog->nameFilters();
            ChooseInFileDialog(dialog, game);
        });
        window->menuItem(QStringLiteral("mnuAddFile"))->trigger();
        QCOMPARE(title, QStringLiteral("Add game file"));
        QCOMPARE(directory, m_env->path(QStringLiteral("personal")));
        QCOMPARE(filters,
            QStringList({QStringLiteral("All files (*.exe *.swf)"), QStringLiteral("EXE files (*.exe)"),
                QStringLiteral("SWF files (*.swf)")}));
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("1"));
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("File1")), game);
        QCOMPARE(window->ListView1()->layoutState().itemCount, before + 1);
        QCOMPARE(window->ListView1()->labN(before).text(), QStringLiteral("chess"));
        QCOMPARE(window->lastAddFileFolder(), folder + u'/');
        QVERIFY(window->tmrIcons()->isActive() || window->pendingIcons() == 0);

        // The same file again: the dialog opens where the last one was chosen, and nothing is added.
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            directory = dialog->directory().absolutePath();
            ChooseInFileDialog(dialog, game);
        });
        window->menuItem(QStringLiteral("mnuAddFile"))->trigger();
        QCOMPARE(directory, folder);
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("1"));
        QCOMPARE(window->ListView1()->layoutState().itemCount, before + 1);

        // Cancelled: nothing changes.
        WhenModalShows([](QWidget* modal) { qobject_cast<QDialog*>(modal)->reject(); });
        window->menuItem(QStringLiteral("mnuAddFile"))->trigger();
        QCOMPARE(window->ListView1()->layoutState().itemCount, before + 1);
        QCOMPARE(window->lastAddFileFolder(), folder + u'/');
    }

    void addFolderThroughTheDialog()
    {
        const QString root = m_env->path(QStringLiteral("personal/Pack"));
        QVERIFY(WriteFile(root + QStringLiteral("/arcade.exe")));
        QVERIFY(WriteFile(root + QStringLiteral("/setup.exe")));
        QVERIFY(WriteFile(root + QStringLiteral("/readme.txt")));
        QVERIFY(WriteFile(root + QStringLiteral("/Sub/racer.exe")));
        QVERIFY(WriteFile(root + QStringLiteral("/Sub/Deeper/movie.swf")));
        auto window = openWindow();
        const int before = window->ListView1()->layoutState().itemCount;

        QString title;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            title = dialog->windowTitle();
            ChooseInFileDialog(dialog, root);
        });
        window->menuItem(QStringLiteral("mnuAddFolder"))->trigger();
        QCOMPARE(title, QStringLiteral("Add games from folder"));
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("3"));
        QStringList stored;
        for (const char* key : {"File1", "File2", "File3"})
            stored << QDir::cleanPath(setting(QStringLiteral("Files"), QString::fromLatin1(key)));
        stored.sort();
        QCOMPARE(stored,
            QStringList({root + QStringLiteral("/Sub/Deeper/movie.swf"), root + QStringLiteral("/Sub/racer.exe"),
                root + QStringLiteral("/arcade.exe")}));
        // Each added game is shown at once, in the order it was recorded.
        QStringList shown = captionsOf(window->ListView1()).mid(before);
        QCOMPARE(shown.size(), 3);
        for (int i = 0; i < 3; ++i) {
            const QString recorded = setting(QStringLiteral("Files"), QStringLiteral("File%1").arg(i + 1));
            QCOMPARE(window->ListView1()->labN(before + i).tag(), recorded);
        }
        const int movie = before + int(shown.indexOf(QStringLiteral("movie")));
        QVERIFY(samePicture(window->ListView1()->imgN(movie).Picture(), window->imgSWF()->Picture()));
    }

    void droppedExecutablesAreAdded()
    {
        const QString first = m_env->path(QStringLiteral("personal/Drop/first.exe"));
        const QString movie = m_env->path(QStringLiteral("personal/Drop/movie.swf"));
        const QString second = m_env->path(QStringLiteral("personal/Drop/second.EXE"));
        for (const QString& file : {first, movie, second})
            QVERIFY(WriteFile(file));
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int before = list->layoutState().itemCount;
        QVERIFY(list->acceptDrops());

        QMimeData mime;
        mime.setUrls({QUrl::fromLocalFile(first), QUrl::fromLocalFile(movie), QUrl::fromLocalFile(second)});
        QDragEnterEvent enter(QPoint(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list, &enter);
        QVERIFY(enter.isAccepted());
        QDropEvent drop(QPointF(40, 40), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
        QApplication::sendEvent(list, &drop);
        QVERIFY(drop.isAccepted());

        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("2"));
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("File1")), first);
        QCOMPARE(setting(QStringLiteral("Files"), QStringLiteral("File2")), second);
        QCOMPARE(captionsOf(list).mid(before), QStringList({QStringLiteral("first"), QStringLiteral("second")}));
        // Their icons wait for the icon timer's next run: a drop does not start it.
        QCOMPARE(window->pendingIcons(), 2);
        QVERIFY(!window->tmrIcons()->isActive());
    }

    void languageDialogWithoutFilesChangesNothing()
    {
        m_program.reset();
        m_program = std::make_unique<ProgramFolderFixture>(false);
        auto window = openWindow();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        window->menuItem(QStringLiteral("mnuLanguage"))->trigger();
        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(m_prompts.first().text, QStringLiteral("Language files not found"));
        QCOMPARE(window->labActions()->text(), QStringLiteral("Actions"));
        QVERIFY(setting(QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName")).isEmpty());
        // The list is rebuilt whatever happened in the dialog.
        QCOMPARE(rebuilt.count(), 1);
    }

    void languageDialogSwitchesWindowAndGameNames()
    {
        BuildSampleLibrary(*m_env);
        auto window = openWindow();
        const auto choose = [&](int entry) {
            WhenModalShows([entry](QWidget* modal) {
                auto* dialog = qobject_cast<frmLanguages*>(modal);
                QVERIFY(dialog);
                dialog->cbLanguages()->setCurrentIndex(entry);
                QTest::mouseClick(dialog->cmdOK(), Qt::LeftButton);
            });
            window->menuItem(QStringLiteral("mnuLanguage"))->trigger();
        };

        choose(2);
        QCOMPARE(setting(QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName")),
            QStringLiteral("Brimvault_Russian.lng"));
        QCOMPARE(window->labActions()->text(), QString::fromUtf8("Действия"));
        QCOMPARE(window->menuItem(QStringLiteral("mnuAbout"))->text(), QString::fromUtf8("О программе..."));
        QCOMPARE(window->ListView1()->labN(0).text(), QString::fromUtf8("Онлайн-игры"));
        // Names from the games' information files, and the publisher's own names by file title.
        QVERIFY(indexOfCaption(window->ListView1(), QString::fromUtf8("Цветные линии")) > 0);
        QVERIFY(indexOfCaption(window->ListView1(), QString::fromUtf8("Змейка")) > 0);
        QCOMPARE(indexOfCaption(window->ListView1(), QStringLiteral("Color Lines")), -1);

        choose(0);
        QCOMPARE(setting(QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName")),
            QStringLiteral("English (Default)"));
        QCOMPARE(window->labActions()->text(), QStringLiteral("Actions"));
        QVERIFY(indexOfCaption(window->ListView1(), QStringLiteral("Color Lines")) > 0);
        QVERIFY(indexOfCaption(window->ListView1(), QStringLiteral("snake")) > 0);
        QVERIFY(m_prompts.isEmpty());
    }

    void helpFollowsTheLanguage_data()
    {
        QTest::addColumn<QString>("languageFile");
        QTest::addColumn<QString>("helpFile");
        QTest::newRow("built-in language") << QString() << QString();
        QTest::newRow("Russian") << "Brimvault_Russian.lng"
                                 << "Brimvault_Russian.html";
        QTest::newRow("Polish") << "Brimvault_Polish.lng"
                                << "Brimvault_Polish.html";
    }
    void helpFollowsTheLanguage()
    {
        QFETCH(QString, languageFile);
        QFETCH(QString, helpFile);
        frmMain window;
        switchTo(languageFile);
        const QString expected
            = helpFile.isEmpty() ? m_program->builtInHelpFile() : m_program->path() + u'/' + helpFile;
        QVERIFY(QFileInfo::exists(expected));
        UrlCatcher catcher;
        window.menuItem(QStringLiteral("mnuHelp"))->trigger();
        QCOMPARE(catcher.opened, QList<QUrl> {QUrl::fromLocalFile(expected)});
    }

    void moreGamesAndAboutThroughTheDialogLibrary()
    {
        frmMain window;
        UrlCatcher catcher;
        window.menuItem(QStringLiteral("mnuGetMoreGames"))->trigger();
        QCOMPARE(
            catcher.opened, QList<QUrl> {QUrl(QStringLiteral("http://127.0.0.1:9/more-games.asp?product=Brimvault"))});

        QStringList shown;
        WhenModalShows([&](QWidget* modal) {
            for (const char* name : {"labCaption", "labVersion", "labCopyright"})
                shown << modal->findChild<QLabel*>(QString::fromLatin1(name))->text();
            qobject_cast<QDialog*>(modal)->accept();
        });
        window.menuItem(QStringLiteral("mnuAbout"))->trigger();
        QCOMPARE(shown,
            QStringList({QStringLiteral("Brimvault"), QStringLiteral("Version " BRIMVAULT_VERSION),
                QString::fromUtf8("Copyright © Brimvault Games. All rights reserved.")}));
    }

    void enterOnTheOnlineEntryOpensTheCatalogue()
    {
        auto window = openWindow();
        UrlCatcher catcher;
        window->ListView1()->setFocus();
        QTest::keyClick(window->ListView1(), Qt::Key_Return);
        QCOMPARE(catcher.opened, QList<QUrl> {QUrl(QStringLiteral("http://127.0.0.1:9/online-games-catalog.asp"))});
    }

    void itemMenuRenamesAndRemovesTheClickedGame()
    {
        const SampleLibrary library = BuildSampleLibrary(*m_env);
        auto window = openWindow();
        SimpleListView* list = window->ListView1();
        const int added = indexOfCaption(list, QStringLiteral("My Puzzle"));
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(added).geometry().center().toPoint());

        QList<InputRequest> asked;
        SetInputHandler([&](const InputRequest& request) -> std::optional<QString> {
            asked.append(request);
            return QStringLiteral("Evening Puzzle");
        });
        window->menuItem(QStringLiteral("mnuRenameGame"))->trigger();
        SetInputHandler({});
        QCOMPARE(asked.size(), 1);
        QCOMPARE(asked.first().defaultText, QStringLiteral("My Puzzle"));
        QCOMPARE(list->labN(added).text(), QStringLiteral("Evening Puzzle"));
        QCOMPARE(setting(QStringLiteral("FilesNames"), QStringLiteral("FileName1")), QStringLiteral("Evening Puzzle"));

        const int before = list->layoutState().itemCount;
        window->menuItem(QStringLiteral("mnuRemoveFile"))->trigger();
        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(m_prompts.first().text, QStringLiteral("Remove Evening Puzzle?"));
        QCOMPARE(m_prompts.first().buttons, PromptButtons::YesNo);
        // The recording handler answers Ok, which is not Yes: nothing is removed.
        QCOMPARE(list->layoutState().itemCount, before);

        SetPromptHandler([](const PromptRequest&) { return PromptAnswer::Yes; });
        window->menuItem(QStringLiteral("mnuRemoveFile"))->trigger();
        QCOMPARE(list->layoutState().itemCount, before - 1);
        QCOMPARE(indexOfCaption(list, QStringLiteral("Evening Puzzle")), -1);
        QVERIFY(setting(QStringLiteral("Files"), QStringLiteral("File1")).isEmpty());
        QVERIFY(QFileInfo::exists(library.addedGame));
    }

    void serviceSignalRebuildsTheList()
    {
        auto window = openWindow();
        const int before = window->ListView1()->layoutState().itemCount;
        QVERIFY(WriteFile(m_env->path(QStringLiteral("commonappdata/Brimvault/Fresh/fresh.exe"))));
        SaveSetting(AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("1"));
        QTRY_COMPARE_WITH_TIMEOUT(window->ListView1()->layoutState().itemCount, before + 1, 8000);
        QCOMPARE(setting(QStringLiteral("Commands"), QStringLiteral("NewGameInstalled")), QStringLiteral("0"));
        QVERIFY(indexOfCaption(window->ListView1(), QStringLiteral("fresh")) > 0);
    }

    void installWithoutTheServiceReportsTheFailure()
    {
        const QString package = m_env->path(QStringLiteral("personal/Downloads/racer.bvxpak"));
        QVERIFY(WriteFile(package, QByteArrayLiteral("PK")));
        auto window = openWindow();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        QString title;
        QStringList filters;
        QString directory;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            title = dialog->windowTitle();
            filters = dialog->nameFilters();
            directory = dialog->directory().absolutePath();
            ChooseInFileDialog(dialog, package);
        });
        window->menuItem(QStringLiteral("mnuInstall"))->trigger();
        QCOMPARE(title, QStringLiteral("Install game"));
        QCOMPARE(filters, QStringList {QStringLiteral("BVXPAK files (*.bvxpak)")});
        QCOMPARE(directory, m_env->path(QStringLiteral("personal")));
        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(m_prompts.first().text, QStringLiteral("There was an error! The game isn't installed!"));
        QCOMPARE(m_prompts.first().icon, PromptIcon::Critical);
        QCOMPARE(rebuilt.count(), 0);
    }

    void closingStopsTheIconBuilder()
    {
        for (int i = 0; i < 300; ++i)
            QVERIFY(WriteFile(m_env->path(QStringLiteral("commonappdata/Brimvault/Many/game%1.exe").arg(i))));
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
        waitForIcons(window.get());
        const FormScaling::TwipsPerPixel design {15.0, 15.0};
        // Whatever the screen, the title keeps its designed pixels and the list its margins in twips.
        QCOMPARE(window->Label3()->geometry(), FormScaling::TwipsToPixels(MainWindowDesign::Label3Twips, design));
        QCOMPARE(window->ListView1()->geometry(),
            MainWindowDesign::ListViewGeometry(window->size(), FormScaling::ScreenTwipsPerPixel(window.get())));
        QTest::mouseClick(
            window->ListView1(), Qt::LeftButton, {}, window->ListView1()->imgN(3).geometry().center().toPoint());

        const QString folder = QStringLiteral(BRIMVAULT_SCREENSHOT_DIR);
        QVERIFY(QDir().mkpath(folder));
        const int dpi = window->logicalDpiX();
        const QString file = folder + QStringLiteral("/main-%1.png").arg(dpi);
        QVERIFY(window->grab().save(file));
        QCOMPARE(QImage(file).size(), window->size() * window->devicePixelRatio());

        WhenModalShows([&](QWidget* modal) {
            modal->grab().save(folder + QStringLiteral("/languages-%1.png").arg(dpi));
            qobject_cast<QDialog*>(modal)->reject();
        });
        window->menuItem(QStringLiteral("mnuLanguage"))->trigger();
        WhenModalShows([&](QWidget* modal) {
            modal->grab().save(folder + QStringLiteral("/about-%1.png").arg(dpi));
            qobject_cast<QDialog*>(modal)->accept();
        });
        window->menuItem(QStringLiteral("mnuAbout"))->trigger();
        window->ShowActionsMenu();
        QTRY_VERIFY(window->mnuActions()->isVisible());
        QVERIFY(window->mnuActions()->grab().save(folder + QStringLiteral("/actions-menu-%1.png").arg(dpi)));
        window->mnuActions()->hide();

        switchTo(QStringLiteral("Brimvault_Russian.lng"));
        window->RebuildList();
        waitForIcons(window.get());
        QVERIFY(window->grab().save(folder + QStringLiteral("/main-%1-russian.png").arg(dpi)));
    }
};

QTEST_MAIN(TestFrmMain)
#include "tst_frmmain.moc"
