// Holds an install slot as an installing service does, until killed or its standard input closes: what an
// interrupted install leaves behind. With a second argument it keeps the games folder lock as well, as an
// install killed during its final rename would.
#include "StagingArea.h"

#include <QDir>
#include <QFile>

#include <cstdio>

int main(int argc, char* argv[])
{
    const QString gamesFolder = QString::fromLocal8Bit(argv[1]);
    auto lock = std::make_unique<Brimvault::GamesFolderLock>(gamesFolder);
    const auto slot = lock->isLocked() ? Brimvault::InstallSlot::create(gamesFolder) : nullptr;
    if (argc == 2)
        lock.reset();
    QFile part(slot ? slot->path() + QStringLiteral("/Half/data/part.bin") : QString());
    if (!slot || !QDir().mkpath(slot->path() + QStringLiteral("/Half/data")) || !part.open(QIODevice::WriteOnly)
        || part.write(QByteArray(4096, 'x')) != 4096)
        return 1;
    part.close();
    std::printf("%s\n", QFile::encodeName(slot->path()).constData());
    std::fflush(stdout);
    while (std::getchar() != EOF) { }
    return 0;
}
