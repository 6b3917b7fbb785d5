#pragma once

#include <QString>

namespace Brimvault {

// Text functions over Windows-style paths. Each first drops everything from the first "?" on (addresses
// with a query). They never touch the file system; callers convert the result when they do.

// "exe", "*.exe", "exe;" or "*.exe;"; empty when the last "." is not after the last "\" ("/" counts as "\").
QString GetFileExtention(const QString& path, bool withWildcard, bool withSemicolon);

// The name without its folder; withExtension appends "." and the extension, so a name without one gains a
// lone ".".
QString GetFileName(const QString& path, bool withExtension);

// The folder with its trailing separator, ".\" for a bare name; withName appends the name without extension.
QString GetFileFolder(const QString& path, bool withName);

// Appends the separator the path already uses; a bare word becomes ".\word\"; empty stays empty.
QString AddSlash(const QString& path);

} // namespace Brimvault
