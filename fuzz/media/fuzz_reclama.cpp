// The advertising information file from outside (downloaded with the advertisements): which of the
// "Image_*.*" files are due today. Each input is the folder's "Reclama.ifb"; today comes from its first two
// bytes, so that the same dates are tried against different days.
#include "FuzzEnvironment.h"

#include "media/ReclamaSchedule.h"
#include "store/DataFolders.h"

#include <QByteArray>
#include <QDate>
#include <QDir>
#include <QFile>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <limits>

using namespace Brimvault;

namespace {

void require(bool condition)
{
    if (!condition)
        std::abort();
}

QDate todayFrom(const QByteArray& bytes)
{
    // Four years from a leap year, so that the 29th of February and year ends come up.
    const int word = bytes.size() < 2 ? 0 : (quint8(bytes.at(0)) << 8) | quint8(bytes.at(1));
    return QDate(2024, 1, 1).addDays(word % 1461);
}

bool sameReclama(const ReclamaSchedule::DueReclama& a, const ReclamaSchedule::DueReclama& b)
{
    return a.filePath == b.filePath && a.address == b.address;
}

bool isOneOf(const ReclamaSchedule::DueReclama& picked, const QList<ReclamaSchedule::DueReclama>& due)
{
    for (const ReclamaSchedule::DueReclama& item : due) {
        if (sameReclama(item, picked))
            return true;
    }
    return false;
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    FuzzEnvironment::instance();
    const QString folder = DataFolders::ReclamaFolder();
    QDir().mkpath(folder);
    for (const char* name : {"Image_1.jpg", "Image_2.swf", "Image_Promo.htm", "image_3.GIF"}) {
        QFile file(folder + QLatin1String(name));
        if (file.open(QIODevice::WriteOnly))
            file.write("advertisement");
    }
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const QByteArray bytes(reinterpret_cast<const char*>(data), qsizetype(size));
    const QString folder = DataFolders::ReclamaFolder();
    QFile info(folder + ReclamaSchedule::InfoFileName);
    if (!info.open(QIODevice::WriteOnly | QIODevice::Truncate) || info.write(bytes) != bytes.size())
        std::abort();
    info.close();

    const QDate today = todayFrom(bytes);
    const QStringList files = ReclamaSchedule::ReclamaFiles(folder);
    require(files.size() == 4);
    const auto due = ReclamaSchedule::DueReclamas(folder, today);
    if (!due)
        return 0;
    require(due->size() <= files.size());
    for (const ReclamaSchedule::DueReclama& item : *due) {
        require(files.contains(item.filePath));
        require(!item.address.isEmpty() && item.address == item.address.trimmed());
    }

    // Whatever the random number, the pick is one of the due ones, or nothing when none is due.
    for (double random : {0.0, 0.5, 0.999999999}) {
        const auto picked = ReclamaSchedule::PickReclama(*due, random);
        require(picked.has_value() == !due->isEmpty());
        if (picked)
            require(isOneOf(*picked, *due));
    }
    for (double random : {1.0, -0.1, std::nan(""), std::numeric_limits<double>::infinity()})
        require(!ReclamaSchedule::PickReclama(*due, random));
    return 0;
}
