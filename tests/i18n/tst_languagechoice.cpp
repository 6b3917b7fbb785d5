#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include "LanguageFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QLocale>
#include <QTest>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

namespace {

// The stored choice as "LngFileName LngNik".
QString storedChoice()
{
    return GetSetting(AppTitle(), u"LocaleSettings"_qs, u"LngFileName"_qs) + u' '
        + GetSetting(AppTitle(), u"LocaleSettings"_qs, u"LngNik"_qs);
}

void storeChoice(const QString& fileName, const QString& shortName)
{
    if (!fileName.isEmpty())
        SaveSetting(AppTitle(), u"LocaleSettings"_qs, u"LngFileName"_qs, fileName);
    if (!shortName.isEmpty())
        SaveSetting(AppTitle(), u"LocaleSettings"_qs, u"LngNik"_qs, shortName);
}

} // namespace

class tst_LanguageChoice : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = m_env->programDir();
        UseBuiltInLanguage();
    }
    void cleanup() { m_env.reset(); }

    // Beside the program: Russian (204) and Polish (238); one level up, a Polish file that a stored name must
    // not reach.
    void startUpChoice_data()
    {
        QTest::addColumn<QString>("stored"); // "LngFileName LngNik", either may be empty
        QTest::addColumn<QByteArray>("locale");
        QTest::addColumn<QString>("extraFile"); // "name:charset", "name:charset:repeated" is unusable
        QTest::addColumn<QString>("language");
        QTest::addColumn<QString>("shortName");
        QTest::addColumn<QString>("storedAfter");
        const QString english = u"English (Default)"_qs;
        QTest::newRow("stored choice, short name derived")
            << u"Brimvault_Polish.lng "_qs << "ru_RU"_qba << QString() << u"Polish"_qs << u"POLISH"_qs
            << u"Brimvault_Polish.lng "_qs;
        QTest::newRow("stored short name kept") << u"Brimvault_Polish.lng PL"_qs << "ru_RU"_qba << QString()
                                                << u"Polish"_qs << u"PL"_qs << u"Brimvault_Polish.lng PL"_qs;
        QTest::newRow("stored name, other letter case") << u"BRIMVAULT_POLISH.LNG "_qs << "ru_RU"_qba << QString()
                                                        << u"Polish"_qs << u"POLISH"_qs << u"BRIMVAULT_POLISH.LNG "_qs;
        QTest::newRow("stored file missing") << u"Brimvault_Klingon.lng KLINGON"_qs << "ru_RU"_qba << QString()
                                             << english << u"ENG"_qs << u"Brimvault_Klingon.lng KLINGON"_qs;
        QTest::newRow("stored file outside program folder")
            << u"../Brimvault_Polish.lng "_qs << "ru_RU"_qba << QString() << u"Polish"_qs << u"POLISH"_qs
            << u"../Brimvault_Polish.lng "_qs;
        QTest::newRow("stored built-in language, matching file picked")
            << english + u" ENG"_qs << "ru_RU"_qba << QString() << u"Russian"_qs << u"RUSSIAN"_qs
            << u"Brimvault_Russian.lng RUSSIAN"_qs;
        QTest::newRow("no choice, Polish system") << QString() << "pl_PL"_qba << QString() << u"Polish"_qs
                                                  << u"POLISH"_qs << u"Brimvault_Polish.lng POLISH"_qs;
        QTest::newRow("no choice, Western system")
            << QString() << "en_US"_qba << QString() << english << u"ENG"_qs << english + u" ENG"_qs;
        QTest::newRow("no match keeps a stored short name")
            << u" OLD"_qs << "el_GR"_qba << QString() << english << u"ENG"_qs << english + u" OLD"_qs;
        QTest::newRow("first matching file by name")
            << QString() << "uk_UA"_qba << u"Brimvault_Belarusian.lng:204"_qs << u"Brimvault_Belarusian.lng"_qs
            << u"BELARUSIAN"_qs << u"Brimvault_Belarusian.lng BELARUSIAN"_qs;
        QTest::newRow("unusable matching file passed over")
            << QString() << "ru_RU"_qba << u"Brimvault_Broken.lng:204:repeated"_qs << u"Russian"_qs << u"RUSSIAN"_qs
            << u"Brimvault_Russian.lng RUSSIAN"_qs;
    }
    void startUpChoice()
    {
        QFETCH(QString, stored);
        QFETCH(QByteArray, locale);
        QFETCH(QString, extraFile);
        QFETCH(QString, language);
        QFETCH(QString, shortName);
        QFETCH(QString, storedAfter);
        WriteLanguageFile(m_program, u"Brimvault_Russian.lng"_qs, "Russian", 204);
        WriteLanguageFile(m_program, u"Brimvault_Polish.lng"_qs, "Polish", 238);
        WriteLanguageFile(m_env->root(), u"Brimvault_Polish.lng"_qs, "Outside", 238);
        if (!extraFile.isEmpty()) {
            const QString name = extraFile.section(u':', 0, 0);
            WriteLanguageFile(m_program, name, name.toUtf8(), extraFile.section(u':', 1, 1).toInt(),
                extraFile.endsWith(u"repeated") ? "@1=a\r\n@1=b\r\n" : "@1=a\r\n");
        }
        storeChoice(stored.section(u' ', 0, -2), stored.section(u' ', -1));
        m_env->setLocale(locale);
        InitLocalizer();
        QCOMPARE(LanguageName(), language);
        QCOMPARE(ShortLanguageName(), shortName);
        QCOMPARE(UsesBuiltInTexts(), language == u"English (Default)");
        QCOMPARE(storedChoice(), storedAfter);
    }

    void noFilesNoChoice()
    {
        m_env->setLocale("ru_RU");
        InitLocalizer();
        QVERIFY(UsesBuiltInTexts());
        QCOMPARE(storedChoice(), u"English (Default) ENG"_qs);
    }

    void chooseLanguageFile_data()
    {
        QTest::addColumn<QString>("fileName"); // empty: the built-in language
        QTest::addColumn<QString>("storedAfter");
        QTest::addColumn<QString>("language");
        QTest::newRow("prefix in another case")
            << u"BRIMVAULT_russian.LNG"_qs << u"BRIMVAULT_russian.LNG RUSSIAN"_qs << u"Russian"_qs;
        QTest::newRow("built-in") << QString() << u"English (Default) ENG"_qs << u"English (Default)"_qs;
        QTest::newRow("unusable file") << u"Brimvault_Broken.lng"_qs << u"Brimvault_Broken.lng BROKEN"_qs
                                       << u"English (Default)"_qs;
    }
    void chooseLanguageFile()
    {
        QFETCH(QString, fileName);
        QFETCH(QString, storedAfter);
        QFETCH(QString, language);
        // Start from another language so that every value has to change.
        ChooseLanguageFile(WriteLanguageFile(m_program, u"Brimvault_Polish.lng"_qs, "Polish", 238));
        QCOMPARE(storedChoice(), u"Brimvault_Polish.lng POLISH"_qs);
        ChooseLanguageFile(fileName.isEmpty()
                ? QString()
                : WriteLanguageFile(m_program, fileName, "Russian", fileName.contains(u"Broken") ? 0 : 204));
        QCOMPARE(storedChoice(), storedAfter);
        QCOMPARE(LanguageName(), language);
        QCOMPARE(ShortLanguageName(), UsesBuiltInTexts() ? u"ENG"_qs : storedAfter.section(u' ', -1));
    }

    void shortNames()
    {
        QCOMPARE(ShortNameFromFileName(u"brimVAULT_Polish.LNG"_qs), u"POLISH"_qs);
        QCOMPARE(ShortNameFromFileName(u"Deutsch.lng"_qs), u"DEUTSCH"_qs);
        QCOMPARE(ShortNameFromFileName(u"My_Brimvault_Lang.lng"_qs), u"MY_LANG"_qs);
        QCOMPARE(ShortNameFromFileName(u"BrimvaultRu.lng"_qs), u"BRIMVAULTRU"_qs);
    }

    void listLanguageFiles()
    {
        QVERIFY(ListLanguageFiles().isEmpty());
        WriteLanguageFile(m_program, u"b_second.lng"_qs, "Second", 238);
        WriteLanguageFile(m_program, u"A_first.LNG"_qs, "First", 204);
        WriteLanguageFile(m_program, u"c_third.lng"_qs, "Third", 161);
        WriteLanguageFile(m_program, u"not_a_language.txt"_qs, "Text", 204);
        WriteLanguageFile(m_program, u"broken.lng"_qs, "Broken", 0);
        QVERIFY(QDir(m_program).mkdir(u"folder.lng"_qs));
        QStringList files;
        for (const LanguageFileInfo& file : ListLanguageFiles())
            files.append(file.fileName + u' ' + file.languageName + u' ' + QString::number(file.charset));
        QCOMPARE(files,
            (QStringList {u"A_first.LNG First 204"_qs, u"b_second.lng Second 238"_qs, u"c_third.lng Third 161"_qs}));
        // Listing reads the files but leaves the language in force alone.
        QVERIFY(UsesBuiltInTexts());
    }

    void systemCharset_data()
    {
        QTest::addColumn<QByteArray>("locale");
        QTest::addColumn<int>("charset");
        const QList<QPair<const char*, int>> locales {{"ru_RU.UTF-8", 204}, {"uk_UA", 204}, {"be_BY", 204},
            {"bg_BG", 204}, {"sr_RS", 204}, {"sr_Latn_RS", 238}, {"pl_PL", 238}, {"cs_CZ", 238}, {"hu_HU", 238},
            {"hr_HR", 238}, {"el_GR", 161}, {"tr_TR", 162}, {"lt_LT", 186}, {"lv_LV", 186}, {"he_IL", 177},
            {"ar_EG", 178}, {"fa_IR", 178}, {"vi_VN", 163}, {"th_TH", 222}, {"ja_JP", 128}, {"ko_KR", 129},
            {"zh_CN", 134}, {"zh_TW", 136}, {"en_US", 0}, {"de_DE", 0}, {"C", 0}};
        for (const auto& [locale, charset] : locales)
            QTest::newRow(locale) << QByteArray(locale) << charset;
    }
    void systemCharset()
    {
        QFETCH(QByteArray, locale);
        QFETCH(int, charset);
        m_env->setLocale(locale);
        QCOMPARE(int(GetSystemCharset()), charset);
    }

    // Without the environment variable the default locale decides.
    void systemCharsetFollowsDefaultLocale()
    {
        qunsetenv("BRIMVAULT_LOCALE");
        QLocale::setDefault(QLocale(QLocale::Bulgarian, QLocale::Bulgaria));
        QCOMPARE(int(GetSystemCharset()), 204);
        QLocale::setDefault(QLocale(QLocale::Greek, QLocale::Greece));
        QCOMPARE(int(GetSystemCharset()), 161);
        QLocale::setDefault(QLocale::system());
    }

private:
    std::unique_ptr<TestEnvironment> m_env;
    QString m_program;
};

BV_REGISTER_TEST(tst_LanguageChoice);
#include "tst_languagechoice.moc"
