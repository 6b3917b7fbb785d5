#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "icons/NumberedError.h"
#include "icons/PeModule.h"
#include "icons/cResources.h"

#include <QFile>
#include <QJsonArray>
#include <QTest>

using namespace Brimvault;

class TestResources : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    template <typename F>
    static NumberedError raised(F f)
    {
        try {
            f();
        } catch (const NumberedError& error) {
            return error;
        }
        return NumberedError(0, QString(), QString());
    }

    static QVariant jsonKey(const QJsonValue& value)
    {
        return value.isString() ? QVariant(value.toString()) : QVariant(value.toInt());
    }

private Q_SLOTS:
    void initTestCase()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("PE fixtures were not built (mingw-w64, icoutils or python3 missing)");
    }

    void typeNames_data()
    {
        QTest::addColumn<int>("id");
        QTest::addColumn<QString>("name");
        QTest::newRow("1") << 1 << "Cursor";
        QTest::newRow("3") << 3 << "Icon";
        QTest::newRow("7") << 7 << "Font Directory";
        QTest::newRow("12") << 12 << "Group Cursor";
        QTest::newRow("13") << 13 << "Other (13)";
        QTest::newRow("14") << 14 << "Group Icon";
        QTest::newRow("15") << 15 << "Other (15)";
        QTest::newRow("16") << 16 << "Version";
        QTest::newRow("18") << 18 << "Other (18)";
        QTest::newRow("19") << 19 << "VXD";
        QTest::newRow("20") << 20 << "VXD";
        QTest::newRow("23") << 23 << "HTML";
        QTest::newRow("24") << 24 << "Other (24)";
        QTest::newRow("0") << 0 << "Other (0)";
    }

    void typeNames()
    {
        QFETCH(int, id);
        QFETCH(QString, name);
        QCOMPARE(cResources::ResourceTypeName(id), name);
    }

    void orderMatchesPefile_data()
    {
        QTest::addColumn<QString>("file");
        for (const char* name : {"multi32.exe", "multi64.exe", "twogroups32.exe", "twogroups64.exe", "broken64.exe",
                 "ver_ru32.exe", "ver_nodesc64.exe"})
            QTest::newRow(name) << IconTest::peFixture(QString::fromLatin1(name));
    }

    void orderMatchesPefile()
    {
        QFETCH(QString, file);
        const auto reference = IconTest::pefileReading(file);
        if (!reference)
            QSKIP("python3-pefile is not installed");
        const QJsonArray leaves = reference->value(QStringLiteral("resources")).toArray();

        cResources resources;
        resources.setFile(file);
        const int typeCount = resources.GetResourceTypes();
        QList<QVariant> expectedTypes;
        for (const QJsonValue& leaf : leaves) {
            const QVariant type = jsonKey(leaf.toArray().at(0));
            if (!expectedTypes.contains(type))
                expectedTypes.append(type);
        }
        QCOMPARE(typeCount, expectedTypes.size());
        for (int t = 1; t <= typeCount; ++t) {
            QCOMPARE(resources.ResourceType(t), expectedTypes.at(t - 1));
            QList<QVariant> expectedNames;
            for (const QJsonValue& leaf : leaves) {
                if (jsonKey(leaf.toArray().at(0)) == expectedTypes.at(t - 1))
                    expectedNames.append(jsonKey(leaf.toArray().at(1)));
            }
            QCOMPARE(resources.GetResourceNames(t), expectedNames.size());
            for (int n = 1; n <= expectedNames.size(); ++n)
                QCOMPARE(resources.ResourceName(t, n), expectedNames.at(n - 1));
        }

        // The full walk finds the same leaves at the same file offsets.
        QFile bytes(file);
        QVERIFY(bytes.open(QIODevice::ReadOnly));
        const auto module = PeModule::fromBytes(bytes.readAll()).module;
        QVERIFY(module);
        const QList<ResourceLeaf> ours = module->allResources();
        QCOMPARE(ours.size(), leaves.size());
        for (qsizetype i = 0; i < ours.size(); ++i) {
            const QJsonArray leaf = leaves.at(i).toArray();
            QCOMPARE(int(ours.at(i).language), leaf.at(2).toInt());
            QCOMPARE(qint64(ours.at(i).size), qint64(leaf.at(3).toInteger()));
            QCOMPARE(ours.at(i).fileOffset, qint64(leaf.at(4).toInteger()));
        }
    }

    void namedEntriesComeFirst()
    {
        cResources resources;
        resources.setFile(IconTest::peFixture(QStringLiteral("twogroups64.exe")));
        resources.GetResourceTypes();
        // The named type "TILESDATA" precedes the integer types, which ascend.
        QCOMPARE(resources.ResourceType(1), QVariant(QStringLiteral("TILESDATA")));
        QCOMPARE(resources.ResourceType(2), QVariant(3));
        QCOMPARE(resources.ResourceType(3), QVariant(10));
        QCOMPARE(resources.ResourceType(4), QVariant(14));
        const int groups = resources.IndexOfResourceType(14);
        QCOMPARE(groups, 4);
        QCOMPARE(resources.GetResourceNames(groups), 2);
        QCOMPARE(resources.ResourceName(groups, 1), QVariant(QStringLiteral("APPICON")));
        QCOMPARE(resources.ResourceName(groups, 2), QVariant(2));
        // Asking twice refills the one list rather than adding another.
        QCOMPARE(resources.GetResourceNames(groups), 2);
        QCOMPARE(resources.ResourceNameCount(groups), 2);
        QCOMPARE(resources.ResourceNameCount(1), 0);
        resources.UnloadModule();
        QVERIFY(!resources.hModule());
        QCOMPARE(resources.ResourceNameCount(groups), 2);
        QCOMPARE(resources.ResourceTypeCount(), 4);
        resources.ClearUp();
        QCOMPARE(resources.ResourceTypeCount(), 0);
        QCOMPARE(resources.ResourceNameCount(groups), 0);
    }

    void noGroupIcons()
    {
        cResources resources;
        resources.setFile(IconTest::peFixture(QStringLiteral("ver_ru32.exe")));
        QCOMPARE(resources.GetResourceTypes(), 1);
        QCOMPARE(resources.IndexOfResourceType(14), 0);
    }

    void failures_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<bool>("loads");
        QTest::addColumn<quint32>("number");
        QTest::addColumn<QString>("source");
        QTest::addColumn<QString>("message");
        QTest::newRow("missing file") << m_env.path(QStringLiteral("none.exe")) << false << 0x80040419u << ".cResources"
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable") << QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/icons/pe_reference.py")
                                           << false << 0x80040419u << ".cResources"
                                           << "%1 is not a valid Win32 application.";
        QTest::newRow("no resources") << IconTest::peFixture(QStringLiteral("nores64.exe")) << true << 0x80040419u
                                      << ".cResource"
                                      << "The specified image file did not contain a resource section.";
    }

    void failures()
    {
        QFETCH(QString, file);
        QFETCH(bool, loads);
        QFETCH(quint32, number);
        QFETCH(QString, source);
        QFETCH(QString, message);
        cResources resources;
        NumberedError error = raised([&] { resources.setFile(file); });
        if (loads) {
            QCOMPARE(error.number(), 0u);
            QVERIFY(resources.hModule());
            error = raised([&] { resources.GetResourceTypes(); });
        }
        QCOMPARE(error.number(), number);
        QCOMPARE(error.source(), ErrorSource(source.mid(1)));
        QCOMPARE(error.message(), message);
        QCOMPARE(resources.file(), file);
    }

    void namesOfAMissingTypeRaise()
    {
        cResources resources;
        resources.setFile(IconTest::peFixture(QStringLiteral("multi32.exe")));
        resources.GetResourceTypes();
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.GetResourceNames(0));
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceType(9));
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceName(1, 1));
    }
};

QTEST_GUILESS_MAIN(TestResources)
#include "tst_cresources.moc"
