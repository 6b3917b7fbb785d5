#include "ui/listview/SimpleListView.h"

#include "icons/NumberedError.h"
#include "ui/listview/GridLayout.h"
#include "ui/listview/ListConstants.h"
#include "ui/listview/ListElements.h"

#include <QScrollBar>
#include <QStyle>
#include <QTimer>

namespace Brimvault {

SimpleListView::SimpleListView(QWidget* parent)
    : QWidget(parent)
    , m_wrapper(font())
    , m_backColor(QColor::fromRgb(ListGrid::colorFromStored(ListGrid::DefaultBackColorValue)))
{
    installAccessibility();
    setAttribute(Qt::WA_OpaquePaintEvent);
    setFocusPolicy(Qt::StrongFocus);
    setMouseTracking(true);

    m_vbar = new QScrollBar(Qt::Vertical, this);
    m_vbar->setObjectName(QStringLiteral("vbarWindow"));
    // The bar never keeps the focus, so keys keep reaching the list; its value changes on release only, so
    // that a drag scrolls freely and snaps once.
    m_vbar->setFocusPolicy(Qt::NoFocus);
    m_vbar->setTracking(false);
    m_vbar->setSingleStep(ListGrid::CellWidth);
    m_vbar->resize(style()->pixelMetric(QStyle::PM_ScrollBarExtent, nullptr, m_vbar), height());
    m_vbar->hide();
    connect(m_vbar, &QScrollBar::valueChanged, this, &SimpleListView::onScrollValueChanged);
    connect(m_vbar, &QScrollBar::sliderMoved, this, &SimpleListView::onSliderMoved);

    m_timer = new QTimer(this);
    m_timer->setObjectName(QStringLiteral("Timer1"));
    m_timer->setSingleShot(true);
    m_timer->setInterval(ListGrid::HighlightMilliseconds);
    connect(m_timer, &QTimer::timeout, this, &SimpleListView::onHighlightTimeout);

    clearItems();
    arrangeItems();
}

SimpleListView::~SimpleListView() = default;

void SimpleListView::ArrangeConstituentControls() { }

bool SimpleListView::Add(const QPixmap& Picture, const QString& Caption, const QString& Data)
{
    return addItem([&Picture](IconFace& face) { face.setPicture(Picture); }, Caption, Data);
}

bool SimpleListView::Add(IconFace::PictureSource Picture, const QString& Caption, const QString& Data)
{
    return addItem([&Picture](IconFace& face) { face.setPictureSource(std::move(Picture)); }, Caption, Data);
}

qint16 SimpleListView::AddEx(const QString& Caption, const QString& Data)
{
    const int index = m_state.itemCount;
    return addItem(nullptr, Caption, Data) ? qint16(index) : qint16(-1);
}

bool SimpleListView::addItem(
    const std::function<void(IconFace&)>& setPicture, const QString& caption, const QString& dataString)
{
    const int index = m_state.itemCount;
    if (index >= ListGrid::MaxItems) {
        const ListError overflow = ListError::overflow();
        throw NumberedError(
            quint32(overflow.number), overflow.description, ErrorSource(QStringLiteral("SimpleListView")));
    }
    if (index > 0 && index != m_model.loadedCount())
        return false; // that element is already loaded
    ListItem& item = index > 0 ? m_model.load() : m_model.at(0);
    // A game the narrowing leaves out is loaded without taking a cell.
    item.narrowedOut = m_narrowing && !m_narrowing(index, caption, dataString);
    if (index > 0 && !item.narrowedOut)
        GridLayout::placeNext(item, m_state, usableWidth());

    item.face.setBackColor(m_backColor.rgb());
    if (setPicture)
        setPicture(item.face);
    else
        item.iconData = dataString;
    item.iconVisible = true;

    setCaptionText(item, caption);
    item.captionColor = ListGrid::CaptionColor;
    item.tag = dataString;
    item.captionVisible = true;

    if (item.narrowedOut) {
        if (index == 0)
            m_state.nextCellX = 0; // the first game shown takes the first cell
        m_bands.invalidate();
    } else if (index > 0) {
        GridLayout::finishAdd(item, m_state);
        m_bands.append(index, item);
    } else {
        m_bands.invalidate();
    }
    ++m_state.itemCount;
    ++m_shownRevision;
    updateItem(index);
    // The first game a narrowing shows after it showed none becomes the current one.
    if (m_narrowing && !item.narrowedOut && !isItemShown(m_frame.currentIndex()))
        selectItem(index);
    return true;
}

ListError SimpleListView::RemoveCurrentItem()
{
    const int current = m_frame.currentIndex();
    const int count = m_model.loadedCount();
    if (current < count - 1) {
        for (int j = current + 1; j < count; ++j) {
            if (!m_model.isLoaded(j - 1))
                return ListError::missingElement(j - 1);
            m_model.copyContent(j, j - 1);
        }
    } else {
        m_frame.tag = QString::number(current - 1);
        if (ListError error = selectItem(current - 1))
            return error;
    }
    m_bands.invalidate();
    if (count >= 2) {
        m_model.unloadLast();
    } else {
        m_model.at(0).iconVisible = false;
        m_model.at(0).captionVisible = false;
    }
    if (m_state.itemCount > 0)
        --m_state.itemCount;
    ++m_shownRevision;
    selectShownNear(m_frame.currentIndex());
    arrangeItems();
    update();
    return {};
}

void SimpleListView::RemoveAll()
{
    clearItems();
    arrangeItems();
    update();
}

void SimpleListView::clearItems()
{
    m_state.rowTops = {0.0};
    m_state.itemCount = 0;
    m_state.nextCellX = 0;
    m_state.rowTop = ListGrid::RowGap;
    m_frame.tag.clear();
    ListItem& first = m_model.at(0);
    first.iconVisible = false;
    first.captionVisible = false;
    first.tag.clear();
    first.narrowedOut = false;
    m_model.unloadAllButFirst();
    m_bands.invalidate();
    ++m_shownRevision;
}

void SimpleListView::InitSelection()
{
    selectItem(firstShown());
}

QString SimpleListView::GetCurrentData() const
{
    const int current = m_frame.currentIndex();
    return isItemShown(current) ? m_model.at(current).tag : QString();
}

QString SimpleListView::GetCurrentCaption() const
{
    const int current = m_frame.currentIndex();
    return isItemShown(current) ? m_model.at(current).caption : QString();
}

void SimpleListView::SetCurrentCaption(const QString& Caption)
{
    const int current = m_frame.currentIndex();
    if (!isItemShown(current))
        return;
    updateItem(current);
    setCaptionText(m_model.at(current), Caption);
    m_bands.invalidate();
    updateItem(current);
    renarrowCurrent();
}

QColor SimpleListView::BackColor() const
{
    return m_backColor;
}

void SimpleListView::SetBackColor(const QColor& color)
{
    if (!color.isValid())
        return;
    m_backColor = color.toRgb();
    update();
    Q_EMIT propertyChanged(QStringLiteral("BackColor"));
}

QPaintDevice* SimpleListView::hdc()
{
    return this;
}

void SimpleListView::Refresh()
{
    updateScrollRange();
    update();
}

int SimpleListView::OLEDropMode() const
{
    return m_oleDropMode;
}

void SimpleListView::SetOLEDropMode(int mode)
{
    m_oleDropMode = mode == 1 ? 1 : 0;
    setAcceptDrops(m_oleDropMode == 1);
    Q_EMIT propertyChanged(QStringLiteral("OLEDropMode"));
}

void SimpleListView::ReadProperties(const QVariantMap& properties)
{
    bool ok = false;
    const quint32 stored = properties.value(QStringLiteral("BackColor")).toUInt(&ok);
    m_backColor = QColor::fromRgb(ListGrid::colorFromStored(ok ? stored : ListGrid::DefaultBackColorValue));
    const int mode = properties.value(QStringLiteral("OLEDropMode")).toInt(&ok);
    m_oleDropMode = ok && mode == 1 ? 1 : 0;
    setAcceptDrops(m_oleDropMode == 1);
    update();
}

QVariantMap SimpleListView::WriteProperties() const
{
    QVariantMap properties;
    const quint32 stored = ListGrid::colorToStored(m_backColor.rgb());
    if (stored != ListGrid::DefaultBackColorValue)
        properties.insert(QStringLiteral("BackColor"), stored);
    if (m_oleDropMode != 0)
        properties.insert(QStringLiteral("OLEDropMode"), m_oleDropMode);
    return properties;
}

ListIcon SimpleListView::imgN(int index)
{
    return ListIcon(this, index);
}

ListCaption SimpleListView::labN(int index)
{
    return ListCaption(this, index);
}

QRectF SimpleListView::selectionFrameRect() const
{
    return m_frame.rect.translated(m_state.horizontalOffset, m_state.scrollOffsetY);
}

void SimpleListView::setCaptionText(ListItem& item, const QString& text)
{
    item.caption = text;
    item.captionHeight = m_wrapper.height(text, ListGrid::CaptionWidth);
}

QRectF SimpleListView::shownIconRect(const ListItem& item) const
{
    return QRectF(item.iconLeft + m_state.horizontalOffset, item.iconTop + m_state.scrollOffsetY, ListGrid::IconSize,
        ListGrid::IconSize);
}

QRectF SimpleListView::shownCaptionRect(const ListItem& item) const
{
    return QRectF(item.captionLeft + m_state.horizontalOffset, item.captionTop + m_state.scrollOffsetY,
        ListGrid::CaptionWidth, item.captionHeight);
}

const std::vector<int>& SimpleListView::itemsNear(double shownTop, double shownBottom) const
{
    m_bands.collect(m_model, shownTop - m_state.scrollOffsetY, shownBottom - m_state.scrollOffsetY, m_nearby);
    return m_nearby;
}

void SimpleListView::updateItem(int index)
{
    if (!m_model.isLoaded(index) || !isVisible())
        return;
    const ListItem& item = m_model.at(index);
    update(shownIconRect(item).united(shownCaptionRect(item)).toAlignedRect().adjusted(-2, -2, 2, 2));
}

} // namespace Brimvault
