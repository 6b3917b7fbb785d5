#include "ui/listview/SimpleListView.h"

#include <QHelpEvent>
#include <QToolTip>

namespace Brimvault {

void SimpleListView::setToolTipSource(std::function<QString(int index)> source)
{
    m_toolTipSource = std::move(source);
}

bool SimpleListView::showItemToolTip(QHelpEvent* help)
{
    const Hit hit = hitTest(help->pos());
    const QString text = hit.index >= 0 && m_toolTipSource ? m_toolTipSource(hit.index) : QString();
    if (text.isEmpty()) {
        QToolTip::hideText();
        help->ignore();
    } else {
        QToolTip::showText(help->globalPos(), text, this);
    }
    return true;
}

} // namespace Brimvault
