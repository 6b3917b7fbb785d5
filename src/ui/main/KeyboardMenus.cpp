#include "ui/main/KeyboardMenus.h"

#include <QApplication>
#include <QKeyEvent>
#include <QShortcut>
#include <QWidget>

namespace Brimvault {

KeyboardMenus::KeyboardMenus(QWidget* window, std::function<void()> mainMenu, std::function<void()> itemMenu)
    : QObject(window)
    , m_window(window)
    , m_mainMenu(std::move(mainMenu))
{
    auto* f10 = new QShortcut(QKeySequence(Qt::Key_F10), window);
    connect(f10, &QShortcut::activated, this, [this] { m_mainMenu(); });
    for (const QKeySequence& keys : {QKeySequence(Qt::SHIFT | Qt::Key_F10), QKeySequence(Qt::Key_Menu)}) {
        auto* shortcut = new QShortcut(keys, window);
        connect(shortcut, &QShortcut::activated, this, itemMenu);
    }
    // A lone Alt reaches no shortcut: its press and release are watched on their way to the window.
    qApp->installEventFilter(this);
}

bool KeyboardMenus::eventFilter(QObject* watched, QEvent* event)
{
    switch (event->type()) {
    case QEvent::KeyPress: {
        const auto* key = static_cast<QKeyEvent*>(event);
        if (!key->isAutoRepeat())
            m_altAlone = key->key() == Qt::Key_Alt && (key->modifiers() & ~Qt::AltModifier) == Qt::NoModifier;
        break;
    }
    case QEvent::KeyRelease: {
        const auto* key = static_cast<QKeyEvent*>(event);
        const auto* widget = qobject_cast<QWidget*>(watched);
        if (key->key() == Qt::Key_Alt && m_altAlone && widget && widget->window() == m_window
            && m_window->isActiveWindow()) {
            m_altAlone = false;
            m_mainMenu();
            return true;
        }
        break;
    }
    case QEvent::MouseButtonPress:
    case QEvent::FocusOut:
        m_altAlone = false;
        break;
    default:
        break;
    }
    return false;
}

} // namespace Brimvault
