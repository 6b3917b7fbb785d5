#include "gameactions/ItemMenuDelay.h"
#include "gameactions/ServiceSignal.h"

#include "TestEnvironment.h"
#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <QElapsedTimer>
#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;

class tst_Timers : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void newGameInstalled_data();
    void newGameInstalled();
    void watcherPollsEveryThreeSeconds();
    void rightClickOpensMenuOnceAfterDelay();
    void otherButtonsDoNothing_data();
    void otherButtonsDoNothing();

private:
    QString signalValue() const
    {
        return GetSetting(
            AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, QStringLiteral("<none>"));
    }

    std::unique_ptr<TestEnvironment> m_env;
};

void tst_Timers::init()
{
    m_env = std::make_unique<TestEnvironment>();
}

void tst_Timers::cleanup()
{
    m_env.reset();
}

void tst_Timers::newGameInstalled_data()
{
    QTest::addColumn<QString>("stored"); // null: no value at all
    QTest::addColumn<bool>("rebuild");
    QTest::addColumn<QString>("afterwards");

    QTest::newRow("1") << QStringLiteral("1") << true << QStringLiteral("0");
    QTest::newRow("0") << QStringLiteral("0") << false << QStringLiteral("0");
    QTest::newRow("missing") << QString() << false << QStringLiteral("<none>");
    QTest::newRow("2") << QStringLiteral("2") << false << QStringLiteral("2");
    QTest::newRow("blank before 1") << QStringLiteral(" 1") << false << QStringLiteral(" 1");
    QTest::newRow("1 and blank") << QStringLiteral("1 ") << false << QStringLiteral("1 ");
    QTest::newRow("yes") << QStringLiteral("yes") << false << QStringLiteral("yes");
    QTest::newRow("01") << QStringLiteral("01") << false << QStringLiteral("01");
}

void tst_Timers::newGameInstalled()
{
    QFETCH(QString, stored);
    QFETCH(bool, rebuild);
    QFETCH(QString, afterwards);
    if (!stored.isNull())
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, stored));

    QCOMPARE(TakeNewGameInstalledSignal(), rebuild);
    QCOMPARE(signalValue(), afterwards);
    // The signal is taken once.
    QVERIFY(!TakeNewGameInstalledSignal());
}

void tst_Timers::watcherPollsEveryThreeSeconds()
{
    ServiceSignalWatcher watcher;
    QSignalSpy rebuilds(&watcher, &ServiceSignalWatcher::rebuildRequested);
    QElapsedTimer clock;
    clock.start();
    // Written by the key's other spelling, as another process might.
    QVERIFY(
        SaveSetting(AppTitle(), QStringLiteral("COMMANDS"), QStringLiteral("newgameinstalled"), QStringLiteral("1")));

    QTRY_COMPARE_WITH_TIMEOUT(rebuilds.count(), 1, 6000);
    // Coarse timers may tick up to 5% early.
    QVERIFY(clock.elapsed() >= ServiceSignalWatcher::PollIntervalMs * 9 / 10);
    QCOMPARE(signalValue(), QStringLiteral("0"));

    watcher.poll();
    QCOMPARE(rebuilds.count(), 1);
}

void tst_Timers::rightClickOpensMenuOnceAfterDelay()
{
    ItemMenuDelay delay;
    QSignalSpy menus(&delay, &ItemMenuDelay::showItemMenu);
    QElapsedTimer clock;
    clock.start();
    delay.mouseButtonPressed(ItemMenuDelay::RightButton);
    QVERIFY(delay.isPending());
    delay.mouseButtonPressed(ItemMenuDelay::RightButton);
    QCOMPARE(menus.count(), 0);

    QTRY_COMPARE(menus.count(), 1);
    QVERIFY(clock.elapsed() >= ItemMenuDelay::DelayMs - 5);
    QVERIFY(!delay.isPending());
    QTest::qWait(3 * ItemMenuDelay::DelayMs);
    QCOMPARE(menus.count(), 1);

    delay.mouseButtonPressed(ItemMenuDelay::RightButton);
    QTRY_COMPARE(menus.count(), 2);
}

void tst_Timers::otherButtonsDoNothing_data()
{
    QTest::addColumn<int>("button");
    QTest::newRow("left") << 1;
    QTest::newRow("middle") << 4;
    QTest::newRow("none") << 0;
}

void tst_Timers::otherButtonsDoNothing()
{
    QFETCH(int, button);
    ItemMenuDelay delay;
    QSignalSpy menus(&delay, &ItemMenuDelay::showItemMenu);
    delay.mouseButtonPressed(button);
    QVERIFY(!delay.isPending());
    QTest::qWait(3 * ItemMenuDelay::DelayMs);
    QCOMPARE(menus.count(), 0);
}

QTEST_GUILESS_MAIN(tst_Timers)
#include "tst_timers.moc"
