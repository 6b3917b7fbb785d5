#include "store/IniDocument.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <sys/wait.h>
#include <unistd.h>

using namespace Brimvault;
using namespace Qt::StringLiterals;
using Pairs = QList<QPair<QString, QString>>;

namespace {

const QString files = u"Files"_s;

QString get(const QString& section, const QString& key)
{
    return GetSetting(AppTitle(), section, key, u"none"_s);
}

bool save(const QString& section, const QString& key, const QString& value)
{
    return SaveSetting(AppTitle(), section, key, value);
}

// Another process writing the store, as the service does: key prefix + i = value for each i; true when it
// saved them all.
bool writeFromChild(const QString& prefix, int count, const QString& value, const std::function<void()>& meanwhile)
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        for (int i = 0; i < count; ++i)
            if (!save(files, prefix + QString::number(i), value))
                ::_exit(1);
        ::_exit(0);
    }
    meanwhile();
    int status = 0;
    return ::waitpid(pid, &status, 0) == pid && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

} // namespace

class TestSettingsStore : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;

private Q_SLOTS:
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

    void calls_data()
    {
        QTest::addColumn<QString>("actual");
        QTest::addColumn<QString>("expected");
        const auto all = [](const QString& section) -> QString {
            QString text;
            for (const auto& [key, value] : GetAllSettings(AppTitle(), section))
                text += key + u'=' + value + u';';
            return text;
        };
        // Read in other letters, written over in them, then a key not there.
        const auto inAnyCase
            = [&all](const QString& section, const QString& key, const QString& s, const QString& k) -> QString {
            TestEnvironment env;
            save(section, key, u"1"_s);
            const QString first = get(s, k);
            save(s, k, u"2"_s);
            return first + u'|' + all(section) + u'|' + get(section, key + u'x');
        };
        // Values read back from the bytes on disk by the file's own rules, beside a later section.
        const auto onDisk = [](const QString& section, const QString& key, const QString& value) -> QString {
            TestEnvironment env;
            save(section, key, value);
            save(u"Other"_s, u"After"_s, u"2"_s);
            const IniDocument doc = IniDocument::parse(ReadFile(env.settingsFile()));
            return doc.value(section, key).value_or(u"missing"_s) + u'|'
                + doc.value(u"Other"_s, u"After"_s).value_or(QString()) + u'|'
                + QString::number(doc.sectionPairs(section).size());
        };
        const auto countIn = [](const QByteArray& bytes) -> QString {
            TestEnvironment env;
            WriteFile(env.settingsFile(), bytes);
            return get(files, u"count"_s);
        };
        // Defaults for every read, failure for every write, and nothing in the way is destroyed.
        const auto notAFile = [&all](bool folder) -> QString {
            TestEnvironment env;
            const QString path = env.settingsFile();
            folder ? WriteFile(path + u"/keep.txt"_s, "precious") : MakeNamedPipe(path);
            return get(files, u"Count"_s) + all(files) + QString::number(save(files, u"Count"_s, u"1"_s))
                + QString::number(DeleteSetting(AppTitle(), files, u"Count"_s))
                + QString::number(DeleteSection(AppTitle(), files)) + QString::number(QFileInfo(path).isDir())
                + QString::fromUtf8(ReadFile(path + u"/keep.txt"_s));
        };
        QTest::newRow("ASCII in any case")
            << inAnyCase(u"Commands"_s, u"NewGame"_s, u"COMMANDS"_s, u"newgame"_s) << u"1|NewGame=2;|none"_s;
        QTest::newRow("non-ASCII in any case")
            << inAnyCase(u"Ёлка"_s, u"Ключ"_s, u"ёЛКА"_s, u"КЛЮЧ"_s) << u"1|Ключ=2;|none"_s;
        const QString mixed = u"a\r\nb\rc\nd C:\\new\\r\\n\\"_s;
        QTest::newRow("line ends, escape look-alikes") << onDisk(files, u"F1"_s, mixed) << mixed + u"|2|1"_s;
        QTest::newRow("blanks, syntax") << onDisk(files, u"F2"_s, u"  [x]=;# "_s) << u"  [x]=;# |2|1"_s;
        QTest::newRow("empty value") << onDisk(files, u"F3"_s, QString()) << u"|2|1"_s;
        const QString nul = u"a"_s + QChar(0) + u"b"_s;
        QTest::newRow("NUL") << onDisk(files, u"F4"_s, nul) << nul + u"|2|1"_s;
        QTest::newRow("comment-like key with equals") << onDisk(files, u";a=b"_s, u"v"_s) << u"v|2|1"_s;
        QTest::newRow("section-like key") << onDisk(files, u"[key"_s, u"v]"_s) << u"v]|2|1"_s;
        QTest::newRow("bracket section") << onDisk(u"a]b["_s, u"k"_s, u"v"_s) << u"v|2|1"_s;
        QTest::newRow("byte order mark") << countIn("\xEF\xBB\xBF[Files]\nCount=3\n") << u"3"_s;
        QTest::newRow("blanks around header") << countIn("[Other]\nCount=1\n  [Files] \nCount=3") << u"3"_s;
        QTest::newRow("first of a split section") << countIn("[Files]\nCount=3\n[FILES]\nCount=4") << u"3"_s;
        QTest::newRow("entry before any section") << countIn("Count=1\n[Files]\n") << u"none"_s;
        QTest::newRow("invalid UTF-8 entry") << countIn("[Files]\nCount=\xe9\n") << u"none"_s;
        QTest::newRow("folder in the way") << notAFile(true) << u"none0001precious"_s;
        QTest::newRow("named pipe in the way") << notAFile(false) << u"none0000"_s;
    }
    void calls()
    {
        QFETCH(QString, actual);
        QTEST(actual, "expected");
    }

    // A section written in two places (by hand) reads, changes and goes as one, in the file's order.
    void splitSectionAndDeletion()
    {
        QVERIFY(WriteFile(m_env->settingsFile(), "[Files]\nFile1=/a\nCount=1\n[Other]\nx=1\n[files]\nFile2=/b\n"));
        QVERIFY(save(files, u"file2"_s, u"/c"_s) && save(files, u"FILE1"_s, u"/A"_s) && save(files, u"F3"_s, u"/d"_s));
        QCOMPARE(GetAllSettings(AppTitle(), files),
            Pairs({{u"File1"_s, u"/A"_s}, {u"Count"_s, u"1"_s}, {u"F3"_s, u"/d"_s}, {u"File2"_s, u"/c"_s}}));
        QVERIFY(DeleteSetting(AppTitle(), u"FILES"_s, u"file1"_s) && !DeleteSetting(AppTitle(), files, u"File1"_s));
        QVERIFY(!DeleteSetting(AppTitle(), u"Missing"_s, u"File2"_s));
        QCOMPARE(get(files, u"File1"_s) + get(files, u"File2"_s), u"none/c"_s);
        QVERIFY(DeleteSection(AppTitle(), u"files"_s) && !DeleteSection(AppTitle(), files));
        QVERIFY(GetAllSettings(AppTitle(), files).isEmpty() && get(u"Other"_s, u"x"_s) == u"1");
    }

    // Same-size changes right after a read, as the service flips a flag and the timer resets it.
    void otherProcessesWriteTheSameFile()
    {
        for (int round = 1; round <= 3; ++round) {
            QVERIFY(save(files, u"Flag0"_s, u"0"_s));
            QCOMPARE(get(files, u"Flag0"_s), u"0"_s);
            QVERIFY(writeFromChild(u"Flag"_s, 1, QString::number(round), [] {}));
            QCOMPARE(get(files, u"Flag0"_s), QString::number(round));
        }
        const auto writeOwn = [] {
            for (int i = 0; i < 50; ++i)
                QVERIFY(save(files, u"C"_s + QString::number(i), u"c"_s));
        };
        QVERIFY(writeFromChild(u"A"_s, 50, u"a"_s, [&] { QVERIFY(writeFromChild(u"B"_s, 50, u"b"_s, writeOwn)); }));
        QCOMPARE(GetAllSettings(AppTitle(), files).size(), 151);
        QCOMPARE(get(files, u"A49"_s) + get(files, u"B0"_s) + get(files, u"C49"_s), u"abc"_s);
    }

    void damagedFileKeepsItsBytes()
    {
        const QByteArray original = QByteArrayLiteral(
            "[Files]\r\nCount=2\r\n\xff\xfe garbage \x00\x01\r\nFile1=/a\\q\r\n\xc3\x28 invalid=utf8\n[Other]\nx=\xe9");
        QVERIFY(WriteFile(m_env->settingsFile(), original));
        QCOMPARE(get(files, u"File1"_s), u"/aq"_s);
        QVERIFY(save(files, u"File1"_s, u"/aq"_s));
        QCOMPARE(ReadFile(m_env->settingsFile()), original);
        QVERIFY(save(files, u"File3"_s, u"/c"_s) && save(u"Other"_s, u"y"_s, u"1"_s));
        QCOMPARE(ReadFile(m_env->settingsFile()),
            QByteArrayLiteral(
                "[Files]\r\nCount=2\r\n\xff\xfe garbage \x00\x01\r\nFile1=/a\\q\r\n\xc3\x28 invalid=utf8\n"
                "File3=/c\r\n[Other]\nx=\xe9\r\ny=1\r\n"));
    }
};

BV_REGISTER_TEST(TestSettingsStore);
#include "tst_settingsstore.moc"
