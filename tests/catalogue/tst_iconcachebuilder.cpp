#include "catalogue/IconCacheBuilder.h"
#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"

#include "CatalogueTestTree.h"
#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;
using namespace CatalogueTestTree;

using Outcome = IconCacheBuilder::Outcome;
Q_DECLARE_METATYPE(IconCacheBuilder::Outcome)

class TestIconCacheBuilder : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void buildIcon_data();
    void buildIcon();
    void cacheIsNeverRefreshed();
    void corruptCacheIsReplaced();
    void onePerTick();
    void closingStopsTheWork();
};

void TestIconCacheBuilder::buildIcon_data()
{
    QTest::addColumn<QString>("fixture"); // "" for a plain file, "-" for none at all
    QTest::addColumn<bool>("dataFolderExists");
    QTest::addColumn<Outcome>("outcome");
    QTest::addColumn<bool>("cached");
    QTest::newRow("executable with icon") << u"multi64.exe"_qs << true << Outcome::Extracted << true;
    QTest::newRow("32-bit executable") << u"multi32.exe"_qs << true << Outcome::Extracted << true;
    QTest::newRow("first loadable group") << u"broken64.exe"_qs << true << Outcome::Extracted << true;
    QTest::newRow("cache folder's parent missing") << u"multi64.exe"_qs << false << Outcome::Extracted << false;
    QTest::newRow("executable without icon") << u"nores64.exe"_qs << true << Outcome::NoIcon << false;
    QTest::newRow("not an executable") << QString() << true << Outcome::NoIcon << false;
    QTest::newRow("missing file") << u"-"_qs << true << Outcome::NoIcon << false;
}

void TestIconCacheBuilder::buildIcon()
{
    QFETCH(QString, fixture);
    QFETCH(bool, dataFolderExists);
    QFETCH(Outcome, outcome);
    QFETCH(bool, cached);

    TestEnvironment env;
    const QString game = env.path(QStringLiteral("games/game.exe"));
    if (fixture.isEmpty()) {
        QVERIFY(writeFile(game, QByteArray(4096, 'x')));
    } else if (fixture != u"-"_qs) {
        const QString source = peFixture(fixture);
        if (source.isEmpty())
            QSKIP("PE fixtures were not built");
        QVERIFY(copyFile(source, game));
    }
    if (dataFolderExists)
        QVERIFY(QDir().mkpath(env.path(QStringLiteral("commonappdata/Brimvault"))));

    const IconCacheBuilder builder(DataFolders::IconsFolder());
    const IconCacheBuilder::Result result = builder.BuildIcon(game);
    QCOMPARE(result.outcome, outcome);
    QCOMPARE(result.picture.isNull(), outcome == Outcome::NoIcon);
    QCOMPARE(result.cacheFile, IconCacheFile(DataFolders::IconsFolder(), game));
    QCOMPARE(result.saved, cached);
    QCOMPARE(QFileInfo::exists(result.cacheFile), cached);
    if (!dataFolderExists)
        QVERIFY(!QFileInfo::exists(env.path(QStringLiteral("commonappdata/Brimvault"))));
}

void TestIconCacheBuilder::cacheIsNeverRefreshed()
{
    TestEnvironment env;
    const QString withIcon = peFixture(QStringLiteral("multi64.exe"));
    const QString withoutIcon = peFixture(QStringLiteral("nores64.exe"));
    if (withIcon.isEmpty() || withoutIcon.isEmpty())
        QSKIP("PE fixtures were not built");
    const QString game = env.path(QStringLiteral("games/game.exe"));
    QVERIFY(copyFile(withIcon, game));
    QVERIFY(QDir().mkpath(DataFolders::GamesFolder()));
    const IconCacheBuilder builder(DataFolders::IconsFolder());
    const IconCacheBuilder::Result first = builder.BuildIcon(game);
    QCOMPARE(first.outcome, Outcome::Extracted);

    QVERIFY(copyFile(withoutIcon, game));
    const IconCacheBuilder::Result second = builder.BuildIcon(game);
    QCOMPARE(second.outcome, Outcome::FromCache);
    QVERIFY(!second.saved);
    QCOMPARE(second.picture, first.picture);
}

void TestIconCacheBuilder::corruptCacheIsReplaced()
{
    TestEnvironment env;
    const QString withIcon = peFixture(QStringLiteral("multi64.exe"));
    if (withIcon.isEmpty())
        QSKIP("PE fixtures were not built");
    const QString game = env.path(QStringLiteral("games/game.exe"));
    QVERIFY(copyFile(withIcon, game));
    const QString cacheFile = IconCacheFile(DataFolders::IconsFolder(), game);
    QVERIFY(writeFile(cacheFile, QByteArray("\0\0\1\0\1\0", 6)));

    const IconCacheBuilder builder(DataFolders::IconsFolder());
    QCOMPARE(builder.BuildIcon(game).outcome, Outcome::Extracted);
    QCOMPARE(builder.BuildIcon(game).outcome, Outcome::FromCache);
    QVERIFY(QFileInfo(cacheFile).size() > 6);
}

void TestIconCacheBuilder::onePerTick()
{
    TestEnvironment env;
    const QString withIcon = peFixture(QStringLiteral("multi64.exe"));
    if (withIcon.isEmpty())
        QSKIP("PE fixtures were not built");
    QVERIFY(QDir().mkpath(DataFolders::GamesFolder()));
    QStringList games;
    for (const char* name : {"one.exe", "two.exe", "three.exe"}) {
        games.append(env.path(QStringLiteral("games/") + QString::fromLatin1(name)));
        QVERIFY(copyFile(withIcon, games.constLast()));
    }
    IconCacheBuilder builder(DataFolders::IconsFolder());
    for (qsizetype i = 0; i < games.size(); ++i)
        builder.enqueue(games.at(i), quint64(100 + i));
    QCOMPARE(builder.pending(), 3);

    for (qsizetype i = 0; i < games.size(); ++i) {
        const auto done = builder.Tick(false);
        QVERIFY(done);
        QCOMPARE(done->ticket, quint64(100 + i));
        QCOMPARE(done->path, games.at(i));
        QCOMPARE(done->result.outcome, Outcome::Extracted);
        QCOMPARE(builder.pending(), games.size() - i - 1);
        // Only the games handled so far have their cache files.
        for (qsizetype j = 0; j < games.size(); ++j)
            QCOMPARE(QFileInfo::exists(IconCacheFile(DataFolders::IconsFolder(), games.at(j))), j <= i);
    }
    QVERIFY(!builder.Tick(false));
}

void TestIconCacheBuilder::closingStopsTheWork()
{
    TestEnvironment env;
    IconCacheBuilder builder(DataFolders::IconsFolder());
    builder.enqueue(env.path(QStringLiteral("missing.exe")), 1);
    builder.enqueue(env.path(QStringLiteral("other.exe")), 2);
    QVERIFY(!builder.Tick(true));
    QCOMPARE(builder.pending(), 2);
    const auto done = builder.Tick(false);
    QVERIFY(done);
    QCOMPARE(done->result.outcome, Outcome::NoIcon);
    QCOMPARE(builder.pending(), 1);
    QVERIFY(!QFileInfo::exists(DataFolders::IconsFolder()));
}

QTEST_MAIN(TestIconCacheBuilder)
#include "tst_iconcachebuilder.moc"
