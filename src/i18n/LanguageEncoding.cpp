#include "i18n/LanguageEncoding.h"

#include "i18n/CodePageTables.h"

#include <QStringDecoder>
#include <QStringEncoder>

namespace Brimvault::modLocalizer {

int CodePageForCharset(int charset)
{
    switch (charset) {
    case 77: // MAC_CHARSET
        return 10000;
    case 128: // SHIFTJIS_CHARSET
        return 932;
    case 129: // HANGUL_CHARSET
        return 949;
    case 130: // JOHAB_CHARSET
        return 1361;
    case 134: // GB2312_CHARSET
        return 936;
    case 136: // CHINESEBIG5_CHARSET
        return 950;
    case 161: // GREEK_CHARSET
        return 1253;
    case 162: // TURKISH_CHARSET
        return 1254;
    case 163: // VIETNAMESE_CHARSET
        return 1258;
    case 177: // HEBREW_CHARSET
        return 1255;
    case 178: // ARABIC_CHARSET
        return 1256;
    case 186: // BALTIC_CHARSET
        return 1257;
    case 204: // RUSSIAN_CHARSET
        return 1251;
    case 222: // THAI_CHARSET
        return 874;
    case 238: // EASTEUROPE_CHARSET
        return 1250;
    case 255: // OEM_CHARSET
        return 437;
    default:
        return 1252;
    }
}

namespace {

QByteArray ConverterName(int codePage)
{
    switch (codePage) {
    case 437:
        return QByteArrayLiteral("IBM437");
    case 874:
        return QByteArrayLiteral("windows-874");
    case 932:
        return QByteArrayLiteral("Shift_JIS");
    case 936:
        return QByteArrayLiteral("GBK");
    case 949:
        return QByteArrayLiteral("windows-949");
    case 950:
        return QByteArrayLiteral("Big5");
    case 1361:
        return QByteArrayLiteral("johab");
    case 10000:
        return QByteArrayLiteral("macintosh");
    default:
        return "windows-" + QByteArray::number(codePage);
    }
}

bool IsValidUtf8(QByteArrayView bytes, QString* decoded)
{
    QStringDecoder decoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    QString text = decoder.decode(bytes);
    if (decoder.hasError())
        return false;
    *decoded = std::move(text);
    return true;
}

} // namespace

QString DecodeCodePage(const QByteArray& bytes, int codePage)
{
    // Our own tables come first for the code pages we ship, so that a build without ICU reads them alike.
    if (detail::HasCodePageTable(codePage))
        return detail::DecodeWithCodePageTable(bytes, codePage);
    QStringDecoder decoder(ConverterName(codePage).constData(), QStringConverter::Flag::Stateless);
    if (decoder.isValid())
        return decoder.decode(bytes);
    return detail::DecodeWithCodePageTable(bytes, 1252);
}

int EncodeCharacter(QChar character, int codePage)
{
    if (character.unicode() < 0x80 || detail::HasCodePageTable(codePage))
        return detail::EncodeWithCodePageTable(character, codePage);
    QStringEncoder encoder(ConverterName(codePage).constData(), QStringConverter::Flag::Stateless);
    if (!encoder.isValid())
        return detail::EncodeWithCodePageTable(character, 1252);
    const QByteArray bytes = encoder.encode(QStringView(&character, 1));
    // Converters write what they cannot map as "?" or SUB.
    if (encoder.hasError() || bytes.size() != 1 || bytes.at(0) == '?' || bytes.at(0) == '\x1a')
        return -1;
    return static_cast<unsigned char>(bytes.at(0));
}

QString DecodeLanguageFileBytes(const QByteArray& bytes, int charset)
{
    QByteArrayView view(bytes);
    if (view.startsWith("\xEF\xBB\xBF"))
        view = view.sliced(3);
    QString decoded;
    if (IsValidUtf8(view, &decoded))
        return decoded;
    return DecodeCodePage(bytes, CodePageForCharset(charset));
}

} // namespace Brimvault::modLocalizer
