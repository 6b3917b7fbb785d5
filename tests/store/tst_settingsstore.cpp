#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QtTest>

#include <sys/wait.h>
#include <unistd.h>

using namespace Brimvault;

namespace {

const QString files = QStringLiteral("Files");

// Another process writing the store, as the service does: key prefix + i = value for each i.
pid_t startWriter(const QString& prefix, int count, const QString& value)
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        for (int i = 0; i < count; ++i) {
            if (!SaveSetting(AppTitle(), files, prefix + QString::number(i), value))
                ::_exit(1);
        }
        ::_exit(0);
    }
    return pid;
}

int writerExit(pid_t pid)
{
    int status = 0;
    return ::waitpid(pid, &status, 0) == pid && WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

} // namespace

class TestSettingsStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void caseRules_data()
    {
        QTest::addColumn<QString>("writeSection");
        QTest::addColumn<QString>("writeKey");
        QTest::addColumn<QString>("readSection");
        QTest::addColumn<QString>("readKey");
        QTest::newRow("lower") << u"Commands"_qs << u"NewGameInstalled"_qs << u"commands"_qs << u"newgameinstalled"_qs;
        QTest::newRow("upper") << u"files"_qs << u"count"_qs << u"FILES"_qs << u"COUNT"_qs;
        QTest::newRow("non-ASCII") << u"Ёлка"_qs << u"Ключ"_qs << u"ёЛКА"_qs << u"КЛЮЧ"_qs;
    }
    void caseRules()
    {
        QFETCH(QString, writeSection);
        QFETCH(QString, writeKey);
        QFETCH(QString, readSection);
        QFETCH(QString, readKey);
        TestEnvironment env;
        QVERIFY(SaveSetting(AppTitle(), writeSection, writeKey, u"1"_qs));
        QCOMPARE(GetSetting(AppTitle(), readSection, readKey, u"none"_qs), u"1"_qs);
        QVERIFY(SaveSetting(AppTitle(), readSection, readKey, u"2"_qs));
        const QList<QPair<QString, QString>> one {{writeKey, u"2"_qs}};
        QCOMPARE(GetAllSettings(AppTitle(), writeSection), one);
        QCOMPARE(GetSetting(AppTitle(), writeSection, writeKey + u'x', u"none"_qs), u"none"_qs);
        QCOMPARE(GetSetting(AppTitle(), writeSection + u'x', writeKey, u"none"_qs), u"none"_qs);
    }

    // Values read back from the bytes on disk, not only from what the process remembers.
    void roundTripThroughFile_data()
    {
        QTest::addColumn<QString>("section");
        QTest::addColumn<QString>("key");
        QTest::addColumn<QString>("value");
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
    void roundTripThroughFile()
    {
        QFETCH(QString, section);
        QFETCH(QString, key);
        QFETCH(QString, value);
        TestEnvironment env;
        QVERIFY(SaveSetting(AppTitle(), section, key, value));
        QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"After"_qs, u"2"_qs));
        const IniDocument doc = IniDocument::parse(ReadFile(env.settingsFile()));
        QCOMPARE(doc.value(section, key), std::optional<QString>(value));
        QCOMPARE(doc.value(u"Other"_qs, u"After"_qs), std::optional<QString>(u"2"_qs));
        QCOMPARE(doc.sectionPairs(section).size(), 1);
    }

    void deletion()
    {
        TestEnvironment env;
        QVERIFY(SaveSetting(AppTitle(), files, u"File1"_qs, u"/a"_qs));
        QVERIFY(SaveSetting(AppTitle(), files, u"File2"_qs, u"/b"_qs));
        QVERIFY(SaveSetting(AppTitle(), u"FilesNames"_qs, u"FileName1"_qs, u"A"_qs));
        QVERIFY(DeleteSetting(AppTitle(), u"FILES"_qs, u"file1"_qs));
        QVERIFY(!DeleteSetting(AppTitle(), files, u"File1"_qs));
        QVERIFY(!DeleteSetting(AppTitle(), u"Missing"_qs, u"File2"_qs));
        QCOMPARE(GetSetting(AppTitle(), files, u"File1"_qs, u"gone"_qs), u"gone"_qs);
        QCOMPARE(GetSetting(AppTitle(), files, u"File2"_qs), u"/b"_qs);
        QVERIFY(DeleteSection(AppTitle(), u"files"_qs));
        QVERIFY(!DeleteSection(AppTitle(), files));
        QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
        QCOMPARE(GetSetting(AppTitle(), u"FilesNames"_qs, u"FileName1"_qs), u"A"_qs);
        QVERIFY(SaveSetting(AppTitle(), files, u"File9"_qs, u"/z"_qs));
        QCOMPARE(GetAllSettings(AppTitle(), files).size(), 1);
    }

    // A section written in two places (by hand) reads, changes and goes as one, in the file's order.
    void splitSectionReadsAsOne()
    {
        TestEnvironment env;
        QVERIFY(WriteFile(env.settingsFile(), "[Files]\nFile1=/a\nCount=1\n[Other]\nx=1\n[files]\nFile2=/b\n"));
        QVERIFY(SaveSetting(AppTitle(), files, u"file2"_qs, u"/c"_qs));
        QVERIFY(SaveSetting(AppTitle(), files, u"FILE1"_qs, u"/A"_qs));
        QVERIFY(SaveSetting(AppTitle(), files, u"File3"_qs, u"/d"_qs));
        const QList<QPair<QString, QString>> expected {
            {u"File1"_qs, u"/A"_qs}, {u"Count"_qs, u"1"_qs}, {u"File3"_qs, u"/d"_qs}, {u"File2"_qs, u"/c"_qs}};
        QCOMPARE(GetAllSettings(AppTitle(), files), expected);
        QVERIFY(DeleteSection(AppTitle(), files));
        QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
        QCOMPARE(GetSetting(AppTitle(), u"Other"_qs, u"x"_qs), u"1"_qs);
    }

    void handEditedFile_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("value");
        QTest::newRow("CR LF") << QByteArray("[Files]\r\nCount=3\r\n") << u"3"_qs;
        QTest::newRow("byte order mark") << QByteArray("\xEF\xBB\xBF[Files]\nCount=3\n") << u"3"_qs;
        QTest::newRow("blanks around header") << QByteArray("[Other]\nCount=1\n  [Files] \nCount=3") << u"3"_qs;
        QTest::newRow("comment") << QByteArray("[Files]\n;Count=1\nCount=3") << u"3"_qs;
        QTest::newRow("garbage before") << QByteArrayLiteral("\xff\xfe\x00\n[Files]\nCount=3") << u"3"_qs;
        QTest::newRow("first of a split section") << QByteArray("[Files]\nCount=3\n[FILES]\nCount=4") << u"3"_qs;
        QTest::newRow("entry before any section") << QByteArray("Count=1\n[Files]\n") << u"none"_qs;
        QTest::newRow("invalid UTF-8 entry") << QByteArray("[Files]\nCount=\xe9\n") << u"none"_qs;
    }
    void handEditedFile()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QString, value);
        TestEnvironment env;
        QVERIFY(WriteFile(env.settingsFile(), bytes));
        QCOMPARE(GetSetting(AppTitle(), files, u"count"_qs, u"none"_qs), value);
    }

    void secondProcessWriteIsSeenAtOnce()
    {
        TestEnvironment env;
        // Same-size changes right after a read, as the service flips a flag and the timer resets it.
        for (int round = 0; round < 6; ++round) {
            QVERIFY(SaveSetting(AppTitle(), files, u"Flag0"_qs, u"0"_qs));
            QCOMPARE(GetSetting(AppTitle(), files, u"Flag0"_qs), u"0"_qs);
            QCOMPARE(writerExit(startWriter(u"Flag"_qs, 1, QString::number(round + 1))), 0);
            QCOMPARE(GetSetting(AppTitle(), files, u"Flag0"_qs), QString::number(round + 1));
        }
    }

    void concurrentWritersLoseNothing()
    {
        TestEnvironment env;
        const pid_t first = startWriter(u"A"_qs, 50, u"a"_qs);
        const pid_t second = startWriter(u"B"_qs, 50, u"b"_qs);
        for (int i = 0; i < 50; ++i)
            QVERIFY(SaveSetting(AppTitle(), files, u"C"_qs + QString::number(i), u"c"_qs));
        QCOMPARE(writerExit(first), 0);
        QCOMPARE(writerExit(second), 0);
        QCOMPARE(GetAllSettings(AppTitle(), files).size(), 150);
        QCOMPARE(GetSetting(AppTitle(), files, u"A49"_qs), u"a"_qs);
        QCOMPARE(GetSetting(AppTitle(), files, u"B0"_qs), u"b"_qs);
    }

    void damagedFileKeepsItsBytes()
    {
        TestEnvironment env;
        const QByteArray original
            = QByteArrayLiteral("[Files]\r\nCount=2\r\n\xff\xfe garbage \x00\x01\r\nFile1=/a\\q\r\n\xc3\x28 "
                                "invalid=utf8\n[Other]\nx=\xe9\xe9");
        QVERIFY(WriteFile(env.settingsFile(), original));
        QCOMPARE(GetSetting(AppTitle(), files, u"File1"_qs), u"/aq"_qs);
        QVERIFY(SaveSetting(AppTitle(), files, u"File1"_qs, u"/aq"_qs));
        QCOMPARE(ReadFile(env.settingsFile()), original);
        QVERIFY(SaveSetting(AppTitle(), files, u"File3"_qs, u"/c"_qs));
        QVERIFY(SaveSetting(AppTitle(), u"Other"_qs, u"y"_qs, u"1"_qs));
        QCOMPARE(ReadFile(env.settingsFile()),
            QByteArrayLiteral(
                "[Files]\r\nCount=2\r\n\xff\xfe garbage \x00\x01\r\nFile1=/a\\q\r\n\xc3\x28 invalid=utf8\n"
                "File3=/c\r\n[Other]\nx=\xe9\xe9\r\ny=1\r\n"));
    }

    // Defaults for every read, failure for every write, and nothing in the way is destroyed or blocks.
    void settingsPathIsNotAFile_data()
    {
        QTest::addColumn<bool>("folder");
        QTest::newRow("folder") << true;
        QTest::newRow("named pipe") << false;
    }
    void settingsPathIsNotAFile()
    {
        QFETCH(bool, folder);
        TestEnvironment env;
        const QString inside = env.settingsFile() + u"/keep.txt"_qs;
        QVERIFY(folder ? WriteFile(inside, "precious") : MakeNamedPipe(env.settingsFile()));
        QCOMPARE(GetSetting(AppTitle(), files, u"Count"_qs, u"0"_qs), u"0"_qs);
        QVERIFY(GetAllSettings(AppTitle(), files).isEmpty());
        QVERIFY(!SaveSetting(AppTitle(), files, u"Count"_qs, u"1"_qs));
        QVERIFY(!DeleteSetting(AppTitle(), files, u"Count"_qs));
        QVERIFY(!DeleteSection(AppTitle(), files));
        QCOMPARE(QFileInfo(env.settingsFile()).isDir(), folder);
        QVERIFY(QFileInfo::exists(env.settingsFile()));
        if (folder)
            QCOMPARE(ReadFile(inside), QByteArray("precious"));
    }
};

BV_REGISTER_TEST(TestSettingsStore);
#include "tst_settingsstore.moc"
