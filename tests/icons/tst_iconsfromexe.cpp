#include "PeFixtures.h"
#include "ProgramRun.h"
#include "RealPeFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "app/clsFileVersion.h"
#include "icons/IconCommands.h"
#include "icons/NumberedError.h"
#include "icons/PeModule.h"
#include "icons/VersionResource.h"
#include "icons/cFileIcon.h"
#include "icons/cResources.h"

#include <QJsonArray>
#include <QProcess>
#include <QRegularExpression>
#include <QTextStream>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QString keyText(const ResourceKey& key)
{
    return key.named ? key.name : QString::number(key.id);
}

constexpr quint32 Sub = 0x80000000u;

QByteArray put(const QByteArray& bytes, qint64 at, quint32 value)
{
    return Patched<quint32>(bytes.leftJustified(qMax(bytes.size(), at + 4), '\0'), at, value);
}

// The bytes with a resource directory at `at`: named and id counts, then (name or id, target) pairs.
QByteArray putDirectory(QByteArray rsrc, qint64 at, quint16 named, quint16 ids, const QList<quint32>& pairs)
{
    rsrc = put(rsrc, at + 12, named | quint32(ids) << 16);
    for (qsizetype i = 0; i < pairs.size(); ++i)
        rsrc = put(rsrc, at + 16 + 4 * i, pairs.at(i));
    return rsrc;
}

// A 32-bit image: a 4 KiB section at 0x1000 with nothing in the file, then one at 0x2000 whose first `rawSize`
// bytes of `rsrc` lie at file offset 0x200.
QByteArray peWith(const QByteArray& rsrc, qint64 rawSize = -1)
{
    rawSize = rawSize < 0 ? rsrc.size() : rawSize;
    QByteArray pe("MZ");
    // PE header at 0x40; i386, two sections; optional header of 224 bytes; headers' size; 16 directories,
    // the resource one; the section table at 0x138.
    for (const auto& [at, value] :
        QList<std::pair<qint64, quint32>> {{0x3C, 0x40}, {0x40, 0x4550}, {0x44, 0x2014C}, {0x54, 224}, {0x58, 0x10B},
            {0x94, 0x200}, {0xB4, 16}, {0xC8, 0x2000}, {0xCC, quint32(rsrc.size())}, {0x140, 0x1000}, {0x144, 0x1000},
            {0x168, quint32(qMax(rsrc.size(), rawSize))}, {0x16C, 0x2000}, {0x170, quint32(rawSize)}, {0x174, 0x200}})
        pe = put(pe, at, value);
    return pe.leftJustified(0x200, '\0') + rsrc.left(rawSize);
}

// Types 3 and 14: a one-image group 1 (1 × 1, 1-bit, 48 bytes) and its image 1, which lies `padding` further on.
QByteArray validIconTree(quint32 padding = 0)
{
    QByteArray rsrc = putDirectory({}, 0, 0, 2, {3, Sub | 0x30, 14, Sub | 0x60});
    rsrc = putDirectory(rsrc, 0x30, 0, 1, {1, Sub | 0x48});
    rsrc = putDirectory(rsrc, 0x48, 0, 1, {0x409, 0xC0});
    rsrc = putDirectory(rsrc, 0x60, 0, 1, {1, Sub | 0x78});
    rsrc = putDirectory(rsrc, 0x78, 0, 1, {0x409, 0xD0});
    for (const auto& [at, value] :
        QList<std::pair<qint64, quint32>> {{0xC0, 0x2100 + padding}, {0xC4, 48}, {0xD0, 0x20E0}, {0xD4, 20}})
        rsrc = put(rsrc, at, value);
    rsrc = rsrc.leftJustified(0xE0, '\0') + QByteArray::fromHex("0000 0100 0100 01010200 0100 0100 30000000 0100");
    return rsrc.leftJustified(0x100 + padding, '\0') + QByteArray::fromHex("28000000 01000000 02000000 0100 0100")
        + QByteArray(32, '\0');
}

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

class TestIconsFromExe : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    cFileIcon craftedMainIcon(const QByteArray& pe)
    {
        const QString path = m_env.path(u"crafted.exe"_s);
        cFileIcon icon;
        if (WriteFile(path, pe))
            icon.LoadMainIconFromEXE(path);
        return icon;
    }

private Q_SLOTS:
    void initTestCase()
    {
        PeFixture(u"multi64.exe"_s); // fails the run, naming what to install, when not built
        REQUIRE_TOOL("wrestool", "icoutils");
    }

    void mainIcon_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QVariant>("resourceId");
        QTest::addColumn<QString>("reason"); // why --extract-icon finds none
        // Groups 1 to 3 lack an image, disagree on a size, or use an id above 32767.
        QTest::newRow("first three groups broken") << PeFixture(u"broken64.exe"_s) << QVariant(4) << "";
        QTest::newRow("only group broken")
            << PeFixture(u"badsize64.exe"_s) << QVariant() << "none of the file's 1 icon groups loads completely";
        QTest::newRow("no group") << PeFixture(u"ver_ru32.exe"_s) << QVariant() << "the file has no icon";
        QTest::newRow("no resources") << PeFixture(u"nores64.exe"_s) << QVariant() << "the file has no resources";
        QTest::newRow("missing file") << m_env.path(u"none.exe"_s) << QVariant()
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable")
            << IconInput(u"main.ico"_s) << QVariant() << "the file is not a valid Win32 application.";
    }

    // The main icon, and the --extract-icon command that saves it, against wrestool's extraction.
    void mainIcon()
    {
        QFETCH(QString, file);
        QFETCH(QVariant, resourceId);
        QFETCH(QString, reason);
        cFileIcon icon;
        icon.AddImage(16, 16, 2); // a previous icon is always replaced
        QCOMPARE(icon.LoadMainIconFromEXE(file), resourceId.isValid());
        QCOMPARE(icon.Filename(), file);
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.ImageCount(), resourceId.isValid() ? 1 : 0); // both groups hold one image

        const QString out = m_env.path(u"main.ico"_s);
        QFile::remove(out);
        QString err;
        QTextStream errStream(&err);
        QCOMPARE(IconCommands::ExtractIcon(file, out, errStream), reason.isEmpty() ? 0 : 1);
        QCOMPARE(err, reason.isEmpty() ? QString() : file + u": "_s + reason + u'\n');
        if (resourceId.isValid())
            QCOMPARE(ReadFile(out), WrestoolGroup(file, resourceId.toString()).value_or("wrestool failed"));
        else
            QVERIFY(!QFile::exists(out));
    }

    // An id the file lacks gives way to the name, which matches without regard to case.
    void groupByName()
    {
        const QString file = PeFixture(u"twogroups32.exe"_s);
        cFileIcon icon;
        QVERIFY(icon.LoadIconFromEXE(file, 99, u"appicon"_s));
        QCOMPARE(icon.toIconFile(), WrestoolGroup(file, u"APPICON"_s).value_or("wrestool failed"));
    }

    // Group icons are type 14; the types either side of it have no name.
    void typeNames()
    {
        for (const auto& [id, name] : QList<std::pair<int, QString>> {
                 {13, u"Other (13)"_s}, {14, u"Group Icon"_s}, {15, u"Other (15)"_s}, {16, u"Version"_s}})
            QCOMPARE(cResources::ResourceTypeName(id), name);
    }

    // Fixtures and executables no one here built (whatever packages on this machine installed), read by pefile
    // and wrestool: the resource directory leaf by leaf, the lists and the main icon.
    void agreesWithPefile_data()
    {
        QTest::addColumn<QString>("file");
        for (const char* name : {"multi32.exe", "multi64.exe", "twogroups64.exe", "ver_ru32.exe", "ver_nodesc64.exe"})
            QTest::newRow(name) << PeFixture(QString::fromLatin1(name));
        const QStringList real = RealPeFiles({}, 120);
        REQUIRE_FIXTURE(!real.isEmpty(), "Windows executables: install mingw-w64");
        for (const QString& file : real)
            QTest::newRow(qPrintable(file)) << file;
    }

    void agreesWithPefile()
    {
        QFETCH(QString, file);
        const auto reference = PefileReading(file);
        QVERIFY(reference && !reference->contains(u"error"_s));
        // Leaf by leaf as "type/name/language/size/offset", and each type with its names as cResources lists them.
        QStringList leaves, wantedLists;
        for (const QJsonValue& value : reference->value(u"resources"_s).toArray()) {
            const QStringList leaf = value.toVariant().toStringList();
            leaves.append(leaf.join(u'/'));
            if (wantedLists.isEmpty() || !wantedLists.last().startsWith(leaf[0] + u':'))
                wantedLists.append(leaf[0] + u':');
            if (!wantedLists.last().endsWith(u' ' + leaf[1]))
                wantedLists.last() += u' ' + leaf[1];
        }
        const auto module = PeModule::fromBytes(ReadFile(file)).module;
        QVERIFY(module);
        QStringList ours;
        for (const ResourceLeaf& leaf : module->allResources())
            ours.append(QStringList {keyText(leaf.type), keyText(leaf.name), QString::number(leaf.language),
                QString::number(leaf.size), QString::number(leaf.fileOffset)}
                            .join(u'/'));
        QCOMPARE(ours, leaves);

        cResources resources;
        resources.setFile(file);
        if (reference->value(u"resources"_s).isNull())
            QVERIFY_THROWS_EXCEPTION(NumberedError, resources.GetResourceTypes()); // no resource section
        else
            QCOMPARE(resources.GetResourceTypes(), wantedLists.size());
        QStringList lists;
        for (int t = 1; t <= resources.ResourceTypeCount(); ++t) {
            lists.append(resources.ResourceType(t).toString() + u':');
            resources.GetResourceNames(t); // filled again below, not added to
            for (int n = 1, names = resources.GetResourceNames(t); n <= names; ++n)
                lists.last() += u' ' + resources.ResourceName(t, n).toString();
        }
        QCOMPARE(lists, wantedLists);
        const QString groups = wantedLists.filter(QRegularExpression(u"^14:"_s)).value(0);
        QCOMPARE(resources.IndexOfResourceType(14), wantedLists.indexOf(groups) + 1);
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceType(lists.size() + 1));

        // The main icon: the first group, as wrestool extracts it.
        const QString group = groups.section(u' ', 1, 1);
        cFileIcon icon;
        QCOMPARE(icon.LoadMainIconFromEXE(file), !group.isEmpty());
        if (!group.isEmpty()) {
            QCOMPARE(icon.ResourceID().toString(), group);
            QCOMPARE(icon.toIconFile(), WrestoolGroup(file, group).value_or("wrestool failed"));
        }
    }

    // Its resources start where the section before ends.
    void validTreeLoads() { QCOMPARE(craftedMainIcon(peWith(validIconTree())).ImageSize(1), 48); }

    // "types" is how many resource types are listed, or -1 when the file is refused.
    void malformedFilesEndCleanly_data()
    {
        QTest::addColumn<QByteArray>("pe");
        QTest::addColumn<int>("types");
        const QByteArray valid = peWith(validIconTree());
        QTest::newRow("empty") << QByteArray() << -1;
        QTest::newRow("no PE signature") << QByteArray(valid).replace(0x41, 1, "X") << -1;
        QTest::newRow("unknown optional header") << Patched<quint16>(valid, 0x58, 0x107) << -1;
        QTest::newRow("header offset past the end") << Patched<quint32>(valid, 0x3C, 0xFFFFFFF0u) << -1;
        QTest::newRow("section table past the end") << Patched<quint16>(valid, 0x46, 0xFFFF) << -1;
        QTest::newRow("directory pointing at itself") << peWith(putDirectory({}, 0, 0, 1, {14, Sub})) << 1;
        QTest::newRow("counts past the end") << peWith(putDirectory({}, 0, 0xFFFF, 0xFFFF, {14, Sub | 0x20})) << 1;
        QTest::newRow("image data outside every section") << peWith(put(validIconTree(), 0xC0, 0x7FFF0000u)) << 2;
        QTest::newRow("data range wrapping around")
            << peWith(put(put(validIconTree(), 0xC0, 0xFFFFFFF0u), 0xC4, 0x100)) << 2;
        QTest::newRow("image in the zero-filled tail") << peWith(validIconTree(), 0x100) << 2;
        // Every type points at the same long run of entries, shifted by one entry each time.
        QList<quint32> entries;
        for (quint32 i = 0; i < 2000; ++i)
            entries += {i + 1, Sub | (16 + 8 * i)};
        QTest::newRow("overlapping directories") << peWith(putDirectory({}, 0, 0, 2000, entries)) << 2000;
        const QByteArray longName = put(putDirectory({}, 0, 1, 0, {Sub | 0x20, Sub | 0x18}), 0x20, 0xFFFF);
        QTest::newRow("name longer than the file") << peWith(longName + QByteArray(0xFFF0, 'A')) << 1;
    }

    void malformedFilesEndCleanly()
    {
        QFETCH(QByteArray, pe);
        QFETCH(int, types);
        const auto opened = PeModule::fromBytes(pe);
        QCOMPARE(bool(opened.module), types >= 0);
        if (!opened.module) {
            QCOMPARE(opened.error, PeError::BadFormat);
            return;
        }
        const QList<ResourceKey> found = opened.module->resourceTypes();
        QCOMPARE(found.size(), types);
        for (const ResourceKey& key : found)
            QVERIFY(key.name.size() <= 512);
        QVERIFY(opened.module->allResources().size() <= pe.size() / 16); // no more leaves than the file has room for
        QCOMPARE(craftedMainIcon(pe).ImageCount(), 0);
    }

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

BV_REGISTER_TEST(TestIconsFromExe);
#include "tst_iconsfromexe.moc"
