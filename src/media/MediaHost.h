#pragma once

#include "media/ReclamaSchedule.h"

#include <QString>

#include <functional>

namespace Brimvault {

// The media host window lives in a module of its own beside the program, loaded when a Flash movie or an
// advertisement is first shown: the web engine's libraries are large, and a program that links them pays for
// loading them at every start, even for `--list`.
namespace MediaHost {

// What the module offers. Both open a new window that deletes itself when it closes.
struct EntryPoints {
    // Plays the movie or page at `path`; `closed` runs when its window has gone, however it ended.
    void (*runGame)(const QString& path, const QString& caption, std::function<void()> closed);
    // Shows the advertisement; every failure passes quietly.
    void (*showReclama)(const ReclamaSchedule::DueReclama& due);
};

// The name the module exports its entry points under; the number changes with EntryPoints.
inline constexpr char EntryPointsSymbol[] = "BrimvaultMediaHost1";

// The media host, loaded on the first call; nullptr when the module is missing or cannot be loaded (the
// reason is logged).
const EntryPoints* Get();

// Tells the user that Flash movies cannot be played: the player, or the host around it, is missing.
void ReportFlashMissing();

// A program that links the media host in (the tests, Windows) hands it over here instead of a module.
void Provide(const EntryPoints* linkedIn);

} // namespace MediaHost
} // namespace Brimvault
