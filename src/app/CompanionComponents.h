#pragma once

#include <QList>
#include <QString>

namespace Brimvault {

// The five companion components in the order start-up checks them: the ProgID prefix and the library file
// that holds it, beside the program. Windows names the files Quillet.dll, Tamarisk.ocx, ...; elsewhere the
// same base names carry the platform's library suffix.
struct CompanionComponent {
    QString prefix;
    QString fileName;
};

QList<CompanionComponent> CompanionComponents();

// The file for a prefix (matched without regard to case), or an empty text for an unknown prefix.
QString CompanionComponentFile(const QString& prefix);

} // namespace Brimvault
