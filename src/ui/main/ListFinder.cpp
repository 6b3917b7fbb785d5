#include "ui/main/ListFinder.h"

#include "i18n/modLocalizer.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/MainWindowDesign.h"

#include <QCoreApplication>
#include <QKeyEvent>
#include <QLineEdit>
#include <QScrollBar>
#include <QShortcut>

namespace Brimvault {

namespace {

constexpr int FieldWidth = 220;
constexpr int FieldMargin = 6;

bool opensField(const QKeyEvent* event)
{
    if (event->modifiers() & (Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier))
        return false;
    const QString text = event->text();
    return !text.isEmpty() && text.front().isLetterOrNumber();
}

} // namespace

ListFinder::ListFinder(QWidget* window, SimpleListView* list)
    : QObject(window)
    , m_window(window)
    , m_list(list)
    , m_field(new QLineEdit(window))
{
    m_field->setObjectName(QStringLiteral("txtFind"));
    m_field->setClearButtonEnabled(true);
    m_field->hide();
    const QColor top = MainWindowDesign::BandTopColor();
    const QColor bottom = MainWindowDesign::BandBottomColor();
    m_field->setStyleSheet(QStringLiteral("QLineEdit { color: white; border: 1px solid %1; border-radius: 3px;"
                                          " padding: 2px 4px; background: qlineargradient(x1:0, y1:0, x2:0, y2:1,"
                                          " stop:0 %2, stop:1 %3); }")
                               .arg(MainWindowDesign::BandEdgeColor().name(), top.name(), bottom.name()));
    connect(m_field, &QLineEdit::textEdited, this, &ListFinder::narrow);
    auto* shortcut = new QShortcut(QKeySequence::Find, window);
    connect(shortcut, &QShortcut::activated, this, [this] { open(); });
    m_list->installEventFilter(this);
    m_field->installEventFilter(this);
    caption();
}

bool ListFinder::isOpen() const
{
    return m_field->isVisible();
}

void ListFinder::caption()
{
    // A screen reader announces the field by the same words a sighted user sees in it.
    m_field->setPlaceholderText(modLocalizer::Translate(1300));
    m_field->setAccessibleName(m_field->placeholderText());
}

void ListFinder::open(const QString& typed)
{
    if (!isOpen()) {
        m_savedIndex = m_list->currentIndex();
        m_savedData = m_list->GetCurrentData();
        m_savedScroll = m_list->vbarWindow()->value();
        place();
        m_field->show();
        m_field->raise();
    }
    m_field->setFocus();
    if (!typed.isEmpty()) {
        m_field->insert(typed);
        narrow(m_field->text());
    }
}

void ListFinder::close()
{
    if (!isOpen())
        return;
    const bool hadFocus = m_field->hasFocus();
    m_field->hide();
    m_field->clear();
    m_list->setNarrowing({});
    // Items may have come and gone meanwhile: the saved item is found again by its data.
    int index = m_savedIndex;
    if (m_list->labN(index).tag() != m_savedData) {
        for (int i = 0; i < m_list->loadedCount(); ++i) {
            if (m_list->labN(i).tag() == m_savedData) {
                index = i;
                break;
            }
        }
    }
    m_list->restoreView(index, m_savedScroll);
    if (hadFocus)
        m_list->setFocus();
}

void ListFinder::narrow(const QString& text)
{
    if (text.trimmed().isEmpty()) {
        close();
        return;
    }
    const GameFinder::Query query(text);
    m_list->setNarrowing([this, query](int index, const QString& caption, const QString& data) {
        return query.matches(m_keys.keyAt(index, caption, data));
    });
}

void ListFinder::place()
{
    const QRect list = m_list->geometry();
    const int height = m_field->sizeHint().height();
    const int width = std::min(FieldWidth, list.width());
    m_field->setGeometry(
        list.right() - width - FieldMargin - m_list->vbarWindow()->width(), list.top() + FieldMargin, width, height);
}

bool ListFinder::fieldKey(QKeyEvent* event)
{
    switch (event->key()) {
    case Qt::Key_Escape:
        close();
        return true;
    case Qt::Key_Up:
    case Qt::Key_Down:
    case Qt::Key_Left:
    case Qt::Key_Right:
    case Qt::Key_Return:
    case Qt::Key_Enter: {
        // Nothing found leaves nothing to start.
        if (m_list->shownCount() == 0)
            return true;
        QKeyEvent forwarded(event->type(), event->key(), event->modifiers(), event->text());
        QCoreApplication::sendEvent(m_list, &forwarded);
        return true;
    }
    default:
        return false;
    }
}

bool ListFinder::eventFilter(QObject* watched, QEvent* event)
{
    if (watched == m_list) {
        if (event->type() == QEvent::Resize || event->type() == QEvent::Move) {
            if (isOpen())
                place();
        } else if (event->type() == QEvent::KeyPress) {
            auto* key = static_cast<QKeyEvent*>(event);
            if (key->key() == Qt::Key_Escape && isOpen()) {
                close();
                return true;
            }
            if (opensField(key)) {
                open(key->text());
                return true;
            }
        }
    } else if (watched == m_field && event->type() == QEvent::KeyPress) {
        return fieldKey(static_cast<QKeyEvent*>(event));
    }
    return QObject::eventFilter(watched, event);
}

} // namespace Brimvault
