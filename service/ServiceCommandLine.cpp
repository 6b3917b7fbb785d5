#include "ServiceCommandLine.h"

namespace Brimvault {

namespace {

bool isSwitch(const QString& argument, QChar letter)
{
    return argument.size() == 2 && (argument.at(0) == u'-' || argument.at(0) == u'/')
        && argument.at(1).toUpper() == letter;
}

// A package path may come with its quotes when a caller quoted it twice.
QString unquoted(QString text)
{
    text = text.trimmed();
    if (text.size() >= 2 && text.startsWith(u'"') && text.endsWith(u'"'))
        text = text.mid(1, text.size() - 2);
    return text;
}

} // namespace

ServiceCommand ParseServiceCommandLine(const QStringList& arguments)
{
    ServiceCommand command;
    if (arguments.isEmpty())
        return command;
    const QString& first = arguments.first();
    if (isSwitch(first, u'U') && arguments.size() == 1) {
        command.kind = ServiceCommand::Kind::Tidy;
    } else if (isSwitch(first, u'R') && arguments.size() == 1) {
        command.kind = ServiceCommand::Kind::AfterLaunch;
    } else if (isSwitch(first, u'I') && arguments.size() >= 2) {
        // An unquoted path with blanks arrives in pieces.
        command.kind = ServiceCommand::Kind::Install;
        command.package = unquoted(arguments.mid(1).join(u' '));
    } else if (first == u"--pack" && arguments.size() == 3) {
        command.kind = ServiceCommand::Kind::Pack;
        command.gameFolder = arguments.at(1);
        command.package = arguments.at(2);
    }
    if ((command.kind == ServiceCommand::Kind::Install && command.package.isEmpty())
        || (command.kind == ServiceCommand::Kind::Pack && (command.package.isEmpty() || command.gameFolder.isEmpty())))
        command.kind = ServiceCommand::Kind::Usage;
    return command;
}

QString ServiceUsage()
{
    return QStringLiteral("Usage:\n"
                          "  BrimvaultService -I \"package.bvxpak\"   install a game package\n"
                          "  BrimvaultService -U                     tidy up after interrupted installs\n"
                          "  BrimvaultService -R                     the same tidy-up, after a game has run\n"
                          "  BrimvaultService --pack FOLDER OUT.bvxpak   build a package from a game folder\n");
}

} // namespace Brimvault
