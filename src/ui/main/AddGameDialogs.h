#pragma once

#include <QString>

// Titles and filter of the dialogs behind "Add game file..." and "Add games from folder...", in the
// language in force.
namespace Brimvault::AddGameDialogs {

QString AddFileTitle(); // 730 "Add game file"
QString AddFolderTitle(); // 750 "Add games from folder"
// "All files (*.exe;*.swf)|*.exe;*.swf|EXE files (*.exe)|*.exe|SWF files (*.swf)|*.swf" in English.
QString AddFileFilter();

} // namespace Brimvault::AddGameDialogs
