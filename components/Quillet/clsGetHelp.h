#pragma once

#include <QObject>
#include <QString>
#include <QUrl>

namespace Brimvault {

// Opens help in the user's default browser: a help file, an address, or the publisher's more-games page.
class clsGetHelp : public QObject {
    Q_OBJECT
public:
    explicit clsGetHelp(QObject* parent = nullptr);

    // sHelpFile is a help file's path, an address ("https://..."), or a product name followed by
    // "MoreGames" ("BrimvaultMoreGames"), which opens the catalogue server's more-games page for it. A
    // help file that does not exist is reported in a message box. False when nothing was opened.
    Q_INVOKABLE bool GetHelp(const QString& sHelpFile);

    // What GetHelp opens for its argument; empty for a file that does not exist.
    static QUrl HelpUrl(const QString& sHelpFile);
};

} // namespace Brimvault
