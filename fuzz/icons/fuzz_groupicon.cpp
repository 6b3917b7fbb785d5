#include "FuzzFile.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"
#include "icons/cResources.h"

#include <QImage>

using namespace Brimvault;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const QString path = WriteFuzzInput(data, size);
    cFileIcon icon;
    if (icon.LoadMainIconFromEXE(path)) {
        qint64 total = 6 + 16 * qint64(icon.ImageCount());
        for (int i = 1; i <= icon.ImageCount(); ++i)
            total += icon.ImageSize(i);
        if (total != icon.toIconFile().size())
            __builtin_trap();
        (void)icon.BestIconPicture();
    }
    (void)icon.LoadIconFromEXE(path, 1, QStringLiteral("#2"));
    try {
        cResources resources;
        resources.setFile(path);
        const int types = qMin(resources.GetResourceTypes(), 64);
        for (int t = 1; t <= types; ++t) {
            const int count = resources.GetResourceNames(t);
            for (int n = 1; n <= count; ++n)
                (void)resources.ResourceName(t, n);
        }
    } catch (const NumberedError&) { }
    return 0;
}
