#include "BenchLibrary.h"

#include "catalogue/IconCacheKey.h"
#include "icons/cFileIcon.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"

#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QTextStream>

#include <algorithm>
#include <vector>

namespace Brimvault::BenchLibrary {

namespace {

// One game: its folder, the executable, the info file and the cached icon.
bool makeGame(const QString& folder, const QString& title, const QByteArray& exe, const QByteArray& icon)
{
    if (!QDir().mkpath(folder))
        return false;
    const QString path = folder + u'/' + title + QStringLiteral(".exe");
    clsFileBag info;
    info.SetRecord(clsFileBag::MakeKey(QStringLiteral("Name")), QStringLiteral("Game ") + title);
    info.SetCurrentFileName(folder + u'/' + title + QStringLiteral(".bvxinf"));
    return writeBytes(path, exe) && info.SaveFile()
        && writeBytes(IconCacheFile(DataFolders::IconsFolder(), path), icon);
}

} // namespace

bool writeBytes(const QString& path, const QByteArray& bytes)
{
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(bytes) == bytes.size();
}

std::optional<GameFiles> loadGameFiles(const QString& peFixture)
{
    QFile fixture(peFixture);
    cFileIcon icon;
    if (!fixture.open(QIODevice::ReadOnly) || !icon.LoadMainIconFromEXE(fixture.fileName())) {
        QTextStream(stderr) << "PE fixture missing: " << fixture.fileName() << '\n';
        return std::nullopt;
    }
    return GameFiles {fixture.readAll(), icon.toIconFile()};
}

QList<int> librarySizes(const QStringList& arguments)
{
    QList<int> sizes;
    for (const QString& argument : arguments)
        sizes.append(argument.toInt());
    if (sizes.isEmpty())
        sizes = {1000, 10000, 30000};
    return sizes;
}

void pointAt(const QString& root)
{
    qputenv("BRIMVAULT_SETTINGS_DIR", (root + QStringLiteral("/settings")).toLocal8Bit());
    qputenv("BRIMVAULT_COMMON_APPDATA", (root + QStringLiteral("/commonappdata")).toLocal8Bit());
    qputenv("BRIMVAULT_PERSONAL", (root + QStringLiteral("/personal")).toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_DIR", (root + QStringLiteral("/program")).toLocal8Bit());
    qputenv("BRIMVAULT_PROGRAM_FILES", (root + QStringLiteral("/programfiles")).toLocal8Bit());
    qputenv("windir", (root + QStringLiteral("/windows")).toLocal8Bit());
    qputenv("WINEPREFIX", (root + QStringLiteral("/wine")).toLocal8Bit());
    qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://127.0.0.1:9");
}

bool makeLibrary(const QString& root, int installed, int addedByHand, const QByteArray& exe, const QByteArray& icon)
{
    for (const char* sub :
        {"settings", "commonappdata/Brimvault/Icons", "personal", "program", "windows", "programfiles"})
        QDir(root).mkpath(QString::fromLatin1(sub));
    pointAt(root);

    const QString games = DataFolders::GamesFolder();
    for (int i = 0; i < installed; ++i) {
        if (!makeGame(games + QStringLiteral("Game %1").arg(i), QStringLiteral("game%1").arg(i), exe, icon))
            return false;
    }
    QByteArray settings = "[Files]\nCount=" + QByteArray::number(addedByHand) + '\n';
    for (int i = 0; i < addedByHand; ++i) {
        const QString folder = root + QStringLiteral("/added/Added %1").arg(i);
        const QString title = QStringLiteral("added%1").arg(i);
        if (!makeGame(folder, title, exe, icon))
            return false;
        settings += "File" + QByteArray::number(i + 1) + '=' + (folder + u'/' + title + u".exe").toUtf8() + '\n';
    }
    settings += "[LocaleSettings]\nLngFileName=English (Default)\nLngNik=ENG\n";
    return writeBytes(SettingsFilePath(AppTitle()), settings)
        && GetAllSettings(AppTitle(), QStringLiteral("Files")).size() == addedByHand + 1;
}

QString reusableLibrary(int installed, int addedByHand, const QByteArray& exe, const QByteArray& icon)
{
    const QString kept = qEnvironmentVariable("BRIMVAULT_BENCH_LIBRARIES");
    if (kept.isEmpty())
        return QString();
    const QString root = kept + QStringLiteral("/library-%1-%2").arg(installed).arg(addedByHand);
    const QString readyMark = root + QStringLiteral("/ready");
    if (QFile::exists(readyMark)) {
        pointAt(root);
        return root;
    }
    QDir(root).removeRecursively();
    if (!makeLibrary(root, installed, addedByHand, exe, icon) || !writeBytes(readyMark, QByteArray()))
        return QString();
    return root;
}

} // namespace Brimvault::BenchLibrary
