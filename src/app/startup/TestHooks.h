#pragma once

class QString;

namespace Brimvault {

class frmMain;

// Hooks for tests that start the real program as a child process. Each is off unless its environment
// variable names a file, and none of them changes what the program does when they are off.
namespace TestHooks {

// BRIMVAULT_PROMPT_LOG: every message box and input box is appended to the file as one JSON object per
// line (kind, title, text, icon, buttons) instead of being shown, and answered with its cancelling button
// (OK for a box that has only OK), so that an unattended run never waits for a click. True when installed.
bool InstallPromptLogIfRequested();

// BRIMVAULT_WINDOW_REPORT: once the window has filled its list and the icon queue is empty, writes what it
// shows (title, captions, each item's data and kind of picture) as JSON to the file and ends the event loop
// with exit code 0.
void ReportWindowWhenFilled(frmMain* window);

} // namespace TestHooks

} // namespace Brimvault
