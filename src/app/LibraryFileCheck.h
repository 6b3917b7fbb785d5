#pragma once

#include <QString>

#include <optional>

namespace Brimvault {

// Why the file cannot be a complete shared library for this process, or nothing when it may be loaded.
// The system's loader maps a cut-off library without complaint and the process dies of a bus error the
// first time it runs code from the missing part, so every component file is checked before it is loaded:
// its headers, program headers, loadable segments and section headers must all lie inside the file.
// Only ELF systems are checked; elsewhere the answer is always nothing.
std::optional<QString> LibraryFileProblem(const QString& path);

} // namespace Brimvault
