#pragma once

#include "ui/main/frmMain.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QEventLoop>

#include <memory>

// For the benchmarks that link the main window: opens it and lets events run until discovery has filled the
// list and no icon waits, or until timeoutMs. *filled says whether it got there; *milliseconds is the time
// from construction.
inline std::unique_ptr<Brimvault::frmMain> OpenFilledWindow(int timeoutMs, bool* filled, double* milliseconds)
{
    QElapsedTimer timer;
    timer.start();
    auto window = std::make_unique<Brimvault::frmMain>();
    bool rebuilt = false;
    QObject::connect(window.get(), &Brimvault::frmMain::listRebuilt, window.get(), [&rebuilt] { rebuilt = true; });
    window->show();
    while (!(rebuilt && window->pendingIcons() == 0) && timer.elapsed() < timeoutMs)
        QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents | QEventLoop::AllEvents, 50);
    *filled = rebuilt && window->pendingIcons() == 0;
    *milliseconds = double(timer.nsecsElapsed()) / 1e6;
    return window;
}
