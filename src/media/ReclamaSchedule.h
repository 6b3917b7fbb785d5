#pragma once

#include <QList>
#include <QString>
#include <optional>

class QDate;

namespace Brimvault::ReclamaSchedule {

// One advertisement whose display period covers today: the file to show and its click-through address.
struct DueReclama {
    QString filePath;
    QString address;
};

inline constexpr QLatin1String InfoFileName("Reclama.ifb");
inline constexpr QLatin1String FilePattern("Image_*.*");

// How the main window is being closed. Only its own close command and the program itself show an
// advertisement; a system shutdown or the task manager do not.
enum class UnloadMode { FormControlMenu = 0, FormCode = 1, AppWindows = 2, AppTaskManager = 3, FormMdiForm = 4 };
bool ShowsReclamaOnUnload(UnloadMode mode);

// The "Image_*.*" files of the folder, by name, with their full paths.
QStringList ReclamaFiles(const QString& folder);

// The advertisements of the folder that are due today, in file order. Nothing when the schedule has to be
// abandoned: the information file cannot be read, or a date of a candidate is not a date.
std::optional<QList<DueReclama>> DueReclamas(const QString& folder, const QDate& today);

// Number floor(random * count) of the due ones; random lies in [0, 1).
std::optional<DueReclama> PickReclama(const QList<DueReclama>& due, double random);

// What the main window shows when it closes: one of the advertisements of the advertising folder due
// today, chosen at random; nothing when none is due or the unload mode shows none.
std::optional<DueReclama> ReclamaToShow(UnloadMode mode);

} // namespace Brimvault::ReclamaSchedule
