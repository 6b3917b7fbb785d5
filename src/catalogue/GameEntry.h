#pragma once

#include <QImage>
#include <QString>

namespace Brimvault {

// Where the picture of a list item comes from.
enum class IconSource {
    File, // the game's own .ico beside it
    Cache, // the icon cache file under the game's cache key
    Flash, // the window's Flash picture (imgSWF)
    Online, // the window's online-games picture (imgOnLine)
    Queued, // the default picture for now; the icon cache builder makes the real one later
};

// "file", "cache", "flash", "online", "queued".
QString IconSourceName(IconSource source);

// One item of the icon list as the main window sees it.
struct GameEntry {
    QString caption; // already shortened and wrapped
    QString path; // the item's data string, exactly as discovery passed it
    IconSource source = IconSource::Queued;
    QString iconFile; // the .ico that gave the picture, for File and Cache
    QImage picture; // that picture, unless the builder was told not to keep pictures; null also when the
                    // list is to make it from iconFile when it first shows the game
};

} // namespace Brimvault

// Its members move as plain bytes, so a growing list of thousands of games moves them without copying each.
Q_DECLARE_TYPEINFO(Brimvault::GameEntry, Q_RELOCATABLE_TYPE);
