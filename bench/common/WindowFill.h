#pragma once

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QEvent>
#include <QEventLoop>
#include <QTimer>

#include <memory>

// What the benchmarks that open the main window read off one fill.
struct FillTimes {
    bool filled = false; // discovery filled the list and no icon waits
    double fill = 0; // milliseconds from construction to filled
    double firstScreen = -1; // ... to the rows visible without scrolling painted with their captions and icons
    double longestGap = 0; // the longest wait of a 1 ms timer for the event loop between show and filled
};

namespace WindowFillDetail {

// Notes the first paint of the list that shows a full screen whose every visible item has its picture.
class FirstScreenWatch : public QObject {
public:
    FirstScreenWatch(Brimvault::SimpleListView* list, const QElapsedTimer& clock, double* at)
        : m_list(list)
        , m_clock(clock)
        , m_at(at)
    {
        list->installEventFilter(this);
    }

    bool eventFilter(QObject* watched, QEvent* event) override
    {
        if (*m_at < 0 && watched == m_list && event->type() == QEvent::Paint && screenComplete())
            *m_at = double(m_clock.nsecsElapsed()) / 1e6;
        return false;
    }

private:
    bool screenComplete() const
    {
        const int count = m_list->loadedCount();
        const int height = m_list->height();
        // Full: the newest item reaches the bottom edge (the list is not scrolled while it fills); items out of
        // sight are not painted, so this is the last paint that can show it.
        if (count < 2 || m_list->itemRect(count - 1).bottom() < height - 1)
            return false;
        for (int i = 0; i < count && m_list->itemRect(i).top() < height; ++i) {
            if (m_list->imgN(i).Picture().isNull() || m_list->labN(i).text().isEmpty())
                return false;
        }
        return true;
    }

    Brimvault::SimpleListView* m_list;
    const QElapsedTimer& m_clock;
    double* m_at;
};

} // namespace WindowFillDetail

// Opens the main window and lets events run until the list is filled or until timeoutMs.
inline std::unique_ptr<Brimvault::frmMain> OpenFilledWindow(int timeoutMs, FillTimes* times)
{
    QElapsedTimer clock;
    clock.start();
    auto window = std::make_unique<Brimvault::frmMain>();
    bool rebuilt = false;
    QObject::connect(window.get(), &Brimvault::frmMain::listRebuilt, window.get(), [&rebuilt] { rebuilt = true; });
    WindowFillDetail::FirstScreenWatch watch(window->ListView1(), clock, &times->firstScreen);
    QTimer ticker;
    ticker.setTimerType(Qt::PreciseTimer);
    ticker.setInterval(1);
    qint64 lastTick = -1;
    bool filling = true; // as it was at the last tick: the wait that ends the fill still counts
    QObject::connect(&ticker, &QTimer::timeout, [&] {
        const qint64 now = clock.nsecsElapsed();
        if (filling)
            times->longestGap = qMax(times->longestGap, double(now - lastTick) / 1e6);
        lastTick = now;
        filling = !rebuilt;
    });
    window->show();
    ticker.start();
    lastTick = clock.nsecsElapsed();
    while (!(rebuilt && window->pendingIcons() == 0) && clock.elapsed() < timeoutMs)
        QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents | QEventLoop::AllEvents, 50);
    times->fill = double(clock.nsecsElapsed()) / 1e6;
    times->filled = rebuilt && window->pendingIcons() == 0;
    return window;
}
