#include "store/SettingsStore.h"

#include "TestEnvironment.h"

#include <QtTest>

using namespace Brimvault;

class TestSettingsStore : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void keysIgnoreCase();
};

void TestSettingsStore::keysIgnoreCase()
{
    TestEnvironment env;
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("Count"), QStringLiteral("3")));
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("files"), QStringLiteral("COUNT")), QStringLiteral("3"));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("FILES"), QStringLiteral("count"), QStringLiteral("4")));
    QCOMPARE(GetAllSettings(AppTitle(), QStringLiteral("Files")).size(), 1);
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("Count")), QStringLiteral("4"));
}

QTEST_GUILESS_MAIN(TestSettingsStore)
#include "tst_settingsstore.moc"
