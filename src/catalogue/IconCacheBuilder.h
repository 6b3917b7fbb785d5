#pragma once

#include <QImage>
#include <QList>
#include <QString>

#include <optional>

namespace Brimvault {

// Makes the icons of queued list items, one game per timer tick, and keeps each icon taken out of an
// executable as a file in the icon cache, so that the next run reads the file instead.
class IconCacheBuilder {
public:
    enum class Outcome {
        FromCache, // the cache file gave the picture
        Extracted, // taken out of the executable (and cached, unless saving failed)
        NoIcon, // nothing usable: the window shows its no-icon picture
    };

    struct Result {
        Outcome outcome = Outcome::NoIcon;
        QImage picture; // null for NoIcon
        QString cacheFile;
        bool saved = false; // a new cache file was written
    };

    // What one tick did; ticket is the caller's handle of the list item (its image control).
    struct Done {
        quint64 ticket = 0;
        QString path;
        Result result;
    };

    explicit IconCacheBuilder(const QString& iconsFolder);

    void enqueue(const QString& path, quint64 ticket);
    void clear();
    qsizetype pending() const { return m_queue.size(); }

    // One tick: the first queued game, unless the window is closing (then nothing is done and the queue
    // stays). The caller starts the timer again while pending() is not zero.
    std::optional<Done> Tick(bool closing);

    // The picture of one game: the cache file, else the executable's main icon, saved to the cache.
    Result BuildIcon(const QString& path) const;

private:
    struct Work {
        QString path;
        quint64 ticket;
    };

    QString m_iconsFolder;
    QList<Work> m_queue;
};

} // namespace Brimvault
