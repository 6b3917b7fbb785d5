#pragma once

#include <QLabel>

namespace Brimvault {

// A label or picture that acts like a button: a left click raises Click.
class ClickLabel : public QLabel {
    Q_OBJECT
public:
    explicit ClickLabel(QWidget* parent = nullptr);

Q_SIGNALS:
    void Click();

protected:
    void mouseReleaseEvent(QMouseEvent* event) override;
};

} // namespace Brimvault
