#pragma once

#include <QObject>
#include <QString>

namespace Brimvault {

// Adds the time a started game runs to its play history. Never waits: the end of the process is noticed by
// the event loop (a process descriptor on Linux, the process handle on Windows, a slow poll elsewhere).
class PlayTimeWatcher : public QObject {
    Q_OBJECT
public:
    explicit PlayTimeWatcher(QObject* parent = nullptr);

    // path is the game as the list holds it; a process that cannot be watched is left alone.
    void watch(qint64 pid, const QString& path);

Q_SIGNALS:
    // The time was added.
    void ended(const QString& path, qint64 seconds);
};

} // namespace Brimvault
