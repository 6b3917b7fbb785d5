#include "ui/listview/SimpleListViewAccessible.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"

namespace Brimvault {

SimpleListViewAccessible::SimpleListViewAccessible(SimpleListView* list)
    : QAccessibleWidget(list, QAccessible::List)
{ }

SimpleListViewAccessible::~SimpleListViewAccessible()
{
    for (QAccessible::Id id : std::as_const(m_items))
        QAccessible::deleteAccessibleInterface(id);
}

QAccessibleInterface* SimpleListViewAccessible::factory(const QString& className, QObject* object)
{
    auto* list = qobject_cast<SimpleListView*>(object);
    if (!list || className != QLatin1StringView(object->metaObject()->className()))
        return nullptr;
    return new SimpleListViewAccessible(list);
}

SimpleListView* SimpleListViewAccessible::list() const
{
    return static_cast<SimpleListView*>(widget());
}

const std::vector<int>& SimpleListViewAccessible::shownItems() const
{
    // A reader walks every child in turn: the shown items are listed once per change, not once per question.
    const SimpleListView* view = list();
    const quint64 key = view->shownRevision();
    if (key != m_shownKey) {
        m_shown.clear();
        for (int i = 0; i < view->layoutState().itemCount; ++i) {
            if (view->isItemShown(i))
                m_shown.push_back(i);
        }
        m_shownKey = key;
    }
    return m_shown;
}

int SimpleListViewAccessible::childOfItem(int itemIndex) const
{
    const std::vector<int>& shown = shownItems();
    const auto found = std::lower_bound(shown.begin(), shown.end(), itemIndex);
    return found != shown.end() && *found == itemIndex ? int(found - shown.begin()) : -1;
}

int SimpleListViewAccessible::childCount() const
{
    return int(shownItems().size());
}

QAccessibleInterface* SimpleListViewAccessible::itemInterface(int itemIndex) const
{
    const auto known = m_items.constFind(itemIndex);
    if (known != m_items.cend())
        return QAccessible::accessibleInterface(*known);
    auto* item = new SimpleListViewItemAccessible(list(), itemIndex);
    m_items.insert(itemIndex, QAccessible::registerAccessibleInterface(item));
    return item;
}

QAccessibleInterface* SimpleListViewAccessible::child(int index) const
{
    const std::vector<int>& shown = shownItems();
    if (index < 0 || index >= int(shown.size()))
        return nullptr;
    return itemInterface(shown[std::size_t(index)]);
}

int SimpleListViewAccessible::indexOfChild(const QAccessibleInterface* child) const
{
    const auto* item = dynamic_cast<const SimpleListViewItemAccessible*>(child);
    return item && item->isValid() ? childOfItem(item->itemIndex()) : -1;
}

QAccessibleInterface* SimpleListViewAccessible::childAt(int x, int y) const
{
    const int child = childOfItem(list()->hitTest(list()->mapFromGlobal(QPoint(x, y))).index);
    return child >= 0 ? this->child(child) : nullptr;
}

QAccessibleInterface* SimpleListViewAccessible::focusChild() const
{
    const int current = list()->currentItem();
    if (!list()->hasFocus() || current < 0)
        return nullptr;
    const int child = childOfItem(current);
    return child >= 0 ? this->child(child) : nullptr;
}

QString SimpleListViewAccessible::text(QAccessible::Text t) const
{
    QString text = QAccessibleWidget::text(t);
    if (t == QAccessible::Name && text.isEmpty())
        text = SimpleListView::tr("Games");
    return text;
}

SimpleListViewItemAccessible::SimpleListViewItemAccessible(SimpleListView* list, int itemIndex)
    : m_list(list)
    , m_index(itemIndex)
{ }

bool SimpleListViewItemAccessible::isValid() const
{
    return m_list && m_index < m_list->layoutState().itemCount && m_list->isItemShown(m_index);
}

QWindow* SimpleListViewItemAccessible::window() const
{
    return m_list ? m_list->window()->windowHandle() : nullptr;
}

QAccessibleInterface* SimpleListViewItemAccessible::parent() const
{
    return m_list ? QAccessible::queryAccessibleInterface(m_list) : nullptr;
}

QString SimpleListViewItemAccessible::text(QAccessible::Text t) const
{
    if (!isValid())
        return {};
    switch (t) {
    case QAccessible::Name:
        return m_list->labN(m_index).text();
    case QAccessible::Description:
        return m_list->labN(m_index).tag();
    default:
        return {};
    }
}

QRect SimpleListViewItemAccessible::rect() const
{
    if (!isValid())
        return {};
    const QRect local = m_list->itemRect(m_index);
    return QRect(m_list->mapToGlobal(local.topLeft()), local.size());
}

QAccessible::State SimpleListViewItemAccessible::state() const
{
    QAccessible::State state;
    if (!isValid()) {
        state.invalid = true;
        return state;
    }
    state.selectable = true;
    state.focusable = true;
    state.selected = m_list->currentItem() == m_index;
    state.focused = state.selected && m_list->hasFocus();
    state.offscreen = !m_list->rect().intersects(m_list->itemRect(m_index));
    return state;
}

void* SimpleListViewItemAccessible::interface_cast(QAccessible::InterfaceType type)
{
    return type == QAccessible::ActionInterface ? static_cast<QAccessibleActionInterface*>(this) : nullptr;
}

// Pressing an item starts its game, as Enter and a double click do; the first action is a reader's default.
QStringList SimpleListViewItemAccessible::actionNames() const
{
    return {pressAction(), setFocusAction()};
}

void SimpleListViewItemAccessible::doAction(const QString& actionName)
{
    if (!isValid())
        return;
    if (actionName == pressAction())
        m_list->activateItem(m_index);
    else if (actionName == setFocusAction())
        m_list->focusItem(m_index);
}

QStringList SimpleListViewItemAccessible::keyBindingsForAction(const QString& actionName) const
{
    if (actionName == pressAction())
        return {QStringLiteral("Return")};
    return {};
}

} // namespace Brimvault
