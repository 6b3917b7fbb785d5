#include "PeFixtures.h"
#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "app/clsFileVersion.h"
#include "icons/IconCommands.h"
#include "icons/VersionResource.h"

#include <QProcess>
#include <QTextStream>
#include <QtEndian>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QByteArray text(const QString& value)
{
    return QByteArray(reinterpret_cast<const char*>(value.utf16()), value.size() * 2).append(2, '\0');
}

QByteArray padded(QByteArray bytes)
{
    return bytes.append((4 - bytes.size() % 4) % 4, '\0');
}

// A VS_VERSIONINFO node: length, value length, type, key, padding, value, padding, children.
QByteArray node(
    const QString& key, const QByteArray& value, quint16 type, quint16 valueLength, const QByteArray& children = {})
{
    QByteArray out = padded(padded(QByteArray(6, '\0') + text(key)) + value) + children;
    qToLittleEndian<quint16>(quint16(out.size()), out.data());
    qToLittleEndian<quint16>(valueLength, out.data() + 2);
    qToLittleEndian<quint16>(type, out.data() + 4);
    return out;
}

// A version block whose string table `table` holds CompanyName = value (value length as given), translated
// 0419/04E3.
QByteArray versionBlock(const QString& table, const QByteArray& value, quint16 valueLength)
{
    const QByteArray translation = node(u"Translation"_s, QByteArray("\x19\x04\xe3\x04", 4), 0, 4);
    const QByteArray strings
        = node(u"StringFileInfo"_s, {}, 1, 0, node(table, {}, 1, 0, node(u"CompanyName"_s, value, 1, valueLength)));
    return node(
        u"VS_VERSION_INFO"_s, QByteArray(52, '\0'), 0, 52, strings + node(u"VarFileInfo"_s, {}, 1, 0, translation));
}

} // namespace

class TestFileVersion : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

private Q_SLOTS:
    // Each field has its own place in the line; a file without version information empties them all.
    void getAllHasItsOwnOrder()
    {
        clsFileVersion version;
        QVERIFY(version.ReadVersion(PeFixture(u"multi32.exe"_s)));
        QCOMPARE(version.FullFileName(), PeFixture(u"multi32.exe"_s));
        QCOMPARE(version.GetAll(),
            u"Marble Cascade Deluxe; 1.2; marble; Marble Cascade; 1.2.3.4; Fixture Works; (c) Fixture Works; marble.exe"_s);
        QVERIFY(!version.ReadVersion(PeFixture(u"twogroups64.exe"_s)));
        QCOMPARE(version.GetAll(), u"; ; ; ; ; ; ; "_s);
    }

    void blockQueries_data()
    {
        QTest::addColumn<QByteArray>("block");
        QTest::addColumn<QString>("company");
        const QByteArray acme = text(u"Acme"_s);
        QTest::newRow("plain") << versionBlock(u"041904E3"_s, acme, 5) << "Acme";
        QTest::newRow("keys in other case") << versionBlock(u"041904e3"_s, acme, 5) << "Acme";
        QTest::newRow("length in bytes") << versionBlock(u"041904E3"_s, acme, 10) << "Acme";
        QTest::newRow("text with a NUL inside")
            << versionBlock(u"041904E3"_s, text(u"Ac"_s) + text(u"me"_s), 6) << "Ac";
        QTest::newRow("table under another name") << versionBlock(u"040904B0"_s, acme, 5) << "";
    }

    void blockQueries()
    {
        QFETCH(QByteArray, block);
        QFETCH(QString, company);
        const auto strings = ReadVersionStrings(VersionResource(block));
        QVERIFY(strings);
        QCOMPARE(strings->translation, u"041904E3"_s);
        QCOMPARE(strings->values.at(0), company);
    }

    void brokenBlocksReadNothing_data()
    {
        QTest::addColumn<QByteArray>("block");
        const QByteArray vars
            = node(u"VarFileInfo"_s, {}, 1, 0, node(u"Translation"_s, QByteArray("\x09\x04", 2), 0, 2));
        QByteArray tooLong = node(u"VS_VERSION_INFO"_s, {}, 0, 0, vars);
        tooLong.replace(0, 2, "\xff\xff");
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("short translation") << node(u"VS_VERSION_INFO"_s, QByteArray(52, '\0'), 0, 52, vars);
        QTest::newRow("children of length 0") << node(u"VS_VERSION_INFO"_s, {}, 0, 0, QByteArray(64, '\0'));
        QTest::newRow("length past the end") << tooLong;
    }

    void brokenBlocksReadNothing()
    {
        QFETCH(QByteArray, block);
        QVERIFY(!ReadVersionStrings(VersionResource(block)));
    }

    // Both commands through the real program: standard output, the icon file, and a one-line reason.
    void theProgramRunsBothCommands()
    {
        QProcess process;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert(u"XDG_RUNTIME_DIR"_s, m_env.root()); // else Qt's start-up note shares standard error
        process.setProcessEnvironment(environment);
        const auto run = [&process](const QStringList& arguments) {
            process.start(ProgramPath(), arguments);
            return process.waitForFinished(60000) ? process.exitCode() : -1;
        };
        const auto error = [&process] { return QString::fromUtf8(process.readAllStandardError()); };
        QCOMPARE(run({u"--version-info"_s, PeFixture(u"ver_ru32.exe"_s)}), 0);
        QVERIFY(process.readAllStandardOutput().startsWith(
            u"Translation=041904E3\nCompanyName=Студия Пример\nFileDescription=Весёлые шарики\n"_s.toUtf8()));
        QCOMPARE(run({u"--version-info"_s, PeFixture(u"nores64.exe"_s)}), 1);
        QCOMPARE(error(), PeFixture(u"nores64.exe"_s) + u": no version information could be read\n"_s);
        const QString ico = m_env.path(u"program.ico"_s);
        QCOMPARE(run({u"--extract-icon"_s, PeFixture(u"multi64.exe"_s), ico}), 0);
        QCOMPARE(ReadFile(ico), ReadFile(IconInput(u"main.ico"_s)));
        QCOMPARE(run({u"--extract-icon"_s, PeFixture(u"nores64.exe"_s), ico}), 1);
        QCOMPARE(error(), PeFixture(u"nores64.exe"_s) + u": the file has no resources\n"_s);
        QCOMPARE(run({u"--extract-icon"_s, PeFixture(u"multi64.exe"_s), m_env.path(u"no/folder/out.ico"_s)}), 1);
        QCOMPARE(error(), m_env.path(u"no/folder/out.ico"_s) + u": Couldn't open file for writing.\n"_s);
    }
};

BV_REGISTER_TEST(TestFileVersion);
#include "tst_clsfileversion.moc"
