#pragma once

#include <QString>

namespace Brimvault {

enum class MediaKind { StillPicture, FlashMovie, WebPage };

// Decided by the text behind the last "." of the path, lower-cased: a web page when that text occurs in
// "*htm*html*shtml*mht*asp*php*aspx*" or the path holds ".asp?"; "swf" is a Flash movie; anything else a
// still picture. The search is a plain substring search, so "ht" and "sp" also count as web pages.
MediaKind MediaKindOf(const QString& path);

// The part of text behind separator: its first occurrence at or after start (1-based), or its last one when
// fromEnd is set. The whole text when the separator does not occur.
QString RightTo(const QString& text, const QString& separator, int start = 1, bool fromEnd = false);

} // namespace Brimvault
