// The settings file from outside (hand edits, damage, another version of the program): every value the
// program turns into a number, a flag, a list or a command line. Each input is the whole settings file;
// the readers run over it as the program runs them, then the writers that build on what they read.
#include "FuzzEnvironment.h"

#include "PackageLimits.h"
#include "app/CatalogueServer.h"
#include "catalogue/AddedGamesSnapshot.h"
#include "catalogue/GameAdder.h"
#include "catalogue/ListBuilder.h"
#include "gameactions/CompatibilityRunner.h"
#include "gameactions/LaunchRules.h"
#include "gameactions/ServiceSignal.h"
#include "i18n/modLocalizer.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"
#include "support/CommandLine.h"

#include <QByteArray>
#include <QFile>
#include <QSet>

#include <cstddef>
#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

QByteArray settingsBytes()
{
    QFile file(FuzzEnvironment::instance().settingsFile());
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

QString gamePath(const char* name)
{
    return FuzzEnvironment::instance().path(QStringLiteral("games/")) + QLatin1String(name);
}

bool hasEntry(const QList<CatalogueStore::AddedGame>& games, const QString& key, const QString& path)
{
    for (const CatalogueStore::AddedGame& game : games) {
        if (game.key == key && game.path == path)
            return true;
    }
    return false;
}

// A key written the way the program writes it: "File" + n.
bool isPlainKey(const CatalogueStore::AddedGame& game)
{
    return game.number() > 0
        && game.key.compare(CatalogueKeys::FileKeyPrefix + QString::number(game.number()), Qt::CaseInsensitive) == 0;
}

// The snapshot the list is built from agrees with the store the other commands read.
void checkSnapshot(const AddedGamesSnapshot& snapshot)
{
    const QList<CatalogueStore::AddedGame> games = CatalogueStore::AddedGames();
    require(snapshot.games().size() == games.size());
    require(snapshot.highestNumber() >= CatalogueStore::EntryCount());
    for (const CatalogueStore::AddedGame& game : games) {
        require(snapshot.highestNumber() >= game.number());
        const auto first = CatalogueStore::FindAddedGame(games, game.path);
        require(first.has_value());
        if (isPlainKey(*first))
            require(snapshot.userName(game.path) == CatalogueStore::DisplayName(first->key));
    }
}

void checkReadOnlyValues()
{
    const QByteArray before = settingsBytes();
    modLocalizer::InitLocalizer(modLocalizer::ChoiceStorage::ReadOnly);
    modLocalizer::Translate(1020, QStringLiteral("Brimvault"));
    require(settingsBytes() == before);

    const QString root = CatalogueServerRoot();
    require(!root.isEmpty() && !root.endsWith(u'/') && root == root.trimmed());
    require(ArticleAddress(root, QStringLiteral("42")).startsWith(root));

    const PackageLimits limits = PackageLimits::fromSettings();
    require(limits.maxUnpackedBytes > 0 && limits.maxRatio > 0 && limits.maxEntries > 0);

    // The runner only prefixes the game: the game itself is always handed on.
    const QString game = gamePath("windows game.exe");
    const auto command = ResolveCommandLine(game, CompatibilityRunner());
    if (command) {
        require(!command->program.isEmpty());
        require(command->program == game || command->arguments.contains(game));
    }
}

// Start-up stores a language choice when there is none, and a second start finds nothing more to store.
void checkStoredLanguageChoice()
{
    modLocalizer::InitLocalizer(modLocalizer::ChoiceStorage::Store);
    const QByteArray afterFirst = settingsBytes();
    const QString language = modLocalizer::LanguageName();
    require(!GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngFileNameKey).isEmpty());
    modLocalizer::InitLocalizer(modLocalizer::ChoiceStorage::Store);
    require(settingsBytes() == afterFirst);
    require(modLocalizer::LanguageName() == language);
}

void checkServiceSignal()
{
    const QString key = CatalogueKeys::NewGameInstalledKey;
    const QString before = GetSetting(AppTitle(), CatalogueKeys::CommandsSection, key, QStringLiteral("<none>"));
    const bool taken = TakeNewGameInstalledSignal();
    const QString after = GetSetting(AppTitle(), CatalogueKeys::CommandsSection, key, QStringLiteral("<none>"));
    require(after == (taken ? QString(CatalogueKeys::NoNewGameInstalled) : before));
    require(!TakeNewGameInstalledSignal());
}

// Adding games never loses an entry that was there and never gives out a number still in use.
void checkAddingGames()
{
    const QList<CatalogueStore::AddedGame> before = CatalogueStore::AddedGames();
    ListBuilder builder(FuzzEnvironment::instance().path(QStringLiteral("icons")));
    builder.setKeepPictures(false);
    builder.beginPass();
    checkSnapshot(builder.addedGames());

    GameAdder adder(builder);
    adder.AddGameFile(gamePath("windows game.exe"));
    adder.AddGamesFromFolder(FuzzEnvironment::instance().path(QStringLiteral("games")));

    const QList<CatalogueStore::AddedGame> after = CatalogueStore::AddedGames();
    for (const CatalogueStore::AddedGame& game : before)
        require(hasEntry(after, game.key, game.path));
    QSet<int> usedBefore;
    for (const CatalogueStore::AddedGame& game : before)
        usedBefore.insert(game.number());
    for (const CatalogueStore::AddedGame& game : after) {
        if (!hasEntry(before, game.key, game.path))
            require(game.number() > 0 && !usedBefore.contains(game.number()));
    }
    // The counter covers every number in use, so that the next game cannot take one of them.
    for (const CatalogueStore::AddedGame& game : after)
        require(CatalogueStore::EntryCount() >= game.number());
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    const FuzzEnvironment& env = FuzzEnvironment::instance();
    // A Cyrillic locale, so that start-up can pick the Russian file by its character set.
    qputenv("BRIMVAULT_LOCALE", "ru_RU");
    env.writeFile(QStringLiteral("games/windows game.exe"), QByteArrayLiteral("MZ\x90\x00"));
    env.writeFile(QStringLiteral("games/movie.swf"), QByteArrayLiteral("FWS\x06"));
    env.writeFile(QStringLiteral("program/Brimvault_Russian.lng"),
        QByteArrayLiteral("#language=Russian\r\n#charset=204\r\n@10=\xdf\xe7\xfb\xea\r\n"));
    env.writeFile(QStringLiteral("program/Brimvault_Polish.lng"),
        QByteArrayLiteral("#language=Polski\r\n#charset=238\r\n@10=J\xeazyk\r\n"));
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const FuzzEnvironment& env = FuzzEnvironment::instance();
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));
    if (!env.writeFile(QStringLiteral("settings/Brimvault.ini"), bytes))
        std::abort();
    checkReadOnlyValues();
    checkStoredLanguageChoice();
    checkServiceSignal();
    checkAddingGames();
    return 0;
}
