#include "app/CompanionComponents.h"
#include "app/ComponentObjects.h"
#include "app/ComponentRegistry.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QLibrary>
#include <QtTest>

using namespace Brimvault;

namespace {

// Loads a component file and runs its DllRegisterServer, as an installer would.
std::int32_t registerLibrary(const QString& path)
{
    QLibrary library(path);
    if (!library.load())
        return -1;
    auto registerServer = reinterpret_cast<RegisterServerFunction>(library.resolve(RegisterServerSymbol));
    return registerServer ? registerServer() : -2;
}

QString builtComponent(const QString& prefix)
{
    return QStringLiteral(BRIMVAULT_BIN_DIR) + u'/' + CompanionComponentFile(prefix);
}

} // namespace

// Late-bound calls on an object of our own, with parameters of several types.
class Calculator : public QObject {
    Q_OBJECT
    Q_PROPERTY(int Total MEMBER m_total)
public:
    Q_INVOKABLE int Add(int a, int b) const { return a + b; }
    Q_INVOKABLE QString Join(const QString& a, const QVariant& b) const { return a + b.toString(); }
    Q_INVOKABLE void Reset() { m_total = 0; }
    int m_total = 7;
};

class TestComponentRegistry : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void registerThenCreate_data()
    {
        QTest::addColumn<QString>("prefix");
        for (const char* prefix : {"Quillet", "Tamarisk", "Velloran", "Ostrane", "Corvelle"})
            QTest::newRow(prefix) << QString::fromLatin1(prefix);
    }
    void registerThenCreate()
    {
        QFETCH(QString, prefix);
        TestEnvironment env;
        const QString copy = env.path(u"program/"_qs + CompanionComponentFile(prefix));
        QVERIFY(WriteFile(copy, ReadFile(builtComponent(prefix))));
        const QString progId = prefix + QStringLiteral(".clsVersion");
        QVERIFY(!CreateObject(progId));
        QCOMPARE(registerLibrary(copy), 0);
        QCOMPARE(RegisteredLibrary(progId), copy);
        QVERIFY(ComponentRegistryPath().startsWith(env.path(QStringLiteral("settings"))));
        CreatedObject created = CreateObject(progId.toUpper());
        QVERIFY2(created, qPrintable(created.error));
        const CallOutcome version = CallByName(created.object.get(), QStringLiteral("getversion"));
        QVERIFY2(version.ok, qPrintable(version.error));
        QCOMPARE(version.value.toString(), QStringLiteral(BRIMVAULT_VERSION));
        const CallOutcome missing = CallByName(created.object.get(), QStringLiteral("GetColour"));
        QVERIFY(!missing.ok && missing.error.contains(QStringLiteral("GetColour")));

        QVERIFY(QFile::remove(copy));
        created = CreateObject(progId);
        QVERIFY(!created);
        QVERIFY2(created.error.contains(copy), qPrintable(created.error));
    }

    void unknownOrBrokenFails()
    {
        TestEnvironment env;
        QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
        QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Ostrane"))), 0);
        QVERIFY(CreateObject(QStringLiteral("quillet.CLSVERSION"))); // kept by the second registration
        const QString fake = env.path(QStringLiteral("Velloran.so"));
        QVERIFY(WriteFile(fake,
            "\x7f"
            "ELF but not really a library"));
        QVERIFY(RegisterProgIds({QStringLiteral("Velloran.clsVersion")}, fake));
        for (const char* progId : {"Quillet.clsNothing", "Nobody.clsVersion", "Quillet", "", "Velloran.clsVersion"}) {
            const CreatedObject created = CreateObject(QString::fromLatin1(progId));
            QVERIFY2(!created && !created.error.isEmpty(), progId);
        }
        QVERIFY(!CallByName(nullptr, QStringLiteral("GetVersion")).ok);
    }

    void registryFile()
    {
        TestEnvironment env;
        QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
        // Garbage lines (another encoding, hand edits) survive a later registration byte for byte.
        QVERIFY(WriteFile(ComponentRegistryPath(), ReadFile(ComponentRegistryPath()) + "\xff\xfe garbage\n"));
        QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Velloran"))), 0);
        const QByteArray after = ReadFile(ComponentRegistryPath());
        QVERIFY(after.contains("\xff\xfe garbage\n"));
        QVERIFY(after.contains("Quillet.clsVersion") && after.contains("Velloran.clsVersion"));

        // Root ignores file permissions; a folder in the file's place stops any writer.
        QVERIFY(QFile::remove(ComponentRegistryPath()));
        QVERIFY(QDir().mkpath(ComponentRegistryPath()));
        QVERIFY(registerLibrary(builtComponent(QStringLiteral("Corvelle"))) != 0);
        QVERIFY(RegisteredLibrary(QStringLiteral("Corvelle.clsVersion")).isEmpty());
    }

    void callByName_data()
    {
        QTest::addColumn<QString>("method");
        QTest::addColumn<QVariantList>("args");
        QTest::addColumn<CallType>("type");
        QTest::addColumn<bool>("ok");
        QTest::addColumn<QVariant>("result"); // with the total afterwards for a method without result
        const CallType call = CallType::Method;
        QTest::newRow("ints") << u"Add"_qs << QVariantList {2, 3} << call << true << QVariant(5);
        QTest::newRow("name ignores case") << u"aDD"_qs << QVariantList {2, 3} << call << true << QVariant(5);
        QTest::newRow("text to int") << u"Add"_qs << QVariantList {u"40"_qs, 2} << call << true << QVariant(42);
        QTest::newRow("text that is no number")
            << u"Add"_qs << QVariantList {u"x"_qs, 2} << call << false << QVariant();
        QTest::newRow("too few arguments") << u"Add"_qs << QVariantList {2} << call << false << QVariant();
        QTest::newRow("too many arguments") << u"Add"_qs << QVariantList {1, 2, 3} << call << false << QVariant();
        QTest::newRow("variant parameter")
            << u"Join"_qs << QVariantList {u"v"_qs, 1.5} << call << true << QVariant(u"v1.5"_qs);
        QTest::newRow("void method") << u"Reset"_qs << QVariantList {} << call << true << QVariant(0);
        QTest::newRow("QObject's own slot") << u"deleteLater"_qs << QVariantList {} << call << false << QVariant();
        QTest::newRow("get") << u"total"_qs << QVariantList {} << CallType::Get << true << QVariant(7);
        QTest::newRow("let") << u"Total"_qs << QVariantList {12} << CallType::Let << true << QVariant(12);
        QTest::newRow("let, no number") << u"Total"_qs << QVariantList {u"twelve"_qs} << CallType::Let << false
                                        << QVariant();
        QTest::newRow("get, missing") << u"Missing"_qs << QVariantList {} << CallType::Get << false << QVariant();
        QTest::newRow("QObject's own property")
            << u"objectName"_qs << QVariantList {} << CallType::Get << false << QVariant();
    }
    void callByName()
    {
        QFETCH(QString, method);
        QFETCH(QVariantList, args);
        QFETCH(CallType, type);
        QFETCH(bool, ok);
        QFETCH(QVariant, result);
        Calculator calculator;
        const CallOutcome outcome = CallByName(&calculator, method, args, type);
        QCOMPARE(outcome.ok, ok);
        QCOMPARE(outcome.error.isEmpty(), ok);
        if (ok)
            QCOMPARE(outcome.value.isValid() ? outcome.value : QVariant(calculator.m_total), result);
    }
};

BV_REGISTER_TEST(TestComponentRegistry);
#include "tst_componentregistry.moc"
