#include "ui/main/AddGameDialogs.h"

#include "i18n/modLocalizer.h"

namespace Brimvault::AddGameDialogs {

QString AddFileTitle()
{
    return modLocalizer::Translate(730, QStringLiteral("Add game file"));
}

QString AddFolderTitle()
{
    return modLocalizer::Translate(750, QStringLiteral("Add games from folder"));
}

QString AddFileFilter()
{
    const QString files = modLocalizer::Translate(720, QStringLiteral("files"));
    return modLocalizer::Translate(725, QStringLiteral("All")) + u' ' + files
        + QStringLiteral(" (*.exe;*.swf)|*.exe;*.swf|EXE ") + files + QStringLiteral(" (*.exe)|*.exe|SWF ") + files
        + QStringLiteral(" (*.swf)|*.swf");
}

} // namespace Brimvault::AddGameDialogs
