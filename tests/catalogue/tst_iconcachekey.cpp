#include "catalogue/IconCacheKey.h"

#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

// The sums use the code page of the system's character set; the expected keys were summed by hand from the
// code page tables (windows-1251: И = 0xC8, г = 0xE3, ...).
class TestIconCacheKey : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void cleanup() { qunsetenv("BRIMVAULT_LOCALE"); }
    void keyInTheLocalesCodePage_data();
    void keyInTheLocalesCodePage();
};

void TestIconCacheKey::keyInTheLocalesCodePage_data()
{
    QTest::addColumn<QByteArray>("locale");
    QTest::addColumn<QString>("path");
    QTest::addColumn<QString>("key");
    QTest::newRow("Russian, one game") << QByteArray("ru_RU") << QStringLiteral("/home/u/Игры/Пасьянс/game.exe")
                                       << QStringLiteral("GAME20232107");
    QTest::newRow("Russian, a second game")
        << QByteArray("ru_RU") << QStringLiteral("/home/u/Игры/Шахматы/game.exe") << QStringLiteral("GAME20122099");
    QTest::newRow("Polish") << QByteArray("pl_PL") << QStringLiteral("/home/u/Gry/Łódź/gra.exe")
                            << QStringLiteral("GRA11581272");
    QTest::newRow("French") << QByteArray("fr_FR") << QStringLiteral("/home/u/Jeux/Été/jeu.exe")
                            << QStringLiteral("JEU10441387");
}

void TestIconCacheKey::keyInTheLocalesCodePage()
{
    QFETCH(QByteArray, locale);
    QFETCH(QString, path);
    QFETCH(QString, key);
    qputenv("BRIMVAULT_LOCALE", locale);
    QCOMPARE(IconCacheKey(path), key);
}

BV_REGISTER_TEST(TestIconCacheKey);
#include "tst_iconcachekey.moc"
