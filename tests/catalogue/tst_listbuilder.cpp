#include "catalogue/CatalogueServer.h"
#include "catalogue/GameEntry.h"
#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueTestTree.h"
#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;
using namespace CatalogueTestTree;

using Records = QList<QPair<QString, QString>>;
Q_DECLARE_METATYPE(Records)

class TestListBuilder : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void caption_data();
    void caption();
    void userNameMatchesPathLoosely();
    void userNameOfRepeatedKey();
    void icon_data();
    void icon();
    void picturesCanBeLeftOut();
    void knownPaths();
    void onlineEntry();
};

void TestListBuilder::initTestCase()
{
    modLocalizer::UseBuiltInLanguage();
    QCOMPARE(modLocalizer::ShortLanguageName(), QStringLiteral("ENG"));
}

void TestListBuilder::caption_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("fixture"); // "" for a plain file, else pe/<name> or catalogue/<name>
    QTest::addColumn<QString>("userName");
    QTest::addColumn<Records>("info");
    QTest::addColumn<QString>("expected");

    const Records noInfo;
    const QString name = QStringLiteral("Name");
    const QString nameEng = QStringLiteral("Name_ENG");
    QTest::newRow("user name beats info file and zone table")
        << u"hrtzzm.exe"_qs << QString() << u"My Hearts"_qs << Records {{name, QStringLiteral("Info Hearts")}}
        << u"My Hearts"_qs;
    QTest::newRow("info file beats zone table") << u"hrtzzm.exe"_qs << QString() << QString()
                                                << Records {{name, QStringLiteral("Info Hearts")}} << u"Info Hearts"_qs;
    QTest::newRow("info file in the current language")
        << u"game.exe"_qs << QString() << QString()
        << Records {{name, QStringLiteral("Any Language")}, {nameEng, QStringLiteral("  English Name  ")}}
        << u"English Name"_qs;
    QTest::newRow("info file language record blank")
        << u"game.exe"_qs << QString() << QString()
        << Records {{name, QStringLiteral(" Any Language ")}, {nameEng, QStringLiteral("   ")}} << u"Any Language"_qs;
    QTest::newRow("info file of another language only")
        << u"game.exe"_qs << QString() << QString() << Records {{QStringLiteral("Name_RUS"), QStringLiteral("Igra")}}
        << u"game"_qs;
    QTest::newRow("zone table") << u"hrtzzm.exe"_qs << QString() << QString() << noInfo << u"Internet Chervi"_qs;
    QTest::newRow("zone member without row falls to version")
        << u"zm.exe"_qs << u"pe/multi64.exe"_qs << QString() << noInfo << u"Marble Cascade"_qs;
    QTest::newRow("version description") << u"marble.exe"_qs << u"pe/multi64.exe"_qs << QString() << noInfo
                                         << u"Marble Cascade"_qs;
    QTest::newRow("version description with russian prefix")
        << u"chess.exe"_qs << u"catalogue/ru_prefix.exe"_qs << QString() << noInfo << u"Chess"_qs;
    QTest::newRow("long version description trimmed, cut and broken")
        << u"long.exe"_qs << u"catalogue/long_desc.exe"_qs << QString() << noInfo
        << u"SuperMegaUlt raExtremeHyp erDelu..."_qs;
    QTest::newRow("version without description")
        << u"nodesc.exe"_qs << u"pe/ver_nodesc64.exe"_qs << QString() << noInfo << u"nodesc"_qs;
    QTest::newRow("executable without resources")
        << u"Arcade.exe"_qs << u"pe/nores64.exe"_qs << QString() << noInfo << u"Arcade"_qs;
    QTest::newRow("plain file") << u"Some Game.exe"_qs << QString() << QString() << noInfo << u"Some Game"_qs;
    QTest::newRow("long file title broken")
        << u"VeryLongGameTitle.exe"_qs << QString() << QString() << noInfo << u"VeryLongGame Title"_qs;
    QTest::newRow("user name is tidied too")
        << u"g.exe"_qs << QString() << u"Исполняемый файл для игры Шашки"_qs << noInfo << u"Шашки"_qs;
}

void TestListBuilder::caption()
{
    QFETCH(QString, fileName);
    QFETCH(QString, fixture);
    QFETCH(QString, userName);
    QFETCH(Records, info);
    QFETCH(QString, expected);

    TestEnvironment env;
    const QString path = env.path(QStringLiteral("games/") + fileName);
    if (fixture.isEmpty()) {
        QVERIFY(writeFile(path));
    } else {
        const QString source
            = fixture.startsWith(QStringLiteral("pe/")) ? peFixture(fixture.mid(3)) : catalogueFixture(fixture.mid(10));
        if (source.isEmpty())
            QSKIP("PE fixtures were not built");
        QVERIFY(copyFile(source, path));
    }
    if (!info.isEmpty())
        QVERIFY(writeInfoFile(path.left(path.lastIndexOf(u'.')) + QStringLiteral(".bvxinf"), info));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("File7"), path));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("File8"), env.path(QStringLiteral("x"))));
    if (!userName.isEmpty()) {
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("FilesNames"), QStringLiteral("FileName7"), userName));
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("FilesNames"), QStringLiteral("FileName8"), u"Wrong"_qs));
    }

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    const GameEntry entry = builder.AddGameToList(path);
    QCOMPARE(entry.caption, expected);
    QCOMPARE(entry.path, path);
}

void TestListBuilder::userNameMatchesPathLoosely()
{
    TestEnvironment env;
    const QString path = env.path(QStringLiteral("games/Game.exe"));
    QVERIFY(writeFile(path));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("count"), QStringLiteral("12")));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("FILE12"), u"  "_qs + path.toUpper()));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("FilesNames"), QStringLiteral("filename12"), u"Mine"_qs));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    QCOMPARE(builder.AddGameToList(path).caption, QStringLiteral("Mine"));
    QCOMPARE(builder.AddGameToList(env.path(QStringLiteral("games/Other.exe"))).caption, QStringLiteral("Other"));
}

// A name key written twice by hand: the list shows the name that renaming and removing read, the first one.
void TestListBuilder::userNameOfRepeatedKey()
{
    TestEnvironment env;
    const QString path = env.path(QStringLiteral("games/Game.exe"));
    QVERIFY(writeFile(path));
    const QByteArray settings = "[Files]\r\nCount=1\r\nFile1=" + path.toUtf8()
        + "\r\n[FilesNames]\r\nFileName1=First\r\nfilename1=Second\r\n";
    QVERIFY(writeFile(env.settingsFile(), settings));
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("FilesNames"), QStringLiteral("FileName1")), u"First"_qs);
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    QCOMPARE(builder.AddGameToList(path).caption, u"First"_qs);
}

void TestListBuilder::icon_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("ownIcon"); // "", "valid" or "corrupt"
    QTest::addColumn<QString>("cacheIcon");
    QTest::addColumn<QString>("expected");
    QTest::newRow("own icon") << u"a.exe"_qs << u"valid"_qs << u""_qs << u"file"_qs;
    QTest::newRow("own icon wins over cache") << u"a.exe"_qs << u"valid"_qs << u"valid"_qs << u"file"_qs;
    QTest::newRow("corrupt own icon queues even with cache")
        << u"a.exe"_qs << u"corrupt"_qs << u"valid"_qs << u"queued"_qs;
    QTest::newRow("cache") << u"a.exe"_qs << u""_qs << u"valid"_qs << u"cache"_qs;
    QTest::newRow("corrupt cache") << u"a.exe"_qs << u""_qs << u"corrupt"_qs << u"queued"_qs;
    QTest::newRow("nothing") << u"a.exe"_qs << u""_qs << u""_qs << u"queued"_qs;
    QTest::newRow("flash without icon") << u"movie.swf"_qs << u""_qs << u""_qs << u"flash"_qs;
    QTest::newRow("flash with corrupt cache") << u"movie.SWF"_qs << u""_qs << u"corrupt"_qs << u"flash"_qs;
    QTest::newRow("flash with own icon") << u"movie.swf"_qs << u"valid"_qs << u""_qs << u"file"_qs;
}

void TestListBuilder::icon()
{
    QFETCH(QString, fileName);
    QFETCH(QString, ownIcon);
    QFETCH(QString, cacheIcon);
    QFETCH(QString, expected);

    TestEnvironment env;
    const QByteArray valid = iconFileBytes();
    if (valid.isEmpty())
        QSKIP("PE fixtures were not built");
    const QByteArray corrupt = valid.left(40);
    const QString path = env.path(QStringLiteral("games/") + fileName);
    QVERIFY(writeFile(path));
    const QString ownFile = path.left(path.lastIndexOf(u'.')) + QStringLiteral(".ico");
    const QString cacheFile = IconCacheFile(DataFolders::IconsFolder(), path);
    if (!ownIcon.isEmpty())
        QVERIFY(writeFile(ownFile, ownIcon == u"valid"_qs ? valid : corrupt));
    if (!cacheIcon.isEmpty())
        QVERIFY(writeFile(cacheFile, cacheIcon == u"valid"_qs ? valid : corrupt));

    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    const GameEntry entry = builder.AddGameToList(path);
    QCOMPARE(IconSourceName(entry.source), expected);
    if (expected == u"file"_qs || expected == u"cache"_qs) {
        QCOMPARE(entry.iconFile, expected == u"file"_qs ? ownFile : cacheFile);
        QCOMPARE(entry.picture.width(), 32);
    } else {
        QVERIFY(entry.iconFile.isEmpty());
        QVERIFY(entry.picture.isNull());
    }
}

void TestListBuilder::picturesCanBeLeftOut()
{
    TestEnvironment env;
    const QByteArray valid = iconFileBytes();
    if (valid.isEmpty())
        QSKIP("PE fixtures were not built");
    const QString path = env.path(QStringLiteral("games/a.exe"));
    QVERIFY(writeFile(path));
    QVERIFY(writeFile(env.path(QStringLiteral("games/a.ico")), valid));
    ListBuilder builder(DataFolders::IconsFolder());
    builder.setKeepPictures(false);
    builder.beginPass();
    const GameEntry entry = builder.AddGameToList(path);
    QCOMPARE(entry.source, IconSource::File);
    QVERIFY(entry.picture.isNull());
}

void TestListBuilder::knownPaths()
{
    TestEnvironment env;
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    const QString path = env.path(QStringLiteral("Games/Game.EXE"));
    QVERIFY(!builder.IsGameListed(path));
    builder.AddGameToList(u"  "_qs + path);
    QVERIFY(builder.IsGameListed(path.toLower() + u" "_qs));
    QVERIFY(!builder.IsGameListed(path + u"x"_qs));
    QVERIFY(!builder.IsGameListed(env.path(QStringLiteral("Games/Game"))));
    builder.beginPass();
    QVERIFY(!builder.IsGameListed(path));
}

void TestListBuilder::onlineEntry()
{
    TestEnvironment env;
    qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://games.example.org/");
    ListBuilder builder(DataFolders::IconsFolder());
    builder.beginPass();
    const GameEntry entry = builder.OnlineGamesEntry();
    QCOMPARE(entry.caption, QStringLiteral("Online games"));
    QCOMPARE(entry.path, QStringLiteral("http://games.example.org/online-games-catalog.asp"));
    QCOMPARE(entry.source, IconSource::Online);
    QVERIFY(!builder.IsGameListed(entry.path));
}

QTEST_MAIN(TestListBuilder)
#include "tst_listbuilder.moc"
