#pragma once

#include <QApplication>
#include <QList>
#include <QTest>

#include <functional>
#include <memory>

// Several test classes in one executable: each file registers its class with BV_REGISTER_TEST, a one-line
// main runs them all in turn (one executable per folder links once instead of once per class). A first
// argument naming a class runs that class alone, with the usual Qt Test arguments after it.
using TestFactory = std::function<std::unique_ptr<QObject>()>;

inline QList<TestFactory>& RegisteredTests()
{
    static QList<TestFactory> tests;
    return tests;
}

#define BV_REGISTER_TEST(Class)                                                                                        \
    static const bool registered##Class                                                                                \
        = (RegisteredTests().append([] { return std::unique_ptr<QObject>(new Class); }), true)

inline int RunRegisteredTests(int argc, char** argv)
{
    QApplication app(argc, argv);
    const QByteArray only = argc > 1 ? QByteArray(argv[1]) : QByteArray();
    for (const TestFactory& make : RegisteredTests()) {
        const std::unique_ptr<QObject> test = make();
        if (only == test->metaObject()->className()) {
            argv[1] = argv[0];
            return QTest::qExec(test.get(), argc - 1, argv + 1);
        }
    }
    int failures = 0;
    for (const TestFactory& make : RegisteredTests()) {
        const std::unique_ptr<QObject> test = make();
        failures += QTest::qExec(test.get(), argc, argv);
    }
    return failures;
}
