#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/GameEntry.h"
#include "catalogue/ListBuilder.h"
#include "i18n/modLocalizer.h"

#include "CatalogueFiles.h"
#include "CatalogueIcon.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QtTest>

using namespace Brimvault;

// Games unpacked from archives made on Windows spell the system's own files any way; they are found alike.
class TestSideFiles : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { modLocalizer::UseBuiltInLanguage(); }
    void init();
    void cleanup() { m_env.reset(); }
    void stopMarkInAnyCase_data();
    void stopMarkInAnyCase();
    void infoFileAndIconInAnyCase();

private:
    QList<GameEntry> discover();
    QString games(const QString& relative) const
    {
        return m_env->path(QStringLiteral("commonappdata/Brimvault/") + relative);
    }

    std::unique_ptr<TestEnvironment> m_env;
};

void TestSideFiles::init()
{
    m_env = std::make_unique<TestEnvironment>();
    QDir(m_env->root()).mkpath(QStringLiteral("program"));
    qputenv("BRIMVAULT_PROGRAM_DIR", m_env->path(QStringLiteral("program")).toLocal8Bit());
}

QList<GameEntry> TestSideFiles::discover()
{
    const CatalogueLocations locations = CatalogueLocations::fromSystem();
    ListBuilder builder(locations.iconsFolder);
    GameDiscovery discovery(builder, locations);
    QList<GameEntry> entries;
    DiscoveryHooks hooks;
    hooks.addItem = [&entries](const GameEntry& entry) { entries.append(entry); };
    discovery.Run(hooks);
    return entries;
}

void TestSideFiles::stopMarkInAnyCase_data()
{
    QTest::addColumn<QString>("mark");
    QTest::newRow("lower case") << QStringLiteral("dirinfo.bvxinf");
    QTest::newRow("upper case") << QStringLiteral("DIRINFO.BVXINF");
}

void TestSideFiles::stopMarkInAnyCase()
{
    QFETCH(QString, mark);
    QVERIFY(WriteFile(games(QStringLiteral("Tools/tools.exe"))));
    QVERIFY(WriteFile(games(QStringLiteral("Tools/below/hidden.exe"))));
    QVERIFY(
        WriteInfoFile(games(QStringLiteral("Tools/") + mark), {{QStringLiteral("StopDir"), QStringLiteral("Yes")}}));
    const QList<GameEntry> entries = discover();
    QCOMPARE(entries.size(), 2);
    QCOMPARE(entries.at(1).path, games(QStringLiteral("Tools/tools.exe")));
}

void TestSideFiles::infoFileAndIconInAnyCase()
{
    const QByteArray icon = ValidIconFile();
    REQUIRE_FIXTURE(!icon.isEmpty(), "the icon fixture multi64.exe");
    QVERIFY(WriteFile(games(QStringLiteral("Chess/game.exe"))));
    QVERIFY(
        WriteInfoFile(games(QStringLiteral("Chess/GAME.BVXINF")), {{QStringLiteral("Name"), QStringLiteral("Chess")}}));
    QVERIFY(WriteFile(games(QStringLiteral("Chess/Game.ICO")), icon));

    const QList<GameEntry> entries = discover();
    QCOMPARE(entries.size(), 2);
    QCOMPARE(entries.at(1).caption, QStringLiteral("Chess"));
    QCOMPARE(entries.at(1).source, IconSource::File);
    QCOMPARE(entries.at(1).iconFile, games(QStringLiteral("Chess/Game.ICO")));
}

BV_REGISTER_TEST(TestSideFiles);
#include "tst_sidefiles.moc"
