#include "LocalizerTestFolder.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include <QLocale>
#include <QTest>
#include <memory>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

namespace {

QString StoredFileName()
{
    return GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"));
}

QString StoredShortName()
{
    return GetSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik"));
}

void StoreChoice(const QString& fileName, const QString& shortName)
{
    if (!fileName.isNull())
        SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"), fileName);
    if (!shortName.isNull())
        SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik"), shortName);
}

} // namespace

class tst_LanguageChoice : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();

    void startUpChoice_data();
    void startUpChoice();
    void chooseLanguageFileStoresTheChoice_data();
    void chooseLanguageFileStoresTheChoice();
    void shortNameFromFileName_data();
    void shortNameFromFileName();
    void listLanguageFiles();
    void systemCharset_data();
    void systemCharset();
    void systemCharsetFollowsDefaultLocale();

private:
    void writeStandardFiles() const;
    std::unique_ptr<LocalizerTestFolder> m_folder;
};

void tst_LanguageChoice::init()
{
    m_folder = std::make_unique<LocalizerTestFolder>();
    UseBuiltInLanguage();
}

void tst_LanguageChoice::cleanup()
{
    m_folder.reset();
    QLocale::setDefault(QLocale::system());
}

void tst_LanguageChoice::writeStandardFiles() const
{
    m_folder->writeLanguage(QStringLiteral("Brimvault_Russian.lng"), "Russian", 204, "@10=ru\r\n");
    m_folder->writeLanguage(QStringLiteral("Brimvault_Polish.lng"), "Polish", 238, "@10=pl\r\n");
}

void tst_LanguageChoice::startUpChoice_data()
{
    QTest::addColumn<QString>("storedFile"); // null: not stored
    QTest::addColumn<QString>("storedShort");
    QTest::addColumn<QByteArray>("locale");
    QTest::addColumn<QStringList>("extraFiles"); // "name:charset[:repeated]", beside Russian and Polish
    QTest::addColumn<bool>("standardFiles");
    QTest::addColumn<QString>("language");
    QTest::addColumn<QString>("shortName");
    QTest::addColumn<QString>("afterFile");
    QTest::addColumn<QString>("afterShort");

    const QString english = QStringLiteral("English (Default)");
    const QString eng = QStringLiteral("ENG");
    const QString none;

    QTest::newRow("stored choice loaded, short name derived")
        << QStringLiteral("Brimvault_Polish.lng") << none << QByteArray("ru_RU") << QStringList() << true
        << QStringLiteral("Polish") << QStringLiteral("POLISH") << QStringLiteral("Brimvault_Polish.lng") << none;
    QTest::newRow("stored short name kept")
        << QStringLiteral("Brimvault_Polish.lng") << QStringLiteral("PL") << QByteArray("ru_RU") << QStringList()
        << true << QStringLiteral("Polish") << QStringLiteral("PL") << QStringLiteral("Brimvault_Polish.lng")
        << QStringLiteral("PL");
    QTest::newRow("stored name in another letter case")
        << QStringLiteral("BRIMVAULT_POLISH.LNG") << none << QByteArray("ru_RU") << QStringList() << true
        << QStringLiteral("Polish") << QStringLiteral("POLISH") << QStringLiteral("BRIMVAULT_POLISH.LNG") << none;
    QTest::newRow("stored file missing") << QStringLiteral("Brimvault_Klingon.lng") << QStringLiteral("KLINGON")
                                         << QByteArray("ru_RU") << QStringList() << true << english << eng
                                         << QStringLiteral("Brimvault_Klingon.lng") << QStringLiteral("KLINGON");
    QTest::newRow("stored file outside program folder is not followed")
        << QStringLiteral("../Brimvault_Polish.lng") << none << QByteArray("ru_RU") << QStringList() << true
        << QStringLiteral("Polish") << QStringLiteral("POLISH") << QStringLiteral("../Brimvault_Polish.lng") << none;
    QTest::newRow("stored built-in language, matching file picked")
        << english << eng << QByteArray("ru_RU") << QStringList() << true << QStringLiteral("Russian")
        << QStringLiteral("RUSSIAN") << QStringLiteral("Brimvault_Russian.lng") << QStringLiteral("RUSSIAN");
    QTest::newRow("stored built-in language, no match")
        << english << eng << QByteArray("en_US") << QStringList() << true << english << eng << english << eng;
    QTest::newRow("no choice, Russian system")
        << none << none << QByteArray("ru_RU") << QStringList() << true << QStringLiteral("Russian")
        << QStringLiteral("RUSSIAN") << QStringLiteral("Brimvault_Russian.lng") << QStringLiteral("RUSSIAN");
    QTest::newRow("no choice, Polish system")
        << none << none << QByteArray("pl_PL") << QStringList() << true << QStringLiteral("Polish")
        << QStringLiteral("POLISH") << QStringLiteral("Brimvault_Polish.lng") << QStringLiteral("POLISH");
    QTest::newRow("no choice, Western system")
        << none << none << QByteArray("en_US") << QStringList() << true << english << eng << english << eng;
    QTest::newRow("no choice, no files") << none << none << QByteArray("ru_RU") << QStringList() << false << english
                                         << eng << english << eng;
    QTest::newRow("no match keeps a stored short name")
        << none << QStringLiteral("OLD") << QByteArray("el_GR") << QStringList() << true << english << eng << english
        << QStringLiteral("OLD");
    QTest::newRow("first matching file by name")
        << none << none << QByteArray("uk_UA") << QStringList {QStringLiteral("Brimvault_Belarusian.lng:204")} << true
        << QStringLiteral("Brimvault_Belarusian.lng") << QStringLiteral("BELARUSIAN")
        << QStringLiteral("Brimvault_Belarusian.lng") << QStringLiteral("BELARUSIAN");
    QTest::newRow("unusable matching file passed over")
        << none << none << QByteArray("ru_RU") << QStringList {QStringLiteral("Brimvault_Broken.lng:204:repeated")}
        << true << QStringLiteral("Russian") << QStringLiteral("RUSSIAN") << QStringLiteral("Brimvault_Russian.lng")
        << QStringLiteral("RUSSIAN");
}

void tst_LanguageChoice::startUpChoice()
{
    QFETCH(QString, storedFile);
    QFETCH(QString, storedShort);
    QFETCH(QByteArray, locale);
    QFETCH(QStringList, extraFiles);
    QFETCH(bool, standardFiles);
    QFETCH(QString, language);
    QFETCH(QString, shortName);
    QFETCH(QString, afterFile);
    QFETCH(QString, afterShort);

    if (standardFiles)
        writeStandardFiles();
    for (const QString& extra : extraFiles) {
        const QString name = extra.section(u':', 0, 0);
        const QByteArray texts = extra.section(u':', 2) == u"repeated" ? "@1=a\r\n@1=b\r\n" : "@1=a\r\n";
        m_folder->writeLanguage(name, name.toUtf8(), extra.section(u':', 1, 1).toInt(), texts);
    }
    // A language file one level up must not be reachable through a stored name.
    m_folder->writeLanguage(QStringLiteral("../Brimvault_Polish.lng"), "Outside", 238);
    StoreChoice(storedFile, storedShort);
    qputenv("BRIMVAULT_LOCALE", locale);

    InitLocalizer();
    QCOMPARE(LanguageName(), language);
    QCOMPARE(ShortLanguageName(), shortName);
    QCOMPARE(UsesBuiltInTexts(), language == QStringLiteral("English (Default)"));
    QCOMPARE(StoredFileName(), afterFile);
    QCOMPARE(StoredShortName(), afterShort);
}

void tst_LanguageChoice::chooseLanguageFileStoresTheChoice_data()
{
    QTest::addColumn<QString>("fileName"); // empty: the built-in language
    QTest::addColumn<QString>("storedShort");
    QTest::addColumn<QString>("language");

    QTest::newRow("Russian") << QStringLiteral("Brimvault_Russian.lng") << QStringLiteral("RUSSIAN")
                             << QStringLiteral("Russian");
    QTest::newRow("prefix in another case")
        << QStringLiteral("BRIMVAULT_russian.LNG") << QStringLiteral("RUSSIAN") << QStringLiteral("Russian");
    QTest::newRow("built-in") << QString() << QStringLiteral("ENG") << QStringLiteral("English (Default)");
    QTest::newRow("unusable file") << QStringLiteral("Brimvault_Broken.lng") << QStringLiteral("BROKEN")
                                   << QStringLiteral("English (Default)");
}

void tst_LanguageChoice::chooseLanguageFileStoresTheChoice()
{
    QFETCH(QString, fileName);
    QFETCH(QString, storedShort);
    QFETCH(QString, language);

    QString path;
    if (!fileName.isEmpty()) {
        path = fileName.contains(QStringLiteral("Broken"))
            ? m_folder->writeFile(fileName, "#language=Broken\r\n#charset=0\r\n")
            : m_folder->writeLanguage(fileName, "Russian", 204);
    }
    // Start from another language so that every value has to change.
    m_folder->writeLanguage(QStringLiteral("Brimvault_Polish.lng"), "Polish", 238);
    ChooseLanguageFile(m_folder->programDir() + QStringLiteral("/Brimvault_Polish.lng"));
    QCOMPARE(StoredFileName(), QStringLiteral("Brimvault_Polish.lng"));

    ChooseLanguageFile(path);
    QCOMPARE(StoredFileName(), fileName.isEmpty() ? QStringLiteral("English (Default)") : fileName);
    QCOMPARE(StoredShortName(), storedShort);
    QCOMPARE(LanguageName(), language);
    QCOMPARE(ShortLanguageName(), UsesBuiltInTexts() ? QStringLiteral("ENG") : storedShort);
}

void tst_LanguageChoice::shortNameFromFileName_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("shortName");

    QTest::newRow("usual") << QStringLiteral("Brimvault_Russian.lng") << QStringLiteral("RUSSIAN");
    QTest::newRow("any case") << QStringLiteral("brimVAULT_Polish.LNG") << QStringLiteral("POLISH");
    QTest::newRow("no prefix") << QStringLiteral("Deutsch.lng") << QStringLiteral("DEUTSCH");
    QTest::newRow("prefix inside") << QStringLiteral("My_Brimvault_Lang.lng") << QStringLiteral("MY_LANG");
    QTest::newRow("title without underscore kept")
        << QStringLiteral("BrimvaultRu.lng") << QStringLiteral("BRIMVAULTRU");
}

void tst_LanguageChoice::shortNameFromFileName()
{
    QFETCH(QString, fileName);
    QFETCH(QString, shortName);
    QCOMPARE(ShortNameFromFileName(fileName), shortName);
}

void tst_LanguageChoice::listLanguageFiles()
{
    QVERIFY(ListLanguageFiles().isEmpty());

    m_folder->writeLanguage(QStringLiteral("b_second.lng"), "Second", 238);
    m_folder->writeLanguage(QStringLiteral("A_first.LNG"), "First", 204);
    m_folder->writeLanguage(QStringLiteral("c_third.lng"), "Third", 161);
    m_folder->writeLanguage(QStringLiteral("not_a_language.txt"), "Text", 204);
    m_folder->writeFile(QStringLiteral("broken.lng"), "#language=Broken\r\n#charset=abc\r\n");
    QDir(m_folder->programDir()).mkdir(QStringLiteral("folder.lng"));

    const QList<LanguageFileInfo> files = ListLanguageFiles();
    QCOMPARE(files.size(), 3);
    QCOMPARE(files[0].fileName, QStringLiteral("A_first.LNG"));
    QCOMPARE(files[0].languageName, QStringLiteral("First"));
    QCOMPARE(int(files[0].charset), 204);
    QCOMPARE(files[1].fileName, QStringLiteral("b_second.lng"));
    QCOMPARE(int(files[1].charset), 238);
    QCOMPARE(files[2].fileName, QStringLiteral("c_third.lng"));
    QCOMPARE(files[2].languageName, QStringLiteral("Third"));
    // Listing reads the files but leaves the language in force alone.
    QVERIFY(UsesBuiltInTexts());
}

void tst_LanguageChoice::systemCharset_data()
{
    QTest::addColumn<QByteArray>("locale");
    QTest::addColumn<int>("charset");

    QTest::newRow("Russian") << QByteArray("ru_RU") << 204;
    QTest::newRow("Russian, with code set") << QByteArray("ru_RU.UTF-8") << 204;
    QTest::newRow("Ukrainian") << QByteArray("uk_UA") << 204;
    QTest::newRow("Belarusian") << QByteArray("be_BY") << 204;
    QTest::newRow("Bulgarian") << QByteArray("bg_BG") << 204;
    QTest::newRow("Serbian Cyrillic") << QByteArray("sr_RS") << 204;
    QTest::newRow("Serbian Latin") << QByteArray("sr_Latn_RS") << 238;
    QTest::newRow("Polish") << QByteArray("pl_PL") << 238;
    QTest::newRow("Czech") << QByteArray("cs_CZ") << 238;
    QTest::newRow("Hungarian") << QByteArray("hu_HU") << 238;
    QTest::newRow("Croatian") << QByteArray("hr_HR") << 238;
    QTest::newRow("Greek") << QByteArray("el_GR") << 161;
    QTest::newRow("Turkish") << QByteArray("tr_TR") << 162;
    QTest::newRow("Lithuanian") << QByteArray("lt_LT") << 186;
    QTest::newRow("Latvian") << QByteArray("lv_LV") << 186;
    QTest::newRow("Hebrew") << QByteArray("he_IL") << 177;
    QTest::newRow("Arabic") << QByteArray("ar_EG") << 178;
    QTest::newRow("Persian") << QByteArray("fa_IR") << 178;
    QTest::newRow("Vietnamese") << QByteArray("vi_VN") << 163;
    QTest::newRow("Thai") << QByteArray("th_TH") << 222;
    QTest::newRow("Japanese") << QByteArray("ja_JP") << 128;
    QTest::newRow("Korean") << QByteArray("ko_KR") << 129;
    QTest::newRow("Chinese, simplified") << QByteArray("zh_CN") << 134;
    QTest::newRow("Chinese, traditional") << QByteArray("zh_TW") << 136;
    QTest::newRow("English") << QByteArray("en_US") << 0;
    QTest::newRow("German") << QByteArray("de_DE") << 0;
    QTest::newRow("C") << QByteArray("C") << 0;
}

void tst_LanguageChoice::systemCharset()
{
    QFETCH(QByteArray, locale);
    QFETCH(int, charset);
    qputenv("BRIMVAULT_LOCALE", locale);
    QCOMPARE(int(GetSystemCharset()), charset);
}

void tst_LanguageChoice::systemCharsetFollowsDefaultLocale()
{
    QLocale::setDefault(QLocale(QLocale::Bulgarian, QLocale::Bulgaria));
    QCOMPARE(int(GetSystemCharset()), 204);
    QLocale::setDefault(QLocale(QLocale::Greek, QLocale::Greece));
    QCOMPARE(int(GetSystemCharset()), 161);
    // The environment variable overrides the default locale.
    qputenv("BRIMVAULT_LOCALE", "pl_PL");
    QCOMPARE(int(GetSystemCharset()), 238);
}

QTEST_GUILESS_MAIN(tst_LanguageChoice)
#include "tst_languagechoice.moc"
