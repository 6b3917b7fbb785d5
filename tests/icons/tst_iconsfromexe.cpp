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
#include <QRegularExpression>
#include <QTextStream>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QString keyText(const ResourceKey& key)
{
    return key.named ? key.name : QString::number(key.id);
}

} // namespace

class TestIconsFromExe : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

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
        QTest::addColumn<int>("images");
        QTest::addColumn<QString>("reason"); // why --extract-icon finds none
        QTest::newRow("named group first") << PeFixture(u"twogroups32.exe"_s) << QVariant(u"APPICON"_s) << 1 << "";
        // Groups 1 to 3 lack an image, disagree on a size, or use an id above 32767.
        QTest::newRow("first three groups broken") << PeFixture(u"broken64.exe"_s) << QVariant(4) << 1 << "";
        QTest::newRow("only group broken")
            << PeFixture(u"badsize64.exe"_s) << QVariant() << 0 << "none of the file's 1 icon groups loads completely";
        QTest::newRow("no group") << PeFixture(u"ver_ru32.exe"_s) << QVariant() << 0 << "the file has no icon";
        QTest::newRow("no resources") << PeFixture(u"nores64.exe"_s) << QVariant() << 0 << "the file has no resources";
        QTest::newRow("missing file") << m_env.path(u"none.exe"_s) << QVariant() << 0
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable")
            << IconInput(u"main.ico"_s) << QVariant() << 0 << "the file is not a valid Win32 application.";
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

    void truncatedExecutablesNeverLoadPartly()
    {
        const QByteArray whole = ReadFile(PeFixture(u"multi64.exe"_s));
        const QString path = m_env.path(u"cut.exe"_s);
        for (int keep : {0, 2, 64, 200, 400, 1024, 4096, 6000, 9000, 12000, 16000, int(whole.size())}) {
            QVERIFY(WriteFile(path, whole.left(keep)));
            cFileIcon icon;
            if (icon.LoadMainIconFromEXE(path))
                QCOMPARE(icon.toIconFile(), ReadFile(IconInput(u"main.ico"_s)));
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

    // Lists are filled on request; out-of-range indexes raise.
    void resourceLists()
    {
        cResources resources;
        resources.setFile(PeFixture(u"twogroups64.exe"_s));
        QCOMPARE(resources.GetResourceTypes(), 4);
        QCOMPARE(resources.IndexOfResourceType(14), 4);
        QCOMPARE(resources.GetResourceNames(4), 2);
        QCOMPARE(resources.GetResourceNames(4), 2); // refilled, not added to
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceType(9));
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceName(1, 1));
        resources.setFile(PeFixture(u"ver_ru32.exe"_s));
        QCOMPARE(resources.GetResourceTypes(), 1);
        QCOMPARE(resources.IndexOfResourceType(14), 0);
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
        QVERIFY(reference && !reference->contains(u"error"_s));
        // Leaf by leaf as "type/name/language/size/offset", and each type with its names as cResources lists them.
        QStringList leaves, wantedLists;
        for (const QJsonValue& value : reference->value(u"resources"_s).toArray()) {
            const QJsonArray leaf = value.toArray();
            const QString type = leaf.at(0).toVariant().toString();
            const QString name = leaf.at(1).toVariant().toString();
            leaves.append(u"%1/%2/%3/%4/%5"_s.arg(type, name)
                              .arg(leaf.at(2).toInt())
                              .arg(leaf.at(3).toInteger())
                              .arg(leaf.at(4).toInteger()));
            if (wantedLists.isEmpty() || !wantedLists.last().startsWith(type + u':'))
                wantedLists.append(type + u':');
            if (!wantedLists.last().endsWith(u' ' + name))
                wantedLists.last() += u' ' + name;
        }
        const auto module = PeModule::fromBytes(ReadFile(file)).module;
        QVERIFY(module);
        QStringList ours;
        for (const ResourceLeaf& leaf : module->allResources())
            ours.append(u"%1/%2/%3/%4/%5"_s.arg(keyText(leaf.type), keyText(leaf.name))
                            .arg(leaf.language)
                            .arg(leaf.size)
                            .arg(leaf.fileOffset));
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
            for (int n = 1, names = resources.GetResourceNames(t); n <= names; ++n)
                lists.last() += u' ' + resources.ResourceName(t, n).toString();
        }
        QCOMPARE(lists, wantedLists);

        // Keys match without regard to case, as the platform's version query matches them.
        QString out, err;
        QTextStream outStream(&out), errStream(&err);
        const QJsonObject version = reference->value(u"version"_s).toObject();
        QCOMPARE(IconCommands::PrintVersionInfo(file, outStream, errStream), version.isEmpty() ? 1 : 0);
        if (!version.isEmpty()) {
            QString wanted = u"Translation=%1\n"_s.arg(version.value(u"translation"_s).toString());
            const QVariantMap fields = version.value(u"fields"_s).toObject().toVariantMap(); // sorted by key
            for (const char* name : {"CompanyName", "FileDescription", "FileVersion", "InternalName", "LegalCopyright",
                     "OriginalFileName", "ProductName", "ProductVersion"}) {
                QString value;
                for (auto it = fields.begin(); it != fields.end(); ++it)
                    value = it.key().compare(QLatin1String(name), Qt::CaseInsensitive) == 0 ? it.value().toString()
                                                                                            : value;
                wanted += QLatin1String(name) + u'=' + value + u'\n';
            }
            QCOMPARE(out, wanted);
        }

        // The main icon: the first group, as wrestool extracts it.
        const QString groups = wantedLists.filter(QRegularExpression(u"^14:"_s)).value(0);
        const QString group = groups.section(u' ', 1, 1);
        cFileIcon icon;
        QCOMPARE(icon.LoadMainIconFromEXE(file), !group.isEmpty());
        if (!group.isEmpty()) {
            QCOMPARE(icon.ResourceID().toString(), group);
            QCOMPARE(icon.toIconFile(), WrestoolGroup(file, group).value_or("wrestool failed"));
        }
    }
};

BV_REGISTER_TEST(TestIconsFromExe);
#include "tst_iconsfromexe.moc"
