#include "LocalizerTestFolder.h"
#include "i18n/BuiltInTexts.h"
#include "i18n/LanguageEncoding.h"
#include "i18n/LanguageFile.h"
#include "i18n/modLocalizer.h"
#include "support/ProgramFolder.h"

#include <QRandomGenerator>
#include <QStringDecoder>
#include <QTest>
#include <memory>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

class tst_modLocalizer : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();

    void textLines_data();
    void textLines();
    void lfLineEndsAreAccepted();
    void settingLines_data();
    void settingLines();
    void rejectedFilesLeaveBuiltInLanguage_data();
    void rejectedFilesLeaveBuiltInLanguage();
    void missingOrEmptyPathGivesBuiltInLanguage_data();
    void missingOrEmptyPathGivesBuiltInLanguage();
    void replacements_data();
    void replacements();
    void builtInDefaultsComeFromTheTable();
    void builtInState();
    void helpFileFollowsTheLanguage();
    void secondFileReplacesTheFirst();
    void decoding_data();
    void decoding();
    void codePageTablesAgreeWithQt_data();
    void codePageTablesAgreeWithQt();
    void hostileFilesDoNotCrash_data();
    void hostileFilesDoNotCrash();
    void oversizedFileIsRefused();

private:
    std::unique_ptr<LocalizerTestFolder> m_folder;
};

void tst_modLocalizer::init()
{
    m_folder = std::make_unique<LocalizerTestFolder>();
    UseBuiltInLanguage();
}

void tst_modLocalizer::cleanup()
{
    m_folder.reset();
}

void tst_modLocalizer::textLines_data()
{
    QTest::addColumn<QByteArray>("line");
    QTest::addColumn<int>("number");
    QTest::addColumn<QString>("expected");

    QTest::newRow("plain") << QByteArray("@1020=My title") << 1020 << QStringLiteral("My title");
    QTest::newRow("key trimmed") << QByteArray("@ 1020 =x") << 1020 << QStringLiteral("x");
    QTest::newRow("key trimmed of tabs") << QByteArray("@\t1020\t=x") << 1020 << QStringLiteral("x");
    QTest::newRow("leading blanks stripped") << QByteArray("  \t@1020=indented") << 1020 << QStringLiteral("indented");
    QTest::newRow("empty text is not the default") << QByteArray("@720=") << 720 << QString();
    QTest::newRow("line break") << QByteArray("@1220=Error!|nTry again") << 1220
                                << QStringLiteral("Error!\r\nTry again");
    QTest::newRow("tab") << QByteArray("@30=A|tB") << 30 << QStringLiteral("A\tB");
    QTest::newRow("blanks of text kept") << QByteArray("@760= Remove ") << 760 << QStringLiteral(" Remove ");
    QTest::newRow("first equals sign splits") << QByteArray("@30=a=b=c") << 30 << QStringLiteral("a=b=c");
    QTest::newRow("comment line") << QByteArray(";@30=commented") << 30 << QStringLiteral("default");
    QTest::newRow("no equals sign") << QByteArray("@30 nothing") << 30 << QStringLiteral("default");
    QTest::newRow("empty key") << QByteArray("@=x") << 30 << QStringLiteral("default");
    QTest::newRow("other number") << QByteArray("@31=x") << 30 << QStringLiteral("default");
    QTest::newRow("leading zero is another key") << QByteArray("@030=x") << 30 << QStringLiteral("default");
    QTest::newRow("setting syntax is not a text") << QByteArray("#30=x") << 30 << QStringLiteral("default");
}

void tst_modLocalizer::textLines()
{
    QFETCH(QByteArray, line);
    QFETCH(int, number);
    QFETCH(QString, expected);

    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("t.lng"), "Test", 204, line + "\r\n"));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(Translate(number, QStringLiteral("default")), expected);
}

void tst_modLocalizer::lfLineEndsAreAccepted()
{
    LoadLanguageFile(m_folder->writeFile(QStringLiteral("lf.lng"), "#language=Lf\n#charset=204\n@10=Ten\n@20=Twenty"));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(LanguageName(), QStringLiteral("Lf"));
    QCOMPARE(Translate(10, QString()), QStringLiteral("Ten"));
    QCOMPARE(Translate(20, QString()), QStringLiteral("Twenty"));
}

void tst_modLocalizer::settingLines_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::addColumn<QString>("language");
    QTest::addColumn<int>("charset");

    QTest::newRow("plain") << QByteArray("#language=Test\r\n#charset=204\r\n") << QStringLiteral("Test") << 204;
    QTest::newRow("names lower-cased") << QByteArray("#LANGUAGE=Big\r\n#CharSet=238\r\n") << QStringLiteral("Big")
                                       << 238;
    QTest::newRow("value as it stands") << QByteArray("#language= Spaced \r\n#charset=204\r\n")
                                        << QStringLiteral(" Spaced ") << 204;
    QTest::newRow("charset with blanks") << QByteArray("#language=T\r\n#charset= 161 \r\n") << QStringLiteral("T")
                                         << 161;
    QTest::newRow("negative charset is not 0")
        << QByteArray("#language=T\r\n#charset=-3\r\n") << QStringLiteral("T") << -3;
    QTest::newRow("last setting wins") << QByteArray("#language=A\r\n#language=B\r\n#charset=204\r\n")
                                       << QStringLiteral("B") << 204;
    QTest::newRow("unknown setting passed over")
        << QByteArray("#language=T\r\n#charset=204\r\n#author=me\r\n") << QStringLiteral("T") << 204;
}

void tst_modLocalizer::settingLines()
{
    QFETCH(QByteArray, content);
    QFETCH(QString, language);
    QFETCH(int, charset);

    LoadLanguageFile(m_folder->writeFile(QStringLiteral("s.lng"), content));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(LanguageName(), language);
    QCOMPARE(int(LanguageCharset()), charset);
}

void tst_modLocalizer::rejectedFilesLeaveBuiltInLanguage_data()
{
    QTest::addColumn<QByteArray>("content");

    const QByteArray header = "#language=Test\r\n#charset=204\r\n";
    QTest::newRow("repeated key") << header + "@725=A\r\n@725=B\r\n";
    QTest::newRow("repeated key, blanks around") << header + "@725=A\r\n@ 725 =B\r\n";
    QTest::newRow("repeated key, letter case") << header + "@7a=A\r\n@7A=B\r\n";
    QTest::newRow("repeated key, far apart") << header + "@725=A\r\n@10=x\r\n@20=y\r\n@725=A\r\n";
    QTest::newRow("no charset") << QByteArray("#language=Test\r\n@725=A\r\n");
    QTest::newRow("charset 0") << QByteArray("#language=Test\r\n#charset=0\r\n@725=A\r\n");
    QTest::newRow("charset not a number") << QByteArray("#language=Test\r\n#charset=abc\r\n@725=A\r\n");
    QTest::newRow("charset empty") << QByteArray("#language=Test\r\n#charset=\r\n@725=A\r\n");
    QTest::newRow("charset beyond 16 bits") << QByteArray("#language=Test\r\n#charset=70000\r\n@725=A\r\n");
    QTest::newRow("bad charset after good one") << header + "#charset=x\r\n@725=A\r\n";
    QTest::newRow("no language") << QByteArray("#charset=204\r\n@725=A\r\n");
    QTest::newRow("empty language") << QByteArray("#language=\r\n#charset=204\r\n@725=A\r\n");
    QTest::newRow("setting name not trimmed") << QByteArray("#language =Test\r\n#charset=204\r\n@725=A\r\n");
    QTest::newRow("empty file") << QByteArray();
}

void tst_modLocalizer::rejectedFilesLeaveBuiltInLanguage()
{
    QFETCH(QByteArray, content);
    qputenv("BRIMVAULT_LOCALE", "pl_PL");

    // A good file first, so that the rejection visibly replaces a file language.
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("good.lng"), "Good", 204, "@725=Good\r\n"));
    QCOMPARE(Translate(725, QStringLiteral("All")), QStringLiteral("Good"));

    LoadLanguageFile(m_folder->writeFile(QStringLiteral("bad.lng"), content));
    QVERIFY(UsesBuiltInTexts());
    QCOMPARE(LanguageName(), QStringLiteral("English (Default)"));
    QCOMPARE(ShortLanguageName(), QStringLiteral("ENG"));
    QCOMPARE(int(LanguageCharset()), 238);
    QCOMPARE(Translate(725, QStringLiteral("All")), QStringLiteral("All"));
}

void tst_modLocalizer::missingOrEmptyPathGivesBuiltInLanguage_data()
{
    QTest::addColumn<QString>("path");
    QTest::newRow("empty") << QString();
    QTest::newRow("missing") << QStringLiteral("/nonexistent/Brimvault_Russian.lng");
    QTest::newRow("folder") << QStringLiteral("/tmp");
}

void tst_modLocalizer::missingOrEmptyPathGivesBuiltInLanguage()
{
    QFETCH(QString, path);
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("good.lng"), "Good", 204, "@10=Good\r\n"));
    LoadLanguageFile(path);
    QVERIFY(UsesBuiltInTexts());
    QCOMPARE(LanguageName(), QStringLiteral("English (Default)"));
    QCOMPARE(Translate(10, QStringLiteral("Program language")), QStringLiteral("Program language"));
}

void tst_modLocalizer::replacements_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QStringList>("replacements");
    QTest::addColumn<QString>("expected");

    QTest::newRow("none") << QStringLiteral("Remove %1?") << QStringList() << QStringLiteral("Remove %1?");
    QTest::newRow("one pair") << QStringLiteral("Remove %1?")
                              << QStringList {QStringLiteral("%1"), QStringLiteral("Chess")}
                              << QStringLiteral("Remove Chess?");
    QTest::newRow("every occurrence") << QStringLiteral("%n and %n")
                                      << QStringList {QStringLiteral("%n"), QStringLiteral("x")}
                                      << QStringLiteral("x and x");
    QTest::newRow("two pairs in order") << QStringLiteral(
        "%a-%b") << QStringList {QStringLiteral("%a"), QStringLiteral("%b"), QStringLiteral("%b"), QStringLiteral("B")}
                                        << QStringLiteral("B-B");
    QTest::newRow("odd element ignored") << QStringLiteral(
        "%a %b") << QStringList {QStringLiteral("%a"), QStringLiteral("A"), QStringLiteral("%b")}
                                         << QStringLiteral("A %b");
    QTest::newRow("empty placeholder ignored")
        << QStringLiteral("abc") << QStringList {QString(), QStringLiteral("x")} << QStringLiteral("abc");
    QTest::newRow("escapes expanded after replacing")
        << QStringLiteral("aXb") << QStringList {QStringLiteral("X"), QStringLiteral("|n")} << QStringLiteral("a\r\nb");
    QTest::newRow("tab before line break") << QStringLiteral("||n|t") << QStringList() << QStringLiteral("|\r\n\t");
}

void tst_modLocalizer::replacements()
{
    QFETCH(QString, text);
    QFETCH(QStringList, replacements);
    QFETCH(QString, expected);

    QCOMPARE(Translate(5, text, replacements), expected);
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("r.lng"), "R", 204, "@5=" + text.toUtf8() + "\r\n"));
    QCOMPARE(Translate(5, QStringLiteral("unused"), replacements), expected);
}

void tst_modLocalizer::builtInDefaultsComeFromTheTable()
{
    QCOMPARE(Translate(1020), QStringLiteral("Brimvault"));
    QCOMPARE(Translate(1100), QStringLiteral("Remove all added games..."));
    QCOMPARE(Translate(5001), BuiltInText(5001));
    QVERIFY(!Translate(5001).isEmpty());
    QCOMPARE(Translate(9999), QString());

    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("b.lng"), "B", 204, "@1020=Mine\r\n"));
    QCOMPARE(Translate(1020), QStringLiteral("Mine"));
    QCOMPARE(Translate(1100), QStringLiteral("Remove all added games..."));
}

void tst_modLocalizer::builtInState()
{
    qputenv("BRIMVAULT_LOCALE", "ru_RU");
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("x.lng"), "X", 238, "@10=x\r\n"));
    UseBuiltInLanguage();
    QVERIFY(UsesBuiltInTexts());
    QCOMPARE(LanguageName(), QStringLiteral("English (Default)"));
    QCOMPARE(ShortLanguageName(), QStringLiteral("ENG"));
    QCOMPARE(int(LanguageCharset()), 204);
    QCOMPARE(HelpFilePath(), m_folder->programDir() + u'/' + ProgramBaseName() + QStringLiteral(".html"));
    QCOMPARE(Translate(10, QStringLiteral("Program language")), QStringLiteral("Program language"));
}

void tst_modLocalizer::helpFileFollowsTheLanguage()
{
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("h.lng"), "H", 204, "#helpfile=Brimvault_Test.html\r\n"));
    QCOMPARE(HelpFilePath(), m_folder->programDir() + QStringLiteral("/Brimvault_Test.html"));

    // A file without its own help falls back to the default, not to the help of the previous language.
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("n.lng"), "N", 204));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(HelpFilePath(), m_folder->programDir() + u'/' + ProgramBaseName() + QStringLiteral(".html"));
}

void tst_modLocalizer::secondFileReplacesTheFirst()
{
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("a.lng"), "A", 204, "@10=A ten\r\n@20=A twenty\r\n"));
    LoadLanguageFile(m_folder->writeLanguage(QStringLiteral("b.lng"), "B", 238, "@10=B ten\r\n"));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(LanguageName(), QStringLiteral("B"));
    QCOMPARE(Translate(10, QString()), QStringLiteral("B ten"));
    QCOMPARE(Translate(20, QStringLiteral("default")), QStringLiteral("default"));
}

void tst_modLocalizer::decoding_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::addColumn<QString>("expected");

    QTest::newRow("windows-1251") << QByteArray(
        "#language=\xD0\xF3\xF1\xF1\xEA\xE8\xE9\r\n#charset=204\r\n@10=\xDF\xE7\xFB\xEA \xA8\xB8\xB9\r\n")
                                  << QStringLiteral("Язык Ёё№");
    QTest::newRow("windows-1250") << QByteArray(
        "#language=Polski\r\n#charset=238\r\n@10=\xA3\xF3\x64\x9F \xB9\xEA\x9C\xE6\xBF\xF1\xF3\xB3\r\n")
                                  << QStringLiteral("Łódź ąęśćżńół");
    QTest::newRow("charset after the texts")
        << QByteArray("#language=X\r\n@10=\xDF\xE7\xFB\xEA\r\n#charset=204\r\n") << QStringLiteral("Язык");
    QTest::newRow("windows-1253 through Qt")
        << QByteArray("#language=G\r\n#charset=161\r\n@10=\xC5\xEB\xEB\xDC\xE4\xE1\r\n") << QStringLiteral("Ελλάδα");
    QTest::newRow("utf-8 wins over the charset")
        << QByteArray("#language=U\r\n#charset=204\r\n@10=") + QStringLiteral("Язык Łódź").toUtf8() + "\r\n"
        << QStringLiteral("Язык Łódź");
    QTest::newRow("utf-8 with byte order mark")
        << QByteArray("\xEF\xBB\xBF#language=U\r\n#charset=238\r\n@10=") + QStringLiteral("Łódź").toUtf8() + "\r\n"
        << QStringLiteral("Łódź");
}

void tst_modLocalizer::decoding()
{
    QFETCH(QByteArray, content);
    QFETCH(QString, expected);

    LoadLanguageFile(m_folder->writeFile(QStringLiteral("d.lng"), content));
    QVERIFY(!UsesBuiltInTexts());
    QCOMPARE(Translate(10, QString()), expected);
}

void tst_modLocalizer::codePageTablesAgreeWithQt_data()
{
    QTest::addColumn<int>("codePage");
    QTest::newRow("1250") << 1250;
    QTest::newRow("1251") << 1251;
    QTest::newRow("1252") << 1252;
}

void tst_modLocalizer::codePageTablesAgreeWithQt()
{
    QFETCH(int, codePage);
    const QByteArray name = "windows-" + QByteArray::number(codePage);
    if (!QStringDecoder(name.constData()).isValid())
        QSKIP("Qt has no converter for this code page here");

    int compared = 0;
    for (int byte = 0x80; byte <= 0xFF; ++byte) {
        const QByteArray one(1, char(byte));
        QStringDecoder reference(name.constData());
        const QString expected = reference.decode(one);
        if (expected.size() != 1 || expected[0] == QChar::ReplacementCharacter)
            continue; // a byte the code page leaves undefined
        QCOMPARE(DecodeCodePage(one, codePage), expected);
        ++compared;
    }
    QVERIFY(compared >= 123);
}

void tst_modLocalizer::hostileFilesDoNotCrash_data()
{
    QTest::addColumn<QByteArray>("content");
    QTest::addColumn<bool>("usable");

    QTest::newRow("only NULs") << QByteArray(4096, '\0') << false;
    QTest::newRow("NUL inside a text") << QByteArray("#language=N\r\n#charset=204\r\n@10=a\0b\r\n", 30) << true;
    QByteArray random(64 * 1024, Qt::Uninitialized);
    QRandomGenerator generator(20261121);
    for (char& c : random)
        c = char(generator.bounded(256));
    QTest::newRow("random bytes") << random << false;
    QTest::newRow("huge line") << QByteArray("#language=H\r\n#charset=204\r\n@10=") + QByteArray(8 * 1024 * 1024, 'x')
                               << true;
    QTest::newRow("only separators") << QByteArray(100000, '\n') + QByteArray(100000, '\r') << false;
    QTest::newRow("lone markers") << QByteArray("#\r\n@\r\n=\r\n#=\r\n@=\r\n#language\r\n#charset\r\n") << false;
    QTest::newRow("broken utf-8 tail") << QByteArray("#language=T\r\n#charset=204\r\n@10=\xD0") << true;
}

void tst_modLocalizer::hostileFilesDoNotCrash()
{
    QFETCH(QByteArray, content);
    QFETCH(bool, usable);

    LoadLanguageFile(m_folder->writeFile(QStringLiteral("hostile.lng"), content));
    QCOMPARE(UsesBuiltInTexts(), !usable);
    QCOMPARE(ParseLanguageFile(content).isUsable(), usable);
    (void)Translate(10, QStringLiteral("default"));
}

void tst_modLocalizer::oversizedFileIsRefused()
{
    QByteArray content("#language=Big\r\n#charset=204\r\n@10=x\r\n");
    content.append(QByteArray(kMaxLanguageFileSize, ';'));
    LoadLanguageFile(m_folder->writeFile(QStringLiteral("big.lng"), content));
    QVERIFY(UsesBuiltInTexts());
}

QTEST_GUILESS_MAIN(tst_modLocalizer)
#include "tst_modlocalizer.moc"
