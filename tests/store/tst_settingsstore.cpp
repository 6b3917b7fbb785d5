#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QtTest>

#ifdef Q_OS_UNIX
#include <sys/stat.h>
#endif

using namespace Brimvault;

class TestSettingsStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void keysIgnoreCase();
    void caseRules_data();
    void caseRules();
    void roundTripThroughFile_data();
    void roundTripThroughFile();
    void deletion();
    void enumerationOrder();
    void handEditedFile_data();
    void handEditedFile();
    void splitSectionReadsAsOne();
    void secondProcessWriteIsSeenAtOnce();
    void concurrentWritersLoseNothing();
    void corruptFileKeepsItsBytes();
    void unchangedLinesKeepTheirBytes();
    void settingsPathIsNotAFile_data();
    void settingsPathIsNotAFile();
};

namespace {

const QString files = QStringLiteral("Files");

QByteArray readBytes(const QString& path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

void writeBytes(const QString& path, const QByteArray& bytes)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::WriteOnly));
    QCOMPARE(file.write(bytes), bytes.size());
}

int runWriter(const QStringList& arguments)
{
    QProcess writer;
    writer.start(QStringLiteral(SETTINGS_WRITER), arguments);
    if (!writer.waitForFinished(30000))
        return -1;
    return writer.exitStatus() == QProcess::NormalExit ? writer.exitCode() : -1;
}

} // namespace

void TestSettingsStore::keysIgnoreCase()
{
    TestEnvironment env;
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("Count"), QStringLiteral("3")));
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("files"), QStringLiteral("COUNT")), QStringLiteral("3"));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("FILES"), QStringLiteral("count"), QStringLiteral("4")));
    QCOMPARE(GetAllSettings(AppTitle(), QStringLiteral("Files")).size(), 1);
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("4"));
}

void TestSettingsStore::caseRules_data()
{
    QTest::addColumn<QString>("writeSection");
    QTest::addColumn<QString>("writeKey");
    QTest::addColumn<QString>("readSection");
    QTest::addColumn<QString>("readKey");
    QTest::newRow("same") << u"Commands"_qs << u"NewGameInstalled"_qs << u"Commands"_qs << u"NewGameInstalled"_qs;
    QTest::newRow("lower") << u"Commands"_qs << u"NewGameInstalled"_qs << u"commands"_qs << u"newgameinstalled"_qs;
    QTest::newRow("upper") << u"commands"_qs << u"newgameinstalled"_qs << u"COMMANDS"_qs << u"NEWGAMEINSTALLED"_qs;
    QTest::newRow("non-ASCII") << u"Ёлка"_qs << u"Ключ"_qs << u"ёЛКА"_qs << u"КЛЮЧ"_qs;
}

void TestSettingsStore::caseRules()
{
    QFETCH(QString, writeSection);
    QFETCH(QString, writeKey);
    QFETCH(QString, readSection);
    QFETCH(QString, readKey);
    TestEnvironment env;
    QVERIFY(SaveSetting(AppTitle(), writeSection, writeKey, u"1"_qs));
    QCOMPARE(GetSetting(AppTitle(), readSection, readKey, u"none"_qs), u"1"_qs);
    QVERIFY(SaveSetting(AppTitle(), readSection, readKey, u"2"_qs));
    const auto pairs = GetAllSettings(AppTitle(), writeSection);
    QCOMPARE(pairs.size(), 1);
    QCOMPARE(pairs.first().first, writeKey);
    QCOMPARE(pairs.first().second, u"2"_qs);
    QCOMPARE(GetSetting(AppTitle(), writeSection, writeKey + u'x', u"none"_qs), u"none"_qs);
    QCOMPARE(GetSetting(AppTitle(), writeSection + u'x', writeKey, u"none"_qs), u"none"_qs);
}

void TestSettingsStore::roundTripThroughFile_data()
{
    QTest::addColumn<QString>("section");
    QTest::addColumn<QString>("key");
    QTest::addColumn<QString>("value");
    QTest::newRow("plain") << files << u"File1"_qs << u"/games/a.exe"_qs;
    QTest::newRow("line ends") << files << u"File2"_qs << u"a\r\nb\rc\nd"_qs;
    QTest::newRow("escape look-alikes") << files << u"File3"_qs << u"C:\\new\\r\\n\\"_qs;
    QTest::newRow("blanks kept") << files << u"File4"_qs << u"  spaced  "_qs;
    QTest::newRow("syntax in value") << files << u"File5"_qs << u"[x]=;#"_qs;
    QTest::newRow("empty value") << files << u"File6"_qs << QString();
    QTest::newRow("NUL") << files << u"File7"_qs << (u"a"_qs + QChar(0) + u"b"_qs);
    QTest::newRow("equals in key") << files << u"a=b"_qs << u"v"_qs;
    QTest::newRow("comment-like key") << files << u"#key"_qs << u"v"_qs;
    QTest::newRow("semicolon key") << files << u";key"_qs << u"v"_qs;
    QTest::newRow("section-like key") << files << u"[key"_qs << u"v]"_qs;
    QTest::newRow("bracket section") << u"a]b["_qs << u"k"_qs << u"v"_qs;
    QTest::newRow("non-ASCII") << u"FilesNames"_qs << u"FileName1"_qs << u"Игра «Линии»"_qs;
}

// Values read back from the bytes on disk, not only from what the process remembers.
void TestSettingsStore::roundTripThroughFile()
{
    QFETCH(QString, section);
    QFETCH(QString, key);
    QFETCH(QString, value);
    TestEnvironment env;
    QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"Before"_qs, u"1"_qs));
    QVERIFY(SaveSetting(AppTitle(), section, key, value));
    QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"After"_qs, u"2"_qs));
    const IniDocument doc = IniDocument::parse(readBytes(env.settingsFile()));
    QCOMPARE(doc.value(section, key), std::optional<QString>(value));
    QCOMPARE(doc.value(u"Other"_qs, u"After"_qs), std::optional<QString>(u"2"_qs));
    QCOMPARE(doc.sectionPairs(section).size(), 1);
    QCOMPARE(GetSetting(AppTitle(), section, key, u"none"_qs), value);
}

void TestSettingsStore::deletion()
{
    TestEnvironment env;
    QVERIFY(SaveSetting(AppTitle(), files, u"Count"_qs, u"2"_qs));
    QVERIFY(SaveSetting(AppTitle(), files, u"File1"_qs, u"/a"_qs));
    QVERIFY(SaveSetting(AppTitle(), files, u"File2"_qs, u"/b"_qs));
    QVERIFY(SaveSetting(AppTitle(), u"FilesNames"_qs, u"FileName1"_qs, u"A"_qs));

    QVERIFY(DeleteSetting(AppTitle(), u"FILES"_qs, u"file1"_qs));
    QVERIFY(!DeleteSetting(AppTitle(), files, u"File1"_qs));
    QCOMPARE(GetSetting(AppTitle(), files, u"File1"_qs, u"gone"_qs), u"gone"_qs);
    QCOMPARE(GetSetting(AppTitle(), files, u"File2"_qs), u"/b"_qs);
    QVERIFY(!DeleteSetting(AppTitle(), u"Missing"_qs, u"File2"_qs));

    QVERIFY(DeleteSection(AppTitle(), u"files"_qs));
    QVERIFY(!DeleteSection(AppTitle(), files));
    QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
    QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs, u"0"_qs), u"0"_qs);
    QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName1"_qs), u"A"_qs);

    // A deleted section comes back empty when written again.
    QVERIFY(SaveSetting(AppTitle(), files, u"File9"_qs, u"/z"_qs));
    QCOMPARE(GetAllSettings(AppTitle(), files).size(), 1);
}

void TestSettingsStore::enumerationOrder()
{
    TestEnvironment env;
    for (const char* key : {"File1", "File3", "Count", "File2"})
        QVERIFY(SaveSetting(AppTitle(), files, QString::fromLatin1(key), QString::fromLatin1(key).toLower()));
    QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"File0"_qs, u"x"_qs));
    QVERIFY(SaveSetting(AppTitle(), files, u"FILE3"_qs, u"changed"_qs));
    const QList<QPair<QString, QString>> expected {{u"File1"_qs, u"file1"_qs}, {u"File3"_qs, u"changed"_qs},
        {u"Count"_qs, u"count"_qs}, {u"File2"_qs, u"file2"_qs}};
    QCOMPARE(GetAllSettings(AppTitle(), files), expected);
    QVERIFY(GetAllSettings(AppTitle(), u"Nothing"_qs).isEmpty());
}

void TestSettingsStore::handEditedFile_data()
{
    QTest::addColumn<QByteArray>("bytes");
    QTest::addColumn<QString>("value");
    QTest::newRow("CR LF") << QByteArray("[Files]\r\nCount=3\r\n") << u"3"_qs;
    QTest::newRow("byte order mark") << QByteArray("\xEF\xBB\xBF[Files]\nCount=3\n") << u"3"_qs;
    QTest::newRow("blanks around header") << QByteArray("[Other]\nCount=1\n  [Files] \nCount=3") << u"3"_qs;
    QTest::newRow("comment") << QByteArray("[Files]\n;Count=1\nCount=3") << u"3"_qs;
    QTest::newRow("garbage before") << QByteArrayLiteral("\xff\xfe\x00\n[Files]\nCount=3") << u"3"_qs;
    QTest::newRow("section split in two")
        << QByteArray("[Files]\nFile1=a\n[Other]\nCount=1\n[FILES]\nCount=3") << u"3"_qs;
    QTest::newRow("entry before any section") << QByteArray("Count=1\n[Files]\n") << u"none"_qs;
    QTest::newRow("invalid UTF-8 entry") << QByteArray("[Files]\nCount=\xe9\n") << u"none"_qs;
}

void TestSettingsStore::handEditedFile()
{
    QFETCH(QByteArray, bytes);
    QFETCH(QString, value);
    TestEnvironment env;
    writeBytes(env.settingsFile(), bytes);
    QCOMPARE(GetSetting(AppTitle(), files, u"count"_qs, u"none"_qs), value);
}

void TestSettingsStore::splitSectionReadsAsOne()
{
    TestEnvironment env;
    writeBytes(env.settingsFile(), "[Files]\nFile1=/a\n[Other]\nx=1\n[files]\nFile2=/b\n");
    QVERIFY(SaveSetting(AppTitle(), files, u"file2"_qs, u"/c"_qs));
    QVERIFY(SaveSetting(AppTitle(), files, u"File3"_qs, u"/d"_qs));
    const QList<QPair<QString, QString>> expected {
        {u"File1"_qs, u"/a"_qs}, {u"File3"_qs, u"/d"_qs}, {u"File2"_qs, u"/c"_qs}};
    QCOMPARE(GetAllSettings(AppTitle(), files), expected);
    QVERIFY(DeleteSection(AppTitle(), files));
    QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
    QCOMPARE(GetSetting(AppTitle(), u"Other"_qs, u"x"_qs), u"1"_qs);
}

void TestSettingsStore::secondProcessWriteIsSeenAtOnce()
{
    TestEnvironment env;
    const QString commands = QStringLiteral("Commands");
    const QString key = QStringLiteral("NewGameInstalled");
    QCOMPARE(GetSetting(AppTitle(), commands, key, u"0"_qs), u"0"_qs);
    QCOMPARE(runWriter({u"set"_qs, commands, key, u"1"_qs}), 0);
    QCOMPARE(GetSetting(AppTitle(), commands, key, u"0"_qs), u"1"_qs);
    // Same-size changes right after a read, as the service flips the flag and the timer resets it.
    for (int round = 0; round < 6; ++round) {
        QVERIFY(SaveSetting(AppTitle(), commands, key, u"0"_qs));
        QCOMPARE(GetSetting(AppTitle(), commands, key), u"0"_qs);
        QCOMPARE(runWriter({u"set"_qs, commands, key, QString::number(round % 9 + 1)}), 0);
        QCOMPARE(GetSetting(AppTitle(), commands, key), QString::number(round % 9 + 1));
        QCOMPARE(GetAllSettings(AppTitle(), commands).size(), 1);
    }
}

void TestSettingsStore::concurrentWritersLoseNothing()
{
    TestEnvironment env;
    constexpr int writesEach = 50;
    QProcess first;
    QProcess second;
    first.start(QStringLiteral(SETTINGS_WRITER), {u"many"_qs, files, u"A"_qs, QString::number(writesEach)});
    second.start(QStringLiteral(SETTINGS_WRITER), {u"many"_qs, files, u"B"_qs, QString::number(writesEach)});
    // This process writes too while the other two run.
    for (int i = 0; i < writesEach; ++i)
        QVERIFY(SaveSetting(AppTitle(), files, u"C"_qs + QString::number(i), u"c"_qs));
    QVERIFY(first.waitForFinished(60000));
    QVERIFY(second.waitForFinished(60000));
    QCOMPARE(first.exitCode(), 0);
    QCOMPARE(second.exitCode(), 0);

    const auto pairs = GetAllSettings(AppTitle(), files);
    QCOMPARE(pairs.size(), 3 * writesEach);
    for (int i = 0; i < writesEach; ++i) {
        for (const QString& prefix : {u"A"_qs, u"B"_qs}) {
            const QString key = prefix + QString::number(i);
            QCOMPARE(GetSetting(AppTitle(), files, key), key + u"-value"_qs);
        }
    }
}

void TestSettingsStore::corruptFileKeepsItsBytes()
{
    TestEnvironment env;
    const QByteArray original("[Files]\r\n"
                              "Count=2\r\n"
                              "\xff\xfe garbage \x00\x01\x02\r\n"
                              "File1=/a\\q\r\n"
                              "\xc3\x28 invalid=utf8\n"
                              "[Other]\n"
                              "x=\xe9\xe9",
        74);
    QCOMPARE(original.size(), 74);
    writeBytes(env.settingsFile(), original);
    QCOMPARE(GetSetting(AppTitle(), files, u"File1"_qs), u"/aq"_qs);

    QVERIFY(SaveSetting(AppTitle(), files, u"File3"_qs, u"/c"_qs));
    QByteArray after = readBytes(env.settingsFile());
    const QByteArray inserted("File3=/c\r\n");
    const qsizetype at = after.indexOf(inserted);
    QVERIFY(at > 0);
    QCOMPARE(after.remove(at, inserted.size()), original);
    QCOMPARE(GetSetting(AppTitle(), files, u"File3"_qs), u"/c"_qs);

    QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"y"_qs, u"1"_qs));
    after = readBytes(env.settingsFile());
    QVERIFY(after.contains(
        QByteArrayLiteral("\r\n\xff\xfe garbage \x00\x01\x02\r\nFile1=/a\\q\r\n\xc3\x28 invalid=utf8\n")));
    QVERIFY(after.endsWith("[Other]\nx=\xe9\xe9\r\ny=1\r\n"));
}

void TestSettingsStore::unchangedLinesKeepTheirBytes()
{
    TestEnvironment env;
    const QByteArray original("; written by hand\n[Files]\nCount = 1\nFile1=a\\zb\n\n[Names]\nN=x");
    writeBytes(env.settingsFile(), original);
    QVERIFY(SaveSetting(AppTitle(), files, u"File1"_qs, u"azb"_qs));
    QCOMPARE(readBytes(env.settingsFile()), original);
    QVERIFY(SaveSetting(AppTitle(), u"Names"_qs, u"N"_qs, u"y"_qs));
    QCOMPARE(readBytes(env.settingsFile()),
        QByteArray("; written by hand\n[Files]\nCount = 1\nFile1=a\\zb\n\n[Names]\nN=y\n"));
}

void TestSettingsStore::settingsPathIsNotAFile_data()
{
    QTest::addColumn<bool>("folder");
    QTest::newRow("folder") << true;
#ifdef Q_OS_UNIX
    QTest::newRow("named pipe") << false;
#endif
}

// Defaults for every read, failure for every write, and nothing in the way is destroyed or blocks.
void TestSettingsStore::settingsPathIsNotAFile()
{
    QFETCH(bool, folder);
    TestEnvironment env;
    const QString inside = env.settingsFile() + u"/keep.txt"_qs;
    if (folder) {
        QVERIFY(QDir().mkpath(env.settingsFile()));
        writeBytes(inside, "precious");
    } else {
#ifdef Q_OS_UNIX
        QCOMPARE(::mkfifo(QFile::encodeName(env.settingsFile()).constData(), 0600), 0);
#endif
    }
    QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs, u"0"_qs), u"0"_qs);
    QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
    QVERIFY(!SaveSetting(AppTitle(), files, u"Count"_qs, u"1"_qs));
    QVERIFY(!DeleteSetting(AppTitle(), files, u"Count"_qs));
    QVERIFY(!DeleteSection(AppTitle(), files));
    QCOMPARE(runWriter({u"set"_qs, files, u"Count"_qs, u"1"_qs}), 1);
    const QFileInfo info(env.settingsFile());
    QVERIFY(info.exists());
    QCOMPARE(info.isDir(), folder);
    if (folder)
        QCOMPARE(readBytes(inside), QByteArray("precious"));
}

QTEST_GUILESS_MAIN(TestSettingsStore)
#include "tst_settingsstore.moc"
