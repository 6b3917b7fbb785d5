#pragma once

#include <QColor>
#include <QImage>
#include <QList>
#include <QProcessEnvironment>
#include <QRect>
#include <QString>
#include <QStringList>

class TestEnvironment;

// The user's world for the desktop drive, built in the test's temporary tree: installed games with their info
// files, a game added by hand, a recording stand-in for the compatibility runner, a due advertisement.
namespace DriveLibrary {

struct ListedGame {
    QString caption;
    QString path;
};

// A real small executable from the PE fixtures, copied to `path` with an info file naming it.
bool PlaceGame(const QString& path, const QString& fixture, const QString& name, const QString& russianName);
bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName);
// A one-frame Flash movie that shows nothing but its background colour.
bool WriteFlashMovie(const QString& path, const QColor& background);

// A shell script that appends "<working folder>|<arguments>" to `logFile` for every start.
bool WriteRecordingRunner(const QString& scriptPath, const QString& logFile);
// The lines the runner recorded, each split into its working folder and its arguments.
QList<QPair<QString, QString>> RecordedLaunches(const QString& logFile);

// A picture advertisement due every day, with its record in "Reclama.ifb"; the picture is mostly this colour.
bool WriteDueAdvertisement(const QString& reclamaFolder, const QString& clickAddress);
QColor AdvertisementColour();

// The list as the program's own discovery builds it, from "brimvault --list --json" in the same environment.
QList<ListedGame> ListAsDiscovered(const QString& program, const QProcessEnvironment& environment);
qsizetype IndexOfPath(const QList<ListedGame>& games, const QString& path);

// Settings and caches under the user's home belong to the temporary tree as well.
QProcessEnvironment ProgramEnvironment(const TestEnvironment& environment, QProcessEnvironment base);

} // namespace DriveLibrary

// Reads the icon list from a screenshot: items fill the grid's cells left to right, so the first row tells how
// many items are shown and where each one is.
namespace ListPicture {

// The first row's cell of an item, in screen coordinates, for a list whose top-left corner is `listOrigin`.
QRect CellRect(const QPoint& listOrigin, int index);
QPoint IconCentre(const QPoint& listOrigin, int index);
// True when the cell shows something other than the list's background (an icon, a caption, a frame).
bool CellShowsItem(const QImage& screen, const QPoint& listOrigin, int index);
// True when the item's cell carries the selection frame (checked beside its icon, where nothing else paints).
bool ItemLooksSelected(const QImage& screen, const QPoint& listOrigin, int index);
// The number of leading cells of the first row that show an item.
int ItemsInFirstRow(const QImage& screen, const QPoint& listOrigin, int cellsPerRow);
// The share of pixels that differ between two pictures inside the rectangle, 0 to 1.
double ChangedShare(const QImage& before, const QImage& after, const QRect& area);

} // namespace ListPicture
