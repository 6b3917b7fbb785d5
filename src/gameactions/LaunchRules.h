#pragma once

#include <QString>

class QUrl;

namespace Brimvault {

// How a game's path or address is started.
enum class LaunchKind {
    WebPage, // the default browser
    FlashMovie, // a media host window, or the movie's article page on the catalogue server
    Process, // everything else, native games and Windows programs alike
};

// Web pages are named by their extension (htm, html, shtml, mht, asp, php, aspx) or are addresses with an
// ".asp?" query; web addresses of any other kind ("http://", "https://") go to the browser as well.
LaunchKind LaunchKindOf(const QString& path);

// A movie named "20" followed by at least 18 characters, the 20th a digit, has an article on the catalogue
// server: its code is the first 20 characters of the name. Empty for any other movie.
QString ArticleCode(const QString& moviePath);

// The catalogue server's article page for a code.
QString ArticleAddress(const QString& catalogueRoot, const QString& code);

// What the browser is asked to open: an address as it stands, a file as a file URL.
QUrl BrowserUrl(const QString& pathOrAddress);

} // namespace Brimvault
