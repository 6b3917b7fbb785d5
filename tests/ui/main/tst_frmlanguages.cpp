// The language dialog driven as the user drives it, with the real language files in a program folder.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "support/UserPrompt.h"

#include <QComboBox>
#include <QLabel>
#include <QPushButton>
#include <QTest>

using namespace Brimvault;

namespace {

QString localeSetting(const QString& key)
{
    return GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), key);
}

QString russianName()
{
    return QString::fromUtf8("Русский");
}

// Opens the dialog, lets act choose, and returns what exec answered.
int runDialog(const std::function<void(frmLanguages*)>& act)
{
    frmLanguages dialog;
    WhenModalShows([&](QWidget* modal) { act(qobject_cast<frmLanguages*>(modal)); });
    return dialog.exec();
}

} // namespace

class TestFrmLanguages : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    QList<PromptRequest> m_prompts;

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_prompts.clear();
        SetPromptHandler([this](const PromptRequest& request) {
            m_prompts.append(request);
            return PromptAnswer::Ok;
        });
        modLocalizer::UseBuiltInLanguage();
    }
    void cleanup()
    {
        SetPromptHandler({});
        modLocalizer::UseBuiltInLanguage();
        m_env.reset();
    }

    void withoutLanguageFilesOnlyTheMessageShows()
    {
        ProgramFolderFixture program(false);
        frmLanguages dialog;
        QCOMPARE(dialog.exec(), int(QDialog::Rejected));
        QCOMPARE(m_prompts.size(), 1);
        QCOMPARE(m_prompts.first().text, QStringLiteral("Language files not found"));
        QCOMPARE(m_prompts.first().title, QStringLiteral("Brimvault"));
        QCOMPARE(m_prompts.first().icon, PromptIcon::Exclamation);
        QVERIFY(!dialog.isVisible());
        QVERIFY(localeSetting(QStringLiteral("LngFileName")).isEmpty());
        QVERIFY(modLocalizer::UsesBuiltInTexts());
    }

    void listsTheBuiltInLanguageAndEveryFile()
    {
        ProgramFolderFixture program(true);
        QStringList names;
        QList<int> itemData;
        QFont font;
        runDialog([&](frmLanguages* dialog) {
            for (int i = 0; i < dialog->cbLanguages()->count(); ++i) {
                names << dialog->cbLanguages()->itemText(i);
                itemData << dialog->cbLanguages()->itemData(i).toInt();
            }
            font = dialog->font();
            dialog->cmdCancel()->click();
        });
        QCOMPARE(names, QStringList({QStringLiteral("English (Default)"), QStringLiteral("Polski"), russianName()}));
        QCOMPARE(itemData, QList<int>({0, 1, 2}));
        QCOMPARE(font.families().value(0), QStringLiteral("Verdana"));
        QVERIFY(m_prompts.isEmpty());
    }

    void preselectsTheLanguageInForce_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<int>("selected");
        QTest::newRow("nothing stored") << QString() << 0;
        QTest::newRow("built-in language") << "English (Default)" << 0;
        QTest::newRow("Russian") << "Brimvault_Russian.lng" << 2;
        QTest::newRow("other letter case") << "brimvault_polish.LNG" << 1;
        QTest::newRow("file no longer there") << "Brimvault_German.lng" << 0;
    }
    void preselectsTheLanguageInForce()
    {
        QFETCH(QString, stored);
        QFETCH(int, selected);
        ProgramFolderFixture program(true);
        if (!stored.isNull())
            SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"), stored);
        int shown = -1;
        runDialog([&](frmLanguages* dialog) {
            shown = dialog->cbLanguages()->currentIndex();
            dialog->cmdCancel()->click();
        });
        QCOMPARE(shown, selected);
    }

    void okSwitchesTheProgramAndCancelChangesNothing()
    {
        ProgramFolderFixture program(true);
        QCOMPARE(runDialog([](frmLanguages* dialog) {
            dialog->cbLanguages()->setCurrentIndex(2);
            dialog->cmdCancel()->click();
        }),
            int(QDialog::Rejected));
        QVERIFY(modLocalizer::UsesBuiltInTexts());
        QVERIFY(localeSetting(QStringLiteral("LngFileName")).isEmpty());

        QCOMPARE(runDialog([](frmLanguages* dialog) {
            dialog->cbLanguages()->setCurrentIndex(2);
            QTest::mouseClick(dialog->cmdOK(), Qt::LeftButton);
        }),
            int(QDialog::Accepted));
        QCOMPARE(localeSetting(QStringLiteral("LngFileName")), QStringLiteral("Brimvault_Russian.lng"));
        QCOMPARE(localeSetting(QStringLiteral("LngNik")), QStringLiteral("RUSSIAN"));
        QCOMPARE(modLocalizer::LanguageName(), russianName());

        // Opened again, the dialog speaks the language in force.
        QStringList captions;
        runDialog([&](frmLanguages* dialog) {
            captions << dialog->windowTitle() << dialog->labLanguages()->text() << dialog->cmdOK()->text()
                     << dialog->cmdCancel()->text();
            dialog->cbLanguages()->setCurrentIndex(0);
            dialog->cmdOK()->click();
        });
        QCOMPARE(captions,
            QStringList({QString::fromUtf8("Язык программы"), QString::fromUtf8("Пожалуйста, выберите язык:"),
                QStringLiteral("OK"), QString::fromUtf8("Отмена")}));

        // English (Default) returns to the built-in texts.
        QVERIFY(modLocalizer::UsesBuiltInTexts());
        QCOMPARE(localeSetting(QStringLiteral("LngFileName")), QStringLiteral("English (Default)"));
        QCOMPARE(localeSetting(QStringLiteral("LngNik")), QStringLiteral("ENG"));
        frmLanguages english;
        QCOMPARE(english.windowTitle(), QStringLiteral("Program language"));
        QCOMPARE(english.labLanguages()->text(), QStringLiteral("Please, select the language:"));
    }
};

QTEST_MAIN(TestFrmLanguages)
#include "tst_frmlanguages.moc"
