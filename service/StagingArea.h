#pragma once

#include <QLatin1String>
#include <QString>
#include <memory>

class QLockFile;

namespace Brimvault {

// Installs unpack inside the games folder, in a hidden folder that carries a "DirInfo.bvxinf" stop mark, so
// discovery never lists half-unpacked games and the final move is a rename on the same file system.
namespace StagingNames {
inline constexpr QLatin1String StagingFolder(".bvxstaging");
inline constexpr QLatin1String GamesLockFile(".bvxinstall.lock");
inline constexpr QLatin1String SlotPrefix("install-");
inline constexpr QLatin1String LockSuffix(".lock");
inline constexpr QLatin1String PreservedPrefix("kept-");
} // namespace StagingNames

QString StagingFolderPath(const QString& gamesFolder);

// Serialises the steps that create, remove or move folders directly in the games folder.
class GamesFolderLock {
public:
    explicit GamesFolderLock(const QString& gamesFolder, int timeoutMs = 120 * 1000);
    ~GamesFolderLock();
    GamesFolderLock(const GamesFolderLock&) = delete;
    GamesFolderLock& operator=(const GamesFolderLock&) = delete;

    bool isLocked() const { return m_locked; }

private:
    std::unique_ptr<QLockFile> m_lock;
    bool m_locked = false;
};

// One install's private folder in the staging area, held by a lock file while the installing process lives.
// The destructor removes the folder; what a killed process leaves, TidyStagingArea removes later.
class InstallSlot {
public:
    ~InstallSlot();
    InstallSlot(const InstallSlot&) = delete;
    InstallSlot& operator=(const InstallSlot&) = delete;

    // Needs the games folder lock held by the caller.
    static std::unique_ptr<InstallSlot> create(const QString& gamesFolder);

    QString path() const { return m_path; }
    // Removes the slot, and the staging folder too once no other install uses it.
    void discard();
    // Keeps the slot's contents for good under a name no tidy-up removes; returns where they are now.
    QString preserve();

private:
    InstallSlot(const QString& gamesFolder, const QString& path, std::unique_ptr<QLockFile> lock);

    QString m_gamesFolder;
    QString m_path;
    std::unique_ptr<QLockFile> m_lock;
};

// Removes slots whose installing process has ended; slots of running installs are left alone. Returns the
// number of slots removed.
int TidyStagingArea(const QString& gamesFolder);

} // namespace Brimvault
