// Finding as you type and re-ordering over lists of 1,000, 10,000 and 30,000 games: from a key press to the
// narrowed list painted, and from choosing an order to the list painted in it, each against
// QSortFilterProxyModel over a QStandardItemModel in a QListView doing the same with the same captions. Then
// the whole window filled from a generated library of 30,000 games, with its resident memory.
// Arguments: library sizes for the list figures (default 1000 10000 30000); "--no-window" skips the window.
#include "BenchLibrary.h"
#include "BenchReport.h"
#include "WindowFill.h"
#include "catalogue/ListOrder.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ListFinder.h"
#include "ui/main/frmMain.h"

#include <QApplication>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QFile>
#include <QKeyEvent>
#include <QLineEdit>
#include <QListView>
#include <QRandomGenerator>
#include <QSortFilterProxyModel>
#include <QStandardItemModel>
#include <QTemporaryDir>
#include <QTextStream>

#include <memory>
#include <vector>

using namespace Brimvault;
using namespace Brimvault::BenchReport;

namespace {

constexpr int Runs = 7;
const QString Typed = QStringLiteral("dra");

QList<GameEntry> makeEntries(int count)
{
    static const char* words[] = {"Dragon", "Quest", "Puzzle", "Racer", "Mahjong", "Solitaire", "Legend", "Farm",
        "Bubble", "Shooter", "Kingdom", "Island", "Space", "Tetra", "Chess", "Pinball", "Hidden", "Mystery", "Garden",
        "Café", "Ёлка", "Zuma"};
    QRandomGenerator random(14);
    QList<GameEntry> entries;
    for (int i = 0; i < count; ++i) {
        const QString first = QString::fromUtf8(words[random.bounded(int(std::size(words)))]);
        const QString second = QString::fromUtf8(words[random.bounded(int(std::size(words)))]);
        const QString caption = first + u' ' + second + u' ' + QString::number(i);
        GameEntry entry;
        entry.caption = caption;
        entry.path = QStringLiteral("C:\\Games\\%1\\%2%3.exe").arg(caption, second).arg(i);
        entries.append(entry);
    }
    return entries;
}

void press(QWidget* target, const QString& text, int key)
{
    QKeyEvent event(QEvent::KeyPress, key, Qt::NoModifier, text);
    QCoreApplication::sendEvent(target, &event);
}

// Milliseconds per key press: each of the typed letters, then Escape, as a user types a short name.
std::vector<double> typeOurs(SimpleListView* list, ListFinder* finder)
{
    std::vector<double> times;
    for (int run = 0; run < Runs; ++run) {
        for (QChar letter : Typed) {
            QElapsedTimer timer;
            timer.start();
            press(finder->isOpen() ? static_cast<QWidget*>(finder->field()) : list, QString(letter), letter.unicode());
            list->repaint();
            times.push_back(double(timer.nsecsElapsed()) / 1e6);
        }
        press(finder->field(), QString(), Qt::Key_Escape);
        list->repaint();
    }
    return times;
}

std::vector<double> typeReference(QListView* view, QSortFilterProxyModel* proxy)
{
    std::vector<double> times;
    for (int run = 0; run < Runs; ++run) {
        for (int length = 1; length <= Typed.size(); ++length) {
            QElapsedTimer timer;
            timer.start();
            proxy->setFilterFixedString(Typed.left(length));
            view->repaint();
            times.push_back(double(timer.nsecsElapsed()) / 1e6);
        }
        proxy->setFilterFixedString(QString());
        view->repaint();
    }
    return times;
}

void fillList(SimpleListView* list, const QList<GameEntry>& entries)
{
    list->RemoveAll();
    for (const GameEntry& entry : entries)
        list->AddEx(entry.caption, entry.path);
    list->Refresh();
    list->InitSelection();
}

void measureList(int count)
{
    const QList<GameEntry> entries = makeEntries(count);
    QWidget host;
    host.resize(800, 600);
    auto* list = new SimpleListView(&host);
    list->setGeometry(13, 84, 760, 480);
    auto* finder = new ListFinder(&host, list);
    fillList(list, entries);
    host.show();
    QCoreApplication::processEvents();

    QStandardItemModel model;
    for (const GameEntry& entry : entries)
        model.appendRow(new QStandardItem(entry.caption));
    QSortFilterProxyModel proxy;
    proxy.setSourceModel(&model);
    proxy.setFilterCaseSensitivity(Qt::CaseInsensitive);
    proxy.setSortLocaleAware(true);
    proxy.setSortCaseSensitivity(Qt::CaseInsensitive);
    QListView view;
    view.setViewMode(QListView::IconMode);
    view.setUniformItemSizes(true);
    view.setModel(&proxy);
    view.resize(760, 480);
    view.show();
    QCoreApplication::processEvents();

    const double ours = median(typeOurs(list, finder));
    const double reference = median(typeReference(&view, &proxy));
    figure(QStringLiteral("find_keystroke_%1").arg(count), ours, "ms");
    figure(QStringLiteral("find_keystroke_reference_%1").arg(count), reference, "ms");
    ratio(QStringLiteral("find_keystroke_%1").arg(count), ours, reference);

    // Re-ordering: the list is filled again in the new order, as the window does.
    std::vector<double> ourOrder;
    std::vector<double> referenceOrder;
    for (int run = 0; run < 3; ++run) {
        QElapsedTimer timer;
        timer.start();
        QList<GameEntry> sorted = entries;
        ListOrders::Sort(sorted, ListOrder::ByName, {});
        fillList(list, sorted);
        list->repaint();
        ourOrder.push_back(double(timer.nsecsElapsed()) / 1e6);
        timer.restart();
        proxy.sort(0);
        view.repaint();
        referenceOrder.push_back(double(timer.nsecsElapsed()) / 1e6);
        proxy.sort(-1);
    }
    figure(QStringLiteral("reorder_%1").arg(count), median(ourOrder), "ms");
    ratio(QStringLiteral("reorder_%1").arg(count), median(ourOrder), median(referenceOrder));
}

// The window over a generated library: 29,000 installed games and 1,000 added by hand.
bool measureWindow()
{
    const std::optional<BenchLibrary::GameFiles> files = BenchLibrary::loadGameFiles(QStringLiteral(BENCH_PE_FIXTURE));
    if (!files)
        return false;
    QTemporaryDir temporary;
    QString root = BenchLibrary::reusableLibrary(29000, 1000, files->exe, files->icon);
    if (root.isEmpty() && !BenchLibrary::makeLibrary(temporary.path(), 29000, 1000, files->exe, files->icon)) {
        QTextStream(stderr) << "could not build the library of 30000 games\n";
        return false;
    }
    FillTimes times;
    const std::unique_ptr<frmMain> window = OpenFilledWindow(120000, &times);
    if (!times.filled || window->ListView1()->layoutState().itemCount < 30000) {
        QTextStream(stderr) << "window listed " << window->ListView1()->layoutState().itemCount << " games\n";
        return false;
    }
    figure("window_fill_30000", times.fill, "ms");
    figure("window_rss_30000", residentMegabytes(), "MB");

    // Three letters typed into the filled window, as the user does.
    std::vector<double> keys = typeOurs(window->ListView1(), window->finder());
    figure("window_keystroke_30000", median(keys), "ms");
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    QApplication app(argc, argv);
    QStringList arguments = app.arguments().mid(1);
    const bool window = !arguments.removeAll(QStringLiteral("--no-window"));
    QList<int> sizes;
    for (const QString& argument : std::as_const(arguments))
        sizes.append(argument.toInt());
    if (sizes.isEmpty())
        sizes = {1000, 10000, 30000};
    for (int count : std::as_const(sizes))
        measureList(count);
    return window && !measureWindow() ? 1 : 0;
}
