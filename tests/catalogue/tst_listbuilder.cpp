#include "catalogue/IconCacheKey.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"
#include "store/DataFolders.h"

#include "CatalogueFiles.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

GameEntry ListOne(const QString& path, bool keepPictures = true)
{
    ListBuilder builder(DataFolders::IconsFolder());
    builder.setKeepPictures(keepPictures);
    builder.beginPass();
    return builder.AddGameToList(path);
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
        QTest::addColumn<QByteArray>("userName");
        QTest::addColumn<QByteArray>("info");
        QTest::addColumn<QString>("expected");
        QTest::newRow("user name first") << u"hrtzzm.exe"_s << QString() << QByteArray("My Hearts")
                                         << QByteArray("<>Name<Info Hearts") << u"My Hearts"_s;
        QTest::newRow("info file before zone table")
            << u"hrtzzm.exe"_s << QString() << QByteArray() << QByteArray("<>Name<Info Hearts") << u"Info Hearts"_s;
        QTest::newRow("info file of another language only")
            << u"game.exe"_s << QString() << QByteArray() << QByteArray("<>Name_RUS<Igra") << u"game"_s;
        QTest::newRow("zone member without row falls to version")
            << u"zm.exe"_s << u"pe/multi64.exe"_s << QByteArray() << QByteArray() << u"Marble Cascade"_s;
        QTest::newRow("version text with russian prefix")
            << u"chess.exe"_s << u"catalogue/ru_prefix.exe"_s << QByteArray() << QByteArray() << u"Chess"_s;
        QTest::newRow("long version text trimmed, cut and broken")
            << u"long.exe"_s << u"catalogue/long_desc.exe"_s << QByteArray() << QByteArray()
            << u"SuperMegaUlt raExtremeHyp erDelu..."_s;
        QTest::newRow("version without description")
            << u"nodesc.exe"_s << u"pe/ver_nodesc64.exe"_s << QByteArray() << QByteArray() << u"nodesc"_s;
        QTest::newRow("no resources") << u"Arcade.exe"_s << u"pe/nores64.exe"_s << QByteArray() << QByteArray()
                                      << u"Arcade"_s;
        QTest::newRow("user name is tidied too")
            << u"g.exe"_s << QString() << u"Исполняемый файл для игры Шашки"_s.toUtf8() << QByteArray() << u"Шашки"_s;
    }
    void caption()
    {
        QFETCH(QString, fileName);
        QFETCH(QString, fixture);
        QFETCH(QByteArray, userName);
        QFETCH(QByteArray, info);
        TestEnvironment env;
        const QString path = env.path(u"games/"_s + fileName);
        if (fixture.isEmpty())
            QVERIFY(WriteFile(path));
        else
            REQUIRE_FIXTURE(
                CopyFixture(
                    fixture.startsWith(u"pe/") ? PeFixture(fixture.mid(3)) : CatalogueFixture(fixture.mid(10)), path),
                "the executable fixtures (mingw-w64)");
        QVERIFY(info.isEmpty() || WriteFile(path.chopped(4) + u".BVXINF"_s, info));
        // The user's name belongs to the entry whose path matches after trimming and in any case; of a name
        // key written twice by hand the first counts.
        QVERIFY(WriteFile(env.settingsFile(),
            "[Files]\nFILE7=  " + path.toUpper().toUtf8() + "\nFile8=" + env.path(u"x"_s).toUtf8() + "\n[FilesNames]\n"
                + (userName.isEmpty() ? QByteArray() : "filename7=" + userName + "\nFileName7=Wrong\n")
                + "FileName8=Wrong\n"));
        QTEST(ListOne(path).caption, "expected");
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
        const QString ownFile = path.left(path.lastIndexOf(u'.')) + u".ICO"_s;
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
        QVERIFY(ListOne(path, false).source == expected && ListOne(path, false).picture.isNull());
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
};
BV_REGISTER_TEST(TestListBuilder);
#include "tst_listbuilder.moc"
