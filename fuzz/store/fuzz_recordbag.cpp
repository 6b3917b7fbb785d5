// Record bag text from outside (info files, the advertising file): the first line is a key part, the rest
// the bag's text. Every operation must end and keep its promises on any input.
#include "store/clsFileBag.h"

#include <QByteArray>
#include <QStringDecoder>

#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));
    const qsizetype split = bytes.indexOf('\n');
    QStringDecoder decoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    const QString part = split < 0 ? QString() : decoder.decode(bytes.left(split));
    const QString text = decoder.decode(split < 0 ? bytes : bytes.mid(split + 1));

    clsFileBag bag;
    bag.SetCurrentFileText(text);
    const QString key = clsFileBag::MakeKey(part, QStringLiteral("x"));
    for (qint16 field = -1; field < 5; ++field)
        clsFileBag::GetField(key, field);
    bag.RecordCount();
    for (qint16 mode = 0; mode < 4; ++mode) {
        if (bag.GetAll(key, mode).last() != QString())
            std::abort();
        bag.GetAll(part, mode);
    }
    const QString record = bag.GetRecord(key);
    if (!record.isEmpty() && !text.contains(record))
        std::abort();

    // What is set can be read back, whatever the text around it held.
    bag.SetRecord(key, part);
    if (!part.contains(QStringLiteral("\\{"))
        && bag.GetValue(key, QStringLiteral("\x01")) != (part.isEmpty() ? QStringLiteral("\x01") : part))
        std::abort();
    bag.RemoveRecord(key, true);
    if (!bag.GetRecord(key).isEmpty())
        std::abort();
    bag.RemoveRecord(part, true);
    return 0;
}
