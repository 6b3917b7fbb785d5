#include "support/TextCase.h"

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

} // namespace

QString UpperCased(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'a', u'z', 'A' - 'a');
    return converted ? *std::move(converted) : text.toUpper();
}

QString CaseFolded(const QString& text)
{
    std::optional<QString> converted = convertAscii(text, u'A', u'Z', 'a' - 'A');
    return converted ? *std::move(converted) : text.toCaseFolded();
}

} // namespace Brimvault
