#include "gameactions/ItemMenuDelay.h"
#include "gameactions/ServiceSignal.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestSuite.h"

#include <QElapsedTimer>
#include <QSignalSpy>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestTimers : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    static QString signalValue()
    {
        return GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, u"<none>"_s);
    }

private Q_SLOTS:
    void init() { m_env = std::make_unique<TestEnvironment>(); }
    void cleanup() { m_env.reset(); }

    // Only the exact text "1" is the signal; it is taken once, by writing "0".
    void newGameInstalled_data()
    {
        QTest::addColumn<QString>("stored"); // null: no value at all
        QTest::addColumn<bool>("rebuild");
        QTest::addColumn<QString>("afterwards");
        QTest::newRow("1") << u"1"_s << true << u"0"_s;
        QTest::newRow("0") << u"0"_s << false << u"0"_s;
        QTest::newRow("missing") << QString() << false << u"<none>"_s;
        QTest::newRow("2") << u"2"_s << false << u"2"_s;
        QTest::newRow("blank before 1") << u" 1"_s << false << u" 1"_s;
        QTest::newRow("1 and blank") << u"1 "_s << false << u"1 "_s;
        QTest::newRow("01") << u"01"_s << false << u"01"_s;
    }
    void newGameInstalled()
    {
        QFETCH(QString, stored);
        if (!stored.isNull())
            QVERIFY(
                SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey, stored));
        QTEST(TakeNewGameInstalledSignal(), "rebuild");
        QTEST(signalValue(), "afterwards");
        QVERIFY(!TakeNewGameInstalledSignal());
    }

    void watcherPollsEveryThreeSeconds()
    {
        ServiceSignalWatcher watcher;
        QSignalSpy rebuilds(&watcher, &ServiceSignalWatcher::rebuildRequested);
        QElapsedTimer clock;
        clock.start();
        // Written by the key's other spelling, as another process might.
        QVERIFY(SaveSetting(AppTitle(), u"COMMANDS"_s, u"newgameinstalled"_s, u"1"_s));
        QTRY_COMPARE_WITH_TIMEOUT(rebuilds.count(), 1, 6000);
        // Coarse timers may tick up to 5% early.
        QVERIFY(clock.elapsed() >= 2700);
        QCOMPARE(signalValue(), u"0"_s);
        watcher.poll();
        QCOMPARE(rebuilds.count(), 1);
    }

    // The right button (2) opens the menu once, 60 ms later; other buttons do nothing.
    void itemMenuDelay_data()
    {
        QTest::addColumn<int>("button");
        QTest::addColumn<int>("menus");
        QTest::newRow("right") << 2 << 1;
        QTest::newRow("left") << 1 << 0;
        QTest::newRow("middle") << 4 << 0;
        QTest::newRow("none") << 0 << 0;
    }
    void itemMenuDelay()
    {
        QFETCH(int, button);
        QFETCH(int, menus);
        ItemMenuDelay delay;
        QSignalSpy shown(&delay, &ItemMenuDelay::showItemMenu);
        QElapsedTimer clock;
        clock.start();
        delay.mouseButtonPressed(button);
        QCOMPARE(delay.isPending(), menus == 1);
        delay.mouseButtonPressed(button);
        QCOMPARE(shown.count(), 0);
        QTest::qWait(180);
        QCOMPARE(shown.count(), menus);
        QVERIFY(!delay.isPending());
        if (menus == 0)
            return;
        QSignalSpy again(&delay, &ItemMenuDelay::showItemMenu);
        clock.restart();
        delay.mouseButtonPressed(button);
        QTRY_COMPARE(again.count(), 1);
        QVERIFY(clock.elapsed() >= 55);
    }
};
BV_REGISTER_TEST(TestTimers);
#include "tst_timers.moc"
