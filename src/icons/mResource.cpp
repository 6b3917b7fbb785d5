#include "icons/mResource.h"

#include "icons/PeModule.h"

namespace Brimvault::mResource {

QString ApiErrorText(PeError error)
{
    switch (error) {
    case PeError::None:
        return QStringLiteral("The operation completed successfully.");
    case PeError::FileNotFound:
        return QStringLiteral("The system cannot find the file specified.");
    case PeError::AccessDenied:
        return QStringLiteral("Access is denied.");
    case PeError::InvalidHandle:
        return QStringLiteral("The handle is invalid.");
    case PeError::BadFormat:
        return QStringLiteral("%1 is not a valid Win32 application.");
    case PeError::NoResourceSection:
        return QStringLiteral("The specified image file did not contain a resource section.");
    case PeError::TypeNotFound:
        return QStringLiteral("The specified resource type cannot be found in the image file.");
    case PeError::NameNotFound:
        return QStringLiteral("The specified resource name cannot be found in the image file.");
    }
    return {};
}

PeError EnumTypes(const PeModule* module, QList<ResourceKey>& out)
{
    if (!module)
        return PeError::InvalidHandle;
    if (!module->hasResources())
        return PeError::NoResourceSection;
    out.append(module->resourceTypes());
    return PeError::None;
}

PeError EnumNames(const PeModule* module, const ResourceKey& type, QList<ResourceKey>& out)
{
    if (!module)
        return PeError::InvalidHandle;
    if (!module->hasResources())
        return PeError::NoResourceSection;
    const auto names = module->resourceNames(type);
    if (!names)
        return PeError::TypeNotFound;
    out.append(*names);
    return PeError::None;
}

QVariant KeyToVariant(const ResourceKey& key)
{
    return key.named ? QVariant(key.name) : QVariant(int(key.id));
}

} // namespace Brimvault::mResource
