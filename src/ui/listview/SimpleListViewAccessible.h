#pragma once

#include <QAccessibleWidget>
#include <QHash>
#include <QPointer>

#include <vector>

namespace Brimvault {

class SimpleListView;

// The list as assistive technology sees it: a list whose children are the items shown, each with its caption
// as name and its data string as description, the way Qt's item views expose their cells. The list paints
// its items itself, so without this a screen reader would meet one opaque widget.
class SimpleListViewAccessible : public QAccessibleWidget {
public:
    explicit SimpleListViewAccessible(SimpleListView* list);
    ~SimpleListViewAccessible() override;

    // Registered once with QAccessible::installFactory; answers for every SimpleListView.
    static QAccessibleInterface* factory(const QString& className, QObject* object);

    int childCount() const override;
    QAccessibleInterface* child(int index) const override;
    int indexOfChild(const QAccessibleInterface* child) const override;
    QAccessibleInterface* childAt(int x, int y) const override;
    QAccessibleInterface* focusChild() const override;
    QString text(QAccessible::Text t) const override;

    // The child number of an item, or -1 when the item is not shown.
    int childOfItem(int itemIndex) const;

private:
    SimpleListView* list() const;
    const std::vector<int>& shownItems() const;
    QAccessibleInterface* itemInterface(int itemIndex) const;

    mutable std::vector<int> m_shown;
    mutable quint64 m_shownKey = ~quint64(0);
    mutable QHash<int, QAccessible::Id> m_items;
};

// One item of the list; it stands for whatever item holds its index, as a cell of a table stands for its row.
class SimpleListViewItemAccessible : public QAccessibleInterface, public QAccessibleActionInterface {
public:
    SimpleListViewItemAccessible(SimpleListView* list, int itemIndex);

    int itemIndex() const { return m_index; }

    bool isValid() const override;
    QObject* object() const override { return nullptr; }
    QWindow* window() const override;
    QAccessibleInterface* parent() const override;
    QAccessibleInterface* child(int) const override { return nullptr; }
    int childCount() const override { return 0; }
    int indexOfChild(const QAccessibleInterface*) const override { return -1; }
    QAccessibleInterface* childAt(int, int) const override { return nullptr; }
    QString text(QAccessible::Text t) const override;
    void setText(QAccessible::Text, const QString&) override { }
    QRect rect() const override;
    QAccessible::Role role() const override { return QAccessible::ListItem; }
    QAccessible::State state() const override;
    void* interface_cast(QAccessible::InterfaceType type) override;

    QStringList actionNames() const override;
    void doAction(const QString& actionName) override;
    QStringList keyBindingsForAction(const QString& actionName) const override;

private:
    QPointer<SimpleListView> m_list;
    int m_index;
};

} // namespace Brimvault
