#pragma once

#include <QList>
#include <QString>
#include <QVariant>

namespace Brimvault {
class PeModule;
struct ResourceKey;
enum class PeError;
} // namespace Brimvault

// The enumeration wrappers behind cResources and the wording of platform errors.
namespace Brimvault::mResource {

// The system's text for a platform error number, as the platform's message formatter gives it.
QString ApiErrorText(PeError error);

// Fill `out` with the module's types, or a type's names, in directory order.
PeError EnumTypes(const PeModule* module, QList<ResourceKey>& out);
PeError EnumNames(const PeModule* module, const ResourceKey& type, QList<ResourceKey>& out);

// An integer id as an int, a name as its text.
QVariant KeyToVariant(const ResourceKey& key);

} // namespace Brimvault::mResource
