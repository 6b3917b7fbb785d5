#include "LocalizerTestFolder.h"
#include "i18n/BuiltInTexts.h"
#include "i18n/LanguageFile.h"
#include "i18n/PublisherGames.h"
#include "i18n/modLocalizer.h"

#include <QFile>
#include <QSet>
#include <QStringDecoder>
#include <QTest>
#include <memory>

using namespace Brimvault;
using namespace Brimvault::modLocalizer;

namespace {

QString ShippedFile(const QString& fileName)
{
    return QStringLiteral(BRIMVAULT_SOURCE_DIR "/lang/") + fileName;
}

QByteArray ReadShipped(const QString& fileName)
{
    QFile file(ShippedFile(fileName));
    if (!file.open(QIODevice::ReadOnly))
        return {};
    return file.readAll();
}

} // namespace

class tst_LanguageFiles : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init();
    void cleanup();

    void shippedFiles_data();
    void loads();
    void loads_data() { shippedFiles_data(); }
    void coversExactlyTheBuiltInNumbers();
    void coversExactlyTheBuiltInNumbers_data() { shippedFiles_data(); }
    void writtenInItsCodePageWithCrLf();
    void writtenInItsCodePageWithCrLf_data() { shippedFiles_data(); }
    void textsFitHowTheyAreUsed();
    void textsFitHowTheyAreUsed_data() { shippedFiles_data(); }
    void builtInTable();
    void publisherGames();
    void shippedBesideTheProgram();

private:
    std::unique_ptr<LocalizerTestFolder> m_folder;
};

void tst_LanguageFiles::init()
{
    m_folder = std::make_unique<LocalizerTestFolder>();
    UseBuiltInLanguage();
}

void tst_LanguageFiles::cleanup()
{
    m_folder.reset();
}

void tst_LanguageFiles::shippedFiles_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("language");
    QTest::addColumn<int>("charset");
    QTest::addColumn<QString>("helpFile");
    QTest::addColumn<QString>("dialogTitle"); // text 10, proves the decoding

    QTest::newRow("Russian") << QStringLiteral("Brimvault_Russian.lng") << QStringLiteral("Русский") << 204
                             << QStringLiteral("Brimvault_Russian.html") << QStringLiteral("Язык программы");
    QTest::newRow("Polish") << QStringLiteral("Brimvault_Polish.lng") << QStringLiteral("Polski") << 238
                            << QStringLiteral("Brimvault_Polish.html") << QStringLiteral("Język programu");
}

void tst_LanguageFiles::loads()
{
    QFETCH(QString, fileName);
    QFETCH(QString, language);
    QFETCH(int, charset);
    QFETCH(QString, helpFile);
    QFETCH(QString, dialogTitle);

    QVERIFY(QFile::copy(ShippedFile(fileName), m_folder->programDir() + u'/' + fileName));
    ChooseLanguageFile(m_folder->programDir() + u'/' + fileName);
    QVERIFY2(!UsesBuiltInTexts(), "the shipped file was refused");
    QCOMPARE(LanguageName(), language);
    QCOMPARE(int(LanguageCharset()), charset);
    QCOMPARE(HelpFilePath(), m_folder->programDir() + u'/' + helpFile);
    QCOMPARE(ShortLanguageName(), ShortNameFromFileName(fileName));
    QCOMPARE(Translate(10), dialogTitle);
    QCOMPARE(Translate(1020), QStringLiteral("Brimvault"));
}

void tst_LanguageFiles::coversExactlyTheBuiltInNumbers()
{
    QFETCH(QString, fileName);

    const LanguageFileContent content = ParseLanguageFile(ReadShipped(fileName));
    QVERIFY(content.isUsable());

    QSet<QString> expected;
    for (int number : BuiltInTextNumbers())
        expected.insert(QString::number(number));
    const QSet<QString> present(content.texts.keyBegin(), content.texts.keyEnd());

    QStringList missing = QStringList(expected.subtract(present).values());
    missing.sort();
    QVERIFY2(missing.isEmpty(), qPrintable(QStringLiteral("missing: ") + missing.join(u' ')));

    QSet<QString> builtIn;
    for (int number : BuiltInTextNumbers())
        builtIn.insert(QString::number(number));
    QStringList unknown = QStringList(QSet<QString>(present).subtract(builtIn).values());
    unknown.sort();
    QVERIFY2(unknown.isEmpty(), qPrintable(QStringLiteral("not used by the program: ") + unknown.join(u' ')));

    for (auto it = content.texts.cbegin(); it != content.texts.cend(); ++it)
        QVERIFY2(!it.value().trimmed().isEmpty(), qPrintable(QStringLiteral("empty text ") + it.key()));
}

void tst_LanguageFiles::writtenInItsCodePageWithCrLf()
{
    QFETCH(QString, fileName);
    QFETCH(int, charset);

    const QByteArray bytes = ReadShipped(fileName);
    QVERIFY(!bytes.isEmpty());

    // Written for the Windows program too, which reads the code page of the charset, not UTF-8.
    QStringDecoder utf8(QStringConverter::Utf8);
    const QString asUtf8 = utf8.decode(bytes);
    Q_UNUSED(asUtf8);
    QVERIFY2(utf8.hasError(), "the file is UTF-8, not in the code page of its charset");

    for (qsizetype i = 0; i < bytes.size(); ++i) {
        if (bytes[i] == '\n')
            QVERIFY2(i > 0 && bytes[i - 1] == '\r', qPrintable(QStringLiteral("bare LF at byte %1").arg(i)));
        if (bytes[i] == '\r')
            QVERIFY2(i + 1 < bytes.size() && bytes[i + 1] == '\n', "bare CR");
    }
    QVERIFY(bytes.endsWith("\r\n"));

    const QByteArray codePage = charset == 204 ? QByteArrayLiteral("windows-1251") : QByteArrayLiteral("windows-1250");
    QStringDecoder reference(codePage.constData());
    if (reference.isValid())
        QVERIFY(!QString(reference.decode(bytes)).contains(QChar::ReplacementCharacter));
}

void tst_LanguageFiles::textsFitHowTheyAreUsed()
{
    QFETCH(QString, fileName);
    const LanguageFileContent content = ParseLanguageFile(ReadShipped(fileName));

    // Text 760 is followed by the game's caption and "?".
    QVERIFY(content.texts.value(QStringLiteral("760")).endsWith(u' '));
    // The remove-all question turns every "..." of the menu caption into "?"; the install dialog title
    // drops it. Both must find it.
    QVERIFY(content.texts.value(QStringLiteral("1100")).endsWith(QStringLiteral("...")));
    QVERIFY(content.texts.value(QStringLiteral("1085")).endsWith(QStringLiteral("...")));
    // Filter labels must not break the "label|pattern" pairs of the file dialogs.
    for (const char* key : {"720", "725"})
        QVERIFY(!content.texts.value(QString::fromLatin1(key)).contains(u'|'));
    for (const QString& text : content.texts)
        QVERIFY2(!text.contains(QStringLiteral("\r")) && !text.contains(QChar(0)), qPrintable(text));
}

void tst_LanguageFiles::builtInTable()
{
    const QList<int> numbers = BuiltInTextNumbers();
    QVERIFY(std::is_sorted(numbers.begin(), numbers.end()));
    QCOMPARE(QSet<int>(numbers.begin(), numbers.end()).size(), numbers.size());
    for (int number : numbers)
        QVERIFY2(!BuiltInText(number).isEmpty(), qPrintable(QString::number(number)));
    for (int number :
        {10, 20, 30, 40, 50, 690, 720, 725, 730, 750, 760, 770, 1010, 1020, 1060, 1070, 1080, 1085, 1090, 1100, 1110,
            1130, 1150, 1160, 1180, 1200, 1210, 1220, 1250, 1260, 1270, 2010, 2020, 2030, 2040, 2050, 5001, 5026})
        QVERIFY2(numbers.contains(number), qPrintable(QString::number(number)));
    QVERIFY(!numbers.contains(5027));
    QCOMPARE(BuiltInText(760), QStringLiteral("Remove "));
    QCOMPARE(BuiltInText(2030), QStringLiteral("Internet Chervi"));
    QCOMPARE(BuiltInText(4), QString());
}

void tst_LanguageFiles::publisherGames()
{
    const QStringList titles = MakerGameList().split(u',');
    QCOMPARE(titles.size(), kPublisherGameCount);
    QSet<QString> seen;
    for (int i = 0; i < titles.size(); ++i) {
        const QString& title = titles[i];
        QVERIFY2(!title.isEmpty() && title.trimmed() == title, qPrintable(title));
        QVERIFY2(!seen.contains(title.toLower()), qPrintable(title));
        seen.insert(title.toLower());
        // A title inside the Zone membership text would be taken for an Internet game.
        QVERIFY2(!QStringLiteral("*bckgzm*chkrzm*hrtzzm*Rvsezm*shvlzm*").contains(title, Qt::CaseInsensitive),
            qPrintable(title));
        QCOMPARE(BuiltInText(kFirstPublisherGameText + i), PublisherGameName(i));
    }
    QCOMPARE(PublisherGameName(-1), QString());
    QCOMPARE(PublisherGameName(kPublisherGameCount), QString());
}

void tst_LanguageFiles::shippedBesideTheProgram()
{
    qputenv("BRIMVAULT_PROGRAM_DIR", BRIMVAULT_BIN_DIR);
    QStringList names;
    for (const LanguageFileInfo& file : ListLanguageFiles())
        names.append(file.fileName);
    QVERIFY2(names.contains(QStringLiteral("Brimvault_Russian.lng")), qPrintable(names.join(u',')));
    QVERIFY2(names.contains(QStringLiteral("Brimvault_Polish.lng")), qPrintable(names.join(u',')));
}

QTEST_GUILESS_MAIN(tst_LanguageFiles)
#include "tst_languagefiles.moc"
