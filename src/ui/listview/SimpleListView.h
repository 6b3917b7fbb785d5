#pragma once

#include "ui/listview/CaptionWrapper.h"
#include "ui/listview/ItemBands.h"
#include "ui/listview/ListError.h"
#include "ui/listview/ListModel.h"

#include <QColor>
#include <QVariantMap>
#include <QWidget>

#include <functional>

class QHelpEvent;
class QMimeData;
class QPainter;
class QScrollBar;
class QTimer;

namespace Brimvault {

class ListIcon;
class ListCaption;

// The scrolling grid of large icons with captions. Items are plain records painted by the list itself, so
// a library of tens of thousands of games costs no more widgets than one of twenty, and scrolling moves
// nothing but an offset. Each item's icon and caption stay observable through ListIcon and ListCaption.
class SimpleListView : public QWidget {
    Q_OBJECT
    Q_PROPERTY(QColor BackColor READ BackColor WRITE SetBackColor)
    Q_PROPERTY(int OLEDropMode READ OLEDropMode WRITE SetOLEDropMode)

public:
    explicit SimpleListView(QWidget* parent = nullptr);
    ~SimpleListView() override;

    void ArrangeConstituentControls();
    bool Add(const QPixmap& Picture, const QString& Caption, const QString& Data);
    // The same, with a picture made only when the item is first painted or its picture is asked for.
    bool Add(IconFace::PictureSource Picture, const QString& Caption, const QString& Data);
    // Both raise the overflow error (NumberedError 6) beyond 32767 items; AddEx returns the new item's index.
    qint16 AddEx(const QString& Caption, const QString& Data);
    // Removing the only item fails with the missing-element error and leaves the selection tag at "-1";
    // nothing else changes, so the host clears the list with RemoveAll instead.
    ListError RemoveCurrentItem();
    void RemoveAll();
    void InitSelection();
    QString GetCurrentData() const;
    QString GetCurrentCaption() const;
    void SetCurrentCaption(const QString& Caption);
    QColor BackColor() const;
    void SetBackColor(const QColor& color);
    QPaintDevice* hdc();
    void Refresh();
    void OLEDrag();
    int OLEDropMode() const;
    void SetOLEDropMode(int mode);

    // Persisted properties: "BackColor" (0x00BBGGRR) and "OLEDropMode"; defaults are not written.
    void ReadProperties(const QVariantMap& properties);
    QVariantMap WriteProperties() const;

    // The elements and the state behind them, for the host and for tests.
    int loadedCount() const { return m_model.loadedCount(); }
    ListIcon imgN(int index);
    ListCaption labN(int index);
    const ListLayoutState& layoutState() const { return m_state; }
    int currentIndex() const { return m_frame.currentIndex(); }
    QString selectionTag() const { return m_frame.tag; }
    QRectF selectionFrameRect() const;
    bool isSelectionFrameVisible() const { return m_frame.visible; }
    QScrollBar* vbarWindow() const { return m_vbar; }
    QTimer* Timer1() const { return m_timer; }

    // Assistive technology and the keyboard. An item is shown unless the narrowing hides it; a change of
    // narrowing calls shownItemsChanged(), so that readers list the items again. The revision moves with every
    // change of the shown items (adding and removing too).
    void shownItemsChanged();
    quint64 shownRevision() const { return m_shownRevision; }
    // The selected item, or -1 when none is selected or it is not shown.
    int currentItem() const;
    QRect itemRect(int index) const;
    // Selects the item and raises EnterKey with its data string, as Enter does.
    void activateItem(int index);
    void focusItem(int index);
    // The dashed focus mark around the current item, shown while the list has the focus after keyboard use.
    bool showsFocusMark() const;
    // Narrowing: only the items the test accepts are shown, re-flowed in their order; every operation above
    // sees the shown items only. Items added or renamed later are tested too. An empty test shows all.
    using NarrowingTest = std::function<bool(int index, const QString& caption, const QString& data)>;
    void setNarrowing(NarrowingTest shows);
    bool isNarrowed() const { return bool(m_narrowing); }
    bool isItemShown(int index) const;
    int shownCount() const;
    // Selects a shown item and scrolls to a value of the scroll bar, as a view saved before narrowing.
    void restoreView(int index, int scrollValue);

    // The tooltip of an item, asked for when the pointer rests on it; none when it gives an empty text.
    void setToolTipSource(std::function<QString(int index)> source);

Q_SIGNALS:
    // Arguments passed by reference may be changed by a directly connected host: an Effect of 0 refuses a
    // drop (1 copy, 2 move, 4 link). Button: 1 left, 2 right, 4 middle; Shift: 1 shift, 2 control, 4 alt.
    void EnterKey(QString& Data);
    void OLECompleteDrag(qint32 Effect);
    void OLEDragDrop(const QMimeData* Data, qint32& Effect, qint16 Button, qint16 Shift, float X, float Y);
    void OLEDragOver(
        const QMimeData* Data, qint32& Effect, qint16 Button, qint16 Shift, float X, float Y, qint16 State);
    void OLEGiveFeedback(qint32 Effect, bool& DefaultCursors);
    void OLESetData(QMimeData* Data, qint16 DataFormat);
    void OLEStartDrag(QMimeData* Data, qint32& AllowedEffects);
    void MouseDown(qint16 Button, qint16 Shift, float X, float Y);
    void MouseMove(qint16 Button, qint16 Shift, float X, float Y);
    void MouseUp(qint16 Button, qint16 Shift, float X, float Y);

    // A persisted property was written; the host saves WriteProperties() when it keeps its settings.
    void propertyChanged(const QString& name);

protected:
    bool event(QEvent* event) override;
    void focusInEvent(QFocusEvent* event) override;
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void showEvent(QShowEvent* event) override;
    void changeEvent(QEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void dragEnterEvent(QDragEnterEvent* event) override;
    void dragMoveEvent(QDragMoveEvent* event) override;
    void dragLeaveEvent(QDragLeaveEvent* event) override;
    void dropEvent(QDropEvent* event) override;

private:
    friend class ListIcon;
    friend class ListCaption;
    friend class SimpleListViewAccessible;

    struct Hit {
        int index = -1;
        bool onIcon = false;
        QPointF origin;
        bool background = false; // pressed on the empty background
    };

    // Items
    // A picture, or a source of one, or neither (the item then waits for its icon).
    bool addItem(const std::function<void(IconFace&)>& setPicture, const QString& caption, const QString& dataString);
    void clearItems();
    void setCaptionText(ListItem& item, const QString& text);
    QRectF shownIconRect(const ListItem& item) const;
    QRectF shownCaptionRect(const ListItem& item) const;
    void updateItem(int index);

    // Layout and scrolling
    double usableWidth() const;
    void arrangeItems();
    void updateScrollRange();
    void scrollContents(int value);
    void onScrollValueChanged(int value);
    void onSliderMoved(int position);
    QRect itemArea() const;
    const std::vector<int>& itemsNear(double shownTop, double shownBottom) const;

    // Focus and assistive technology
    static void installAccessibility();
    void notifyAccessibleFocus();
    void setKeyboardCues(bool shown);
    void paintFocusMark(QPainter& painter) const;
    // Narrowing and tooltips
    bool showItemToolTip(QHelpEvent* help);
    // Moves the selection off an item the narrowing left out: to the next shown item, else the one before.
    void selectShownNear(int index);
    // After a rename: the current item leaves when it no longer passes the test.
    void renarrowCurrent();
    // The first item the narrowing shows; 0 when it shows none.
    int firstShown() const;

    // Selection and input
    ListError selectItem(int index);
    void onHighlightTimeout();
    void moveByArrow(int keyCode);
    void keepFrameInView();
    Hit hitTest(const QPointF& point) const;
    qint16 shiftState(Qt::KeyboardModifiers modifiers) const;
    void handleDrag(QDropEvent* event, qint16 state);

    ListModel m_model;
    ListLayoutState m_state;
    SelectionFrame m_frame;
    CaptionWrapper m_wrapper;
    mutable ItemBands m_bands;
    mutable std::vector<int> m_nearby;
    QScrollBar* m_vbar = nullptr;
    QTimer* m_timer = nullptr;
    QColor m_backColor;
    int m_oleDropMode = 0;
    Hit m_capture;
    int m_wheelRemainder = 0;
    bool m_keyboardCues = false;
    quint64 m_shownRevision = 0;
    NarrowingTest m_narrowing;
    std::function<QString(int)> m_toolTipSource;
};

} // namespace Brimvault
