#include "app/ComponentObjects.h"

#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

class Calculator : public QObject {
    Q_OBJECT
    Q_PROPERTY(int Total MEMBER m_total)
public:
    Q_INVOKABLE int Add(int a, int b) const { return a + b; }
    Q_INVOKABLE void Reset() { m_total = 0; }
    int m_total = 7;
};

class TestComponentRegistry : public QObject {
    Q_OBJECT
private Q_SLOTS:
    // Every component registering itself and the program calling them is seen through the start-up runs.
    void createdByProgIdInAnyLetterCase()
    {
        TestEnvironment env;
        QVERIFY(!CreateObject(u"Quillet.clsVersion"_qs));
        QVERIFY(RegisterQuillet());
        const CreatedObject created = CreateObject(u"QUILLET.CLSVERSION"_qs);
        QVERIFY2(created, qPrintable(created.error));
        QCOMPARE(
            CallByName(created.object.get(), u"getversion"_qs).value.toString(), QStringLiteral(BRIMVAULT_VERSION));
        QVERIFY(CallByName(created.object.get(), u"GetColour"_qs).error.contains(u"GetColour"_qs));
    }

    void callByName_data()
    {
        QTest::addColumn<QString>("method");
        QTest::addColumn<QVariantList>("args");
        QTest::addColumn<CallType>("type");
        QTest::addColumn<bool>("ok");
        QTest::addColumn<QVariant>("result"); // with the total afterwards for a method without result
        const CallType call = CallType::Method;
        QTest::newRow("text to int") << u"Add"_qs << QVariantList {u"40"_qs, 2} << call << true << QVariant(42);
        QTest::newRow("text that is no number")
            << u"Add"_qs << QVariantList {u"x"_qs, 2} << call << false << QVariant();
        QTest::newRow("void method") << u"Reset"_qs << QVariantList {} << call << true << QVariant(0);
        QTest::newRow("QObject's own slot") << u"deleteLater"_qs << QVariantList {} << call << false << QVariant();
        QTest::newRow("get") << u"total"_qs << QVariantList {} << CallType::Get << true << QVariant(7);
        QTest::newRow("let") << u"Total"_qs << QVariantList {12} << CallType::Let << true << QVariant(12);
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

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
#include "tst_componentregistry.moc"
