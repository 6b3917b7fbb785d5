#pragma once

#include "catalogue/GameFinder.h"

#include <QObject>
#include <QPointer>
#include <QString>

class QKeyEvent;
class QLineEdit;
class QWidget;

namespace Brimvault {

class SimpleListView;

// Find as you type over the icon list: a letter or digit typed in the window (or Ctrl+F) opens a small
// field over the list's top right corner, and the list shows only the games the text finds. Escape, or an
// empty field, closes it and brings back the whole list with the selection and scroll position it had.
class ListFinder : public QObject {
    Q_OBJECT
public:
    ListFinder(QWidget* window, SimpleListView* list);

    QLineEdit* field() const { return m_field; }
    bool isOpen() const;
    void open(const QString& typed = QString());
    void close();
    // Sets the placeholder in the language in force.
    void caption();

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void narrow(const QString& text);
    void place();
    bool fieldKey(QKeyEvent* event);

    QWidget* m_window;
    SimpleListView* m_list;
    QLineEdit* m_field;
    GameFinder::KeyCache m_keys;
    // The view the full list had when the field opened.
    int m_savedIndex = 0;
    QString m_savedData;
    int m_savedScroll = 0;
};

} // namespace Brimvault
