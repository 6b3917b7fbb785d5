#include "app/CompanionComponents.h"
#include "app/ComponentObjects.h"
#include "app/ComponentRegistry.h"

#include "TestEnvironment.h"

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
    Q_PROPERTY(int Total READ total WRITE setTotal)
public:
    Q_INVOKABLE int Add(int a, int b) const { return a + b; }
    Q_INVOKABLE QString Join(const QString& a, const QVariant& b) const { return a + b.toString(); }
    Q_INVOKABLE QVariant Echo(const QVariant& value) const { return value; }
    Q_INVOKABLE void Reset() { m_total = 0; }

    int total() const { return m_total; }
    void setTotal(int value) { m_total = value; }

private:
    int m_total = 7;
};

class TestComponentRegistry : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void registerThenCreate_data();
    void registerThenCreate();
    void progIdsIgnoreCase();
    void unknownProgIdFails_data();
    void unknownProgIdFails();
    void deletedLibraryFailsCleanly();
    void libraryThatIsNotALibraryFailsCleanly();
    void unwritableRegistryFailsRegistration();
    void garbageInRegistrySurvivesRegistration();
    void callByName_data();
    void callByName();
    void propertiesByName();
    void missingMethodFailsCleanly();
};

void TestComponentRegistry::registerThenCreate_data()
{
    QTest::addColumn<QString>("prefix");
    for (const CompanionComponent& component : CompanionComponents())
        QTest::newRow(qPrintable(component.prefix)) << component.prefix;
}

void TestComponentRegistry::registerThenCreate()
{
    QFETCH(QString, prefix);
    TestEnvironment env;
    QTemporaryDir programDir;
    const QString copy = programDir.filePath(CompanionComponentFile(prefix));
    QVERIFY(QFile::copy(builtComponent(prefix), copy));

    const QString progId = prefix + QStringLiteral(".clsVersion");
    QVERIFY(!CreateObject(progId));
    QCOMPARE(registerLibrary(copy), 0);
    QCOMPARE(RegisteredLibrary(progId), QFileInfo(copy).absoluteFilePath());
    QVERIFY(ComponentRegistryPath().startsWith(env.path(QStringLiteral("settings"))));

    CreatedObject created = CreateObject(progId);
    QVERIFY2(created, qPrintable(created.error));
    const CallOutcome version = CallByName(created.object.get(), QStringLiteral("GetVersion"));
    QVERIFY2(version.ok, qPrintable(version.error));
    QCOMPARE(version.value.toString(), QStringLiteral(BRIMVAULT_VERSION));
}

void TestComponentRegistry::progIdsIgnoreCase()
{
    TestEnvironment env;
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Ostrane"))), 0);
    // A second registration keeps the first one's entries.
    QVERIFY(!RegisteredLibrary(QStringLiteral("Quillet.clsVersion")).isEmpty());
    QVERIFY(CreateObject(QStringLiteral("quillet.CLSVERSION")));
    QVERIFY(CreateObject(QStringLiteral("OSTRANE.clsversion")));
}

void TestComponentRegistry::unknownProgIdFails_data()
{
    QTest::addColumn<QString>("progId");
    QTest::newRow("unknown class of a registered component") << QStringLiteral("Quillet.clsNothing");
    QTest::newRow("unregistered component") << QStringLiteral("Nobody.clsVersion");
    QTest::newRow("prefix only") << QStringLiteral("Quillet");
    QTest::newRow("empty") << QString();
}

void TestComponentRegistry::unknownProgIdFails()
{
    QFETCH(QString, progId);
    TestEnvironment env;
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
    const CreatedObject created = CreateObject(progId);
    QVERIFY(!created);
    QVERIFY(!created.error.isEmpty());
}

void TestComponentRegistry::deletedLibraryFailsCleanly()
{
    TestEnvironment env;
    QTemporaryDir programDir;
    const QString copy = programDir.filePath(CompanionComponentFile(QStringLiteral("Tamarisk")));
    QVERIFY(QFile::copy(builtComponent(QStringLiteral("Tamarisk")), copy));
    QCOMPARE(registerLibrary(copy), 0);
    QVERIFY(QFile::remove(copy));

    const CreatedObject created = CreateObject(QStringLiteral("Tamarisk.clsVersion"));
    QVERIFY(!created);
    QVERIFY2(created.error.contains(copy), qPrintable(created.error));
}

void TestComponentRegistry::libraryThatIsNotALibraryFailsCleanly()
{
    TestEnvironment env;
    QTemporaryDir programDir;
    const QString fake = programDir.filePath(QStringLiteral("Velloran.so"));
    QFile file(fake);
    QVERIFY(file.open(QIODevice::WriteOnly));
    file.write("\x7f"
               "ELF but not really a library");
    file.close();
    QVERIFY(RegisterProgIds({QStringLiteral("Velloran.clsVersion")}, fake));

    const CreatedObject created = CreateObject(QStringLiteral("Velloran.clsVersion"));
    QVERIFY(!created);
    QVERIFY(!created.error.isEmpty());
}

void TestComponentRegistry::unwritableRegistryFailsRegistration()
{
    TestEnvironment env;
    // Root ignores file permissions; a folder in the file's place stops any writer.
    QVERIFY(QDir().mkpath(ComponentRegistryPath()));
    QVERIFY(registerLibrary(builtComponent(QStringLiteral("Corvelle"))) != 0);
    QVERIFY(RegisteredLibrary(QStringLiteral("Corvelle.clsVersion")).isEmpty());
    QVERIFY(!CreateObject(QStringLiteral("Corvelle.clsVersion")));
}

void TestComponentRegistry::garbageInRegistrySurvivesRegistration()
{
    TestEnvironment env;
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
    QFile registry(ComponentRegistryPath());
    QVERIFY(registry.open(QIODevice::ReadOnly));
    const QByteArray before = registry.readAll();
    registry.close();
    QVERIFY(before.contains("Quillet.clsVersion"));

    // Garbage lines (another encoding, hand edits) survive a later registration byte for byte.
    QVERIFY(registry.open(QIODevice::Append));
    registry.write("\xff\xfe garbage\n");
    registry.close();
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Velloran"))), 0);
    QVERIFY(registry.open(QIODevice::ReadOnly));
    const QByteArray after = registry.readAll();
    QVERIFY(after.contains("\xff\xfe garbage"));
    QVERIFY(after.contains("Quillet.clsVersion"));
    QVERIFY(after.contains("Velloran.clsVersion"));
}

void TestComponentRegistry::callByName_data()
{
    QTest::addColumn<QString>("method");
    QTest::addColumn<QVariantList>("args");
    QTest::addColumn<bool>("ok");
    QTest::addColumn<QVariant>("result");

    QTest::newRow("ints") << QStringLiteral("Add") << QVariantList {2, 3} << true << QVariant(5);
    QTest::newRow("name ignores case") << QStringLiteral("aDD") << QVariantList {2, 3} << true << QVariant(5);
    QTest::newRow("text converts to int")
        << QStringLiteral("Add") << QVariantList {QStringLiteral("40"), 2} << true << QVariant(42);
    QTest::newRow("text that is no number")
        << QStringLiteral("Add") << QVariantList {QStringLiteral("x"), 2} << false << QVariant();
    QTest::newRow("too few arguments") << QStringLiteral("Add") << QVariantList {2} << false << QVariant();
    QTest::newRow("too many arguments") << QStringLiteral("Add") << QVariantList {1, 2, 3} << false << QVariant();
    QTest::newRow("variant parameter") << QStringLiteral("Join") << QVariantList {QStringLiteral("v"), 1.5} << true
                                       << QVariant(QStringLiteral("v1.5"));
    QTest::newRow("variant result") << QStringLiteral("Echo") << QVariantList {QStringLiteral("abc")} << true
                                    << QVariant(QStringLiteral("abc"));
    QTest::newRow("void method") << QStringLiteral("Reset") << QVariantList {} << true << QVariant();
    QTest::newRow("QObject's own slot is not offered")
        << QStringLiteral("deleteLater") << QVariantList {} << false << QVariant();
}

void TestComponentRegistry::callByName()
{
    QFETCH(QString, method);
    QFETCH(QVariantList, args);
    QFETCH(bool, ok);
    QFETCH(QVariant, result);

    Calculator calculator;
    const CallOutcome outcome = CallByName(&calculator, method, args);
    QCOMPARE(outcome.ok, ok);
    QCOMPARE(outcome.error.isEmpty(), ok);
    if (ok)
        QCOMPARE(outcome.value, result);
}

void TestComponentRegistry::propertiesByName()
{
    Calculator calculator;
    CallOutcome outcome = CallByName(&calculator, QStringLiteral("total"), {}, CallType::Get);
    QVERIFY(outcome.ok);
    QCOMPARE(outcome.value.toInt(), 7);
    QVERIFY(CallByName(&calculator, QStringLiteral("Total"), {12}, CallType::Let).ok);
    QCOMPARE(calculator.total(), 12);
    QVERIFY(!CallByName(&calculator, QStringLiteral("Total"), {QStringLiteral("twelve")}, CallType::Let).ok);
    QVERIFY(!CallByName(&calculator, QStringLiteral("Missing"), {}, CallType::Get).ok);
    QVERIFY(!CallByName(&calculator, QStringLiteral("objectName"), {}, CallType::Get).ok);
}

void TestComponentRegistry::missingMethodFailsCleanly()
{
    TestEnvironment env;
    QCOMPARE(registerLibrary(builtComponent(QStringLiteral("Quillet"))), 0);
    CreatedObject created = CreateObject(QStringLiteral("Quillet.clsVersion"));
    QVERIFY(created);
    const CallOutcome outcome = CallByName(created.object.get(), QStringLiteral("GetColour"));
    QVERIFY(!outcome.ok);
    QVERIFY(outcome.error.contains(QStringLiteral("GetColour")));
    QVERIFY(!CallByName(nullptr, QStringLiteral("GetVersion")).ok);
}

QTEST_GUILESS_MAIN(TestComponentRegistry)
#include "tst_componentregistry.moc"
