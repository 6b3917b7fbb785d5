#pragma once

#include "ui/listview/IconFace.h"

#include <QColor>
#include <QWidget>

namespace Brimvault {

// A 32 x 32 picture control: draws its icon with its transparency over its background colour, carries a
// data string and passes its mouse events on unchanged (Button 1 left, 2 right, 4 middle; Shift 1, 2, 4).
class ImageCtrl : public QWidget {
    Q_OBJECT

public:
    explicit ImageCtrl(QWidget* parent = nullptr);
    ~ImageCtrl() override;

    void SetData(const QString& value);
    QString Data() const;
    void SetPicture(const QPixmap& picture);
    QPixmap Picture() const;
    QPaintDevice* hdc();
    void SetBackColor(const QColor& color);
    QColor BackColor() const;

    // The picture the surface shows now; setting an empty picture leaves the last one drawn.
    QPixmap shownPicture() const { return m_face.shownPicture(); }

    QSize sizeHint() const override;

Q_SIGNALS:
    void Click();
    void DblClick();
    void MouseDown(qint16 Button, qint16 Shift, float X, float Y);
    void MouseMove(qint16 Button, qint16 Shift, float X, float Y);
    void MouseUp(qint16 Button, qint16 Shift, float X, float Y);

protected:
    void paintEvent(QPaintEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;

private:
    IconFace m_face;
    QString m_data;
};

} // namespace Brimvault
