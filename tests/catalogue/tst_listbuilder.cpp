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

    void entries_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        // A game file (plain, or a copy of a built fixture: pe/<name> or catalogue/<name>) with a user's name and
        // an info file. The user's name belongs to the entry whose path matches after trimming and in any case;
        // of a name key written twice by hand the first counts.
        const auto caption = [](const QString& fileName, const QString& fixture, const QByteArray& userName = {},
                                 const QByteArray& info = {}) -> QString {
            TestEnvironment env;
            const QString path = env.path(u"games/"_s + fileName);
            const QString built
                = fixture.startsWith(u"pe/") ? PeFixture(fixture.mid(3)) : CatalogueFixture(fixture.mid(10));
            if (fixture.isEmpty() ? !WriteFile(path) : !CopyFixture(built, path))
                return u"missing the executable fixtures (mingw-w64): build them with make test"_s;
            if (!info.isEmpty())
                WriteFile(path.chopped(4) + u".BVXINF"_s, info);
            WriteFile(env.settingsFile(),
                "[Files]\nFILE7=  " + path.toUpper().toUtf8() + "\nFile8=" + env.path(u"x"_s).toUtf8()
                    + "\n[FilesNames]\n"
                    + (userName.isEmpty() ? QByteArray() : "filename7=" + userName + "\nFileName7=Wrong\n")
                    + "FileName8=Wrong\n");
            return ListOne(path).caption;
        };
        // Where the icon comes from, the file shown and its width; v: a valid icon file, c: a corrupt one.
        const auto icon = [](const QString& fileName, char own, char cache) -> QString {
            TestEnvironment env;
            const QByteArray valid = ValidIconFile();
            if (valid.isEmpty())
                return u"missing the PE fixture multi64.exe (mingw-w64): build it with make test"_s;
            const QString path = env.path(u"games/"_s + fileName);
            const QString ownFile = path.left(path.lastIndexOf(u'.')) + u".ICO"_s;
            const QString cacheFile = IconCacheFile(DataFolders::IconsFolder(), path);
            WriteFile(path);
            if (own != '-')
                WriteFile(ownFile, own == 'v' ? valid : valid.left(40));
            if (cache != '-')
                WriteFile(cacheFile, cache == 'v' ? valid : valid.left(40));
            const GameEntry entry = ListOne(path);
            // The command line asks for the decision without the picture.
            const GameEntry bare = ListOne(path, false);
            return IconSourceName(entry.source) + u' ' + QString::number(entry.picture.width())
                + (entry.iconFile == ownFile          ? u" own"_s
                        : entry.iconFile == cacheFile ? u" cache"_s
                                                      : entry.iconFile)
                + (bare.source == entry.source && bare.picture.isNull() ? QString() : u" differs bare"_s);
        };
        // Each takes the first source that has a name: user, info file, zone table, version text, file title.
        QTest::newRow("user name first") << caption(u"hrtzzm.exe"_s, {}, "My Hearts", "<>Name<Info Hearts")
                                         << u"My Hearts"_s;
        QTest::newRow("info file before zone table")
            << caption(u"hrtzzm.exe"_s, {}, {}, "<>Name<Info Hearts") << u"Info Hearts"_s;
        QTest::newRow("info file of another language only")
            << caption(u"game.exe"_s, {}, {}, "<>Name_RUS<Igra") << u"game"_s;
        QTest::newRow("zone member without row falls to version")
            << caption(u"zm.exe"_s, u"pe/multi64.exe"_s) << u"Marble Cascade"_s;
        QTest::newRow("version text with russian prefix")
            << caption(u"chess.exe"_s, u"catalogue/ru_prefix.exe"_s) << u"Chess"_s;
        QTest::newRow("long version text trimmed, cut and broken")
            << caption(u"long.exe"_s, u"catalogue/long_desc.exe"_s) << u"SuperMegaUlt raExtremeHyp erDelu..."_s;
        QTest::newRow("version without description")
            << caption(u"nodesc.exe"_s, u"pe/ver_nodesc64.exe"_s) << u"nodesc"_s;
        QTest::newRow("no resources") << caption(u"Arcade.exe"_s, u"pe/nores64.exe"_s) << u"Arcade"_s;
        QTest::newRow("user name is tidied too")
            << caption(u"g.exe"_s, {}, u"Исполняемый файл для игры Шашки"_s.toUtf8()) << u"Шашки"_s;
        QTest::newRow("own icon wins over cache") << icon(u"a.exe"_s, 'v', 'v') << u"file 32 own"_s;
        QTest::newRow("corrupt own icon queues, cache or not") << icon(u"a.exe"_s, 'c', 'v') << u"queued 0"_s;
        QTest::newRow("cache") << icon(u"a.exe"_s, '-', 'v') << u"cache 32 cache"_s;
        QTest::newRow("corrupt cache") << icon(u"a.exe"_s, '-', 'c') << u"queued 0"_s;
        QTest::newRow("nothing") << icon(u"a.exe"_s, '-', '-') << u"queued 0"_s;
        QTest::newRow("flash with corrupt cache") << icon(u"movie.SWF"_s, '-', 'c') << u"flash 0"_s;
        QTest::newRow("flash with own icon") << icon(u"movie.swf"_s, 'v', '-') << u"file 32 own"_s;
    }
    void entries()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
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
