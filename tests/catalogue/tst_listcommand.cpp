#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueFiles.h"
#include "CatalogueIcon.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>

using namespace Brimvault;
using namespace Qt::StringLiterals;

// The program's --list and --json output, read as a user's script would.
class TestListCommand : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    QString m_games;

    struct Output {
        int exitCode = -1;
        QByteArray out;
    };
    static Output run(const QStringList& arguments)
    {
        QProcess process;
        process.start(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"), arguments);
        Output output;
        if (process.waitForFinished(60000) && process.exitStatus() == QProcess::NormalExit)
            output = {process.exitCode(), process.readAllStandardOutput()};
        return output;
    }
    QString path(const QString& relative) const { return m_env->path(relative); }
    static bool save(const QString& section, const QString& key, const QString& value)
    {
        return SaveSetting(AppTitle(), section, key, value);
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        QDir(m_env->root()).mkpath(u"program"_s);
        qputenv("BRIMVAULT_PROGRAM_DIR", path(u"program"_s).toLocal8Bit());
        qputenv("WINEPREFIX", path(u"wine"_s).toLocal8Bit());
        m_games = DataFolders::GamesFolder();
        REQUIRE_FIXTURE(QFileInfo::exists(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault")), "the program brimvault");
        const QByteArray icon = ValidIconFile();
        REQUIRE_FIXTURE(!icon.isEmpty(), "the PE fixture multi64.exe (mingw-w64)");
        QVERIFY(WriteFile(m_games + u"Own/own.exe"_s) && WriteFile(m_games + u"Own/own.ico"_s, icon));
        QVERIFY(WriteFile(m_games + u"Cached/cached.exe"_s));
        QVERIFY(WriteFile(IconCacheFile(DataFolders::IconsFolder(), m_games + u"Cached/cached.exe"_s), icon));
        QVERIFY(CopyFixture(PeFixture(u"multi64.exe"_s), m_games + u"Marble/marble.exe"_s));
        QVERIFY(WriteInfoFile(m_games + u"Marble/marble.bvxinf"_s,
            {{u"Name"_s, u"Marble Everywhere"_s}, {u"Name_TST"_s, u"Marble In Test Language"_s}}));
        QVERIFY(WriteFile(m_games + u"Flash/movie.swf"_s));
        QVERIFY(WriteFile(path(u"windows/sol.exe"_s)) && WriteFile(path(u"mine/Added Game.exe"_s)));
        QVERIFY(save(u"Files"_s, u"File3"_s, path(u"mine/Added Game.exe"_s)));
        QVERIFY(save(u"Files"_s, u"File4"_s, m_games + u"Own/own.exe"_s));
        QVERIFY(save(u"Files"_s, u"File5"_s, path(u"mine/hrtzzm.exe"_s)));
        QVERIFY(save(u"FilesNames"_s, u"FileName3"_s, u"Renamed"_s));
        QVERIFY(WriteFile(path(u"program/Brimvault_Test.lng"_s),
            "#language=Testish\n#charset=204\n@1250=Online Test\n@2030=Test Chervi\n"));
        QVERIFY(save(u"LocaleSettings"_s, u"LngFileName"_s, u"Brimvault_Test.lng"_s));
        QVERIFY(save(u"LocaleSettings"_s, u"LngNik"_s, u"TST"_s));
    }
    void cleanup() { m_env.reset(); }

    void listing()
    {
        const Output text = run({u"--list"_s});
        QCOMPARE(text.exitCode, 0);
        QStringList lines = QString::fromUtf8(text.out).split(u'\n');
        QCOMPARE(lines.takeLast(), QString());
        // Installed games in the walk's order, then the classic games, then the added ones.
        const QStringList installed {u"own\t"_s + m_games + u"Own/own.exe"_s,
            u"cached\t"_s + m_games + u"Cached/cached.exe"_s,
            u"Marble In Test Language\t"_s + m_games + u"Marble/marble.exe"_s,
            u"movie\t"_s + m_games + u"Flash/movie.swf"_s};
        QCOMPARE(lines.size(), 8);
        QCOMPARE(lines.first(), u"Online Test\thttp://127.0.0.1:9/online-games-catalog.asp"_s);
        QCOMPARE(
            QSet<QString>(lines.begin() + 1, lines.begin() + 5), QSet<QString>(installed.begin(), installed.end()));
        QCOMPARE(lines.mid(5),
            QStringList({u"sol\t"_s + path(u"windows/sol.exe"_s), u"Renamed\t"_s + path(u"mine/Added Game.exe"_s),
                u"Test Chervi\t"_s + path(u"mine/hrtzzm.exe"_s)}));

        const Output json = run({u"--list"_s, u"--json"_s});
        QCOMPARE(json.exitCode, 0);
        QJsonParseError error;
        const QJsonArray array = QJsonDocument::fromJson(json.out, &error).array();
        QCOMPARE(error.error, QJsonParseError::NoError);
        QHash<QString, QString> iconByPath;
        QStringList jsonLines;
        for (const QJsonValue& value : array) {
            const QJsonObject object = value.toObject();
            QCOMPARE(object.size(), 6);
            iconByPath.insert(object.value(u"path"_s).toString(), object.value(u"icon"_s).toString());
            jsonLines.append(object.value(u"caption"_s).toString() + u'\t' + object.value(u"path"_s).toString());
        }
        QCOMPARE(jsonLines, lines);
        QCOMPARE(iconByPath.value(u"http://127.0.0.1:9/online-games-catalog.asp"_s), u"online"_s);
        QCOMPARE(iconByPath.value(m_games + u"Own/own.exe"_s), u"file"_s);
        QCOMPARE(iconByPath.value(m_games + u"Cached/cached.exe"_s), u"cache"_s);
        QCOMPARE(iconByPath.value(m_games + u"Marble/marble.exe"_s), u"queued"_s);
        QCOMPARE(iconByPath.value(m_games + u"Flash/movie.swf"_s), u"flash"_s);
    }

    // Without a stored language the window's start-up would store one; the listing must not.
    void writesNothing()
    {
        QVERIFY(DeleteSection(AppTitle(), u"LocaleSettings"_s));
        const auto before = SnapshotTree(m_env->root());
        QCOMPARE(run({u"--list"_s}).exitCode, 0);
        QCOMPARE(run({u"--list"_s, u"--json"_s}).exitCode, 0);
        QCOMPARE(SnapshotTree(m_env->root()), before);
    }

    void badArguments_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::newRow("unknown argument") << QStringList {u"--list"_s, u"--xml"_s};
        QTest::newRow("too many") << QStringList {u"--list"_s, u"--json"_s, u"--json"_s};
    }
    void badArguments()
    {
        QFETCH(QStringList, arguments);
        const Output output = run(arguments);
        QCOMPARE(output.exitCode, 2);
        QVERIFY(output.out.isEmpty());
    }
};
BV_REGISTER_TEST(TestListCommand);
#include "tst_listcommand.moc"
