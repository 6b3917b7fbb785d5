// The language dialog driven as the user drives it, with the real language files in a program folder.
#include "MainWindowFixture.h"
#include "PromptRecorder.h"
#include "TestEnvironment.h"
#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include <QComboBox>
#include <QLabel>
#include <QPushButton>
#include <QTest>

#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

QString localeSetting(const QString& key)
{
    return GetSetting(AppTitle(), u"LocaleSettings"_s, key);
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

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<PromptRecorder> m_prompts;

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_prompts = std::make_unique<PromptRecorder>();
        modLocalizer::UseBuiltInLanguage();
    }
    void cleanup()
    {
        m_prompts.reset();
        modLocalizer::UseBuiltInLanguage();
        m_env.reset();
    }

    void withoutLanguageFilesOnlyTheMessageShows()
    {
        ProgramFolderFixture program(false);
        frmLanguages dialog;
        QCOMPARE(dialog.exec(), int(QDialog::Rejected));
        QCOMPARE(m_prompts->texts(), QStringList {u"Language files not found"_s});
        QCOMPARE(m_prompts->prompts.first().title, u"Brimvault"_s);
        QCOMPARE(m_prompts->prompts.first().icon, PromptIcon::Exclamation);
        QVERIFY(!dialog.isVisible());
        QVERIFY(localeSetting(u"LngFileName"_s).isEmpty());
        QVERIFY(modLocalizer::UsesBuiltInTexts());
    }

    void preselectsTheLanguageInForce_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<int>("selected");
        QTest::newRow("nothing stored") << QString() << 0;
        QTest::newRow("built-in language") << u"English (Default)"_s << 0;
        QTest::newRow("Russian") << u"Brimvault_Russian.lng"_s << 2;
        QTest::newRow("other letter case") << u"brimvault_polish.LNG"_s << 1;
        QTest::newRow("file no longer there") << u"Brimvault_German.lng"_s << 0;
    }
    void preselectsTheLanguageInForce()
    {
        QFETCH(QString, stored);
        QFETCH(int, selected);
        ProgramFolderFixture program(true);
        if (!stored.isNull())
            SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, stored);
        // The built-in language first, then every language file by the name it gives itself.
        QStringList shown;
        runDialog([&](frmLanguages* dialog) {
            for (int i = 0; i < dialog->cbLanguages()->count(); ++i)
                shown << dialog->cbLanguages()->itemText(i);
            shown << QString::number(dialog->cbLanguages()->currentIndex()) << dialog->font().families().value(0);
            dialog->cmdCancel()->click();
        });
        QCOMPARE(shown,
            QStringList({u"English (Default)"_s, u"Polski"_s, u"Русский"_s, QString::number(selected), u"Verdana"_s}));
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
        QVERIFY(localeSetting(u"LngFileName"_s).isEmpty());

        QCOMPARE(runDialog([](frmLanguages* dialog) {
            dialog->cbLanguages()->setCurrentIndex(2);
            QTest::mouseClick(dialog->cmdOK(), Qt::LeftButton);
        }),
            int(QDialog::Accepted));
        QCOMPARE(localeSetting(u"LngFileName"_s), u"Brimvault_Russian.lng"_s);
        QCOMPARE(localeSetting(u"LngNik"_s), u"RUSSIAN"_s);
        QCOMPARE(modLocalizer::LanguageName(), u"Русский"_s);

        // Opened again, the dialog speaks the language in force.
        QStringList captions;
        runDialog([&](frmLanguages* dialog) {
            captions << dialog->windowTitle() << dialog->labLanguages()->text() << dialog->cmdOK()->text()
                     << dialog->cmdCancel()->text();
            dialog->cbLanguages()->setCurrentIndex(0);
            dialog->cmdOK()->click();
        });
        QCOMPARE(captions, QStringList({u"Язык программы"_s, u"Пожалуйста, выберите язык:"_s, u"OK"_s, u"Отмена"_s}));

        // English (Default) returns to the built-in texts.
        QVERIFY(modLocalizer::UsesBuiltInTexts());
        QCOMPARE(localeSetting(u"LngFileName"_s), u"English (Default)"_s);
        QCOMPARE(localeSetting(u"LngNik"_s), u"ENG"_s);
        frmLanguages english;
        QCOMPARE(english.windowTitle(), u"Program language"_s);
        QCOMPARE(english.labLanguages()->text(), u"Please, select the language:"_s);
    }
};

BV_REGISTER_TEST(TestFrmLanguages);
#include "tst_frmlanguages.moc"
