#include "ui/listview/ListModel.h"

namespace Brimvault {

int SelectionFrame::currentIndex() const
{
    return tag.trimmed().toInt();
}

ListModel::ListModel()
{
    ListItem first;
    first.caption = QStringLiteral("Label1");
    m_items.push_back(std::move(first));
}

ListItem& ListModel::load()
{
    // A new element starts as a copy of the first one's caption properties, hidden and without content.
    ListItem item;
    item.face.setBackColor(m_items.front().face.backColor());
    item.captionLeft = m_items.front().captionLeft;
    item.captionTop = m_items.front().captionTop;
    item.iconLeft = m_items.front().iconLeft;
    item.iconTop = m_items.front().iconTop;
    m_items.push_back(std::move(item));
    return m_items.back();
}

void ListModel::unloadLast()
{
    if (m_items.size() > 1)
        m_items.pop_back();
}

void ListModel::unloadAllButFirst()
{
    m_items.resize(1);
}

void ListModel::reserve(int count)
{
    if (count > 0)
        m_items.reserve(std::size_t(count));
}

void ListModel::copyContent(int from, int to)
{
    const ListItem& source = at(from);
    ListItem& target = at(to);
    target.face.setPictureOf(source.face);
    target.caption = source.caption;
    target.captionHeight = source.captionHeight;
    target.tag = source.tag;
    target.narrowedOut = source.narrowedOut;
}

} // namespace Brimvault
