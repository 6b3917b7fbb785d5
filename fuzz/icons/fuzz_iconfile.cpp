#include "FuzzFile.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"

#include <QImage>

using namespace Brimvault;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    cFileIcon icon;
    if (!icon.LoadIcon(WriteFuzzInput(data, size)))
        return 0;
    for (int i = 1; i <= icon.ImageCount(); ++i) {
        (void)icon.ImageColourCount(i);
        (void)icon.IconHandle(i);
    }
    (void)icon.BestIconPicture();
    const QByteArray saved = icon.toIconFile();
    try {
        icon.AddImage(16, 16, 16);
        icon.RemoveImage(1);
    } catch (const NumberedError&) { }
    cFileIcon copy;
    icon.CloneTo(copy);
    if (copy.toIconFile() != icon.toIconFile())
        __builtin_trap();
    return saved.isEmpty() ? 1 : 0;
}
