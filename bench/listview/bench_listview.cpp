// The icon list beside Qt's QListView in icon mode, on the same captions and pictures: fill and show,
// re-arrangement after a resize, one scroll step, and heap memory, for 1,000 and 20,000 games.
#include "BenchReport.h"
#include "ui/listview/SimpleListView.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QListView>
#include <QPainter>
#include <QScrollBar>
#include <QStandardItemModel>

#include <algorithm>
#include <cstdio>
#include <functional>
#include <malloc.h>
#include <memory>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

constexpr int Runs = 5;
constexpr int ScrollSteps = 40;
const QSize StartSize(800, 600);
const QSize ResizedSize(650, 600);

QStringList makeCaptions(int count)
{
    static const char* const words[] = {"Chess", "Solitaire", "Deluxe", "Mah", "Jongg", "Quest", "of", "the", "Dragon",
        "Empire", "Internet", "Reversi", "Spider", "Tower", "Hanoi", "Bubble", "Shooter", "Classic", "Space", "Pinball",
        "Lines", "Sudoku", "Kingdom", "Legends", "Puzzle", "Mania", "Island", "Farm", "Gold", "Rush", "Super",
        "Adventure", "Crystal", "Garden"};
    constexpr int wordCount = int(sizeof(words) / sizeof(words[0]));
    QStringList captions;
    captions.reserve(count);
    quint32 seed = 12345;
    auto next = [&seed] {
        seed = seed * 1103515245u + 12345u;
        return int((seed >> 16) & 0x7FFF);
    };
    for (int i = 0; i < count; ++i) {
        const int length = 1 + next() % 4;
        QString caption;
        for (int w = 0; w < length; ++w) {
            if (w)
                caption += u' ';
            caption += QString::fromLatin1(words[next() % wordCount]);
        }
        caption += u' ' + QString::number(i);
        captions << caption;
    }
    return captions;
}

std::vector<QPixmap> makePictures()
{
    std::vector<QPixmap> pictures;
    for (int i = 0; i < 16; ++i) {
        QImage image(32, 32, QImage::Format_ARGB32_Premultiplied);
        image.fill(Qt::transparent);
        QPainter painter(&image);
        painter.setRenderHint(QPainter::Antialiasing);
        painter.setBrush(QColor::fromHsv(i * 22, 170, 210));
        painter.setPen(Qt::NoPen);
        painter.drawRoundedRect(QRectF(2, 2, 28, 28), 6, 6);
        painter.end();
        pictures.push_back(QPixmap::fromImage(image));
    }
    return pictures;
}

size_t heapInUse()
{
    return mallinfo2().uordblks;
}

void settle()
{
    QApplication::processEvents();
    QApplication::processEvents();
}

// Counts paint events anywhere in the application, so that a figure which painted nothing is noticed.
class PaintCounter : public QObject {
public:
    int paints = 0;

protected:
    bool eventFilter(QObject* watched, QEvent* event) override
    {
        if (event->type() == QEvent::Paint)
            ++paints;
        return QObject::eventFilter(watched, event);
    }
};

PaintCounter* paintCounter = nullptr;

void expectPainted(const char* what)
{
    if (paintCounter->paints == 0)
        std::fprintf(stderr, "warning: %s painted nothing\n", what);
    paintCounter->paints = 0;
}

struct Figures {
    double fillShowMs = 0;
    double resizeMs = 0;
    double scrollStepMs = 0;
    double memoryKb = 0;
};

// One implementation under test: builds a shown view, re-arranges it, and scrolls it one step.
struct Subject {
    std::function<std::shared_ptr<QWidget>(int count)> build;
    std::function<void(QWidget*)> relayout;
    std::function<QScrollBar*(QWidget*)> bar;
    std::function<int(QWidget*, int)> nextPosition;
};

// Heap taken by the items: a shown view of count items less a shown empty one, so that the window's own
// backing store does not count.
double itemMemoryKb(const Subject& subject, int count)
{
    size_t before = heapInUse();
    std::shared_ptr<QWidget> empty = subject.build(0);
    settle();
    const double emptyBytes = double(heapInUse() - before);
    empty.reset();
    settle();
    before = heapInUse();
    std::shared_ptr<QWidget> full = subject.build(count);
    settle();
    const double fullBytes = double(heapInUse() - before);
    return (fullBytes - emptyBytes) / 1024.0;
}

Figures measure(const Subject& subject, int count)
{
    std::vector<double> fill, resize, scroll, memory;
    for (int run = 0; run < Runs; ++run) {
        memory.push_back(itemMemoryKb(subject, count));
        QElapsedTimer timer;
        timer.start();
        paintCounter->paints = 0;
        std::shared_ptr<QWidget> widget = subject.build(count);
        settle();
        fill.push_back(timer.nsecsElapsed() / 1e6);
        expectPainted("fill and show");

        timer.restart();
        widget->resize(ResizedSize);
        subject.relayout(widget.get());
        settle();
        resize.push_back(timer.nsecsElapsed() / 1e6);
        expectPainted("resize");

        QScrollBar* bar = subject.bar(widget.get());
        timer.restart();
        for (int step = 0; step < ScrollSteps; ++step) {
            bar->setValue(subject.nextPosition(widget.get(), bar->value()));
            settle();
        }
        scroll.push_back(timer.nsecsElapsed() / 1e6 / ScrollSteps);
        expectPainted("scrolling");
    }
    return {median(fill), median(resize), median(scroll), median(memory)};
}

void report(const char* name, int count, const char* unit, double ours, double reference)
{
    const QString figureName = QString::fromLatin1(name) + u'_' + QString::number(count);
    figure(figureName, ours, unit);
    figure(figureName + QStringLiteral("_qlistview"), reference, unit);
    ratio(figureName, ours, reference);
}

} // namespace

int main(int argc, char** argv)
{
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    PaintCounter counter;
    paintCounter = &counter;
    app.installEventFilter(&counter);
    const std::vector<QPixmap> pictures = makePictures();

    for (int count : {1000, 20000}) {
        const QStringList captions = makeCaptions(count);

        Subject ours;
        ours.build = [&](int items) {
            auto list = std::make_shared<SimpleListView>();
            list->resize(StartSize);
            for (int i = 0; i < items; ++i)
                list->Add(pictures[size_t(i) % pictures.size()], captions[i], captions[i]);
            list->Refresh();
            list->show();
            return std::static_pointer_cast<QWidget>(list);
        };
        ours.relayout = [](QWidget*) {}; // the list arranges itself inside its resize event
        ours.bar = [](QWidget* w) { return static_cast<SimpleListView*>(w)->vbarWindow(); };
        ours.nextPosition = [](QWidget* w, int value) {
            const QList<double>& rows = static_cast<SimpleListView*>(w)->layoutState().rowTops;
            for (double top : rows) {
                if (top > value)
                    return int(top);
            }
            return value;
        };

        Subject reference;
        reference.build = [&](int items) {
            auto view = std::make_shared<QListView>();
            auto* model = new QStandardItemModel(view.get());
            for (int i = 0; i < items; ++i) {
                auto* item = new QStandardItem(QIcon(pictures[size_t(i) % pictures.size()]), captions[i]);
                item->setData(captions[i], Qt::UserRole);
                item->setEditable(false);
                model->appendRow(item);
            }
            view->setViewMode(QListView::IconMode);
            view->setMovement(QListView::Static);
            view->setResizeMode(QListView::Adjust);
            view->setWrapping(true);
            view->setWordWrap(true);
            view->setIconSize(QSize(32, 32));
            view->setGridSize(QSize(80, 96));
            view->setModel(model);
            view->resize(StartSize);
            view->show();
            view->doItemsLayout();
            return std::static_pointer_cast<QWidget>(view);
        };
        reference.relayout = [](QWidget* w) { static_cast<QListView*>(w)->doItemsLayout(); };
        reference.bar = [](QWidget* w) { return static_cast<QListView*>(w)->verticalScrollBar(); };
        reference.nextPosition = [](QWidget*, int value) { return value + 96; };

        const Figures mine = measure(ours, count);
        const Figures theirs = measure(reference, count);
        report("fill_show", count, "ms", mine.fillShowMs, theirs.fillShowMs);
        report("resize", count, "ms", mine.resizeMs, theirs.resizeMs);
        report("scroll_step", count, "ms", mine.scrollStepMs, theirs.scrollStepMs);
        report("memory", count, "KiB", mine.memoryKb, theirs.memoryKb);
    }
    return 0;
}
