#include "catalogue/IconCacheBuilder.h"
#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"

#include "CatalogueFiles.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Outcome = IconCacheBuilder::Outcome;

#define REQUIRE_PE(fixture, path) REQUIRE_FIXTURE(CopyFixture(PeFixture(fixture), path), "the PE fixtures (mingw-w64)")

class TestIconCacheBuilder : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString game(const QString& name = u"game.exe"_s) const { return m_env->path(u"games/"_s + name); }
    static QString cacheOf(const QString& path) { return IconCacheFile(DataFolders::IconsFolder(), path); }

private Q_SLOTS:
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

    void buildIcon_data()
    {
        QTest::addColumn<QString>("fixture"); // "" for a plain file
        QTest::addColumn<bool>("dataFolderExists");
        QTest::addColumn<Outcome>("outcome");
        QTest::addColumn<bool>("cached");
        QTest::newRow("64-bit with icon") << u"multi64.exe"_s << true << Outcome::Extracted << true;
        QTest::newRow("first loadable group") << u"broken64.exe"_s << true << Outcome::Extracted << true;
        QTest::newRow("cache folder's parent missing") << u"multi64.exe"_s << false << Outcome::Extracted << false;
        QTest::newRow("without icon") << u"nores64.exe"_s << true << Outcome::NoIcon << false;
        QTest::newRow("not an executable") << QString() << true << Outcome::NoIcon << false;
    }
    void buildIcon()
    {
        QFETCH(QString, fixture);
        QFETCH(bool, dataFolderExists);
        QFETCH(Outcome, outcome);
        QFETCH(bool, cached);
        if (fixture.isEmpty())
            QVERIFY(WriteFile(game(), QByteArray(4096, 'x')));
        else
            REQUIRE_PE(fixture, game());
        if (dataFolderExists)
            QVERIFY(QDir().mkpath(m_env->path(u"commonappdata/Brimvault"_s)));
        const IconCacheBuilder::Result result = IconCacheBuilder(DataFolders::IconsFolder()).BuildIcon(game());
        QCOMPARE(result.outcome, outcome);
        QCOMPARE(result.picture.isNull(), outcome == Outcome::NoIcon);
        QCOMPARE(result.cacheFile, cacheOf(game()));
        QCOMPARE(result.saved && QFileInfo::exists(result.cacheFile), cached);
        QCOMPARE(QFileInfo::exists(m_env->path(u"commonappdata/Brimvault"_s)), dataFolderExists);
    }

    // A good cache file is used as it is even when the game changed; a damaged one is replaced.
    void cacheFile()
    {
        REQUIRE_PE(u"multi64.exe"_s, game());
        QVERIFY(WriteFile(cacheOf(game()), QByteArray("\0\0\1\0\1\0", 6)));
        const IconCacheBuilder builder(DataFolders::IconsFolder());
        const IconCacheBuilder::Result first = builder.BuildIcon(game());
        QVERIFY(first.outcome == Outcome::Extracted && QFileInfo(cacheOf(game())).size() > 6);
        REQUIRE_PE(u"nores64.exe"_s, game());
        const IconCacheBuilder::Result second = builder.BuildIcon(game());
        QVERIFY(second.outcome == Outcome::FromCache && !second.saved);
        QCOMPARE(second.picture, first.picture);
    }

    void onePerTick()
    {
        QVERIFY(QDir().mkpath(DataFolders::GamesFolder()));
        const QStringList games {game(u"one.exe"_s), game(u"two.exe"_s), game(u"three.exe"_s)};
        IconCacheBuilder builder(DataFolders::IconsFolder());
        for (qsizetype i = 0; i < games.size(); ++i) {
            REQUIRE_PE(u"multi64.exe"_s, games.at(i));
            builder.enqueue(games.at(i), quint64(100 + i));
        }
        // Closing stops the work before the next game.
        QVERIFY(!builder.Tick(true) && builder.pending() == 3);
        for (qsizetype i = 0; i < games.size(); ++i) {
            const auto done = builder.Tick(false);
            QVERIFY(done && done->ticket == quint64(100 + i) && done->path == games.at(i));
            QCOMPARE(done->result.outcome, Outcome::Extracted);
            QCOMPARE(builder.pending(), games.size() - i - 1);
            QVERIFY(QFileInfo::exists(cacheOf(games.at(i))));
            QVERIFY(i + 1 == games.size() || !QFileInfo::exists(cacheOf(games.at(i + 1))));
        }
        QVERIFY(!builder.Tick(false));
    }
};
BV_REGISTER_TEST(TestIconCacheBuilder);
#include "tst_iconcachebuilder.moc"
