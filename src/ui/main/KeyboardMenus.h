#pragma once

#include <QObject>

#include <functional>

class QWidget;

namespace Brimvault {

// Opens a window's menus from the keyboard alone: F10 or a lone tap of Alt opens the main menu, Shift+F10 or
// the context-menu key the menu of the current item. The list takes every key it is given, so these are
// shortcuts, which Qt offers the window before the focused widget.
class KeyboardMenus : public QObject {
    Q_OBJECT
public:
    KeyboardMenus(QWidget* window, std::function<void()> mainMenu, std::function<void()> itemMenu);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    QWidget* m_window;
    std::function<void()> m_mainMenu;
    bool m_altAlone = false;
};

} // namespace Brimvault
