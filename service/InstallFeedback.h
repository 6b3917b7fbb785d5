#pragma once

#include "GameInstaller.h"

#include <memory>

namespace Brimvault {

// What the user sees of an install: a progress window and message boxes when there is a display, lines on
// standard error otherwise. Failures always go to standard error as well.
class InstallFeedback {
public:
    virtual ~InstallFeedback();

    virtual void phase(InstallPhase phase, const QString& gameFolder) = 0;
    // False when the user cancelled.
    virtual bool progress(qint64 done, qint64 total) = 0;
    virtual void failed(const QString& reason) = 0;

protected:
    // Packages smaller than this unpack too fast for progress to be worth showing.
    static constexpr qint64 LargePackageBytes = 8 * 1024 * 1024;
};

// Decided from the platform: the offscreen and minimal platforms, or no X11 or Wayland display, mean none.
bool DisplayAvailable();

// Without this a display that cannot be opened would end the process before it could say why.
void PreferOffscreenFallback();

std::unique_ptr<InstallFeedback> MakeConsoleFeedback();
// Needs a QApplication.
std::unique_ptr<InstallFeedback> MakeWindowFeedback();

void PrintToStandardError(const QString& text);

} // namespace Brimvault
