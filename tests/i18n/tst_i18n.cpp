#include "i18n/ApplyLanguage.h"
#include "i18n/BuiltInTexts.h"
#include "i18n/LanguageEncoding.h"
#include "i18n/LanguageFile.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"

#include "TestEnvironment.h"
#include "TestFiles.h"

#include <QLabel>
#include <QLocale>
#include <QPointer>
#include <QRegularExpression>
#include <QStringDecoder>
#include <QTest>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;
using namespace Qt::StringLiterals;

namespace {

// A window as the program's windows are: its captions come from numbered texts.
class CaptionedWindow : public QLabel {
    Q_OBJECT

public:
    Q_INVOKABLE void ChangeLocalizeCaptions()
    {
        setWindowTitle(Translate(1020));
        setText(Translate(10));
        if (onCaptions)
            onCaptions();
    }
    std::function<void()> onCaptions;
};

// "LngFileName|LngNik|language name|short name": the stored choice and the language in force.
QString choice()
{
    return QStringList(
        {GetSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s),
            GetSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s), LanguageName(), ShortLanguageName()})
        .join(u'|');
}

} // namespace

class tst_I18n : public QObject {
    Q_OBJECT
    std::unique_ptr<TestEnvironment> m_env;

    QString load(const QByteArray& content)
    {
        const QString path = m_env->programDir() + u"/t.lng"_s;
        LoadLanguageFile(WriteFile(path, content) ? path : QString());
        return Translate(10, u"default"_s);
    }
    // A language file in folder: its "#language" and "#charset" settings, then texts as they stand.
    static QString writeLanguage(const QString& folder, const QString& name, const QByteArray& language, int charset,
        const QByteArray& texts = "@10=Title\r\n")
    {
        const QString path = folder + u'/' + name;
        const QByteArray header = "#language=" + language + "\r\n#charset=" + QByteArray::number(charset) + "\r\n";
        return WriteFile(path, header + texts) ? path : QString();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        UseBuiltInLanguage();
    }
    void cleanup()
    {
        m_env.reset();
        QLocale::setDefault(QLocale::system());
    }

    // Setting names in any case; a charset line after the texts decides their decoding all the same. A refused
    // file leaves the built-in language, with the system's charset, in force.
    void languageFile_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("text10");
        const auto file = [](const QByteArray& lines) -> QByteArray {
            return "#LANGUAGE=Test\r\n" + lines + "\r\n#CharSet= 204 \r\n";
        };
        const QString refused = u"<refused>"_s;
        QTest::newRow("leading blanks stripped") << file("  \t@10=indented") << u"indented"_s;
        QTest::newRow("empty text is not the default") << file("@10=") << QString();
        QTest::newRow("value as it stands, escapes") << file("@10= a=b|nc|t ") << u" a=b\r\nc\t "_s;
        QTest::newRow("LF line ends") << file("@11=x\n@10=lf\n@12=y") << u"lf"_s;
        QTest::newRow("no equals sign") << file("@10 nothing") << u"default"_s;
        QTest::newRow("leading zero is another key") << file("@010=x") << u"default"_s;
        QTest::newRow("NUL inside a text") << file(QByteArray("@10=a\0b", 7)) << u"a"_s + QChar(0) + u"b"_s;
        QTest::newRow("windows-1251") << file("@10=\xDF\xE7\xFB\xEA \xA8\xB8\xB9") << u"Язык Ёё№"_s;
        QTest::newRow("windows-1253") << QByteArray("#language=Test\r\n#charset=161\r\n@10=\xC5\xEB\xEB\xDC")
                                      << u"Ελλά"_s;
        QTest::newRow("utf-8 wins") << "\xEF\xBB\xBF" + file("@10=" + u"Łódź"_s.toUtf8()) << u"Łódź"_s;
        QTest::newRow("broken utf-8 tail") << QByteArray("#language=Test\r\n#charset=204\r\n@10=abc\xD0") << u"abcР"_s;
        QTest::newRow("last setting wins")
            << QByteArray("#language=A\r\n#charset=204\r\n#language=Test") << u"default"_s;
        QTest::newRow("negative charset") << QByteArray("#language=Test\r\n#charset=-3") << u"default"_s;
        QTest::newRow("repeated key, blanks around") << file("@10=A\r\n@ 10 =B") << refused;
        QTest::newRow("repeated key, letter case") << file("@7a=A\r\n@7A=B") << refused;
        QTest::newRow("no charset") << QByteArray("#language=Test\r\n@10=A\r\n") << refused;
        QTest::newRow("charset beyond 16 bits") << QByteArray("#language=Test\r\n#charset=70000\r\n") << refused;
        QTest::newRow("bad charset after good one")
            << QByteArray("#language=Test\r\n#charset=1\r\n#charset=x") << refused;
        QTest::newRow("empty language") << QByteArray("#language=\r\n#charset=204\r\n@10=A\r\n") << refused;
        QTest::newRow("setting name not trimmed") << QByteArray("#language =Test\r\n#charset=204\r\n") << refused;
        QTest::newRow("lone markers") << QByteArray("#\r\n@\r\n=\r\n#=\r\n@=\r\n#language\r\n#charset\r\n") << refused;
    }
    void languageFile()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, text10);
        const bool refused = text10 == u"<refused>";
        m_env->setLocale("pl_PL");
        QCOMPARE(load("#language=Good\r\n#charset=204\r\n@10=Good\r\n#helpfile=Good.html\r\n"), u"Good"_s);
        QCOMPARE(HelpFilePath(), m_env->programDir() + u"/Good.html"_s);
        QCOMPARE(load(content), refused ? u"default"_s : text10);
        // Nothing of the file before stays; texts the file lacks are the built-in ones, the help is the default.
        QCOMPARE(Translate(1020), u"Brimvault"_s);
        QCOMPARE(HelpFilePath(), m_env->programDir() + u"/tst_i18n.html"_s);
        QCOMPARE(LanguageName(), refused ? u"English (Default)"_s : u"Test"_s);
        if (refused)
            QCOMPARE(int(LanguageCharset()), 238);
    }

    void replacements_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QStringList>("replacements");
        QTest::addColumn<QString>("expected");
        QTest::newRow("every occurrence") << u"%n and %n"_s << QStringList {u"%n"_s, u"x"_s} << u"x and x"_s;
        QTest::newRow("pairs in order") << u"%a-%b"_s << QStringList {u"%a"_s, u"%b"_s, u"%b"_s, u"B"_s} << u"B-B"_s;
        QTest::newRow("odd element ignored") << u"%a %b"_s << QStringList {u"%a"_s, u"A"_s, u"%b"_s} << u"A %b"_s;
        QTest::newRow("empty placeholder ignored") << u"abc"_s << QStringList {QString(), u"x"_s} << u"abc"_s;
        QTest::newRow("escapes after replacing") << u"aXb"_s << QStringList {u"X"_s, u"|n"_s} << u"a\r\nb"_s;
        QTest::newRow("tab before line break") << u"||n|t"_s << QStringList() << u"|\r\n\t"_s;
    }
    void replacements()
    {
        QFETCH(QString, text);
        QFETCH(QStringList, replacements);
        QTEST(Translate(5, text, replacements), "expected");
    }

    // Qt's converters (ICU) are the independent reader of the code pages the program carries itself.
    void codePagesAgreeWithQt()
    {
        for (int codePage : {1250, 1251, 1252}) {
            QStringDecoder qt(QByteArray("windows-" + QByteArray::number(codePage)).constData());
            QVERIFY2(qt.isValid(), "Qt without ICU: install libqt6core6 from Debian");
            int compared = 0;
            for (int byte = 0x80; byte <= 0xFF; ++byte) {
                const QString expected = qt.decode(QByteArray(1, char(byte)));
                if (expected.size() != 1 || expected[0] == QChar::ReplacementCharacter)
                    continue; // a byte the code page leaves undefined
                QCOMPARE(DecodeCodePage(QByteArray(1, char(byte)), codePage), expected);
                ++compared;
            }
            QVERIFY(compared >= 123);
        }
    }

    void shippedFile_data()
    {
        QTest::addColumn<QString>("fileName");
        QTest::addColumn<QString>("shown"); // text 10, proving the decoding, then the language and its charset
        QTest::newRow("Russian") << u"Brimvault_Russian.lng"_s << u"Язык программы|Русский204"_s;
        QTest::newRow("Polish") << u"Brimvault_Polish.lng"_s << u"Język programu|Polski238"_s;
    }
    void shippedFile()
    {
        QFETCH(QString, fileName);
        const QByteArray bytes = ReadFile(QStringLiteral(BRIMVAULT_BIN_DIR "/") + fileName);
        REQUIRE_FIXTURE(!bytes.isEmpty(), "the language files beside the built program");
        const QString title = load(bytes);
        QTEST(QString(title + u'|' + LanguageName() + QString::number(LanguageCharset())), "shown");
        const QHash<QString, QString> texts = ParseLanguageFile(bytes).texts;
        QSet<int> numbers;
        for (const auto& [number, text] : texts.asKeyValueRange()) {
            numbers.insert(number.toInt());
            QVERIFY2(!text.trimmed().isEmpty() && !text.contains(u'\r') && !text.contains(QChar(0)), qPrintable(text));
        }
        const QList<int> builtIn = BuiltInTextNumbers();
        QCOMPARE(numbers, QSet<int>(builtIn.begin(), builtIn.end()));
        // Text 760 is followed by the game's caption; the remove-all question and the install dialog title
        // both look for the "..." of 1100 and 1085; filter labels must not break "label|pattern" pairs.
        QVERIFY(texts.value(u"760"_s).endsWith(u' '));
        QVERIFY(texts.value(u"1100"_s).endsWith(u"..."_s) && texts.value(u"1085"_s).endsWith(u"..."_s));
        QVERIFY(!texts.value(u"720"_s).contains(u'|') && !texts.value(u"725"_s).contains(u'|'));
        // Written for the Windows program too: in the code page of its charset, not UTF-8, with CR LF.
        QStringDecoder utf8(QStringConverter::Utf8);
        const QString asUtf8 = utf8(bytes);
        QVERIFY2(utf8.hasError(), "the file is UTF-8, not in the code page of its charset");
        QCOMPARE(QList<qsizetype>({bytes.count('\n'), bytes.count('\r')}), QList<qsizetype>(2, bytes.count("\r\n")));
    }

    // Beside the program, sorted by name in any case: an unusable file and Belarusian, Russian, Polish;
    // one level up, a Polish file that a stored name must not reach.
    void startUpChoice_data()
    {
        QTest::addColumn<QString>("stored"); // "LngFileName|LngNik", empty ones not stored
        QTest::addColumn<QByteArray>("locale");
        QTest::addColumn<QString>("after");
        const QString english = u"English (Default)|ENG"_s;
        QTest::newRow("stored, short name derived") << u"pl.lng|"_s << "ru_RU"_ba << u"pl.lng||Polish|PL"_s;
        QTest::newRow("stored short name kept") << u"pl.lng|X"_s << "ru_RU"_ba << u"pl.lng|X|Polish|X"_s;
        QTest::newRow("stored, other letter case") << u"PL.LNG|"_s << "ru_RU"_ba << u"PL.LNG||Polish|PL"_s;
        QTest::newRow("stored file missing") << u"xx.lng|XX"_s << "ru_RU"_ba << u"xx.lng|XX|"_s + english;
        QTest::newRow("stored outside the folder") << u"../pl.lng|"_s << "ru_RU"_ba << u"../pl.lng||Polish|PL"_s;
        QTest::newRow("stored built-in, first match") << english << "ru_RU"_ba << u"by.lng|BY|Belarusian|BY"_s;
        QTest::newRow("no choice, Polish system") << QString() << "pl_PL"_ba << u"pl.lng|PL|Polish|PL"_s;
        QTest::newRow("no choice, Western system") << QString() << "en_US"_ba << english + u'|' + english;
        QTest::newRow("no match keeps a short name")
            << u"|OLD"_s << "el_GR"_ba << u"English (Default)|OLD|"_s + english;
    }
    void startUpChoice()
    {
        QFETCH(QString, stored);
        QFETCH(QByteArray, locale);
        const QString program = m_env->programDir();
        writeLanguage(program, u"Ab.txt"_s, "Text", 204);
        writeLanguage(program, u"Ac.lng"_s, "Broken", 204, "@1=a\r\n@1=b\r\n");
        writeLanguage(program, u"by.lng"_s, "Belarusian", 204);
        writeLanguage(program, u"Ru.lng"_s, "Russian", 204);
        writeLanguage(program, u"pl.lng"_s, "Polish", 238);
        writeLanguage(m_env->root(), u"pl.lng"_s, "Outside", 238);
        const QStringList keys {u"LngFileName"_s, u"LngNik"_s};
        for (int i = 0; i < 2; ++i)
            if (!stored.section(u'|', i, i).isEmpty())
                SaveSetting(AppTitle(), u"LocaleSettings"_s, keys[i], stored.section(u'|', i, i));
        m_env->setLocale(locale);
        InitLocalizer();
        QTEST(choice(), "after");
    }

    // The choice is stored as named, even that of an unusable file; the title prefix leaves the short name.
    void chooseLanguageFile()
    {
        ChooseLanguageFile(writeLanguage(m_env->programDir(), u"BRIMVAULT_russian.LNG"_s, "Russian", 204));
        QCOMPARE(choice(), u"BRIMVAULT_russian.LNG|RUSSIAN|Russian|RUSSIAN"_s);
        ChooseLanguageFile(writeLanguage(m_env->programDir(), u"My_Brimvault_Lang.lng"_s, "Broken", 0));
        QCOMPARE(choice(), u"My_Brimvault_Lang.lng|MY_LANG|English (Default)|ENG"_s);
        QCOMPARE(ShortNameFromFileName(u"BrimvaultRu.lng"_s), u"BRIMVAULTRU"_s);
    }

    // The variable, where set, wins over the locale in force.
    void systemCharset_data()
    {
        QTest::addColumn<QByteArray>("locale");
        QTest::addColumn<int>("charset");
        const QList<QPair<const char*, int>> locales {{"ru_RU.UTF-8", 204}, {"sr_RS", 204}, {"sr_Latn_RS", 238},
            {"pl_PL", 238}, {"tr_TR", 162}, {"lt_LT", 186}, {"he_IL", 177}, {"ar_EG", 178}, {"vi_VN", 163},
            {"th_TH", 222}, {"ja_JP", 128}, {"ko_KR", 129}, {"zh_CN", 134}, {"zh_TW", 136}, {"en_US", 0}, {"C", 0},
            {"", 161}};
        for (const auto& [locale, charset] : locales)
            QTest::newRow(locale) << QByteArray(locale) << charset;
    }
    void systemCharset()
    {
        QFETCH(QByteArray, locale);
        m_env->setLocale(locale);
        QLocale::setDefault(QLocale(QLocale::Greek, QLocale::Greece));
        QTEST(int(GetSystemCharset()), "charset");
    }

    // Switching re-captions every window, shown or not, even when one closes another while taking its captions;
    // windows without captions of their own are passed over. A window opened later takes its captions when a
    // language file is in force.
    void switchLanguageReCaptionsEveryWindow()
    {
        auto first = std::make_unique<CaptionedWindow>();
        QPointer<CaptionedWindow> second = new CaptionedWindow;
        auto third = std::make_unique<CaptionedWindow>();
        first->onCaptions = [&second] { delete second.data(); };
        third->onCaptions = first->onCaptions;
        first->show();
        QWidget plain;
        QTest::failOnWarning(QRegularExpression(u".*"_s));
        QVERIFY(!ApplyLanguage(first.get(), false) && first->text().isEmpty());
        SwitchLanguage(writeLanguage(m_env->programDir(), u"Ru.lng"_s, "Russian", 204, "@10=Rus\r\n@1020=Brim\r\n"));
        QVERIFY(second.isNull());
        QCOMPARE(first->windowTitle() + first->text() + third->text(), u"BrimRusRus"_s);
        CaptionedWindow later;
        QVERIFY(ApplyLanguage(&later, false));
        QCOMPARE(later.text(), u"Rus"_s);
        SwitchLanguage(QString());
        QCOMPARE(first->windowTitle() + u'/' + third->text(), u"Brimvault/Program language"_s);
        QCOMPARE(choice(), u"English (Default)|ENG|English (Default)|ENG"_s);
    }
};

QTEST_MAIN(tst_I18n)
#include "tst_i18n.moc"
