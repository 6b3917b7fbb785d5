#include "catalogue/CatalogueListing.h"
#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include "CatalogueTestTree.h"
#include "TestEnvironment.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QtTest>

using namespace Brimvault;
using namespace CatalogueTestTree;

class TestListCommand : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void init();
    void cleanup();
    void textAgreesWithTheLibrary();
    void jsonNamesTheIconSources();
    void writesNothing();
    void badArguments_data();
    void badArguments();

private:
    struct Output {
        int exitCode = -1;
        QByteArray out;
    };
    Output run(const QStringList& arguments) const;
    void buildLibrary();
    QString libraryText() const;

    std::unique_ptr<TestEnvironment> m_env;
    QString m_gamesFolder;
};

void TestListCommand::init()
{
    m_env = std::make_unique<TestEnvironment>();
    QDir(m_env->root()).mkpath(QStringLiteral("program"));
    qputenv("BRIMVAULT_PROGRAM_DIR", m_env->path(QStringLiteral("program")).toLocal8Bit());
    qputenv("WINEPREFIX", m_env->path(QStringLiteral("wine")).toLocal8Bit());
    m_gamesFolder = DataFolders::GamesFolder();
    if (!QFileInfo::exists(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault")))
        QSKIP("the program was not built");
}

void TestListCommand::cleanup()
{
    m_env.reset();
}

TestListCommand::Output TestListCommand::run(const QStringList& arguments) const
{
    QProcess process;
    process.setProgram(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault"));
    process.setArguments(arguments);
    process.start();
    Output output;
    if (!process.waitForFinished(60000))
        return output;
    output.exitCode = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
    output.out = process.readAllStandardOutput();
    return output;
}

void TestListCommand::buildLibrary()
{
    const QByteArray icon = iconFileBytes();
    QVERIFY(!icon.isEmpty());
    QVERIFY(writeFile(m_gamesFolder + u"Own/own.exe"_qs));
    QVERIFY(writeFile(m_gamesFolder + u"Own/own.ico"_qs, icon));
    QVERIFY(writeFile(m_gamesFolder + u"Cached/cached.exe"_qs));
    QVERIFY(writeFile(IconCacheFile(DataFolders::IconsFolder(), m_gamesFolder + u"Cached/cached.exe"_qs), icon));
    QVERIFY(copyFile(peFixture(u"multi64.exe"_qs), m_gamesFolder + u"Marble/marble.exe"_qs));
    QVERIFY(writeInfoFile(m_gamesFolder + u"Marble/marble.bvxinf"_qs,
        {{u"Name"_qs, u"Marble Everywhere"_qs}, {u"Name_TST"_qs, u"Marble In Test Language"_qs}}));
    QVERIFY(writeFile(m_gamesFolder + u"Flash/movie.swf"_qs));
    QVERIFY(writeFile(m_env->path(u"windows/sol.exe"_qs)));
    const QString added = m_env->path(u"mine/Added Game.exe"_qs);
    QVERIFY(writeFile(added));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File3"_qs, added));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File4"_qs, m_gamesFolder + u"Own/own.exe"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"Files"_qs, u"File5"_qs, m_env->path(u"mine/hrtzzm.exe"_qs)));
    QVERIFY(SaveSetting(AppTitle(), u"FilesNames"_qs, u"FileName3"_qs, u"Renamed"_qs));
    QVERIFY(writeFile(m_env->path(u"program/Brimvault_Test.lng"_qs),
        QByteArrayLiteral("#language=Testish\n#charset=204\n@1250=Online Test\n@2030=Test Chervi\n")));
    QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_qs, u"LngFileName"_qs, u"Brimvault_Test.lng"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_qs, u"LngNik"_qs, u"TST"_qs));
}

QString TestListCommand::libraryText() const
{
    QString text;
    QTextStream out(&text);
    CatalogueListing::LoadLanguageWithoutStoring();
    CatalogueListing::WriteCatalogue(CatalogueListing::ListCatalogue(), CatalogueListing::Format::Text, out);
    out.flush();
    return text;
}

void TestListCommand::textAgreesWithTheLibrary()
{
    if (peFixture(u"multi64.exe"_qs).isEmpty())
        QSKIP("PE fixtures were not built");
    buildLibrary();
    const Output output = run({u"--list"_qs});
    QCOMPARE(output.exitCode, 0);
    const QString text = QString::fromUtf8(output.out);
    QCOMPARE(text, libraryText());

    QStringList lines = text.split(u'\n');
    QCOMPARE(lines.takeLast(), QString());
    QCOMPARE(lines.size(), 8);
    QCOMPARE(lines.first(), u"Online Test\thttp://127.0.0.1:9/online-games-catalog.asp"_qs);
    QVERIFY(lines.contains(u"Marble In Test Language\t"_qs + m_gamesFolder + u"Marble/marble.exe"_qs));
    QCOMPARE(lines.at(5), u"sol\t"_qs + m_env->path(u"windows/sol.exe"_qs));
    QCOMPARE(lines.at(6), u"Renamed\t"_qs + m_env->path(u"mine/Added Game.exe"_qs));
    QCOMPARE(lines.at(7), u"Test Chervi\t"_qs + m_env->path(u"mine/hrtzzm.exe"_qs));
}

void TestListCommand::jsonNamesTheIconSources()
{
    if (peFixture(u"multi64.exe"_qs).isEmpty())
        QSKIP("PE fixtures were not built");
    buildLibrary();
    const Output output = run({u"--list"_qs, u"--json"_qs});
    QCOMPARE(output.exitCode, 0);
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(output.out, &error);
    QCOMPARE(error.error, QJsonParseError::NoError);
    QVERIFY(document.isArray());

    QHash<QString, QString> iconByPath;
    QStringList jsonLines;
    for (const QJsonValue& value : document.array()) {
        const QJsonObject object = value.toObject();
        QCOMPARE(object.size(), 3);
        iconByPath.insert(object.value(u"path"_qs).toString(), object.value(u"icon"_qs).toString());
        jsonLines.append(object.value(u"caption"_qs).toString() + u'\t' + object.value(u"path"_qs).toString());
    }
    QCOMPARE(jsonLines.join(u'\n') + u'\n', libraryText());
    QCOMPARE(iconByPath.value(u"http://127.0.0.1:9/online-games-catalog.asp"_qs), u"online"_qs);
    QCOMPARE(iconByPath.value(m_gamesFolder + u"Own/own.exe"_qs), u"file"_qs);
    QCOMPARE(iconByPath.value(m_gamesFolder + u"Cached/cached.exe"_qs), u"cache"_qs);
    QCOMPARE(iconByPath.value(m_gamesFolder + u"Marble/marble.exe"_qs), u"queued"_qs);
    QCOMPARE(iconByPath.value(m_gamesFolder + u"Flash/movie.swf"_qs), u"flash"_qs);
    QCOMPARE(iconByPath.value(m_env->path(u"windows/sol.exe"_qs)), u"queued"_qs);
}

void TestListCommand::writesNothing()
{
    if (peFixture(u"multi64.exe"_qs).isEmpty())
        QSKIP("PE fixtures were not built");
    buildLibrary();
    // Without a stored language the window's start-up would store one; the listing must not.
    QVERIFY(DeleteSection(AppTitle(), u"LocaleSettings"_qs));
    const auto before = snapshotTree(m_env->root());
    QVERIFY(before.size() > 10);
    QCOMPARE(run({u"--list"_qs}).exitCode, 0);
    QCOMPARE(run({u"--list"_qs, u"--json"_qs}).exitCode, 0);
    QCOMPARE(snapshotTree(m_env->root()), before);
}

void TestListCommand::badArguments_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::newRow("unknown argument") << QStringList {u"--list"_qs, u"--xml"_qs};
    QTest::newRow("too many") << QStringList {u"--list"_qs, u"--json"_qs, u"--json"_qs};
}

void TestListCommand::badArguments()
{
    QFETCH(QStringList, arguments);
    const Output output = run(arguments);
    QCOMPARE(output.exitCode, 2);
    QVERIFY(output.out.isEmpty());
}

QTEST_MAIN(TestListCommand)
#include "tst_listcommand.moc"
