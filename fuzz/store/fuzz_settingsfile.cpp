// The settings file from outside (hand edits, damage): reading and writing it back must keep every byte
// of what nobody changed, and a value written must read back.
#include "store/IniDocument.h"

#include <QByteArray>
#include <QStringDecoder>

#include <cstdint>
#include <cstdlib>

using namespace Brimvault;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));
    IniDocument doc = IniDocument::parse(bytes);
    if (doc.serialize() != bytes)
        std::abort();

    // Names and value come from the input too, so that odd characters reach the writer.
    QStringDecoder decoder(QStringConverter::Utf8, QStringConverter::Flag::Stateless);
    const QString tail = decoder.decode(bytes.right(12));
    const QString section = tail.left(3);
    const QString key = QStringLiteral("k") + tail.mid(3, 4);
    const QString value = tail.mid(7);
    doc.sectionPairs(section);
    doc.setValue(section, key, value);
    doc.setValue(QStringLiteral("Files"), tail, value);
    const QByteArray written = doc.serialize();
    const IniDocument reread = IniDocument::parse(written);
    // Slicing may cut a surrogate pair in two; such halves never come from outside and cannot be written.
    const bool wellFormed
        = QStringView(section).isValidUtf16() && QStringView(key).isValidUtf16() && QStringView(value).isValidUtf16();
    if (wellFormed && reread.value(section, key) != value)
        std::abort();
    if (reread.serialize() != written)
        std::abort();
    doc.removeValue(section, key);
    doc.removeSection(section);
    return 0;
}
