#include "ui/main/ClickLabel.h"

#include <QAccessibleWidget>
#include <QMouseEvent>

namespace Brimvault {

namespace {

// To a screen reader the label is the button it acts as, named by its caption.
class ClickLabelAccessible : public QAccessibleWidget {
public:
    explicit ClickLabelAccessible(ClickLabel* label)
        : QAccessibleWidget(label, QAccessible::Button)
    {
        addControllingSignal(QStringLiteral("Click()"));
    }

    QString text(QAccessible::Text t) const override
    {
        QString text = QAccessibleWidget::text(t);
        if (t == QAccessible::Name && text.isEmpty())
            text = static_cast<ClickLabel*>(widget())->text();
        return text;
    }

    QStringList actionNames() const override { return {pressAction()}; }

    void doAction(const QString& actionName) override
    {
        if (actionName == pressAction())
            Q_EMIT static_cast<ClickLabel*>(widget())->Click();
    }
};

QAccessibleInterface* clickLabelAccessible(const QString& className, QObject* object)
{
    auto* label = qobject_cast<ClickLabel*>(object);
    if (!label || className != QLatin1StringView(object->metaObject()->className()))
        return nullptr;
    return new ClickLabelAccessible(label);
}

} // namespace

ClickLabel::ClickLabel(QWidget* parent)
    : QLabel(parent)
{
    static const bool accessible = [] {
        QAccessible::installFactory(&clickLabelAccessible);
        return true;
    }();
    Q_UNUSED(accessible);
    setCursor(Qt::PointingHandCursor);
    setAttribute(Qt::WA_Hover);
}

void ClickLabel::mouseReleaseEvent(QMouseEvent* event)
{
    QLabel::mouseReleaseEvent(event);
    if (event->button() == Qt::LeftButton && rect().contains(event->position().toPoint()))
        Q_EMIT Click();
}

} // namespace Brimvault
