#include "i18n/BuiltInTexts.h"
#include "i18n/LanguageFile.h"
#include "i18n/PublisherGames.h"
#include "i18n/modLocalizer.h"

#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include <QSet>
#include <QStringDecoder>
#include <QTest>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

// The language files that ship beside the program, and the built-in table they translate.
class tst_LanguageFiles : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void shippedFile_data()
    {
        QTest::addColumn<QString>("fileName");
        QTest::addColumn<QString>("language");
        QTest::addColumn<int>("charset");
        QTest::addColumn<QString>("dialogTitle"); // text 10, proves the decoding
        QTest::newRow("Russian") << u"Brimvault_Russian.lng"_qs << u"Русский"_qs << 204 << u"Язык программы"_qs;
        QTest::newRow("Polish") << u"Brimvault_Polish.lng"_qs << u"Polski"_qs << 238 << u"Język programu"_qs;
    }
    void shippedFile()
    {
        QFETCH(QString, fileName);
        QFETCH(QString, language);
        QFETCH(int, charset);
        QFETCH(QString, dialogTitle);
        TestEnvironment env;
        const QByteArray bytes = ReadFile(QStringLiteral(BRIMVAULT_BIN_DIR "/") + fileName);
        REQUIRE_FIXTURE(!bytes.isEmpty(), "the language files beside the built program");
        QVERIFY(WriteFile(env.programDir() + u'/' + fileName, bytes));
        ChooseLanguageFile(env.programDir() + u'/' + fileName);
        QVERIFY2(!UsesBuiltInTexts(), "the shipped file was refused");
        QCOMPARE(LanguageName(), language);
        QCOMPARE(int(LanguageCharset()), charset);
        QCOMPARE(HelpFilePath(), env.programDir() + u'/' + fileName.replace(u".lng"_qs, u".html"_qs));
        QCOMPARE(Translate(10), dialogTitle);
        QCOMPARE(Translate(1020), u"Brimvault"_qs);

        // Exactly the numbers of the built-in table, none empty.
        const LanguageFileContent content = ParseLanguageFile(bytes);
        QStringList numbers = content.texts.keys();
        numbers.sort();
        QStringList builtIn;
        for (int number : BuiltInTextNumbers())
            builtIn.append(QString::number(number));
        builtIn.sort();
        QCOMPARE(numbers, builtIn);
        for (const QString& text : content.texts)
            QVERIFY2(!text.trimmed().isEmpty() && !text.contains(u'\r') && !text.contains(QChar(0)), qPrintable(text));
        // Text 760 is followed by the game's caption; the remove-all question and the install dialog title
        // both look for the "..." of 1100 and 1085; filter labels must not break "label|pattern" pairs.
        QVERIFY(content.texts.value(u"760"_qs).endsWith(u' '));
        QVERIFY(content.texts.value(u"1100"_qs).endsWith(u"..."_qs));
        QVERIFY(content.texts.value(u"1085"_qs).endsWith(u"..."_qs));
        QVERIFY(!content.texts.value(u"720"_qs).contains(u'|') && !content.texts.value(u"725"_qs).contains(u'|'));

        // Written for the Windows program too: in the code page of its charset, not UTF-8, with CR LF.
        QStringDecoder utf8(QStringConverter::Utf8);
        const QString asUtf8 = utf8(bytes);
        QVERIFY2(utf8.hasError(), "the file is UTF-8, not in the code page of its charset");
        QCOMPARE(bytes.count('\n'), bytes.count("\r\n"));
        QCOMPARE(bytes.count('\r'), bytes.count("\r\n"));
        QVERIFY(bytes.endsWith("\r\n"));
    }

    void builtInTable()
    {
        const QList<int> numbers = BuiltInTextNumbers();
        for (int number : {10, 20, 30, 40, 50, 690, 720, 725, 730, 750, 760, 770, 1010, 1020, 1060, 1070, 1080, 1085,
                 1090, 1100, 1110, 1130, 1150, 1160, 1180, 1200, 1210, 1220, 1250, 1260, 1270, 2010, 2020, 2030, 2040,
                 2050, 5001, 5026})
            QVERIFY2(numbers.contains(number) && !BuiltInText(number).isEmpty(), qPrintable(QString::number(number)));
        QVERIFY(!numbers.contains(5027));
        QCOMPARE(BuiltInText(760), u"Remove "_qs);
        QCOMPARE(BuiltInText(2030), u"Internet Chervi"_qs);
        QCOMPARE(BuiltInText(4), QString());
    }

    void publisherGames()
    {
        const QStringList titles = MakerGameList().split(u',');
        QCOMPARE(titles.size(), 26);
        QSet<QString> seen;
        for (int i = 0; i < titles.size(); ++i) {
            QVERIFY2(!titles[i].isEmpty() && titles[i].trimmed() == titles[i], qPrintable(titles[i]));
            QVERIFY2(!seen.contains(titles[i].toLower()), qPrintable(titles[i]));
            seen.insert(titles[i].toLower());
            // A title inside the Zone membership text would be taken for an Internet game.
            QVERIFY(!u"*bckgzm*chkrzm*hrtzzm*Rvsezm*shvlzm*"_qs.contains(titles[i], Qt::CaseInsensitive));
            QCOMPARE(BuiltInText(5001 + i), PublisherGameName(i));
        }
        QCOMPARE(PublisherGameName(-1), QString());
        QCOMPARE(PublisherGameName(26), QString());
    }
};

BV_REGISTER_TEST(tst_LanguageFiles);
#include "tst_languagefiles.moc"
