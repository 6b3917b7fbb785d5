#include "MainWindowFixture.h"

#include "ListTestIcons.h"
#include "TestEnvironment.h"
#include "app/ComponentObjects.h"
#include "catalogue/IconCacheKey.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"
#include "support/ProgramFolder.h"

#include <QApplication>
#include <QDesktopServices>
#include <QDialog>
#include <QDir>
#include <QFile>
#include <QFileDialog>
#include <QFileInfo>
#include <QImage>
#include <QLibrary>
#include <QPointer>
#include <QTest>
#include <QTimer>
#include <QWidget>

#include <memory>

bool RegisterQuillet()
{
    QLibrary library(QStringLiteral(BRIMVAULT_BIN_DIR "/Quillet"));
    if (!library.load())
        return false;
    auto registerServer
        = reinterpret_cast<Brimvault::RegisterServerFunction>(library.resolve(Brimvault::RegisterServerSymbol));
    return registerServer && registerServer() == 0;
}

ProgramFolderFixture::ProgramFolderFixture(bool withLanguageFiles)
{
    qputenv("BRIMVAULT_PROGRAM_DIR", m_dir.path().toLocal8Bit());
    const QDir source(QStringLiteral(BRIMVAULT_SOURCE_DIR));
    if (withLanguageFiles) {
        const QDir lang(source.filePath(QStringLiteral("lang")));
        for (const QString& name : lang.entryList({QStringLiteral("*.lng")}, QDir::Files))
            QFile::copy(lang.filePath(name), m_dir.filePath(name));
    }
    const QDir help(source.filePath(QStringLiteral("help")));
    for (const QString& name : help.entryList({QStringLiteral("*.html")}, QDir::Files))
        QFile::copy(help.filePath(name), m_dir.filePath(name));
    QFile::copy(help.filePath(QStringLiteral("brimvault.html")), builtInHelpFile());
}

ProgramFolderFixture::~ProgramFolderFixture()
{
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
}

QString ProgramFolderFixture::builtInHelpFile() const
{
    return m_dir.filePath(Brimvault::ProgramBaseName() + QStringLiteral(".html"));
}

bool WriteFile(const QString& path, const QByteArray& bytes)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(bytes) == bytes.size();
}

bool WriteIconFile(const QString& path, const QColor& color, QChar letter)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    return makeTestIcon(color, letter).toImage().convertToFormat(QImage::Format_ARGB32).save(path, "ICO");
}

bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName)
{
    Brimvault::clsFileBag bag;
    bag.SetCurrentFileName(Brimvault::InfoFiles::GameInfoFileName(gamePath));
    bag.SetRecord(Brimvault::clsFileBag::MakeKey(QStringLiteral("Name")), name);
    bag.SetRecord(Brimvault::clsFileBag::MakeKey(QStringLiteral("Name_RUSSIAN")), russianName);
    return bag.SaveFile();
}

SampleLibrary BuildSampleLibrary(const TestEnvironment& environment)
{
    struct Installed {
        const char* folder;
        const char* title;
        const char* name;
        const char* russianName;
        QColor color;
        char letter;
    };
    const Installed games[] = {
        {"Lines", "lines", "Color Lines", "Цветные линии", QColor(220, 60, 60), 'L'},
        {"Mahjong", "mahjong", "Mahjong Garden", "Сад маджонга", QColor(40, 150, 90), 'M'},
        {"Sudoku", "sudoku", "Sudoku Master", "Мастер судоку", QColor(70, 90, 200), 'S'},
        {"Chess 3D", "chess3d", "Chess 3D", "Шахматы 3D", QColor(60, 60, 70), 'C'},
        {"Klondike", "klondike", "Klondike Solitaire", "Пасьянс «Косынка»", QColor(200, 40, 120), 'K'},
        {"Aquarium", "aquarium", "Aquarium", "Аквариум", QColor(30, 160, 200), 'A'},
        {"Street Racer", "streetracer", "Street Racer", "Уличные гонки", QColor(240, 150, 20), 'R'},
        {"Jewel Match", "jewelmatch", "Jewel Match", "Самоцветы", QColor(150, 60, 200), 'J'},
        {"Air Hockey", "airhockey", "Air Hockey", "Аэрохоккей", QColor(20, 120, 160), 'H'},
    };
    SampleLibrary library;
    const QString gamesFolder = environment.path(QStringLiteral("commonappdata/Brimvault/"));
    for (const Installed& game : games) {
        const QString folder = gamesFolder + QString::fromLatin1(game.folder) + u'/';
        const QString exe = folder + QString::fromLatin1(game.title) + QStringLiteral(".exe");
        WriteFile(exe);
        WriteGameInfo(exe, QString::fromUtf8(game.name), QString::fromUtf8(game.russianName));
        WriteIconFile(folder + QString::fromLatin1(game.title) + QStringLiteral(".ico"), game.color,
            QChar::fromLatin1(game.letter));
        library.installed.append(exe);
    }
    library.noIconGame = gamesFolder + QStringLiteral("Snake/snake.exe");
    WriteFile(library.noIconGame);
    library.cachedGame = gamesFolder + QStringLiteral("Happy Farm/happyfarm.exe");
    WriteFile(library.cachedGame);
    WriteGameInfo(library.cachedGame, QStringLiteral("Happy Farm"), QString::fromUtf8("Весёлая ферма"));
    WriteIconFile(Brimvault::IconCacheFile(gamesFolder + QStringLiteral("Icons/"), library.cachedGame),
        QColor(110, 180, 40), u'F');
    library.flashMovie = gamesFolder + QStringLiteral("Bubbles/bubbles.swf");
    WriteFile(library.flashMovie, QByteArrayLiteral("FWS"));
    WriteGameInfo(library.flashMovie, QStringLiteral("Bubble Shooter"), QString::fromUtf8("Стрелок шариками"));

    library.addedGame = environment.path(QStringLiteral("personal/Puzzles/puzzle.exe"));
    WriteFile(library.addedGame);
    WriteIconFile(environment.path(QStringLiteral("personal/Puzzles/puzzle.ico")), QColor(230, 200, 40), u'P');
    const QString app = Brimvault::AppTitle();
    Brimvault::SaveSetting(app, QStringLiteral("Files"), QStringLiteral("Count"), QStringLiteral("1"));
    Brimvault::SaveSetting(app, QStringLiteral("Files"), QStringLiteral("File1"), library.addedGame);
    Brimvault::SaveSetting(app, QStringLiteral("FilesNames"), QStringLiteral("FileName1"), QStringLiteral("My Puzzle"));
    return library;
}

void WhenModalShows(const std::function<void(QWidget*)>& act)
{
    auto* poll = new QTimer(qApp);
    poll->setInterval(10);
    auto tries = std::make_shared<int>(0);
    QObject::connect(poll, &QTimer::timeout, qApp, [poll, act, tries] {
        QWidget* modal = QApplication::activeModalWidget();
        if (!modal && ++*tries < 500)
            return;
        poll->stop();
        poll->deleteLater();
        if (!modal)
            return;
        QPointer<QWidget> shown(modal);
        act(modal);
        // A dialog the test failed to close must not hang the run.
        QTimer::singleShot(3000, qApp, [shown] {
            if (auto* dialog = qobject_cast<QDialog*>(shown.data()); dialog && dialog->isVisible())
                dialog->reject();
        });
    });
    poll->start();
}

UrlCatcher::UrlCatcher()
{
    for (const char* scheme : {"file", "http", "https"})
        QDesktopServices::setUrlHandler(QString::fromLatin1(scheme), this, "open");
}

UrlCatcher::~UrlCatcher()
{
    for (const char* scheme : {"file", "http", "https"})
        QDesktopServices::unsetUrlHandler(QString::fromLatin1(scheme));
}

void ChooseInFileDialog(QWidget* fileDialog, const QString& path)
{
    auto* dialog = qobject_cast<QFileDialog*>(fileDialog);
    if (!dialog)
        return;
    const QFileInfo chosen(path);
    if (chosen.isDir()) {
        // In a folder, accepting with nothing typed answers that folder.
        dialog->setDirectory(chosen.absoluteFilePath());
    } else {
        dialog->setDirectory(chosen.absolutePath());
        // The dialog leaves the name field alone while the user types in it.
        if (QWidget* focused = dialog->focusWidget())
            focused->clearFocus();
        dialog->selectFile(chosen.fileName());
    }
    // The dialog reads folders in the background; accepting before it has the file would answer nothing.
    const QString expected = QDir::cleanPath(chosen.absoluteFilePath());
    for (int i = 0; i < 200 && QDir::cleanPath(dialog->selectedFiles().value(0)) != expected; ++i)
        QTest::qWait(10);
    static_cast<QDialog*>(dialog)->accept();
}
