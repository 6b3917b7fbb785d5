// The icon list's grid, scrolling, key navigation and caption wrapping, without a widget.
#include "ui/listview/CaptionWrapper.h"
#include "ui/listview/GridLayout.h"
#include "ui/listview/KeyNavigation.h"
#include "ui/listview/ListModel.h"
#include "ui/listview/RowSnapping.h"

#include "TestSuite.h"

#include <QFontMetricsF>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// count items whose caption heights cycle through heights, arranged for a usable width.
struct Grid {
    ListModel model;
    ListLayoutState state;
    SelectionFrame frame;

    Grid(int count, const QList<int>& heights, double usableWidth)
    {
        for (int i = 0; i < count; ++i) {
            ListItem& item = i == 0 ? model.at(0) : model.load();
            item.captionHeight = heights.at(i % heights.size());
            item.iconVisible = item.captionVisible = true;
        }
        GridLayout::arrangeAll(model, state, frame, usableWidth);
    }
};

const QList<double> RowTops {0, 97, 194, 291};

} // namespace

class TestListLayout : public QObject {
    Q_OBJECT

    const QFont m_font {u"DejaVu Sans"_s, 9};

private Q_SLOTS:
    void captionLinesFitAndAreGreedy_data()
    {
        QTest::addColumn<QString>("caption");
        QTest::newRow("long word") << u"Supercalifragilisticexpialidocious"_s;
        QTest::newRow("blanks between") << u"Mah   Jongg  Quest of the Dragon"_s;
        QTest::newRow("emoji word") << u"🎮🎲🎯🎮🎲🎯 Party"_s;
        QTest::newRow("arabic") << u"لعبة الشطرنج الكبيرة"_s;
    }
    void captionLinesFitAndAreGreedy()
    {
        QFETCH(QString, caption);
        const CaptionWrapper wrapper(m_font);
        const QFontMetricsF metrics(m_font);
        const QList<CaptionWrapper::Line> lines = wrapper.wrap(caption, 64);
        QString words;
        for (qsizetype i = 0; i < lines.size(); ++i) {
            const QString text = caption.mid(lines[i].start, lines[i].length);
            // Every line fits as drawn, except a single character wider than a line.
            QVERIFY2(text.size() < 2 || metrics.horizontalAdvance(text) <= 64.5, qPrintable(text));
            QVERIFY(!text.endsWith(u' ') && (text.isEmpty() || !text.front().isLowSurrogate()));
            if (i + 1 < lines.size()) {
                // Greedy: the next line's first word (or character, inside a broken word) would not have fit.
                const QString next = caption.mid(lines[i + 1].start, lines[i + 1].length);
                const QString extended = lines[i + 1].start == lines[i].start + lines[i].length
                    ? text + next.left(1)
                    : caption.mid(lines[i].start, lines[i + 1].start - lines[i].start) + next.section(u' ', 0, 0);
                QVERIFY2(metrics.horizontalAdvance(extended) > 63.5, qPrintable(extended));
            }
            words += text;
        }
        QCOMPARE(words.remove(u' '), QString(caption).remove(u' '));
    }

    void captionHardBreaksAndEmptyText()
    {
        const CaptionWrapper wrapper(m_font);
        QCOMPARE(QList<int>({wrapper.lineCount(u"A\nB"_s, 64), wrapper.lineCount(u"A\r\nB"_s, 64),
                     wrapper.lineCount(u"   "_s, 64), wrapper.height(QString(), 64)}),
            QList<int>({2, 2, 1, wrapper.lineSpacing()}));
        // A word too wide for the line breaks after its hyphen rather than inside one of its parts.
        const QList<CaptionWrapper::Line> lines = wrapper.wrap(u"Онлайн-игры"_s, 64);
        QCOMPARE(lines.size(), 2);
        QCOMPARE(lines[1].start, 7);
    }

    // Seven items with captions 28, 42 and 14 high; a row is as tall as its tallest caption.
    void arrange_data()
    {
        QTest::addColumn<double>("usableWidth");
        QTest::addColumn<QList<float>>("lefts");
        QTest::addColumn<QList<double>>("rowTops");
        QTest::addColumn<int>("maxColumns");
        QTest::newRow("a row that exactly fits")
            << 240.0 << QList<float> {24, 104, 184, 24, 104, 184, 24} << QList<double> {0, 109, 204} << 3;
        QTest::newRow("one pixel short") << 239.0 << QList<float> {24, 104, 24, 104, 24, 104, 24}
                                         << QList<double> {0, 109, 190, 285} << 2;
        QTest::newRow("below one cell, the first wraps too")
            << 79.0 << QList<float>(7, 24) << QList<double> {0, 14, 95, 190, 257, 338, 433, 500} << 1;
    }
    void arrange()
    {
        QFETCH(double, usableWidth);
        Grid grid(7, {28, 42, 14}, -1);
        grid.state.scrollOffsetY = -120;
        grid.frame.rect = QRectF(5, 200, 73, 62); // unscrolled; shown at 80
        GridLayout::arrangeAll(grid.model, grid.state, grid.frame, usableWidth);
        QList<float> lefts;
        for (int i = 0; i < 7; ++i)
            lefts << grid.model.at(i).iconLeft;
        QTEST(lefts, "lefts");
        QTEST(grid.state.rowTops, "rowTops");
        QTEST(grid.state.maxColumns, "maxColumns");
        const ListItem& first = grid.model.at(0);
        QCOMPARE(QList<float>({first.iconTop, first.captionLeft, first.captionTop}), QList<float>({14, 8, 53}));
        // Laid out for scroll position 0; the frame stays where it was shown.
        QCOMPARE(QList<double>({grid.state.scrollOffsetY, grid.frame.rect.top()}), QList<double>({0, 80}));
    }

    // Rows start at 0, 97, 194 and 291; without notches a released value snaps, with them the wheel moves.
    void rowSnapping_data()
    {
        QTest::addColumn<int>("value");
        QTest::addColumn<int>("maximum");
        QTest::addColumn<int>("notches");
        QTest::addColumn<int>("expected"); // -1: no snapping
        QTest::newRow("maximum is kept") << 300 << 300 << 0 << -1;
        QTest::newRow("nearest row at the maximum") << 280 << 291 << 0 << -1;
        QTest::newRow("tie keeps the earlier row") << 145 << 400 << 0 << 97;
        QTest::newRow("wheel from between rows") << 120 << 250 << 1 << 194;
        QTest::newRow("wheel past the last row to the maximum") << 194 << 250 << 2 << 250;
        QTest::newRow("wheel up from the maximum") << 250 << 250 << -1 << 194;
        QTest::newRow("wheel up to the top") << 97 << 250 << -3 << 0;
    }
    void rowSnapping()
    {
        QFETCH(int, value);
        QFETCH(int, maximum);
        QFETCH(int, notches);
        QTEST(notches ? RowSnapping::wheelTarget(RowTops, value, maximum, notches)
                      : RowSnapping::snapTarget(RowTops, value, maximum).value_or(-1),
            "expected");
    }

    // Eight items three to a row; the tie row has two icons as near below the reference as each other.
    void findNeighbour_data()
    {
        QTest::addColumn<int>("current");
        QTest::addColumn<int>("keyCode");
        QTest::addColumn<QPointF>("reference"); // (0, 0): the current icon's corner
        QTest::addColumn<int>("expected"); // -1: nothing
        QTest::newRow("right") << 0 << 39 << QPointF() << 1;
        QTest::newRow("right at row end does not wrap") << 2 << 39 << QPointF() << -1;
        QTest::newRow("left at row start") << 3 << 37 << QPointF() << -1;
        QTest::newRow("down same column") << 1 << 40 << QPointF() << 4;
        QTest::newRow("down to the nearest of a shorter row") << 5 << 40 << QPointF() << 7;
        QTest::newRow("up on the first row") << 1 << 38 << QPointF() << -1;
        QTest::newRow("tie keeps the lower index") << 7 << 40 << QPointF(64, 14) << 3;
    }
    void findNeighbour()
    {
        QFETCH(int, current);
        QFETCH(int, keyCode);
        QFETCH(QPointF, reference);
        const Grid grid(8, {28}, 283);
        const ListItem& item = grid.model.at(current);
        if (reference.isNull())
            reference = QPointF(item.iconLeft, item.iconTop);
        const auto direction = KeyNavigation::directionFromKeyCode(keyCode);
        QTEST(direction ? KeyNavigation::findNeighbour(grid.model, 0, current, *direction, reference, 300).value_or(-1)
                        : -1,
            "expected");
    }
};

BV_REGISTER_TEST(TestListLayout);
#include "tst_listlayout.moc"
