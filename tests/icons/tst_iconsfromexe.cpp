#include "IconTests.h"
#include "PeFixtures.h"
#include "RealPeFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/IconCommands.h"
#include "icons/PeModule.h"
#include "icons/cFileIcon.h"
#include "icons/cResources.h"

#include <QJsonArray>
#include <QTextStream>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QVariant jsonKey(const QJsonValue& value)
{
    return value.isString() ? QVariant(value.toString()) : QVariant(value.toInt());
}

QVariant keyOf(const ResourceKey& key)
{
    return key.named ? QVariant(key.name) : QVariant(int(key.id));
}

} // namespace

class TestIconsFromExe : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

private Q_SLOTS:
    void initTestCase()
    {
        PeFixture(QStringLiteral("multi64.exe")); // fails the run, naming what to install, when not built
        REQUIRE_TOOL("wrestool", "icoutils");
    }

    void mainIcon_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QVariant>("resourceId");
        QTest::addColumn<int>("images");
        QTest::addColumn<QString>("reason"); // why --extract-icon finds none
        QTest::newRow("multi32") << PeFixture(QStringLiteral("multi32.exe")) << QVariant(1) << 5 << "";
        QTest::newRow("multi64") << PeFixture(QStringLiteral("multi64.exe")) << QVariant(1) << 5 << "";
        QTest::newRow("named group first")
            << PeFixture(QStringLiteral("twogroups32.exe")) << QVariant(QStringLiteral("APPICON")) << 1 << "";
        // Groups 1 to 3 lack an image, disagree on a size, or use an id above 32767.
        QTest::newRow("first three groups broken")
            << PeFixture(QStringLiteral("broken64.exe")) << QVariant(4) << 1 << "";
        QTest::newRow("only group broken") << PeFixture(QStringLiteral("badsize64.exe")) << QVariant() << 0
                                           << "none of the file's 1 icon groups loads completely";
        QTest::newRow("no group") << PeFixture(QStringLiteral("ver_ru32.exe")) << QVariant() << 0
                                  << "the file has no icon";
        QTest::newRow("no resources") << PeFixture(QStringLiteral("nores64.exe")) << QVariant() << 0
                                      << "the file has no resources";
        QTest::newRow("missing file") << m_env.path(QStringLiteral("none.exe")) << QVariant() << 0
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable")
            << IconInput(QStringLiteral("main.ico")) << QVariant() << 0 << "the file is not a valid Win32 application.";
    }

    // The main icon, and the --extract-icon command that saves it, against wrestool's extraction.
    void mainIcon()
    {
        QFETCH(QString, file);
        QFETCH(QVariant, resourceId);
        QFETCH(int, images);
        QFETCH(QString, reason);
        cFileIcon icon;
        icon.AddImage(16, 16, 2); // a previous icon is always replaced
        QCOMPARE(icon.LoadMainIconFromEXE(file), resourceId.isValid());
        QCOMPARE(icon.Filename(), file);
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.ImageCount(), images);

        const QString out = m_env.path(QStringLiteral("main.ico"));
        QFile::remove(out);
        QString err;
        QTextStream errStream(&err);
        QCOMPARE(IconCommands::ExtractIcon(file, out, errStream), reason.isEmpty() ? 0 : 1);
        QCOMPARE(err, reason.isEmpty() ? QString() : file + QStringLiteral(": ") + reason + u'\n');
        if (resourceId.isValid())
            QCOMPARE(ReadFile(out), WrestoolGroup(file, resourceId.toString()).value_or("wrestool failed"));
        else
            QVERIFY(!QFile::exists(out));
    }

    void extractIconToAnUnwritablePlace()
    {
        const QString out = m_env.path(QStringLiteral("no/folder/out.ico"));
        QString err;
        QTextStream errStream(&err);
        QCOMPARE(IconCommands::ExtractIcon(PeFixture(QStringLiteral("multi32.exe")), out, errStream), 1);
        QCOMPARE(err, out + QStringLiteral(": Couldn't open file for writing.\n"));
    }

    void groupsOneByOne_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<int>("id");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QVariant>("resourceId");
        QTest::addColumn<QString>("group"); // wrestool's name of the group that loads; empty when none
        const QString broken = PeFixture(QStringLiteral("broken64.exe"));
        const QString two = PeFixture(QStringLiteral("twogroups32.exe"));
        const QVariant appIcon(QStringLiteral("APPICON"));
        QTest::newRow("missing image") << broken << 1 << QString() << QVariant() << "";
        QTest::newRow("sizes disagree") << broken << 2 << QString() << QVariant() << "";
        QTest::newRow("image id above 32767") << broken << 3 << QString() << QVariant() << "";
        QTest::newRow("id") << broken << 4 << QString() << QVariant(4) << "4";
        QTest::newRow("id as #text") << broken << 0 << "#4" << QVariant(QStringLiteral("#4")) << "4";
        QTest::newRow("name") << two << 0 << "APPICON" << appIcon << "APPICON";
        QTest::newRow("name in lower case")
            << two << 0 << "appicon" << QVariant(QStringLiteral("appicon")) << "APPICON";
        QTest::newRow("unknown id falls back on the name") << two << 99 << "APPICON" << appIcon << "APPICON";
        QTest::newRow("id wins over name") << two << 2 << "APPICON" << QVariant(2) << "2";
        QTest::newRow("neither") << two << 99 << "OTHER" << QVariant() << "";
    }

    void groupsOneByOne()
    {
        QFETCH(QString, file);
        QFETCH(int, id);
        QFETCH(QString, name);
        QFETCH(QVariant, resourceId);
        QFETCH(QString, group);
        cFileIcon icon;
        QCOMPARE(icon.LoadIconFromEXE(file, id, name), !group.isEmpty());
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.Filename(), file);
        if (group.isEmpty())
            QCOMPARE(icon.ImageCount(), 0);
        else
            QCOMPARE(icon.toIconFile(), WrestoolGroup(file, group).value_or("wrestool failed"));
    }

    void truncatedExecutablesNeverLoadPartly()
    {
        const QByteArray whole = ReadFile(PeFixture(QStringLiteral("multi64.exe")));
        const QString path = m_env.path(QStringLiteral("cut.exe"));
        for (int keep : {0, 2, 64, 200, 400, 1024, 4096, 6000, 9000, 12000, 16000, int(whole.size())}) {
            QVERIFY(WriteFile(path, whole.left(keep)));
            cFileIcon icon;
            if (icon.LoadMainIconFromEXE(path))
                QCOMPARE(icon.toIconFile(), ReadFile(IconInput(QStringLiteral("main.ico"))));
            else
                QCOMPARE(icon.ImageCount(), 0);
            if (keep == whole.size())
                QCOMPARE(icon.ImageCount(), 5);
        }
    }

    void typeNames()
    {
        for (const auto& [id, name] : QList<std::pair<int, QString>> {{1, u"Cursor"_s}, {3, u"Icon"_s},
                 {7, u"Font Directory"_s}, {12, u"Group Cursor"_s}, {13, u"Other (13)"_s}, {14, u"Group Icon"_s},
                 {15, u"Other (15)"_s}, {16, u"Version"_s}, {18, u"Other (18)"_s}, {19, u"VXD"_s}, {20, u"VXD"_s},
                 {23, u"HTML"_s}, {24, u"Other (24)"_s}, {0, u"Other (0)"_s}})
            QCOMPARE(cResources::ResourceTypeName(id), name);
    }

    void resourceLists()
    {
        cResources resources;
        resources.setFile(PeFixture(QStringLiteral("twogroups64.exe")));
        QCOMPARE(resources.GetResourceTypes(), 4);
        // The named type "TILESDATA" precedes the integer types, which ascend.
        QCOMPARE(resources.ResourceType(1), QVariant(QStringLiteral("TILESDATA")));
        QCOMPARE(resources.ResourceType(4), QVariant(14));
        QCOMPARE(resources.IndexOfResourceType(14), 4);
        QCOMPARE(resources.GetResourceNames(4), 2);
        QCOMPARE(resources.ResourceName(4, 1), QVariant(QStringLiteral("APPICON")));
        QCOMPARE(resources.ResourceName(4, 2), QVariant(2));
        // Asking twice refills the one list rather than adding another.
        QCOMPARE(resources.GetResourceNames(4), 2);
        QCOMPARE(resources.ResourceNameCount(4), 2);
        QCOMPARE(resources.ResourceNameCount(1), 0);
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.GetResourceNames(0));
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceType(9));
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceName(1, 1));
        resources.UnloadModule();
        QVERIFY(!resources.hModule());
        QCOMPARE(resources.ResourceNameCount(4), 2);
        QCOMPARE(resources.ResourceTypeCount(), 4);
        resources.ClearUp();
        QCOMPARE(resources.ResourceTypeCount(), 0);
        QCOMPARE(resources.ResourceNameCount(4), 0);

        resources.setFile(PeFixture(QStringLiteral("ver_ru32.exe")));
        QCOMPARE(resources.GetResourceTypes(), 1);
        QCOMPARE(resources.IndexOfResourceType(14), 0);
    }

    void resourceFailures_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<bool>("loads");
        QTest::addColumn<QString>("source");
        QTest::addColumn<QString>("message");
        QTest::newRow("missing file") << m_env.path(QStringLiteral("none.exe")) << false << "cResources"
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable") << IconInput(QStringLiteral("main.ico")) << false << "cResources"
                                           << "%1 is not a valid Win32 application.";
        QTest::newRow("no resources") << PeFixture(QStringLiteral("nores64.exe")) << true << "cResource"
                                      << "The specified image file did not contain a resource section.";
    }

    void resourceFailures()
    {
        QFETCH(QString, file);
        QFETCH(bool, loads);
        QFETCH(QString, source);
        QFETCH(QString, message);
        cResources resources;
        NumberedError error = Raised([&] { resources.setFile(file); });
        QCOMPARE(bool(resources.hModule()), loads);
        if (loads)
            error = Raised([&] { resources.GetResourceTypes(); });
        QCOMPARE(error.number(), 0x80040419u);
        QCOMPARE(error.source(), ErrorSource(source));
        QCOMPARE(error.message(), message);
        QCOMPARE(resources.file(), file);
    }

    // Fixtures and executables no one here built (whatever packages on this machine installed), read by pefile
    // and wrestool: the resource directory leaf by leaf, the lists, the version strings and the main icon.
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
        QVERIFY(reference);
        QVERIFY2(!reference->contains(QStringLiteral("error")), "pefile refuses the file");
        const QJsonArray leaves = reference->value(QStringLiteral("resources")).toArray();
        const auto module = PeModule::fromBytes(ReadFile(file)).module;
        QVERIFY(module);
        const QList<ResourceLeaf> ours = module->allResources();
        QCOMPARE(ours.size(), leaves.size());
        QList<QVariant> types; // leaves come grouped by type, then by name
        QList<QList<QVariant>> names;
        for (qsizetype i = 0; i < ours.size(); ++i) {
            const QJsonArray leaf = leaves.at(i).toArray();
            QCOMPARE(keyOf(ours.at(i).type), jsonKey(leaf.at(0)));
            QCOMPARE(keyOf(ours.at(i).name), jsonKey(leaf.at(1)));
            QCOMPARE(int(ours.at(i).language), leaf.at(2).toInt());
            QCOMPARE(qint64(ours.at(i).size), leaf.at(3).toInteger());
            QCOMPARE(ours.at(i).fileOffset, leaf.at(4).toInteger());
            if (types.isEmpty() || types.last() != jsonKey(leaf.at(0))) {
                types.append(jsonKey(leaf.at(0)));
                names.append(QList<QVariant>());
            }
            if (names.last().isEmpty() || names.last().last() != jsonKey(leaf.at(1)))
                names.last().append(jsonKey(leaf.at(1)));
        }

        cResources resources;
        resources.setFile(file);
        if (reference->value(QStringLiteral("resources")).isNull()) {
            QVERIFY_THROWS_EXCEPTION(NumberedError, resources.GetResourceTypes()); // no resource section
            types.clear();
        } else {
            QCOMPARE(resources.GetResourceTypes(), types.size());
        }
        for (int t = 1; t <= types.size(); ++t) {
            QCOMPARE(resources.ResourceType(t), types.at(t - 1));
            const QList<QVariant>& expected = names.at(t - 1);
            QCOMPARE(resources.GetResourceNames(t), expected.size());
            for (int n = 1; n <= expected.size(); ++n)
                QCOMPARE(resources.ResourceName(t, n), expected.at(n - 1));
        }

        // Keys match without regard to case, as the platform's version query matches them.
        QString out;
        QString err;
        QTextStream outStream(&out);
        QTextStream errStream(&err);
        const int exitCode = IconCommands::PrintVersionInfo(file, outStream, errStream);
        const QJsonObject version = reference->value(QStringLiteral("version")).toObject();
        QCOMPARE(exitCode, version.isEmpty() ? 1 : 0);
        if (!version.isEmpty()) {
            QString wanted
                = QStringLiteral("Translation=%1\n").arg(version.value(QStringLiteral("translation")).toString());
            const QJsonObject fields = version.value(QStringLiteral("fields")).toObject();
            for (const char* name : {"CompanyName", "FileDescription", "FileVersion", "InternalName", "LegalCopyright",
                     "OriginalFileName", "ProductName", "ProductVersion"}) {
                QString value;
                for (auto it = fields.begin(); it != fields.end(); ++it) {
                    if (it.key().compare(QLatin1String(name), Qt::CaseInsensitive) == 0)
                        value = it.value().toString();
                }
                wanted += QLatin1String(name) + u'=' + value + u'\n';
            }
            QCOMPARE(out, wanted);
        }

        // The main icon: the first group, as wrestool extracts it.
        cFileIcon icon;
        const QList<QVariant> groups = names.value(types.indexOf(QVariant(14)));
        QCOMPARE(icon.LoadMainIconFromEXE(file), !groups.isEmpty());
        if (!groups.isEmpty()) {
            QCOMPARE(icon.ResourceID(), groups.first());
            QCOMPARE(icon.toIconFile(), WrestoolGroup(file, groups.first().toString()).value_or("wrestool failed"));
        }
    }
};

BV_REGISTER_TEST(TestIconsFromExe);
#include "tst_iconsfromexe.moc"
