#include "i18n/LanguageEncoding.h"
#include "i18n/LanguageFile.h"

#include <QByteArray>
#include <cstddef>
#include <cstdint>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArray bytes = QByteArray::fromRawData(reinterpret_cast<const char*>(data), qsizetype(size));
    const auto content = Brimvault::modLocalizer::ParseLanguageFile(bytes);
    (void)content.isUsable();
    // Every code page a charset can name, including those decoded by Qt rather than our tables.
    for (int charset : {0, 128, 129, 134, 136, 161, 204, 222, 238})
        (void)Brimvault::modLocalizer::DecodeLanguageFileBytes(bytes, charset);
    return 0;
}
