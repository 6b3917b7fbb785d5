// Game and folder info files from outside (installed packages, hand edits): the display name read from
// them in the current language, its tidying for the list caption, and the folder stop mark that the folder
// walk obeys. Each input is written as both the game's info file and a folder's "DirInfo.bvxinf".
#include "FuzzEnvironment.h"

#include "catalogue/FolderWalk.h"
#include "catalogue/GameEntry.h"
#include "catalogue/GameNames.h"
#include "catalogue/ListBuilder.h"
#include "store/InfoFiles.h"

#include <QByteArray>
#include <QDir>
#include <QStringDecoder>

#include <cstddef>
#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

namespace {

// Thirty characters, "..." and two inserted blanks.
constexpr qsizetype LongestCaption = 35;

void require(bool condition)
{
    if (!condition)
        std::abort();
}

// A language tag the input itself names after "Name_", so that localised records are found.
QString tagNamedIn(const QString& text)
{
    const qsizetype at = text.indexOf(QStringLiteral("Name_"), 0, Qt::CaseInsensitive);
    if (at < 0)
        return QString();
    QString tag;
    for (qsizetype i = at + 5; i < text.size() && tag.size() < 8; ++i) {
        const QChar c = text.at(i);
        if (c == u'\\' || c == u'{' || c == u'}' || c == u'\r' || c == u'\n')
            break;
        tag.append(c);
    }
    return tag;
}

void checkName(const QString& game, const QString& tag)
{
    const QString name = InfoFiles::GameInfoName(game, tag);
    require(name == name.trimmed());
    // Only the part before "?" names the file.
    require(InfoFiles::GameInfoName(game + QStringLiteral("?from=list"), tag) == name);
    require(GameNames::TidyName(name).size() <= LongestCaption);
    GameNames::BuiltInName(name);
}

bool walkReaches(const QList<FolderWalk::WalkedFolder>& folders, const QString& path)
{
    for (const FolderWalk::WalkedFolder& folder : folders) {
        if (folder.path == path)
            return true;
    }
    return false;
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    const FuzzEnvironment& env = FuzzEnvironment::instance();
    env.writeFile(QStringLiteral("info/games/Game One.swf"), QByteArrayLiteral("FWS\x06"));
    QDir().mkpath(env.path(QStringLiteral("info/walk/stop/below")));
    QDir().mkpath(env.path(QStringLiteral("icons")));
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const FuzzEnvironment& env = FuzzEnvironment::instance();
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));
    env.writeFile(QStringLiteral("info/games/Game One.bvxinf"), bytes);
    env.writeFile(QStringLiteral("info/walk/stop/DirInfo.bvxinf"), bytes);

    const QString game = env.path(QStringLiteral("info/games/Game One.swf"));
    QStringDecoder decoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    const QString named = tagNamedIn(decoder.decode(bytes));
    for (const QString& tag : {QStringLiteral("ENG"), QStringLiteral("RUS"), named})
        checkName(game, tag);

    // The list item always has a caption: the file title when nothing else names the game.
    ListBuilder builder(env.path(QStringLiteral("icons")));
    builder.setKeepPictures(false);
    builder.beginPass();
    const GameEntry entry = builder.AddGameToList(game);
    require(!entry.caption.isEmpty() && entry.caption.size() <= LongestCaption);

    // The stop mark reads the same with or without the trailing separator, and the walk obeys it.
    const QString stopFolder = env.path(QStringLiteral("info/walk/stop"));
    const bool stop = InfoFiles::IsStopFolder(stopFolder);
    require(InfoFiles::IsStopFolder(stopFolder + u'/') == stop);
    const auto walked = FolderWalk::CollectSubfolders(env.path(QStringLiteral("info/walk/")));
    require(walkReaches(walked, stopFolder + u'/'));
    require(walkReaches(walked, stopFolder + QStringLiteral("/below/")) == !stop);
    return 0;
}
