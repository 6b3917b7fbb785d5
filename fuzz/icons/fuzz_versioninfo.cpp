#include "icons/VersionResource.h"

#include <QByteArray>

using namespace Brimvault;

// The input is a version block as an executable's version resource holds it.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const VersionResource block(QByteArray(reinterpret_cast<const char*>(data), qsizetype(size)));
    const auto strings = ReadVersionStrings(block);
    if (strings && (strings->translation.size() != 8 || strings->values.size() != VersionFieldNames().size()))
        __builtin_trap();
    (void)block.queryValue(QStringLiteral("\\"));
    (void)block.queryString(QStringLiteral("\\StringFileInfo\\040904B0\\ProductName"));
    return 0;
}
