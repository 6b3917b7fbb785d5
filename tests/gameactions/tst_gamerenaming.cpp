#include "gameactions/GameRenaming.h"

#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/SettingsStore.h"

#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestGameRenaming : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<PromptRecorder> m_prompts;

    static QString nameOf(const QString& key)
    {
        return GetSetting(AppTitle(), CatalogueKeys::FilesNamesSection, key, u"<none>"_s);
    }
    std::optional<QString> rename(const QString& caption, const QString& path, const QString& answer)
    {
        m_prompts->inputText = answer;
        return AskAndRenameGame(caption, path);
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_prompts = std::make_unique<PromptRecorder>();
    }
    void cleanup()
    {
        m_prompts.reset();
        m_env.reset();
    }

    // The first entry of the path (matched trimmed, in any case) takes the name; a later duplicate does not.
    void addedGameKeepsItsNumber()
    {
        CatalogueStore::AddGame(u"/games/a.exe"_s);
        CatalogueStore::AddGame(u" /Games/Tetra/tetra.swf "_s);
        CatalogueStore::AddGame(u"/games/tetra/TETRA.SWF"_s);
        QCOMPARE(rename(u"  Tetra  "_s, u"/games/tetra/tetra.swf"_s, u"Falling Blocks"_s),
            std::optional<QString>(u"Falling Blocks"_s));
        QCOMPARE(m_prompts->inputs.size(), 1);
        QCOMPARE(m_prompts->inputs.first().prompt, u"Edit game name"_s);
        QCOMPARE(m_prompts->inputs.first().title, u"Brimvault"_s);
        QCOMPARE(m_prompts->inputs.first().defaultText, u"Tetra"_s);
        QCOMPARE(nameOf(u"FileName2"_s), u"Falling Blocks"_s);
        QCOMPARE(nameOf(u"FileName3"_s), u"<none>"_s);
        QCOMPARE(CatalogueStore::EntryCount(), 3);
    }

    // A discovered game becomes an added one under its upper-cased path; renaming it again finds that entry.
    void discoveredGameIsRecordedAsAdded()
    {
        const QString windowsGame = u"/windows/system32/sol.exe"_s;
        QVERIFY(rename(u"Solitaire"_s, windowsGame, u"Patience"_s).has_value());
        QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::FilesSection, u"File1"_s), u"/WINDOWS/SYSTEM32/SOL.EXE"_s);
        QCOMPARE(nameOf(u"FileName1"_s), u"Patience"_s);
        QVERIFY(rename(u"Patience"_s, windowsGame, u"Klondike"_s).has_value());
        QCOMPARE(CatalogueStore::EntryCount(), 1);
        QCOMPARE(nameOf(u"FileName1"_s), u"Klondike"_s);
    }

    void nothingChanges_data()
    {
        QTest::addColumn<QString>("item");
        QTest::addColumn<std::optional<QString>>("answer");
        QTest::addColumn<int>("questions");
        QTest::newRow("cancel") << u"/games/x.exe"_s << std::optional<QString>() << 1;
        QTest::newRow("empty answer") << u"/games/x.exe"_s << std::optional<QString>(QString()) << 1;
        QTest::newRow("web entry") << u"http://127.0.0.1:9/online-games-catalog.asp"_s << std::optional(u"Web"_s) << 0;
        QTest::newRow("web entry, blanks and case") << u"  Https://127.0.0.1:9/"_s << std::optional(u"Web"_s) << 0;
    }
    void nothingChanges()
    {
        QFETCH(QString, item);
        QFETCH(std::optional<QString>, answer);
        m_prompts->inputText = answer;
        QVERIFY(!AskAndRenameGame(u"Caption"_s, item).has_value());
        QTEST(int(m_prompts->inputs.size()), "questions");
        QVERIFY(GetAllSettings(AppTitle(), CatalogueKeys::FilesSection).isEmpty());
        QVERIFY(GetAllSettings(AppTitle(), CatalogueKeys::FilesNamesSection).isEmpty());
    }
};
BV_REGISTER_TEST(TestGameRenaming);
#include "tst_gamerenaming.moc"
