#pragma once

#include <QString>

namespace Brimvault {

// The folder the program runs from, where its components, language files, help and service lie.
// BRIMVAULT_PROGRAM_DIR overrides it (tests, portable layouts). No trailing separator.
QString ProgramFolder();

// The program's file name without extension ("brimvault"), used to name its default help file.
QString ProgramBaseName();

} // namespace Brimvault
