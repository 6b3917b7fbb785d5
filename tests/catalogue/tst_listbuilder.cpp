#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueFiles.h"
#include "CatalogueIcon.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Records = QList<QPair<QString, QString>>;

namespace {

GameEntry ListOne(const QString& path, bool keepPictures = true)
{
    ListBuilder builder(DataFolders::IconsFolder());
    builder.setKeepPictures(keepPictures);
    builder.beginPass();
    return builder.AddGameToList(path);
}

bool Save(const QString& section, const QString& key, const QString& value)
{
    return SaveSetting(AppTitle(), section, key, value);
}

} // namespace

class TestListBuilder : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }

    // Each row takes the first source that has a name: user, info file, zone table, version text, file title.
    void caption_data()
    {
        QTest::addColumn<QString>("fileName");
        QTest::addColumn<QString>("fixture"); // "" for a plain file, else pe/<name> or catalogue/<name>
        QTest::addColumn<QString>("userName");
        QTest::addColumn<Records>("info");
        QTest::addColumn<QString>("expected");
        const Records none;
        const Records hearts {{u"Name"_s, u"Info Hearts"_s}};
        QTest::newRow("user name first") << u"hrtzzm.exe"_s << QString() << u"My Hearts"_s << hearts << u"My Hearts"_s;
        QTest::newRow("info file before zone table")
            << u"hrtzzm.exe"_s << QString() << QString() << hearts << u"Info Hearts"_s;
        QTest::newRow("info file in the current language")
            << u"game.exe"_s << QString() << QString()
            << Records {{u"Name"_s, u"Any Language"_s}, {u"Name_ENG"_s, u"  English Name  "_s}} << u"English Name"_s;
        QTest::newRow("info file language record blank")
            << u"game.exe"_s << QString() << QString()
            << Records {{u"Name"_s, u" Any Language "_s}, {u"Name_ENG"_s, u"   "_s}} << u"Any Language"_s;
        QTest::newRow("info file of another language only")
            << u"game.exe"_s << QString() << QString() << Records {{u"Name_RUS"_s, u"Igra"_s}} << u"game"_s;
        QTest::newRow("zone table") << u"hrtzzm.exe"_s << QString() << QString() << none << u"Internet Chervi"_s;
        QTest::newRow("zone member without row falls to version")
            << u"zm.exe"_s << u"pe/multi64.exe"_s << QString() << none << u"Marble Cascade"_s;
        QTest::newRow("version text with russian prefix")
            << u"chess.exe"_s << u"catalogue/ru_prefix.exe"_s << QString() << none << u"Chess"_s;
        QTest::newRow("long version text trimmed, cut and broken")
            << u"long.exe"_s << u"catalogue/long_desc.exe"_s << QString() << none
            << u"SuperMegaUlt raExtremeHyp erDelu..."_s;
        QTest::newRow("version without description")
            << u"nodesc.exe"_s << u"pe/ver_nodesc64.exe"_s << QString() << none << u"nodesc"_s;
        QTest::newRow("no resources") << u"Arcade.exe"_s << u"pe/nores64.exe"_s << QString() << none << u"Arcade"_s;
        QTest::newRow("long file title broken")
            << u"VeryLongGameTitle.exe"_s << QString() << QString() << none << u"VeryLongGame Title"_s;
        QTest::newRow("user name is tidied too")
            << u"g.exe"_s << QString() << u"Исполняемый файл для игры Шашки"_s << none << u"Шашки"_s;
    }
    void caption()
    {
        QFETCH(QString, fileName);
        QFETCH(QString, fixture);
        QFETCH(QString, userName);
        QFETCH(Records, info);
        TestEnvironment env;
        const QString path = env.path(u"games/"_s + fileName);
        if (fixture.isEmpty())
            QVERIFY(WriteFile(path));
        else
            REQUIRE_FIXTURE(
                CopyFixture(
                    fixture.startsWith(u"pe/") ? PeFixture(fixture.mid(3)) : CatalogueFixture(fixture.mid(10)), path),
                "the executable fixtures (mingw-w64)");
        if (!info.isEmpty())
            QVERIFY(WriteInfoFile(path.chopped(4) + u".bvxinf"_s, info));
        QVERIFY(Save(u"Files"_s, u"File7"_s, path) && Save(u"Files"_s, u"File8"_s, env.path(u"x"_s)));
        if (!userName.isEmpty())
            QVERIFY(
                Save(u"FilesNames"_s, u"FileName7"_s, userName) && Save(u"FilesNames"_s, u"FileName8"_s, u"Wrong"_s));
        const GameEntry entry = ListOne(path);
        QTEST(entry.caption, "expected");
        QCOMPARE(entry.path, path);
    }

    // The user's name is found for the entry whose path matches after trimming and in any case, and a
    // name key written twice by hand shows the first one, as renaming and removing read it.
    void userNameLookup()
    {
        TestEnvironment env;
        const QString path = env.path(u"games/Game.exe"_s);
        QVERIFY(WriteFile(env.settingsFile(),
            "[Files]\r\nCount=12\r\nFILE12=  " + path.toUpper().toUtf8()
                + "\r\n[FilesNames]\r\nfilename12=First\r\nFileName12=Second\r\n"));
        ListBuilder builder(DataFolders::IconsFolder());
        builder.beginPass();
        QCOMPARE(builder.AddGameToList(path).caption, u"First"_s);
        QCOMPARE(builder.AddGameToList(env.path(u"games/Other.exe"_s)).caption, u"Other"_s);
    }

    void icon_data()
    {
        QTest::addColumn<QString>("fileName");
        QTest::addColumn<QString>("ownIcon"); // "", "valid" or "corrupt"
        QTest::addColumn<QString>("cacheIcon");
        QTest::addColumn<IconSource>("expected");
        QTest::newRow("own icon wins over cache") << u"a.exe"_s << u"valid"_s << u"valid"_s << IconSource::File;
        QTest::newRow("corrupt own icon queues, cache or not")
            << u"a.exe"_s << u"corrupt"_s << u"valid"_s << IconSource::Queued;
        QTest::newRow("cache") << u"a.exe"_s << u""_s << u"valid"_s << IconSource::Cache;
        QTest::newRow("corrupt cache") << u"a.exe"_s << u""_s << u"corrupt"_s << IconSource::Queued;
        QTest::newRow("nothing") << u"a.exe"_s << u""_s << u""_s << IconSource::Queued;
        QTest::newRow("flash with corrupt cache") << u"movie.SWF"_s << u""_s << u"corrupt"_s << IconSource::Flash;
        QTest::newRow("flash with own icon") << u"movie.swf"_s << u"valid"_s << u""_s << IconSource::File;
    }
    void icon()
    {
        QFETCH(QString, fileName);
        QFETCH(QString, ownIcon);
        QFETCH(QString, cacheIcon);
        QFETCH(IconSource, expected);
        TestEnvironment env;
        const QByteArray valid = ValidIconFile();
        REQUIRE_FIXTURE(!valid.isEmpty(), "the PE fixture multi64.exe (mingw-w64)");
        const QString path = env.path(u"games/"_s + fileName);
        const QString ownFile = path.left(path.lastIndexOf(u'.')) + u".ico"_s;
        const QString cacheFile = IconCacheFile(DataFolders::IconsFolder(), path);
        QVERIFY(WriteFile(path));
        if (!ownIcon.isEmpty())
            QVERIFY(WriteFile(ownFile, ownIcon == u"valid" ? valid : valid.left(40)));
        if (!cacheIcon.isEmpty())
            QVERIFY(WriteFile(cacheFile, cacheIcon == u"valid" ? valid : valid.left(40)));
        const GameEntry entry = ListOne(path);
        QCOMPARE(entry.source, expected);
        const bool shown = expected == IconSource::File || expected == IconSource::Cache;
        QCOMPARE(entry.iconFile, shown ? (expected == IconSource::File ? ownFile : cacheFile) : QString());
        QCOMPARE(entry.picture.width(), shown ? 32 : 0);
        // The command line asks for the decision without the picture.
        QCOMPARE(ListOne(path, false).source, expected);
        QVERIFY(ListOne(path, false).picture.isNull());
    }

    void knownPaths()
    {
        TestEnvironment env;
        ListBuilder builder(DataFolders::IconsFolder());
        builder.beginPass();
        const QString path = env.path(u"Games/Game.EXE"_s);
        QVERIFY(!builder.IsGameListed(path));
        builder.AddGameToList(u"  "_s + path);
        QVERIFY(builder.IsGameListed(path.toLower() + u" "_s));
        QVERIFY(!builder.IsGameListed(path + u"x"_s));
        QVERIFY(!builder.IsGameListed(env.path(u"Games/Game"_s)));
        builder.beginPass();
        QVERIFY(!builder.IsGameListed(path));
    }

    void onlineEntry()
    {
        TestEnvironment env;
        qputenv("BRIMVAULT_CATALOGUE_ROOT", "http://games.example.org/");
        ListBuilder builder(DataFolders::IconsFolder());
        builder.beginPass();
        const GameEntry entry = builder.OnlineGamesEntry();
        QCOMPARE(entry.caption, u"Online games"_s);
        QCOMPARE(entry.path, u"http://games.example.org/online-games-catalog.asp"_s);
        QCOMPARE(entry.source, IconSource::Online);
        QVERIFY(!builder.IsGameListed(entry.path));
    }
};
BV_REGISTER_TEST(TestListBuilder);
#include "tst_listbuilder.moc"
