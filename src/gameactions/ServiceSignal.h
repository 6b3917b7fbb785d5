#pragma once

#include <QObject>

class QTimer;

namespace Brimvault {

// The service's "a game was installed" signal: settings "Commands"/"NewGameInstalled". True when it holds
// exactly "1", which is then reset to "0": the list must be rebuilt. Any other value is left alone.
bool TakeNewGameInstalledSignal();

// tmrRegTest: polls the signal every 3 seconds for its whole life and asks for a rebuild when it is set.
class ServiceSignalWatcher : public QObject {
    Q_OBJECT
public:
    static constexpr int PollIntervalMs = 3000;

    explicit ServiceSignalWatcher(QObject* parent = nullptr);

    // One poll, as the timer does it.
    void poll();

Q_SIGNALS:
    void rebuildRequested();

private:
    QTimer* m_timer;
};

} // namespace Brimvault
