#pragma once

#include <QObject>
#include <QString>
#include <functional>
#include <optional>

namespace Brimvault {

class PlayTimeWatcher;

// Starts the game behind a list item, never waiting for it and never reporting a failure: a web page opens in
// the default browser, a Flash movie asks for a media host window (or opens its article page on the catalogue
// server), anything else starts as a process in its own folder. The first launch of the launcher's life also
// starts the companion service with "-R", hidden.
class GameLauncher : public QObject {
    Q_OBJECT
public:
    using ConnectionProbe = std::function<bool()>;
    using CatalogueRootSource = std::function<QString()>;

    explicit GameLauncher(QObject* parent = nullptr);
    ~GameLauncher() override;

    // The list's EnterKey: the item's data as it stands.
    void launchItem(const QString& data, const QString& caption);
    // "Open game offline": the data upper-cased and trimmed; a numbered movie plays locally.
    void launchOffline(const QString& data, const QString& caption);

    // caption is the list's current caption, shown by the media host window for a movie.
    void LaunchGame(const QString& path, bool offline, const QString& caption);

    bool serviceSignalled() const { return m_serviceSignalled; }
    // Counts the launches and the play time of started processes (store/PlayHistory.h).
    PlayTimeWatcher* playTime() const { return m_playTime; }

    // Whether the catalogue server answers, and its root address; asked only for numbered movies. The
    // connection check and the configured catalogue server unless replaced.
    void setConnectionProbe(ConnectionProbe probe);
    void setCatalogueRoot(CatalogueRootSource source);

Q_SIGNALS:
    // The window opens a new media host window and runs the movie in it.
    void flashMovieRequested(const QString& path, const QString& caption);

private:
    bool openInBrowser(const QString& pathOrAddress);
    std::optional<qint64> startProcess(const QString& path, const QString& runner);
    void playMovie(const QString& path, bool offline, const QString& caption);
    void signalServiceOnce(const QString& runner);

    ConnectionProbe m_connectionProbe;
    CatalogueRootSource m_catalogueRoot;
    PlayTimeWatcher* m_playTime = nullptr;
    bool m_serviceSignalled = false;
};

} // namespace Brimvault
