#pragma once

#include <QObject>

class QTimer;

namespace Brimvault {

// tmrMenu: a right click on the list opens the item menu 60 ms later, once, so that the list has selected the
// item under the mouse first and the menu acts on the item just clicked.
class ItemMenuDelay : public QObject {
    Q_OBJECT
public:
    static constexpr int DelayMs = 60;
    static constexpr int RightButton = 2;

    explicit ItemMenuDelay(QObject* parent = nullptr);

    // The list's mouse handler: button 2 (right) arms the timer; other buttons do nothing.
    void mouseButtonPressed(int button);
    bool isPending() const;

Q_SIGNALS:
    // Show the item menu now, at the mouse position.
    void showItemMenu();

private:
    QTimer* m_timer;
};

} // namespace Brimvault
