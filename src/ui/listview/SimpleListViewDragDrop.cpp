#include "ui/listview/SimpleListView.h"

#include <QDrag>
#include <QDragEnterEvent>
#include <QMimeData>

#include <functional>

namespace Brimvault {

namespace {

// Data a drag started by the list carries; asking for a format that was announced without data gives
// the host its chance to supply it.
class ListDragData : public QMimeData {
public:
    std::function<void(QMimeData*, qint16)> onMissing;

protected:
    QVariant retrieveData(const QString& mimeType, QMetaType type) const override
    {
        if (data(mimeType).isEmpty() && onMissing)
            onMissing(const_cast<ListDragData*>(this), formatCode(mimeType));
        return QMimeData::retrieveData(mimeType, type);
    }

private:
    static qint16 formatCode(const QString& mimeType)
    {
        if (mimeType == u"text/plain")
            return 1;
        if (mimeType == u"text/uri-list")
            return 15;
        return 0;
    }
};

qint16 buttonsCode(Qt::MouseButtons buttons)
{
    return qint16((buttons & Qt::LeftButton ? 1 : 0) | (buttons & Qt::RightButton ? 2 : 0)
        | (buttons & Qt::MiddleButton ? 4 : 0));
}

Qt::DropAction chooseAction(qint32 effect, Qt::DropActions possible)
{
    const qint32 allowed = effect & qint32(possible);
    for (Qt::DropAction action : {Qt::CopyAction, Qt::MoveAction, Qt::LinkAction}) {
        if (allowed & qint32(action))
            return action;
    }
    return Qt::IgnoreAction;
}

} // namespace

void SimpleListView::OLEDrag()
{
    auto* dragData = new ListDragData;
    dragData->onMissing = [this](QMimeData* mime, qint16 format) { Q_EMIT OLESetData(mime, format); };
    qint32 allowed = qint32(Qt::CopyAction | Qt::MoveAction);
    Q_EMIT OLEStartDrag(dragData, allowed);
    if (allowed == 0) {
        delete dragData;
        Q_EMIT OLECompleteDrag(0);
        return;
    }
    auto* drag = new QDrag(this);
    drag->setMimeData(dragData);
    connect(drag, &QDrag::actionChanged, this, [this](Qt::DropAction action) {
        bool defaultCursors = true;
        Q_EMIT OLEGiveFeedback(qint32(action), defaultCursors);
    });
    const Qt::DropAction result = drag->exec(Qt::DropActions(allowed));
    Q_EMIT OLECompleteDrag(qint32(result));
}

void SimpleListView::handleDrag(QDropEvent* event, qint16 state)
{
    if (m_oleDropMode != 1) {
        event->ignore();
        return;
    }
    qint32 effect = qint32(event->proposedAction());
    const QPointF at = event->position();
    Q_EMIT OLEDragOver(event->mimeData(), effect, buttonsCode(event->buttons()), shiftState(event->modifiers()),
        float(at.x()), float(at.y()), state);
    const Qt::DropAction action = chooseAction(effect, event->possibleActions());
    if (action == Qt::IgnoreAction) {
        event->ignore();
        return;
    }
    event->setDropAction(action);
    event->accept();
}

void SimpleListView::dragEnterEvent(QDragEnterEvent* event)
{
    handleDrag(event, 0);
}

void SimpleListView::dragMoveEvent(QDragMoveEvent* event)
{
    handleDrag(event, 2);
}

void SimpleListView::dragLeaveEvent(QDragLeaveEvent* event)
{
    if (m_oleDropMode == 1) {
        qint32 effect = 0;
        Q_EMIT OLEDragOver(nullptr, effect, 0, 0, 0.0f, 0.0f, 1);
    }
    event->accept();
}

void SimpleListView::dropEvent(QDropEvent* event)
{
    if (m_oleDropMode != 1) {
        event->ignore();
        return;
    }
    qint32 effect = qint32(event->proposedAction());
    const QPointF at = event->position();
    Q_EMIT OLEDragDrop(event->mimeData(), effect, buttonsCode(event->buttons()), shiftState(event->modifiers()),
        float(at.x()), float(at.y()));
    const Qt::DropAction action = chooseAction(effect, event->possibleActions());
    if (action == Qt::IgnoreAction) {
        event->ignore();
        return;
    }
    event->setDropAction(action);
    event->accept();
}

} // namespace Brimvault
