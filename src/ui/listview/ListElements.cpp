#include "ui/listview/ListElements.h"

#include "ui/listview/SimpleListView.h"

namespace Brimvault {

ListIcon::ListIcon(SimpleListView* list, int index)
    : m_list(list)
    , m_index(index)
{ }

bool ListIcon::isLoaded() const
{
    return m_list && m_list->m_model.isLoaded(m_index);
}

QString ListIcon::Data() const
{
    return isLoaded() ? m_list->m_model.at(m_index).iconData : QString();
}

void ListIcon::SetData(const QString& data)
{
    if (isLoaded())
        m_list->m_model.at(m_index).iconData = data;
}

QPixmap ListIcon::Picture() const
{
    return isLoaded() ? m_list->m_model.at(m_index).face.picture() : QPixmap();
}

void ListIcon::SetPicture(const QPixmap& picture)
{
    if (!isLoaded())
        return;
    m_list->m_model.at(m_index).face.setPicture(picture);
    m_list->updateItem(m_index);
}

QColor ListIcon::BackColor() const
{
    return isLoaded() ? QColor::fromRgb(m_list->m_model.at(m_index).face.backColor()) : QColor();
}

QPixmap ListIcon::shownPicture() const
{
    return isLoaded() ? m_list->m_model.at(m_index).face.shownPicture() : QPixmap();
}

QRectF ListIcon::geometry() const
{
    return isLoaded() ? m_list->shownIconRect(m_list->m_model.at(m_index)) : QRectF();
}

bool ListIcon::isVisible() const
{
    return isLoaded() && m_list->m_model.at(m_index).iconVisible && !m_list->m_model.at(m_index).narrowedOut;
}

ListCaption::ListCaption(SimpleListView* list, int index)
    : m_list(list)
    , m_index(index)
{ }

bool ListCaption::isLoaded() const
{
    return m_list && m_list->m_model.isLoaded(m_index);
}

QString ListCaption::text() const
{
    return isLoaded() ? m_list->m_model.at(m_index).caption : QString();
}

QString ListCaption::tag() const
{
    return isLoaded() ? m_list->m_model.at(m_index).tag : QString();
}

QColor ListCaption::foreColor() const
{
    return isLoaded() ? QColor::fromRgb(m_list->m_model.at(m_index).captionColor) : QColor();
}

QRectF ListCaption::geometry() const
{
    return isLoaded() ? m_list->shownCaptionRect(m_list->m_model.at(m_index)) : QRectF();
}

bool ListCaption::isVisible() const
{
    return isLoaded() && m_list->m_model.at(m_index).captionVisible && !m_list->m_model.at(m_index).narrowedOut;
}

} // namespace Brimvault
