#pragma once

namespace Brimvault {

// Answers the prompt seam (support/UserPrompt.h) with real message boxes and input boxes, parented to the
// active window. The program installs them once at start; in-process tests install their own handlers.
void InstallWidgetPrompts();

} // namespace Brimvault
