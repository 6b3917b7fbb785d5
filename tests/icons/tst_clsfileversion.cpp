#include "PeFixtures.h"
#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestSuite.h"
#include "app/clsFileVersion.h"
#include "icons/VersionResource.h"

#include <QProcess>

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
    const QByteArray out = padded(padded(LittleEndian(quint16(0), valueLength, type) + text(key)) + value) + children;
    return Patched<quint16>(out, 0, quint16(out.size()));
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

    // "company" is what the string table gives for CompanyName, "-" when no strings are read.
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
        const QByteArray vars
            = node(u"VarFileInfo"_s, {}, 1, 0, node(u"Translation"_s, QByteArray("\x09\x04", 2), 0, 2));
        QTest::newRow("empty") << QByteArray() << "-";
        QTest::newRow("short translation") << node(u"VS_VERSION_INFO"_s, QByteArray(52, '\0'), 0, 52, vars) << "-";
        QTest::newRow("children of length 0") << node(u"VS_VERSION_INFO"_s, {}, 0, 0, QByteArray(64, '\0')) << "-";
        QTest::newRow("length past the end")
            << Patched<quint16>(node(u"VS_VERSION_INFO"_s, {}, 0, 0, vars), 0, 0xFFFF) << "-";
    }

    void blockQueries()
    {
        QFETCH(QByteArray, block);
        QFETCH(QString, company);
        const auto strings = ReadVersionStrings(VersionResource(block));
        QCOMPARE(strings ? strings->values.at(0) : u"-"_s, company);
        QCOMPARE(strings ? strings->translation : u"-"_s, company == u"-" ? u"-"_s : u"041904E3"_s);
    }

    // Both commands through the real program: what they print, and a one-line reason on standard error.
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
        QCOMPARE(run({u"--version-info"_s, PeFixture(u"ver_ru32.exe"_s)}), 0);
        QCOMPARE(QString::fromUtf8(process.readAllStandardOutput()),
            u"Translation=041904E3\nCompanyName=Студия Пример\nFileDescription=Весёлые шарики\nFileVersion=2.0.0.1\n"
            "InternalName=\nLegalCopyright=\nOriginalFileName=\nProductName=Шарики\nProductVersion=\n"_s);
        QCOMPARE(run({u"--version-info"_s, PeFixture(u"nores64.exe"_s)}), 1);
        QCOMPARE(process.readAllStandardError(),
            (PeFixture(u"nores64.exe"_s) + u": no version information could be read\n"_s).toUtf8());
        QCOMPARE(run({u"--extract-icon"_s, PeFixture(u"multi64.exe"_s), m_env.path(u"no/folder/out.ico"_s)}), 1);
        QCOMPARE(process.readAllStandardError(),
            (m_env.path(u"no/folder/out.ico"_s) + u": Couldn't open file for writing.\n"_s).toUtf8());
    }
};

BV_REGISTER_TEST(TestFileVersion);
#include "tst_clsfileversion.moc"
