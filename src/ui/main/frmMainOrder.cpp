// The Order menu and the play history the window shows in its tooltips.
#include "ui/main/frmMain.h"

#include "catalogue/ListOrder.h"
#include "catalogue/PlayHistoryText.h"
#include "store/PlayHistory.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

#include <QAction>
#include <QActionGroup>
#include <QMenu>

namespace Brimvault {

void frmMain::createOrderMenu()
{
    m_mnuOrder = m_mnuActions->addMenu(QString());
    m_mnuOrder->setObjectName(QStringLiteral("mnuOrder"));
    m_mnuOrder->menuAction()->setObjectName(QStringLiteral("mnuOrder"));
    auto* group = new QActionGroup(m_mnuOrder);
    const std::pair<const char*, ListOrder> choices[] = {{"mnuOrderFound", ListOrder::AsFound},
        {"mnuOrderName", ListOrder::ByName}, {"mnuOrderRecent", ListOrder::RecentlyPlayed}};
    for (const auto& [name, order] : choices) {
        QAction* action = m_mnuOrder->addAction(QString());
        action->setObjectName(QString::fromLatin1(name));
        action->setCheckable(true);
        action->setData(int(order));
        group->addAction(action);
        connect(action, &QAction::triggered, this, [this, order = order] { chooseOrder(int(order)); });
    }
    connect(m_mnuOrder, &QMenu::aboutToShow, this, &frmMain::checkStoredOrder);
    checkStoredOrder();
}

void frmMain::checkStoredOrder()
{
    const int stored = int(ListOrders::Stored());
    for (QAction* action : m_mnuOrder->actions())
        action->setChecked(action->data().toInt() == stored);
}

void frmMain::chooseOrder(int order)
{
    ListOrders::Store(ListOrder(order));
    checkStoredOrder();
    if (m_closing)
        return;
    m_listView->RemoveAll();
    RebuildList();
}

QString frmMain::itemToolTip(int index) const
{
    const QString path = m_listView->labN(index).tag();
    return m_listView->labN(index).text().simplified() + u'\n' + path + u'\n'
        + PlayHistoryText::Summary(PlayHistory::Read(path));
}

} // namespace Brimvault
