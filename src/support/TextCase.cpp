#include "support/TextCase.h"

#include <cstring>
#include <optional>

namespace Brimvault {

namespace {

bool isAscii(const QString& text)
{
    return QtPrivate::isAscii(QStringView(text));
}

// `from`..`to` is the ASCII range of letters that changes, `up` whether they move up by 0x20 (else down);
// nothing when the text is not all ASCII and needs the general conversion.
std::optional<QString> convertAscii(const QString& text, char16_t from, char16_t to, bool up)
{
    if (!isAscii(text))
        return std::nullopt;
    const qsizetype size = text.size();
    QString converted(size, Qt::Uninitialized);
    const char16_t* in = reinterpret_cast<const char16_t*>(text.constData());
    char16_t* out = reinterpret_cast<char16_t*>(converted.data());
    // Four characters at a time, one in each 16-bit lane. A lane at or above `from` gets its 0x80 bit from
    // the first sum, a lane above `to` from the second; as every character is below 0x80, no sum carries
    // into the next lane.
    constexpr quint64 eachLane = 0x0001000100010001ull;
    const quint64 atOrAboveFrom = eachLane * (0x80 - from);
    const quint64 aboveTo = eachLane * (0x7F - to);
    qsizetype i = 0;
    for (; i + 4 <= size; i += 4) {
        quint64 lanes = 0;
        std::memcpy(&lanes, in + i, sizeof lanes);
        const quint64 shift = ((lanes + atOrAboveFrom) & ~(lanes + aboveTo) & (eachLane * 0x80)) >> 2;
        lanes = up ? lanes + shift : lanes - shift;
        std::memcpy(out + i, &lanes, sizeof lanes);
    }
    for (; i < size; ++i) {
        const bool letter = in[i] >= from && in[i] <= to;
        out[i] = letter ? char16_t(up ? in[i] + 0x20 : in[i] - 0x20) : in[i];
    }
    return converted;
}

char16_t foldedAscii(QChar c)
{
    return (c >= u'A' && c <= u'Z') ? char16_t(c.unicode() + ('a' - 'A')) : c.unicode();
}

} // namespace

QString UpperCased(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'a', u'z', false);
    return converted ? *std::move(converted) : text.toUpper();
}

QString LowerCased(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'A', u'Z', true);
    return converted ? *std::move(converted) : text.toLower();
}

QString CaseFolded(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'A', u'Z', true);
    return converted ? *std::move(converted) : text.toCaseFolded();
}

qsizetype IndexOfIgnoringCase(const QString& text, const QString& key, qsizetype from)
{
    // Outside ASCII a letter may fold onto an ASCII one (the Kelvin sign onto "k"): Qt's tables decide there.
    if (key.isEmpty() || from < 0 || !isAscii(key) || !isAscii(text))
        return text.indexOf(key, from, Qt::CaseInsensitive);
    const char16_t first = foldedAscii(key.front());
    for (qsizetype at = from; at + key.size() <= text.size(); ++at) {
        if (foldedAscii(text.at(at)) != first)
            continue;
        qsizetype matched = 1;
        while (matched < key.size() && foldedAscii(text.at(at + matched)) == foldedAscii(key.at(matched)))
            ++matched;
        if (matched == key.size())
            return at;
    }
    return -1;
}

} // namespace Brimvault
