#pragma once

#include <QString>

namespace Brimvault {

// The folders discovery looks in, asked once per pass. Folders carry their trailing separator; a folder
// the system does not have is empty.
struct CatalogueLocations {
    QString gamesFolder; // all-users application data + "\Brimvault\"
    QString iconsFolder; // all-users application data + "\Brimvault\Icons\"
    QString programFolder;
    QString windowsFolder; // no trailing separator
    QString programFiles; // no trailing separator
    int windowsMajorVersion = 0;

    static CatalogueLocations fromSystem();
};

// The separator this system's own paths use.
QChar NativeSeparator();

// The name as the file system wants it: "\" becomes "/" where that is the separator.
QString FileSystemPath(const QString& path);

// The program's own file, upper-cased: program folder, program name and ".exe".
QString ProgramOwnFile();

} // namespace Brimvault
