#include "gameactions/ItemMenuDelay.h"

#include <QTimer>

namespace Brimvault {

ItemMenuDelay::ItemMenuDelay(QObject* parent)
    : QObject(parent)
    , m_timer(new QTimer(this))
{
    m_timer->setInterval(DelayMs);
    m_timer->setSingleShot(true);
    m_timer->setTimerType(Qt::PreciseTimer);
    connect(m_timer, &QTimer::timeout, this, &ItemMenuDelay::showItemMenu);
}

void ItemMenuDelay::mouseButtonPressed(int button)
{
    // Arming a timer that is already armed leaves its tick where it was: two quick clicks, one menu.
    if (button == RightButton && !m_timer->isActive())
        m_timer->start();
}

bool ItemMenuDelay::isPending() const
{
    return m_timer->isActive();
}

} // namespace Brimvault
