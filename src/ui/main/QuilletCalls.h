#pragma once

#include <QString>

class QIcon;
class QWidget;

// The main window's uses of the companion dialog library. Each call creates a fresh object by its ProgID,
// calls it by name and lets it go; every error is ignored (a missing library simply does nothing and
// answers empty).
namespace Brimvault::QuilletCalls {

// Open-file dialog flags: OFN_EXPLORER | OFN_FILEMUSTEXIST | OFN_PATHMUSTEXIST.
inline constexpr int OpenExistingFileFlags = 0x81800;

void CenterForm(QWidget* form);
void ShowAbout(const QString& caption, const QString& copyright, const QIcon& icon, const QString& version);
void GetHelp(const QString& argument);

// The chosen file or folder, empty when cancelled.
QString ShowOpenDialog(
    QWidget* owner, const QString& title, const QString& filter, int filterIndex, const QString& initialFolder);
QString BrowseForFolder(QWidget* owner, const QString& title);

} // namespace Brimvault::QuilletCalls
