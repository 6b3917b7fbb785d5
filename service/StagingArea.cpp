#include "StagingArea.h"

#include "store/CatalogueKeys.h"
#include "store/clsFileBag.h"

#include <QCoreApplication>
#include <QDir>
#include <QFileInfo>
#include <QLockFile>
#include <QRandomGenerator>

namespace Brimvault {

namespace {

// Tidying up runs hidden at the program's start: it waits briefly or leaves the work for next time.
constexpr int TidyLockTimeoutMs = 2000;

std::unique_ptr<QLockFile> newLock(const QString& path)
{
    auto lock = std::make_unique<QLockFile>(path);
    // Only a dead owner makes a lock stale: an install of a large game may well hold it for minutes.
    lock->setStaleLockTime(0);
    return lock;
}

bool writeStopMark(const QString& stagingFolder)
{
    const QString markFile = stagingFolder + u'/' + CatalogueKeys::DirInfoFileName;
    if (QFileInfo::exists(markFile))
        return true;
    clsFileBag bag;
    bag.SetCurrentFileName(markFile);
    bag.SetRecord(clsFileBag::MakeKey(QString(CatalogueKeys::StopDirRecord)), CatalogueKeys::StopDirYes);
    return bag.SaveFile();
}

// The staging folder goes once it holds nothing but its stop mark, so a failed install leaves the games
// folder exactly as it found it. Callers hold the games folder lock.
void removeStagingFolderIfUnused(const QString& gamesFolder)
{
    const QString staging = StagingFolderPath(gamesFolder);
    QDir dir(staging);
    const QStringList entries = dir.entryList(QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    if (entries.isEmpty() || entries == QStringList {QString(CatalogueKeys::DirInfoFileName)}) {
        dir.remove(CatalogueKeys::DirInfoFileName);
        QDir(gamesFolder).rmdir(StagingNames::StagingFolder);
    }
}

} // namespace

QString StagingFolderPath(const QString& gamesFolder)
{
    QString folder = gamesFolder;
    if (folder.endsWith(u'/') || folder.endsWith(u'\\'))
        folder.chop(1);
    return folder + u'/' + StagingNames::StagingFolder;
}

GamesFolderLock::GamesFolderLock(const QString& gamesFolder, int timeoutMs)
    : m_lock(newLock(QDir(gamesFolder).filePath(StagingNames::GamesLockFile)))
{
    m_locked = m_lock->tryLock(timeoutMs);
}

GamesFolderLock::~GamesFolderLock()
{
    if (m_locked)
        m_lock->unlock();
}

InstallSlot::InstallSlot(const QString& gamesFolder, const QString& path, std::unique_ptr<QLockFile> lock)
    : m_gamesFolder(gamesFolder)
    , m_path(path)
    , m_lock(std::move(lock))
{ }

InstallSlot::~InstallSlot()
{
    discard();
}

std::unique_ptr<InstallSlot> InstallSlot::create(const QString& gamesFolder)
{
    const QString staging = StagingFolderPath(gamesFolder);
    // A link in its place could lead the unpacking anywhere.
    const QFileInfo existing(staging);
    if (existing.isSymLink() || (existing.exists() && !existing.isDir()))
        return nullptr;
    if (!QDir().mkpath(staging) || !writeStopMark(staging))
        return nullptr;
    for (int attempt = 0; attempt < 16; ++attempt) {
        const QString name = StagingNames::SlotPrefix + QString::number(QCoreApplication::applicationPid()) + u'-'
            + QString::number(QRandomGenerator::global()->generate(), 36);
        const QString path = staging + u'/' + name;
        auto lock = newLock(path + StagingNames::LockSuffix);
        if (QFileInfo::exists(path) || !lock->tryLock(0))
            continue;
        if (!QDir(staging).mkdir(name)) {
            lock->unlock();
            continue;
        }
        return std::unique_ptr<InstallSlot>(new InstallSlot(gamesFolder, path, std::move(lock)));
    }
    removeStagingFolderIfUnused(gamesFolder);
    return nullptr;
}

void InstallSlot::discard()
{
    if (!m_lock)
        return;
    QDir(m_path).removeRecursively();
    GamesFolderLock gamesLock(m_gamesFolder);
    if (QFileInfo::exists(m_path)) {
        // Something inside is still in use; the lock goes with this process and a later tidy-up finishes.
        m_lock.reset();
        return;
    }
    m_lock->unlock();
    m_lock.reset();
    if (gamesLock.isLocked())
        removeStagingFolderIfUnused(m_gamesFolder);
}

QString InstallSlot::preserve()
{
    if (!m_lock)
        return m_path;
    const QFileInfo slot(m_path);
    const QString kept = slot.absolutePath() + u'/' + StagingNames::PreservedPrefix + slot.fileName();
    if (QDir().rename(m_path, kept))
        m_path = kept;
    m_lock.reset();
    return m_path;
}

int TidyStagingArea(const QString& gamesFolder)
{
    if (gamesFolder.isEmpty())
        return 0;
    const QString staging = StagingFolderPath(gamesFolder);
    QDir dir(staging);
    // Taking the lock also clears a lock file that a killed install left in the games folder.
    const bool lockLeftBehind = QFileInfo::exists(QDir(gamesFolder).filePath(StagingNames::GamesLockFile));
    if (!dir.exists() && !lockLeftBehind)
        return 0;
    GamesFolderLock gamesLock(gamesFolder, TidyLockTimeoutMs);
    if (!gamesLock.isLocked() || !dir.exists() || QFileInfo(staging).isSymLink())
        return 0;
    int removed = 0;
    const QStringList names = dir.entryList(
        {StagingNames::SlotPrefix + u'*'}, QDir::AllEntries | QDir::Hidden | QDir::System | QDir::NoDotAndDotDot);
    for (const QString& name : names) {
        if (name.endsWith(StagingNames::LockSuffix))
            continue;
        auto lock = newLock(dir.filePath(name + StagingNames::LockSuffix));
        if (!lock->tryLock(0))
            continue;
        const QFileInfo info(dir.filePath(name));
        const bool gone
            = info.isDir() && !info.isSymLink() ? QDir(info.filePath()).removeRecursively() : dir.remove(name);
        if (gone)
            ++removed;
        lock->unlock();
    }
    // Lock files whose slot is already gone.
    for (const QString& name : dir.entryList(
             {StagingNames::SlotPrefix + u'*' + StagingNames::LockSuffix}, QDir::Files | QDir::Hidden | QDir::System)) {
        const QString slot = name.chopped(StagingNames::LockSuffix.size());
        if (QFileInfo::exists(dir.filePath(slot)))
            continue;
        auto lock = newLock(dir.filePath(name));
        if (lock->tryLock(0))
            lock->unlock();
    }
    removeStagingFolderIfUnused(gamesFolder);
    return removed;
}

} // namespace Brimvault
