#pragma once

namespace Brimvault {

namespace ReclamaSchedule {
enum class UnloadMode;
}

// Shows the advertisement due today in a new media host window when the main window closes with `mode`.
// True when a window was opened; every failure passes quietly.
bool ShowDueReclama(ReclamaSchedule::UnloadMode mode);

} // namespace Brimvault
