#pragma once

#include "TestFiles.h"
#include "UrlCatcher.h"

#include <QColor>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <functional>

class QWidget;
class TestEnvironment;

// Registers the real dialog library (bin/Quillet) in the test's component registry, as start-up would.
bool RegisterQuillet();

// A temporary program folder (BRIMVAULT_PROGRAM_DIR) holding what ships beside the program: the help pages,
// and the language files when asked for.
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

// The game's information file with its name in English and in Russian, as the service installs it.
bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName);

// A library as a user has it: nine installed games with their icons beside them, one without an icon
// ("snake"), one whose icon is already cached ("Happy Farm"), a Flash movie ("Bubble Shooter"), and one game
// added by hand with a name of the user's ("My Puzzle").
// Returns the path of the game added by hand.
QString BuildSampleLibrary(const TestEnvironment& environment);

// Chooses a file or a folder in an open file dialog, once the dialog has taken it in, and accepts it.
void ChooseInFileDialog(QWidget* fileDialog, const QString& path);

// Runs act on the next modal window (dialog or message box) as soon as it shows.
void WhenModalShows(const std::function<void(QWidget*)>& act);
