// Writes settings from a second process, for the settings store tests.
//   settingsstore_writer set <section> <key> <value>
//   settingsstore_writer many <section> <keyPrefix> <count>     writes keyPrefix0 .. keyPrefix<count-1>
#include "store/SettingsStore.h"

#include <QCoreApplication>
#include <QStringList>

using namespace Brimvault;

int main(int argc, char** argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments();
    if (args.size() != 5)
        return 2;
    if (args[1] == u"set")
        return SaveSetting(AppTitle(), args[2], args[3], args[4]) ? 0 : 1;
    if (args[1] == u"many") {
        const int count = args[4].toInt();
        for (int i = 0; i < count; ++i) {
            const QString key = args[3] + QString::number(i);
            if (!SaveSetting(AppTitle(), args[2], key, key + QStringLiteral("-value")))
                return 1;
        }
        return 0;
    }
    return 2;
}
