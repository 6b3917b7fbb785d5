#include "ui/listview/CaptionWrapper.h"
#include "ui/listview/GridLayout.h"
#include "ui/listview/ItemBands.h"
#include "ui/listview/KeyNavigation.h"
#include "ui/listview/ListModel.h"
#include "ui/listview/RowSnapping.h"

#include "TestEnvironment.h"

#include <QFontMetricsF>
#include <QGuiApplication>
#include <QTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// count elements with the given caption heights (cycled), as the list would hold them, arranged for a usable
// width (a negative width leaves them unarranged).
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
        if (usableWidth >= 0)
            GridLayout::arrangeAll(model, state, frame, usableWidth);
    }
};

} // namespace

class TestListLayout : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase() { m_font = QFont(u"DejaVu Sans"_s, 9); }

    void roundedIntDiv_data()
    {
        QTest::addColumn<double>("dividend");
        QTest::addColumn<double>("divisor");
        QTest::addColumn<long long>("quotient");
        QTest::newRow("half rounds to even down") << 2.5 << 1.0 << 2LL;
        QTest::newRow("half rounds to even up") << 3.5 << 1.0 << 4LL;
        QTest::newRow("truncates towards zero") << -7.0 << 2.0 << -3LL;
        QTest::newRow("odd width") << 47.0 << 2.0 << 23LL;
    }
    void roundedIntDiv()
    {
        QFETCH(double, dividend);
        QFETCH(double, divisor);
        QFETCH(long long, quotient);
        QCOMPARE(GridLayout::roundedIntDiv(dividend, divisor), quotient);
    }

    void captionLinesFitAndAreGreedy_data()
    {
        QTest::addColumn<QString>("caption");
        QTest::newRow("three words") << u"Solitaire Collection Deluxe"_s;
        QTest::newRow("long word") << u"Supercalifragilisticexpialidocious"_s;
        QTest::newRow("blanks between") << u"Mah   Jongg  Quest of the Dragon"_s;
        QTest::newRow("cyrillic") << u"Косынка и другие пасьянсы"_s;
        QTest::newRow("emoji word") << QString::fromUtf8("\xF0\x9F\x8E\xAE\xF0\x9F\x8E\xB2\xF0\x9F\x8E\xAF"
                                                         "\xF0\x9F\x8E\xAE\xF0\x9F\x8E\xB2\xF0\x9F\x8E\xAF "
                                                         "Party");
        QTest::newRow("arabic") << QString::fromUtf8("\xD9\x84\xD8\xB9\xD8\xA8\xD8\xA9 "
                                                     "\xD8\xA7\xD9\x84\xD8\xB4\xD8\xB7\xD8\xB1\xD9\x86"
                                                     "\xD8\xAC \xD8\xA7\xD9\x84\xD9\x83\xD8\xA8\xD9\x8A"
                                                     "\xD8\xB1\xD8\xA9");
    }
    void captionLinesFitAndAreGreedy()
    {
        QFETCH(QString, caption);
        CaptionWrapper wrapper(m_font);
        QFontMetricsF metrics(m_font);
        const QList<CaptionWrapper::Line> lines = wrapper.wrap(caption, 64);
        QVERIFY(!lines.isEmpty());
        QString words;
        for (int i = 0; i < lines.size(); ++i) {
            const QString text = caption.mid(lines[i].start, lines[i].length);
            // Every line fits as it is drawn, except a single character wider than a line.
            if (text.size() > 1)
                QVERIFY2(metrics.horizontalAdvance(text) <= 64.5, qPrintable(text));
            QVERIFY(!text.endsWith(u' '));
            QVERIFY(text.isEmpty() || !text.front().isLowSurrogate());
            if (i + 1 < lines.size()) {
                // Greedy: the next line's first word (or character, inside a broken word) would not have fit.
                const QString next = caption.mid(lines[i + 1].start, lines[i + 1].length);
                const bool brokenWord = lines[i + 1].start == lines[i].start + lines[i].length;
                const QString extended = brokenWord
                    ? text + next.left(1)
                    : caption.mid(lines[i].start, lines[i + 1].start - lines[i].start) + next.section(u' ', 0, 0);
                QVERIFY2(metrics.horizontalAdvance(extended) > 63.5, qPrintable(extended));
            }
            words += text + u' ';
        }
        QCOMPARE(words.simplified().remove(u' '), caption.simplified().remove(u' '));
        QCOMPARE(wrapper.height(caption, 64), int(lines.size()) * wrapper.lineSpacing());
    }

    void captionHardBreaksAndEmptyText()
    {
        CaptionWrapper wrapper(m_font);
        QCOMPARE(wrapper.lineCount(u"A\nB"_s, 64), 2);
        QCOMPARE(wrapper.lineCount(u"A\r\nB"_s, 64), 2);
        QCOMPARE(wrapper.height(QString(), 64), wrapper.lineSpacing());
        QCOMPARE(wrapper.lineCount(u"   "_s, 64), 1);
        // A word of wide letters is broken between letters rather than running out of the caption.
        QVERIFY(wrapper.lineCount(u"WWWWWWWWWWWWWWWW"_s, 64) >= 2);
        // A word too wide for the line breaks after its hyphen rather than inside one of its parts.
        const QString online = QString::fromUtf8("Онлайн-игры");
        QVERIFY(QFontMetricsF(m_font).horizontalAdvance(online) > 64);
        const QList<CaptionWrapper::Line> lines = wrapper.wrap(online, 64);
        QCOMPARE(lines.size(), 2);
        QCOMPARE(online.mid(lines[0].start, lines[0].length), QString::fromUtf8("Онлайн-"));
        QCOMPARE(online.mid(lines[1].start, lines[1].length), QString::fromUtf8("игры"));
    }

    void arrangeThreeCellsInUsableWidth283()
    {
        const Grid grid(7, {28, 42, 14}, 283);
        QList<float> lefts;
        for (int i = 0; i < 7; ++i)
            lefts << grid.model.at(i).iconLeft;
        QCOMPARE(lefts, (QList<float> {24, 104, 184, 24, 104, 184, 24}));
        const ListItem& first = grid.model.at(0);
        QCOMPARE(QList<float>({first.iconTop, first.captionLeft, first.captionTop}), QList<float>({14, 8, 53}));
        // The second row starts 14 below the tallest caption of the first (53 + 42).
        QCOMPARE(QList<float>({grid.model.at(3).iconTop, grid.model.at(3).captionTop}), QList<float>({109, 148}));
        QCOMPARE(grid.state.rowTops, (QList<double> {0, 109, 204}));
        QCOMPARE(grid.state.maxColumns, 3);
        QCOMPARE(grid.state.nextCellX, 80.0);
        QCOMPARE(grid.state.lowestBottom, 243 + 28.0);
    }

    void arrangeBelowOneCellPutsEveryItemOnItsOwnRow()
    {
        const Grid grid(4, {14}, 79);
        // The first item takes the wrap branch too.
        QCOMPARE(grid.state.rowTops, (QList<double> {0, 14, 81, 148, 215}));
        for (int i = 0; i < 4; ++i)
            QCOMPARE(grid.model.at(i).iconLeft, 24.0f);
        QCOMPARE(grid.state.maxColumns, 1);
    }

    void arrangeResetsScrollOffsetButKeepsFrameOnScreen()
    {
        Grid grid(3, {14}, -1);
        grid.state.scrollOffsetY = -120;
        grid.frame.rect = QRectF(5, 200, 73, 62); // unscrolled; shown at 80
        GridLayout::arrangeAll(grid.model, grid.state, grid.frame, 400);
        QCOMPARE(grid.state.scrollOffsetY, 0.0);
        QCOMPARE(grid.frame.rect.top(), 80.0);
    }

    void addingToScrolledListTakesLowestBottomScrolled()
    {
        Grid grid(1, {28}, 400);
        grid.state.scrollOffsetY = -200;
        ListItem& item = grid.model.load();
        GridLayout::placeNext(item, grid.state, 400);
        item.captionHeight = 80;
        GridLayout::finishAdd(item, grid.state);
        QCOMPARE(QList<float>({item.iconLeft, item.iconTop}), QList<float>({104, 14})); // shown at -186
        // 53 + 80 - 200 is above the first caption's bottom (53 + 28), so the first stays the lowest.
        QCOMPARE(grid.state.lowestBottom, 81.0);
        QCOMPARE(grid.state.nextCellX, 160.0);
    }

    void scrollRange_data()
    {
        QTest::addColumn<int>("itemCount");
        QTest::addColumn<double>("contentBottom");
        QTest::addColumn<int>("clientHeight");
        QTest::addColumn<bool>("needed");
        QTest::addColumn<int>("maximum");
        QTest::newRow("exactly fits") << 5 << 300.0 << 300 << false << 0;
        QTest::newRow("one pixel more") << 5 << 301.0 << 300 << true << 15;
        QTest::newRow("taller than 16 bits") << 20000 << 400000.0 << 300 << true << 399714;
        QTest::newRow("empty list never scrolls") << 0 << 9000.0 << 300 << false << 0;
    }
    void scrollRange()
    {
        QFETCH(int, itemCount);
        QFETCH(double, contentBottom);
        QFETCH(int, clientHeight);
        QFETCH(bool, needed);
        QFETCH(int, maximum);
        const GridLayout::ScrollRange range
            = GridLayout::scrollRange(itemCount, {100, contentBottom}, QSize(300, clientHeight));
        QCOMPARE(range.needed, needed);
        QCOMPARE(range.maximum, maximum);
        if (needed) {
            QCOMPARE(range.smallChange, 80);
            QCOMPARE(range.largeChange, clientHeight);
        }
    }

    void contentExtentIncludesFrameAndIgnoresScroll()
    {
        Grid grid(2, {28}, 400);
        grid.state.scrollOffsetY = -50;
        QCOMPARE(GridLayout::contentExtent(grid.model, grid.frame, grid.state).bottom, 81.0);
        grid.frame.rect = QRectF(0, 0, 10, 500);
        const GridLayout::Extent extent = GridLayout::contentExtent(grid.model, grid.frame, grid.state);
        QCOMPARE(QList<double>({extent.bottom, extent.right}), QList<double>({500, 88 + 64}));
    }

    void snapTarget_data()
    {
        QTest::addColumn<int>("value");
        QTest::addColumn<int>("maximum");
        QTest::addColumn<int>("expected"); // -1: no snapping
        QTest::newRow("near first row") << 40 << 300 << 0;
        QTest::newRow("near second row") << 60 << 300 << 97;
        QTest::newRow("between third and fourth") << 250 << 300 << 291;
        QTest::newRow("maximum is kept") << 300 << 300 << -1;
        QTest::newRow("nearest row at the maximum") << 280 << 291 << -1;
        QTest::newRow("tie keeps the earlier row") << 145 << 400 << 97;
        QTest::newRow("on a row") << 194 << 300 << 194;
    }
    void snapTarget()
    {
        QFETCH(int, value);
        QFETCH(int, maximum);
        QFETCH(int, expected);
        const QList<double> rowTops {0, 97, 194, 291};
        const std::optional<int> target = RowSnapping::snapTarget(rowTops, value, maximum);
        QCOMPARE(target.value_or(-1), expected);
    }

    void wheelTarget_data()
    {
        QTest::addColumn<int>("value");
        QTest::addColumn<int>("notches");
        QTest::addColumn<int>("expected");
        QTest::newRow("down one row") << 0 << 1 << 97;
        QTest::newRow("from between rows") << 120 << 1 << 194;
        QTest::newRow("last row then maximum") << 194 << 2 << 250;
        QTest::newRow("stays at maximum") << 250 << 1 << 250;
        QTest::newRow("up from maximum") << 250 << -1 << 194;
        QTest::newRow("up to the top") << 97 << -3 << 0;
    }
    void wheelTarget()
    {
        QFETCH(int, value);
        QFETCH(int, notches);
        QFETCH(int, expected);
        const QList<double> rowTops {0, 97, 194, 291};
        QCOMPARE(RowSnapping::wheelTarget(rowTops, value, 250, notches), expected);
    }

    void frameRectIsAsymmetric()
    {
        const QRectF frame = KeyNavigation::frameRect(QRectF(24, 14, 32, 32), QRectF(8, 53, 64, 28));
        QCOMPARE(frame, QRectF(5, 11, 73, 76));
        const QRectF flipped = KeyNavigation::frameRect(QRectF(10, 10, -40, 4), QRectF(10, 10, -40, 4));
        QVERIFY(flipped.width() >= 0);
    }

    void referencePoint_data()
    {
        QTest::addColumn<QPointF>("icon");
        QTest::addColumn<QPointF>("expected");
        QTest::newRow("in view") << QPointF(104, 120) << QPointF(104, 120);
        QTest::newRow("scrolled out above") << QPointF(104, -30) << QPointF(104, 95);
        QTest::newRow("below the view") << QPointF(104, 400) << QPointF(104, 180);
        QTest::newRow("left of the view") << QPointF(-5, 20) << QPointF(80, 20);
        QTest::newRow("right of the view") << QPointF(500, 20) << QPointF(280, 20);
    }
    void referencePoint()
    {
        QFETCH(QPointF, icon);
        QFETCH(QPointF, expected);
        QCOMPARE(KeyNavigation::referencePoint(icon, 400, 300), expected);
    }

    void findNeighbour_data()
    {
        QTest::addColumn<int>("current");
        QTest::addColumn<int>("keyCode");
        QTest::addColumn<int>("expected"); // -1: nothing
        QTest::newRow("right") << 0 << 39 << 1;
        QTest::newRow("right at row end does not wrap") << 2 << 39 << -1;
        QTest::newRow("left at row start") << 3 << 37 << -1;
        QTest::newRow("down same column") << 1 << 40 << 4;
        QTest::newRow("down to the nearest of a shorter row") << 5 << 40 << 7;
        QTest::newRow("up") << 7 << 38 << 4;
        QTest::newRow("up on the first row") << 1 << 38 << -1;
    }
    void findNeighbour()
    {
        QFETCH(int, current);
        QFETCH(int, keyCode);
        QFETCH(int, expected);
        const Grid grid(8, {28}, 283);
        const auto direction = KeyNavigation::directionFromKeyCode(keyCode);
        QVERIFY(direction);
        const ListItem& item = grid.model.at(current);
        const std::optional<int> found = KeyNavigation::findNeighbour(
            grid.model, 0, current, *direction, QPointF(item.iconLeft, item.iconTop), 300);
        QCOMPARE(found.value_or(-1), expected);
    }

    void findNeighbourTieKeepsLowerIndex()
    {
        Grid grid(3, {14}, -1);
        const QPointF places[] = {{100, 0}, {60, 100}, {140, 100}};
        for (int i = 0; i < 3; ++i) {
            grid.model.at(i).iconLeft = float(places[i].x());
            grid.model.at(i).iconTop = float(places[i].y());
        }
        const auto down = KeyNavigation::Direction::Down;
        QCOMPARE(KeyNavigation::findNeighbour(grid.model, 0, 0, down, places[0], 300).value_or(-1), 1);
        // Shown positions count: scrolled up by 150, nothing lies below the reference any more.
        QVERIFY(!KeyNavigation::findNeighbour(grid.model, -150, 0, down, places[0], 300));
        QVERIFY(!KeyNavigation::directionFromKeyCode(13));
    }

    void bandsFindItemsNearAnArea()
    {
        Grid grid(60, {28, 90, 14}, 283);
        ListModel& model = grid.model;
        ItemBands bands;
        std::vector<int> found;
        auto reaches = [&](int i, double top, double bottom) {
            const ListItem& item = model.at(i);
            const double itemTop = std::min(item.iconTop, item.captionTop);
            const double itemBottom = std::max(item.iconTop + 32.0, double(item.captionTop) + item.captionHeight);
            return itemBottom >= top && itemTop <= bottom;
        };
        for (const auto& [top, bottom] :
            QList<QPair<double, double>> {{0, 10}, {250, 260}, {500, 1400}, {3000, 3001}, {99999, 100000}}) {
            bands.collect(model, top, bottom, found);
            QVERIFY(std::is_sorted(found.begin(), found.end()));
            // Every item that reaches into the area is found.
            for (int i = 0; i < model.loadedCount(); ++i) {
                if (reaches(i, top, bottom))
                    QVERIFY2(std::find(found.begin(), found.end(), i) != found.end(), qPrintable(QString::number(i)));
            }
        }
        // Appending keeps the index current without a rebuild; invalidation rebuilds it from the model.
        ListItem& added = model.load();
        GridLayout::placeNext(added, grid.state, 283);
        bands.append(60, added);
        bands.collect(model, added.iconTop, added.iconTop + 1, found);
        QVERIFY(std::find(found.begin(), found.end(), 60) != found.end());
        model.at(0).captionHeight = 5000;
        bands.invalidate();
        bands.collect(model, 4000, 4001, found);
        QVERIFY(std::find(found.begin(), found.end(), 0) != found.end());
    }

private:
    QFont m_font;
};

int main(int argc, char** argv)
{
    TestEnvironment environment;
    qputenv("QT_QPA_PLATFORM", "offscreen");
    QGuiApplication app(argc, argv);
    TestListLayout test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_listlayout.moc"
