#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueFiles.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// The exit code and what the program printed; -1 when it did not end by itself.
QPair<int, QByteArray> run(const QStringList& arguments)
{
    QProcess process;
    process.start(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), arguments);
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit)
        return {-1, {}};
    return {process.exitCode(), process.readAllStandardOutput()};
}

} // namespace

// The program's --list and --json output, read as a user's script would.
class TestListCommand : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void listing()
    {
        TestEnvironment env;
        const QString program = env.programDir();
        const QString games = DataFolders::GamesFolder();
        const QByteArray icon = ValidIconFile();
        REQUIRE_FIXTURE(!icon.isEmpty(), "the PE fixture multi64.exe (mingw-w64)");
        QVERIFY(WriteFile(games + u"Own/own.exe"_s) && WriteFile(games + u"Own/own.ico"_s, icon));
        QVERIFY(WriteFile(games + u"Cached/cached.exe"_s));
        QVERIFY(WriteFile(IconCacheFile(DataFolders::IconsFolder(), games + u"Cached/cached.exe"_s), icon));
        QVERIFY(CopyFixture(PeFixture(u"multi64.exe"_s), games + u"Marble/marble.exe"_s));
        QVERIFY(WriteFile(games + u"Marble/marble.bvxinf"_s, "<>Name<Marble Everywhere\r\n<>Name_TST<Marble In Test"));
        QVERIFY(WriteFile(games + u"Flash/movie.swf"_s));
        QVERIFY(WriteFile(env.path(u"windows/sol.exe"_s)) && WriteFile(env.path(u"mine/Added Game.exe"_s)));
        QVERIFY(WriteFile(env.settingsFile(),
            QString(u"[Files]\nFile3="_s + env.path(u"mine/Added Game.exe"_s) + u"\nFile4="_s + games
                + u"Own/own.exe\nFile5="_s + env.path(u"mine/hrtzzm.exe"_s) + u"\n[FilesNames]\nFileName3=Renamed\n"_s)
                .toUtf8()));
        // Without a stored language the window's start-up would store one; the listing must not.
        const auto before = SnapshotTree(env.root());
        const auto [jsonExit, json] = run({u"--list"_s, u"--json"_s});
        QCOMPARE(jsonExit, 0);
        QCOMPARE(SnapshotTree(env.root()), before);
        QStringList items;
        for (const QJsonValue& value : QJsonDocument::fromJson(json).array()) {
            const QJsonObject object = value.toObject();
            QCOMPARE(object.size(), 6);
            items.append(object.value(u"caption"_s).toString() + u'\t' + object.value(u"path"_s).toString() + u'\t'
                + object.value(u"icon"_s).toString());
        }
        QCOMPARE(items.size(), 8);
        QVERIFY(items.first().endsWith(u"\thttp://127.0.0.1:9/online-games-catalog.asp\tonline"_s));
        for (const QString& item : QStringList {u"own\t"_s + games + u"Own/own.exe\tfile"_s,
                 u"cached\t"_s + games + u"Cached/cached.exe\tcache"_s,
                 u"Marble Everywhere\t"_s + games + u"Marble/marble.exe\tqueued"_s,
                 u"movie\t"_s + games + u"Flash/movie.swf\tflash"_s,
                 u"Renamed\t"_s + env.path(u"mine/Added Game.exe"_s) + u"\tqueued"_s})
            QVERIFY2(items.contains(item), qPrintable(item));

        QVERIFY(WriteFile(program + u"/Brimvault_Test.lng"_s,
            "#language=Testish\n#charset=204\n@1250=Online Test\n@2030=Test Chervi\n"));
        QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"Brimvault_Test.lng"_s)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s, u"TST"_s));
        const auto [textExit, text] = run({u"--list"_s});
        QCOMPARE(textExit, 0);
        QStringList lines = QString::fromUtf8(text).split(u'\n');
        QCOMPARE(lines.takeLast(), QString());
        // Installed games in the walk's order, then the classic games, then the added ones.
        const QStringList installed {u"own\t"_s + games + u"Own/own.exe"_s,
            u"cached\t"_s + games + u"Cached/cached.exe"_s, u"Marble In Test\t"_s + games + u"Marble/marble.exe"_s,
            u"movie\t"_s + games + u"Flash/movie.swf"_s};
        QCOMPARE(lines.size(), 8);
        QCOMPARE(lines.first(), u"Online Test\thttp://127.0.0.1:9/online-games-catalog.asp"_s);
        QCOMPARE(
            QSet<QString>(lines.begin() + 1, lines.begin() + 5), QSet<QString>(installed.begin(), installed.end()));
        QCOMPARE(lines.mid(5),
            QStringList(
                {u"sol\t"_s + env.path(u"windows/sol.exe"_s), u"Renamed\t"_s + env.path(u"mine/Added Game.exe"_s),
                    u"Test Chervi\t"_s + env.path(u"mine/hrtzzm.exe"_s)}));
    }

    void badArguments()
    {
        TestEnvironment env;
        for (const QStringList& arguments :
            {QStringList {u"--list"_s, u"--xml"_s}, {u"--list"_s, u"--json"_s, u"--json"_s}}) {
            const auto [exitCode, out] = run(arguments);
            QVERIFY(exitCode == 2 && out.isEmpty());
        }
    }
};
BV_REGISTER_TEST(TestListCommand);
#include "tst_listcommand.moc"
