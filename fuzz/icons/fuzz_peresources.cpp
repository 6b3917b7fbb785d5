#include "icons/PeModule.h"

#include <QByteArray>

using namespace Brimvault;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const auto opened = PeModule::fromBytes(QByteArray(reinterpret_cast<const char*>(data), qsizetype(size)));
    if (!opened.module)
        return 0;
    const PeModule& module = *opened.module;
    // Every type may list the same long name directory: bound the cross product, not the reader.
    int lookups = 4096;
    for (const ResourceKey& type : module.resourceTypes()) {
        const auto names = module.resourceNames(type);
        if (!names)
            continue;
        for (const ResourceKey& name : *names) {
            if (--lookups < 0)
                break;
            const auto found = module.findResource(type, name);
            if (found && found->data && found->data->size() != qsizetype(found->size))
                __builtin_trap();
        }
    }
    for (const ResourceLeaf& leaf : module.allResources()) {
        if (leaf.fileOffset >= 0 && leaf.fileOffset + qint64(leaf.size) > qint64(size))
            __builtin_trap();
    }
    return 0;
}
