// Holds an install slot the way an installing service does, until killed or its standard input closes:
// the tests use it to leave behind what an interrupted install leaves. With a second argument it keeps
// holding the games folder lock as well, as an install killed during its final rename would.
#include "StagingArea.h"

#include <QDir>
#include <QFile>

#include <cstdio>

int main(int argc, char* argv[])
{
    if (argc != 2 && argc != 3)
        return 2;
    const QString gamesFolder = QString::fromLocal8Bit(argv[1]);
    std::unique_ptr<Brimvault::InstallSlot> slot;
    auto lock = std::make_unique<Brimvault::GamesFolderLock>(gamesFolder);
    if (!lock->isLocked())
        return 1;
    slot = Brimvault::InstallSlot::create(gamesFolder);
    if (argc == 2)
        lock.reset();
    if (!slot)
        return 1;
    QDir(slot->path()).mkpath(QStringLiteral("Half/data"));
    QFile part(slot->path() + QStringLiteral("/Half/data/part.bin"));
    if (!part.open(QIODevice::WriteOnly) || part.write(QByteArray(4096, 'x')) != 4096)
        return 1;
    part.close();
    std::printf("%s\n", QFile::encodeName(slot->path()).constData());
    std::fflush(stdout);
    while (std::getchar() != EOF) { }
    return 0;
}
