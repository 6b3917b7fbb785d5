#include "gameactions/GameRenaming.h"

#include "TestEnvironment.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"

#include <QTest>

using namespace Brimvault;

class tst_GameRenaming : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();
    void addedGameKeepsItsNumber();
    void discoveredGameIsRecordedAsAdded();
    void nothingChanges_data();
    void nothingChanges();

private:
    QString nameOf(const QString& fileNameKey) const
    {
        return GetSetting(AppTitle(), CatalogueKeys::FilesNamesSection, fileNameKey, QStringLiteral("<none>"));
    }

    std::unique_ptr<TestEnvironment> m_env;
    QList<InputRequest> m_questions;
    std::optional<QString> m_answer;
};

void tst_GameRenaming::init()
{
    m_env = std::make_unique<TestEnvironment>();
    m_questions.clear();
    m_answer = QStringLiteral("New Name");
    SetInputHandler([this](const InputRequest& request) {
        m_questions.append(request);
        return m_answer;
    });
}

void tst_GameRenaming::cleanup()
{
    SetInputHandler({});
    m_env.reset();
}

void tst_GameRenaming::addedGameKeepsItsNumber()
{
    CatalogueStore::AddGame(QStringLiteral("/games/a.exe"));
    const QString key = CatalogueStore::AddGame(QStringLiteral(" /Games/Tetra/tetra.swf "));
    CatalogueStore::AddGame(QStringLiteral("/games/tetra/TETRA.SWF")); // a later duplicate is not renamed

    m_answer = QStringLiteral("Falling Blocks");
    QCOMPARE(AskAndRenameGame(QStringLiteral("  Tetra  "), QStringLiteral("/games/tetra/tetra.swf")),
        std::optional<QString>(QStringLiteral("Falling Blocks")));

    QCOMPARE(m_questions.size(), 1);
    QCOMPARE(m_questions.first().prompt, QStringLiteral("Edit game name"));
    QCOMPARE(m_questions.first().title, QStringLiteral("Brimvault"));
    QCOMPARE(m_questions.first().defaultText, QStringLiteral("Tetra"));
    QCOMPARE(nameOf(CatalogueStore::DisplayNameKey(key)), QStringLiteral("Falling Blocks"));
    QCOMPARE(nameOf(QStringLiteral("FileName3")), QStringLiteral("<none>"));
    QCOMPARE(CatalogueStore::EntryCount(), 3);
    QCOMPARE(CatalogueStore::AddedGames().size(), 3);
}

void tst_GameRenaming::discoveredGameIsRecordedAsAdded()
{
    CatalogueStore::AddGame(QStringLiteral("/games/a.exe"));
    CatalogueStore::AddGame(QStringLiteral("/games/b.exe"));
    CatalogueStore::RemoveGame(QStringLiteral("File2"));
    const QString windowsGame = QStringLiteral("/windows/system32/sol.exe");

    m_answer = QStringLiteral("Patience");
    QCOMPARE(
        AskAndRenameGame(QStringLiteral("Solitaire"), windowsGame), std::optional<QString>(QStringLiteral("Patience")));

    // A new number after the highest given out, never a gap; the path as the list holds it, upper-cased.
    QCOMPARE(CatalogueStore::EntryCount(), 3);
    QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::FilesSection, QStringLiteral("File3")), windowsGame.toUpper());
    QCOMPARE(nameOf(QStringLiteral("FileName3")), QStringLiteral("Patience"));

    // Renaming it again finds the new entry instead of adding another one.
    m_answer = QStringLiteral("Klondike");
    QVERIFY(AskAndRenameGame(QStringLiteral("Patience"), windowsGame).has_value());
    QCOMPARE(CatalogueStore::EntryCount(), 3);
    QCOMPARE(nameOf(QStringLiteral("FileName3")), QStringLiteral("Klondike"));
}

void tst_GameRenaming::nothingChanges_data()
{
    QTest::addColumn<QString>("data");
    QTest::addColumn<std::optional<QString>>("answer");
    QTest::addColumn<int>("questions");

    QTest::newRow("cancel") << QStringLiteral("/games/x.exe") << std::optional<QString>() << 1;
    QTest::newRow("empty answer") << QStringLiteral("/games/x.exe") << std::optional<QString>(QString()) << 1;
    QTest::newRow("web entry") << QStringLiteral("http://127.0.0.1:9/online-games-catalog.asp")
                               << std::optional<QString>(QStringLiteral("Web")) << 0;
    QTest::newRow("web entry, blanks and case")
        << QStringLiteral("  Https://127.0.0.1:9/") << std::optional<QString>(QStringLiteral("Web")) << 0;
}

void tst_GameRenaming::nothingChanges()
{
    QFETCH(QString, data);
    QFETCH(std::optional<QString>, answer);
    QFETCH(int, questions);
    m_answer = answer;

    QVERIFY(!AskAndRenameGame(QStringLiteral("Caption"), data).has_value());
    QCOMPARE(m_questions.size(), questions);
    QVERIFY(GetAllSettings(AppTitle(), CatalogueKeys::FilesSection).isEmpty());
    QVERIFY(GetAllSettings(AppTitle(), CatalogueKeys::FilesNamesSection).isEmpty());
}

QTEST_GUILESS_MAIN(tst_GameRenaming)
#include "tst_gamerenaming.moc"
