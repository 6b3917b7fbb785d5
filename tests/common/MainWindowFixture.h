#pragma once

#include "TestFiles.h"
#include "UrlCatcher.h"

#include <QColor>
#include <QPixmap>
#include <QSignalSpy>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>
#include <QTest>

#include <functional>
#include <memory>

class QWidget;
class TestEnvironment;

// A game-like 32 x 32 picture with transparent corners: a rounded square of `color`.
QPixmap GamePicture(const QColor& color);

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

// A library as a user has it: three installed games with their icons beside them, one without an icon
// ("snake"), one whose icon is already cached ("Happy Farm"), a Flash movie ("Bubble Shooter"), and one game
// added by hand with a name of the user's ("My Puzzle").
// Returns the path of the game added by hand.
QString BuildSampleLibrary(const TestEnvironment& environment);

// Chooses a file or a folder in an open file dialog, once the dialog has taken it in, and accepts it.
void ChooseInFileDialog(QWidget* fileDialog, const QString& path);

// Runs act on the next modal window (dialog or message box) as soon as it shows.
void WhenModalShows(const std::function<void(QWidget*)>& act);

// Shows a new main window and returns it once its list has been filled.
template <class Window>
std::unique_ptr<Window> OpenFilledWindow()
{
    auto window = std::make_unique<Window>();
    QSignalSpy rebuilt(window.get(), &Window::listRebuilt);
    window->show();
    QTest::qVerify(rebuilt.wait(20000), "rebuilt.wait(20000)", "the list was not filled", __FILE__, __LINE__);
    return window;
}

// The caption and path of the i-th game of a list built by ShownList; captions of one, four and six words.
QString SampleCaption(int i);
QString SamplePath(int i);

// An icon list `usableWidth` wide beside its scroll bar, holding `items` sample games, shown with the focus.
template <class List>
std::unique_ptr<List> ShownList(int usableWidth, int height, int items)
{
    auto list = std::make_unique<List>();
    list->resize(usableWidth + list->vbarWindow()->width(), height);
    for (int i = 0; i < items; ++i)
        list->Add(GamePicture(QColor::fromHsv(i * 37 % 360, 160, 200)), SampleCaption(i), SamplePath(i));
    list->Refresh();
    list->show();
    list->activateWindow();
    list->setFocus();
    QTest::qVerify(QTest::qWaitForWindowActive(list.get()), "active", "the list has no focus", __FILE__, __LINE__);
    return list;
}
