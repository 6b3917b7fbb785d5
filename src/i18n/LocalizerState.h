#pragma once

class QString;

namespace Brimvault::modLocalizer::detail {

// The short name comes from the chosen file's name, not from the file, so the choice code sets it.
void SetShortLanguageName(const QString& shortName);

} // namespace Brimvault::modLocalizer::detail
