#pragma once

#include <QColor>
#include <QList>
#include <QObject>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>
#include <QUrl>

#include <functional>

class QWidget;
class TestEnvironment;

// Registers the real dialog library (bin/Quillet) in the test's component registry, as start-up would.
bool RegisterQuillet();

// A temporary program folder (BRIMVAULT_PROGRAM_DIR) holding what ships beside the program: the language
// files when asked for, and the help pages.
class ProgramFolderFixture {
public:
    explicit ProgramFolderFixture(bool withLanguageFiles);
    ~ProgramFolderFixture();

    QString path() const { return m_dir.path(); }
    // The help page of the built-in language: the program's file name + ".html".
    QString builtInHelpFile() const;

private:
    QTemporaryDir m_dir;
};

// An icon file with a game-like picture.
bool WriteIconFile(const QString& path, const QColor& color, QChar letter);

// Writes a file with the given bytes, creating its folders.
bool WriteFile(const QString& path, const QByteArray& bytes = QByteArrayLiteral("MZ not a real program"));

// The game's information file with its name in English and in Russian, as the service installs it.
bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName);

// A library as a user has it: installed games in the games folder with their icons beside them, one without
// an icon, a Flash movie, one whose icon is already cached, and one game added by hand with a name of the
// user's. Returns the paths of the installed files.
struct SampleLibrary {
    QStringList installed; // in the games folder, with icons beside them
    QString noIconGame; // in the games folder, waits for the icon cache builder
    QString cachedGame; // in the games folder, icon in the cache
    QString flashMovie; // in the games folder
    QString addedGame; // added by hand, named "My Puzzle"
};
SampleLibrary BuildSampleLibrary(const TestEnvironment& environment);

// Chooses a file or a folder in an open file dialog, once the dialog has taken it in, and accepts it.
void ChooseInFileDialog(QWidget* fileDialog, const QString& path);

// Runs act on the next modal window (dialog or message box) as soon as it shows.
void WhenModalShows(const std::function<void(QWidget*)>& act);

// Catches what would go to the user's browser.
class UrlCatcher : public QObject {
    Q_OBJECT
public:
    UrlCatcher();
    ~UrlCatcher() override;
    QList<QUrl> opened;

public Q_SLOTS:
    void open(const QUrl& url) { opened.append(url); }
};
