#include "PeFixtures.h"
#include "RealPeFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/IconCommands.h"
#include "icons/NumberedError.h"
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
};

BV_REGISTER_TEST(TestIconsFromExe);
#include "tst_iconsfromexe.moc"
