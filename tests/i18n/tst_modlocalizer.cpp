#include "i18n/LanguageEncoding.h"
#include "i18n/modLocalizer.h"

#include "LanguageFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QStringDecoder>
#include <QTest>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

class tst_modLocalizer : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = m_env->programDir();
        UseBuiltInLanguage();
    }
    void cleanup() { m_env.reset(); }

    void textLines_data()
    {
        QTest::addColumn<QByteArray>("line");
        QTest::addColumn<QString>("text30");
        QTest::newRow("plain") << QByteArray("@30=My title") << u"My title"_qs;
        QTest::newRow("key trimmed") << QByteArray("@ 30\t=x") << u"x"_qs;
        QTest::newRow("leading blanks stripped") << QByteArray("  \t@30=indented") << u"indented"_qs;
        QTest::newRow("empty text is not the default") << QByteArray("@30=") << QString();
        QTest::newRow("line break and tab") << QByteArray("@30=Error!|nTry|tagain") << u"Error!\r\nTry\tagain"_qs;
        QTest::newRow("blanks of text kept") << QByteArray("@30= Remove ") << u" Remove "_qs;
        QTest::newRow("first equals sign splits") << QByteArray("@30=a=b=c") << u"a=b=c"_qs;
        QTest::newRow("LF line ends") << QByteArray("@31=x\n@30=lf\n@32=y") << u"lf"_qs;
        QTest::newRow("comment line") << QByteArray(";@30=commented") << u"default"_qs;
        QTest::newRow("no equals sign") << QByteArray("@30 nothing") << u"default"_qs;
        QTest::newRow("empty key") << QByteArray("@=x") << u"default"_qs;
        QTest::newRow("leading zero is another key") << QByteArray("@030=x") << u"default"_qs;
        QTest::newRow("setting syntax is not a text") << QByteArray("#30=x") << u"default"_qs;
    }
    void textLines()
    {
        QFETCH(QByteArray, line);
        QFETCH(QString, text30);
        LoadLanguageFile(WriteLanguageFile(m_program, u"t.lng"_qs, "Test", 204, line + "\r\n"));
        QVERIFY(!UsesBuiltInTexts());
        QCOMPARE(Translate(30, u"default"_qs), text30);
    }

    void settingLines_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("language");
        QTest::addColumn<int>("charset");
        QTest::newRow("names lower-cased") << QByteArray("#LANGUAGE=Big\r\n#CharSet=238\r\n") << u"Big"_qs << 238;
        QTest::newRow("value as it stands")
            << QByteArray("#language= Spaced \r\n#charset=204\n") << u" Spaced "_qs << 204;
        QTest::newRow("charset with blanks") << QByteArray("#language=T\r\n#charset= 161 \r\n") << u"T"_qs << 161;
        QTest::newRow("negative charset is not 0") << QByteArray("#language=T\r\n#charset=-3\r\n") << u"T"_qs << -3;
        QTest::newRow("last setting wins")
            << QByteArray("#language=A\r\n#language=B\r\n#charset=204\r\n") << u"B"_qs << 204;
        QTest::newRow("unknown setting passed over")
            << QByteArray("#language=T\r\n#charset=204\r\n#author=me\r\n") << u"T"_qs << 204;
    }
    void settingLines()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, language);
        QFETCH(int, charset);
        QVERIFY(WriteFile(m_program + u"/s.lng"_qs, content));
        LoadLanguageFile(m_program + u"/s.lng"_qs);
        QVERIFY(!UsesBuiltInTexts());
        QCOMPARE(LanguageName(), language);
        QCOMPARE(int(LanguageCharset()), charset);
    }

    // "" names a file that is not there; a file is written with every other content.
    void rejectedFilesLeaveBuiltInLanguage_data()
    {
        QTest::addColumn<QByteArray>("content");
        const QByteArray header = "#language=Test\r\n#charset=204\r\n";
        QTest::newRow("missing file") << QByteArray();
        QTest::newRow("repeated key, apart") << header + "@725=A\r\n@10=x\r\n@725=B\r\n";
        QTest::newRow("repeated key, blanks around") << header + "@725=A\r\n@ 725 =B\r\n";
        QTest::newRow("repeated key, letter case") << header + "@7a=A\r\n@7A=B\r\n";
        QTest::newRow("no charset") << QByteArray("#language=Test\r\n@725=A\r\n");
        QTest::newRow("charset 0") << QByteArray("#language=Test\r\n#charset=0\r\n@725=A\r\n");
        QTest::newRow("charset not a number") << QByteArray("#language=Test\r\n#charset=abc\r\n@725=A\r\n");
        QTest::newRow("charset beyond 16 bits") << QByteArray("#language=Test\r\n#charset=70000\r\n@725=A\r\n");
        QTest::newRow("bad charset after good one") << header + "#charset=x\r\n@725=A\r\n";
        QTest::newRow("empty language") << QByteArray("#language=\r\n#charset=204\r\n@725=A\r\n");
        QTest::newRow("setting name not trimmed") << QByteArray("#language =Test\r\n#charset=204\r\n@725=A\r\n");
        QTest::newRow("only NULs") << QByteArray(4096, '\0');
        QTest::newRow("random bytes") << RandomBytes(64 * 1024, 20261121);
        QTest::newRow("only line ends") << QByteArray(100000, '\n') + QByteArray(100000, '\r');
        QTest::newRow("lone markers") << QByteArray("#\r\n@\r\n=\r\n#=\r\n@=\r\n#language\r\n#charset\r\n");
        QTest::newRow("over 16 MB") << header + "@725=A\r\n" + QByteArray(16 * 1024 * 1024, ';');
    }
    void rejectedFilesLeaveBuiltInLanguage()
    {
        QFETCH(QByteArray, content);
        m_env->setLocale("pl_PL");
        // A good file first, so that the rejection visibly replaces a file language.
        LoadLanguageFile(WriteLanguageFile(m_program, u"good.lng"_qs, "Good", 204, "@725=Good\r\n"));
        QCOMPARE(Translate(725, u"All"_qs), u"Good"_qs);
        if (!content.isEmpty())
            QVERIFY(WriteFile(m_program + u"/bad.lng"_qs, content));
        LoadLanguageFile(m_program + u"/bad.lng"_qs);
        QVERIFY(UsesBuiltInTexts());
        QCOMPARE(LanguageName(), u"English (Default)"_qs);
        QCOMPARE(ShortLanguageName(), u"ENG"_qs);
        QCOMPARE(int(LanguageCharset()), 238);
        QCOMPARE(Translate(725, u"All"_qs), u"All"_qs);
    }

    void pathsThatAreNoFile()
    {
        for (const QString& path : {QString(), m_program}) {
            LoadLanguageFile(WriteLanguageFile(m_program, u"good.lng"_qs, "Good", 204));
            LoadLanguageFile(path);
            QVERIFY(UsesBuiltInTexts());
        }
    }

    void replacements_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QStringList>("replacements");
        QTest::addColumn<QString>("expected");
        QTest::newRow("every occurrence") << u"%n and %n"_qs << QStringList {u"%n"_qs, u"x"_qs} << u"x and x"_qs;
        QTest::newRow("pairs in order") << u"%a-%b"_qs << QStringList {u"%a"_qs, u"%b"_qs, u"%b"_qs, u"B"_qs}
                                        << u"B-B"_qs;
        QTest::newRow("odd element ignored") << u"%a %b"_qs << QStringList {u"%a"_qs, u"A"_qs, u"%b"_qs} << u"A %b"_qs;
        QTest::newRow("empty placeholder ignored") << u"abc"_qs << QStringList {QString(), u"x"_qs} << u"abc"_qs;
        QTest::newRow("escapes after replacing") << u"aXb"_qs << QStringList {u"X"_qs, u"|n"_qs} << u"a\r\nb"_qs;
        QTest::newRow("tab before line break") << u"||n|t"_qs << QStringList() << u"|\r\n\t"_qs;
    }
    void replacements()
    {
        QFETCH(QString, text);
        QFETCH(QStringList, replacements);
        QFETCH(QString, expected);
        QCOMPARE(Translate(5, text, replacements), expected);
        LoadLanguageFile(WriteLanguageFile(m_program, u"r.lng"_qs, "R", 204, "@5=" + text.toUtf8() + "\r\n"));
        QCOMPARE(Translate(5, u"unused"_qs, replacements), expected);
    }

    void builtInAndFileLanguage()
    {
        m_env->setLocale("ru_RU");
        QCOMPARE(Translate(1020), u"Brimvault"_qs);
        QCOMPARE(Translate(9999), QString());
        LoadLanguageFile(WriteLanguageFile(
            m_program, u"a.lng"_qs, "A", 238, "@1020=Mine\r\n@20=A twenty\r\n#helpfile=Brimvault_Test.html\r\n"));
        QCOMPARE(Translate(1020), u"Mine"_qs);
        QCOMPARE(Translate(1100), u"Remove all added games..."_qs);
        QCOMPARE(HelpFilePath(), m_program + u"/Brimvault_Test.html"_qs);
        // A second file replaces every text and the help of the first.
        LoadLanguageFile(WriteLanguageFile(m_program, u"b.lng"_qs, "B", 161));
        QCOMPARE(LanguageName(), u"B"_qs);
        QCOMPARE(int(LanguageCharset()), 161);
        QCOMPARE(Translate(20, u"default"_qs), u"default"_qs);
        QCOMPARE(HelpFilePath(), m_program + u"/tst_i18n.html"_qs); // the program file name + ".html"
        UseBuiltInLanguage();
        QCOMPARE(LanguageName(), u"English (Default)"_qs);
        QCOMPARE(int(LanguageCharset()), 204);
        QCOMPARE(Translate(1020), u"Brimvault"_qs);
    }

    void decoding_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QString>("expected");
        QTest::newRow("windows-1251") << QByteArray(
            "#language=\xD0\xF3\r\n#charset=204\r\n@10=\xDF\xE7\xFB\xEA \xA8\xB8\xB9")
                                      << u"Язык Ёё№"_qs;
        QTest::newRow("windows-1250") << QByteArray("#language=P\r\n#charset=238\r\n@10=\xA3\xF3\x64\x9F \xB9\xEA\x9C")
                                      << u"Łódź ąęś"_qs;
        QTest::newRow("charset after the texts")
            << QByteArray("#language=X\r\n@10=\xDF\xE7\xFB\xEA\r\n#charset=204") << u"Язык"_qs;
        QTest::newRow("windows-1253 through Qt")
            << QByteArray("#language=G\r\n#charset=161\r\n@10=\xC5\xEB\xEB\xDC") << u"Ελλά"_qs;
        QTest::newRow("utf-8 wins over the charset") << QByteArray("\xEF\xBB\xBF#language=U\r\n#charset=204\r\n@10=")
                + u"Язык Łódź"_qs.toUtf8() << u"Язык Łódź"_qs;
        QTest::newRow("NUL inside a text")
            << QByteArray("#language=N\r\n#charset=204\r\n@10=a\0b", 34) << u"a"_qs + QChar(0) + u"b"_qs;
        QTest::newRow("broken utf-8 tail") << QByteArray("#language=T\r\n#charset=204\r\n@10=\xD0") << u"Р"_qs;
        QTest::newRow("8 MB line") << QByteArray("#language=H\r\n#charset=204\r\n@10=") + QByteArray(8 << 20, 'x')
                                   << QString(8 << 20, u'x');
    }
    void decoding()
    {
        QFETCH(QByteArray, content);
        QFETCH(QString, expected);
        QVERIFY(WriteFile(m_program + u"/d.lng"_qs, content));
        LoadLanguageFile(m_program + u"/d.lng"_qs);
        QVERIFY(!UsesBuiltInTexts());
        QCOMPARE(Translate(10, QString()), expected);
    }

    // Qt's converters (ICU) are the independent reader of the code pages the program carries itself.
    void codePageTablesAgreeWithQt()
    {
        for (int codePage : {1250, 1251, 1252}) {
            const QByteArray name = "windows-" + QByteArray::number(codePage);
            QVERIFY2(QStringDecoder(name.constData()).isValid(), "Qt without ICU: install libqt6core6 from Debian");
            int compared = 0;
            for (int byte = 0x80; byte <= 0xFF; ++byte) {
                const QByteArray one(1, char(byte));
                const QString expected = QStringDecoder(name.constData()).decode(one);
                if (expected.size() != 1 || expected[0] == QChar::ReplacementCharacter)
                    continue; // a byte the code page leaves undefined
                QCOMPARE(DecodeCodePage(one, codePage), expected);
                ++compared;
            }
            QVERIFY(compared >= 123);
        }
    }

private:
    std::unique_ptr<TestEnvironment> m_env;
    QString m_program;
};

BV_REGISTER_TEST(tst_modLocalizer);
#include "tst_modlocalizer.moc"
