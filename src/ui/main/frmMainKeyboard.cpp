// The menus opened from the keyboard: where they show and what they select first.
#include "ui/main/frmMain.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/KeyboardMenus.h"
#include "ui/main/WindowAccessible.h"

#include <QAction>
#include <QMenu>

namespace Brimvault {

namespace {

void popupWithFirstItem(QMenu* menu, const QPoint& at)
{
    menu->popup(at);
    for (QAction* action : menu->actions()) {
        if (!action->isSeparator() && action->isEnabled()) {
            menu->setActiveAction(action);
            break;
        }
    }
}

} // namespace

void frmMain::createKeyboardMenus()
{
    InstallWindowAccessibility();
    new KeyboardMenus(
        this, [this] { showActionsMenuFromKeyboard(); }, [this] { showItemMenuFromKeyboard(); });
}

void frmMain::showActionsMenuFromKeyboard()
{
    if (m_mnuActions && !m_mnuActions->isVisible())
        popupWithFirstItem(m_mnuActions, m_imgActions->mapToGlobal(QPoint(0, m_imgActions->height())));
}

void frmMain::showItemMenuFromKeyboard()
{
    const int current = m_listView->currentItem();
    if (!m_mnuItemPopup || m_mnuItemPopup->isVisible() || current < 0)
        return;
    // The item comes into view first, so that the menu opens beside the icon it acts on.
    m_listView->focusItem(current);
    const QRectF icon = m_listView->imgN(current).geometry();
    popupWithFirstItem(m_mnuItemPopup, m_listView->mapToGlobal(icon.center().toPoint()));
}

} // namespace Brimvault
