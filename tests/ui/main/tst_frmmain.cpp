// The real main window over a temporary library, driven with the mouse, the keyboard and its menus.
#include "MainWindowFixture.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"

#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QAction>
#include <QComboBox>
#include <QFileDialog>
#include <QFileInfo>
#include <QLabel>
#include <QMenu>
#include <QMessageBox>
#include <QScreen>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QStringList column(SimpleListView* list, bool tags = false)
{
    QStringList texts;
    for (int i = 0; i < list->layoutState().itemCount; ++i)
        texts << (tags ? list->labN(i).tag() : list->labN(i).text());
    return texts;
}

bool samePicture(const QPixmap& a, const QPixmap& b)
{
    return !a.isNull()
        && a.toImage().convertToFormat(QImage::Format_ARGB32) == b.toImage().convertToFormat(QImage::Format_ARGB32);
}

// Counts the paints of a list that shows more than one game.
class ListPaints : public QObject {
public:
    bool eventFilter(QObject* list, QEvent* event) override
    {
        count += event->type() == QEvent::Paint && static_cast<SimpleListView*>(list)->loadedCount() > 1;
        return false;
    }
    int count = 0;
};

} // namespace

class TestFrmMain : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderFixture> m_program;
    std::unique_ptr<PromptRecorder> m_prompts;

    // Triggers a menu item that opens a file dialog, chooses path in it (cancels for an empty path) and returns
    // the dialog's title, folder, filters and the filter it starts at.
    QStringList throughFileDialog(frmMain* window, const QString& item, const QString& path)
    {
        QStringList seen;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<QFileDialog*>(modal);
            QVERIFY(dialog);
            seen << dialog->windowTitle() << dialog->directory().absolutePath() << dialog->nameFilters()
                 << dialog->selectedNameFilter();
            path.isEmpty() ? dialog->reject() : ChooseInFileDialog(dialog, path);
        });
        window->menuItem(item)->trigger();
        return seen;
    }

    // Chooses a language in the dialog by keys alone; returns the dialog's title, its languages and the one it
    // started at.
    QStringList chooseLanguage(frmMain* window, int entry)
    {
        QStringList seen;
        WhenModalShows([&](QWidget* modal) {
            auto* dialog = qobject_cast<frmLanguages*>(modal);
            seen << dialog->windowTitle();
            for (int i = 0; i < dialog->cbLanguages()->count(); ++i)
                seen << dialog->cbLanguages()->itemText(i);
            seen << QString::number(dialog->cbLanguages()->currentIndex());
            QVERIFY(dialog->focusWidget() == dialog->cbLanguages());
            for (int i = dialog->cbLanguages()->currentIndex(); i != entry; i += entry > i ? 1 : -1)
                QTest::keyClick(dialog->cbLanguages(), entry > i ? Qt::Key_Down : Qt::Key_Up);
            QTest::keyClick(dialog->cbLanguages(), Qt::Key_Return);
        });
        window->menuItem(u"mnuLanguage"_s)->trigger();
        return seen;
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderFixture>(true);
        QVERIFY(RegisterQuillet());
        // Again here: the built-in language takes its help page from this test's program folder.
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

    void listFilledFromTheLibrary()
    {
        BuildSampleLibrary(*m_env);
        auto window = OpenFilledWindow<frmMain>();
        SimpleListView* list = window->ListView1();
        const QStringList captions = column(list);
        const auto picture = [&](const QString& name) { return list->imgN(int(captions.indexOf(name))).Picture(); };
        QCOMPARE(captions.size(), 8);
        QVERIFY(samePicture(list->imgN(0).Picture(), window->imgOnLine()->Picture()));
        QVERIFY(samePicture(picture(u"Bubble Shooter"_s), window->imgSWF()->Picture()));
        // The game without an icon waits for the icon cache builder, which gives it the no-icon picture.
        QTRY_COMPARE_WITH_TIMEOUT(window->pendingIcons(), 0, 10000);
        QVERIFY(samePicture(picture(u"snake"_s), window->imgNoIcon()->Picture()));
        QVERIFY(!window->tmrIcons()->isActive());
    }

    void addGamesThroughTheDialogs()
    {
        const QString folder = m_env->path(u"personal/Games"_s);
        const QString game = folder + u"/chess.exe"_s;
        for (const char* file : {"chess.exe", "Pack/arcade.exe", "Pack/setup.exe", "Pack/Sub/movie.swf"})
            QVERIFY(WriteFile(folder + u'/' + QString::fromLatin1(file)));
        auto window = OpenFilledWindow<frmMain>();
        SimpleListView* list = window->ListView1();
        QCOMPARE(throughFileDialog(window.get(), u"mnuAddFile"_s, game),
            QStringList({u"Add game file"_s, m_env->path(u"personal"_s), u"All files (*.exe *.swf)"_s,
                u"EXE files (*.exe)"_s, u"SWF files (*.swf)"_s, u"All files (*.exe *.swf)"_s}));
        QCOMPARE(GetSetting(AppTitle(), u"Files"_s, u"File1"_s), game);
        QCOMPARE(column(list).mid(1), QStringList {u"chess"_s});
        // The next dialog opens where the last file was chosen; cancelled, it changes nothing.
        QCOMPARE(throughFileDialog(window.get(), u"mnuAddFile"_s, QString()).value(1), folder);
        QCOMPARE(window->lastAddFileFolder(), folder + u'/');

        QCOMPARE(throughFileDialog(window.get(), u"mnuAddFolder"_s, folder + u"/Pack"_s).value(0),
            u"Add games from folder"_s);
        QCOMPARE(column(list).size(), 4);
        QVERIFY(samePicture(list->imgN(int(column(list).indexOf(u"movie"_s))).Picture(), window->imgSWF()->Picture()));
    }

    void languageDialogSwitchesWindowAndGameNames()
    {
        BuildSampleLibrary(*m_env);
        auto window = OpenFilledWindow<frmMain>();
        const auto captions = [&] {
            QStringList texts {window->windowTitle(), window->mnuActions()->title()};
            for (const char* label : {"labActions", "Label2", "Label3", "Label4"})
                texts << window->findChild<QLabel*>(QString::fromLatin1(label))->text();
            for (QAction* action : window->mnuActions()->actions() + window->mnuItemPopup()->actions())
                texts << action->text();
            texts.removeAll(QString());
            return texts;
        };
        const QStringList english = captions();
        QCOMPARE(english.size(), 19);
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        QCOMPARE(chooseLanguage(window.get(), 2),
            QStringList({u"Program language"_s, u"English (Default)"_s, u"Polski"_s, u"Русский"_s, u"0"_s}));
        // The translations belong to the language files; here every caption must follow.
        const QStringList russian = captions();
        for (qsizetype i = 1; i < english.size(); ++i)
            QVERIFY2(i == 3 || i == 4 || russian.value(i) != english.at(i), qPrintable(english.at(i)));
        // The list is built again, in the language.
        QCOMPARE(column(window->ListView1()).value(0), u"Онлайн-игры"_s);
        // The dialog speaks the language in force and starts at it, whatever the letter case of the stored name.
        SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"brimvault_RUSSIAN.LNG"_s);
        const QStringList again = chooseLanguage(window.get(), 0);
        QCOMPARE(QStringList({again.value(0), again.value(4)}), QStringList({u"Язык программы"_s, u"2"_s}));
        QCOMPARE(captions(), english);
        QCOMPARE(rebuilt.count(), 2);
        QVERIFY(m_prompts->prompts.isEmpty());
        // Without language files only a message shows, and the list is filled again all the same.
        m_program.reset();
        m_program = std::make_unique<ProgramFolderFixture>(false);
        window->menuItem(u"mnuLanguage"_s)->trigger();
        QCOMPARE(m_prompts->texts(), QStringList {u"Language files not found"_s});
        QCOMPARE(rebuilt.count(), 3);
    }

    void addressesOpenInTheBrowserAndAboutShowsTheVersion()
    {
        auto window = OpenFilledWindow<frmMain>();
        UrlCatcher catcher;
        window->menuItem(u"mnuGetMoreGames"_s)->trigger();
        window->menuItem(u"mnuHelp"_s)->trigger();
        const QString help = m_program->builtInHelpFile();
        QCOMPARE(catcher.opened,
            QList<QUrl>({QUrl(u"http://127.0.0.1:9/more-games.asp?product=Brimvault"_s), QUrl::fromLocalFile(help)}));
        // A help page that is not there is reported by name.
        QVERIFY(QFile::remove(help));
        QString message;
        WhenModalShows([&](QWidget* modal) {
            message = qobject_cast<QMessageBox*>(modal)->text();
            qobject_cast<QDialog*>(modal)->accept();
        });
        window->menuItem(u"mnuHelp"_s)->trigger();
        QVERIFY2(message.contains(QFileInfo(help).fileName()), qPrintable(message));

        // The About box is filled through the dialog library's properties.
        WhenModalShows([&](QWidget* modal) {
            message = modal->findChild<QLabel*>(u"labVersion"_s)->text();
            qobject_cast<QDialog*>(modal)->accept();
        });
        window->menuItem(u"mnuAbout"_s)->trigger();
        QCOMPARE(message, QStringLiteral("Version " BRIMVAULT_VERSION));
    }

    void removingOneGameKeepsTheRest()
    {
        BuildSampleLibrary(*m_env);
        auto window = OpenFilledWindow<frmMain>();
        QSignalSpy rebuilt(window.get(), &frmMain::listRebuilt);
        SimpleListView* list = window->ListView1();
        QStringList games = column(list, true);
        QTest::mouseClick(list, Qt::LeftButton, {}, list->imgN(2).geometry().center().toPoint());
        m_prompts->answer = PromptAnswer::Yes;
        window->menuItem(u"mnuRemoveFile"_s)->trigger();
        games.removeAt(2);
        QCOMPARE(column(list, true), games);
        QCOMPARE(list->currentIndex(), 2);
        QCOMPARE(rebuilt.count(), 0);
    }

    // The user sees a full window at once, then the list grows: it is painted while discovery still adds games.
    void listPaintedWhileItFills()
    {
        for (int i = 0; i < 100; ++i) // more than a window shows
            QVERIFY(WriteFile(m_env->path(u"commonappdata/Brimvault/Game %1/game%1.exe"_s.arg(i))));
        frmMain window;
        ListPaints paints;
        window.ListView1()->installEventFilter(&paints);
        int whileFilling = 0;
        connect(&window, &frmMain::listRebuilt, this, [&] { whileFilling = paints.count; });
        QSignalSpy rebuilt(&window, &frmMain::listRebuilt);
        window.show();
        QVERIFY(rebuilt.wait(20000));
        QVERIFY(whileFilling > 0);
    }

    // Whatever the screen: centred, the title in its designed pixels, the list at its margins in twips.
    void placesFollowTheScreen()
    {
        auto window = OpenFilledWindow<frmMain>();
        QVERIFY(
            (window->frameGeometry().center() - window->screen()->availableGeometry().center()).manhattanLength() <= 4);
        QCOMPARE(window->Label3()->geometry(), QRect(76, 8, 380, 44));
        QCOMPARE(
            window->ListView1()->geometry().topLeft(), window->logicalDpiX() == 120 ? QPoint(17, 105) : QPoint(13, 84));
    }
};

QTEST_MAIN(TestFrmMain)
#include "tst_frmmain.moc"
