#include "support/TextCase.h"

#include <algorithm>
#include <optional>

namespace Brimvault {

namespace {

// `from`..`to` is the ASCII range that changes, `shift` what is added to each of its letters; nothing when
// the text is not all ASCII and needs the general conversion.
std::optional<QString> convertAscii(const QString& text, char16_t from, char16_t to, int shift)
{
    QString converted(text.size(), Qt::Uninitialized);
    const char16_t* in = reinterpret_cast<const char16_t*>(text.constData());
    char16_t* out = reinterpret_cast<char16_t*>(converted.data());
    for (qsizetype i = 0; i < text.size(); ++i) {
        const char16_t c = in[i];
        if (c >= 0x80)
            return std::nullopt;
        out[i] = (c >= from && c <= to) ? char16_t(c + shift) : c;
    }
    return converted;
}

bool isAscii(const QString& text)
{
    return std::all_of(text.cbegin(), text.cend(), [](QChar c) { return c.unicode() < 0x80; });
}

char16_t foldedAscii(QChar c)
{
    return (c >= u'A' && c <= u'Z') ? char16_t(c.unicode() + ('a' - 'A')) : c.unicode();
}

} // namespace

QString UpperCased(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'a', u'z', 'A' - 'a');
    return converted ? *std::move(converted) : text.toUpper();
}

QString LowerCased(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'A', u'Z', 'a' - 'A');
    return converted ? *std::move(converted) : text.toLower();
}

QString CaseFolded(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'A', u'Z', 'a' - 'A');
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
