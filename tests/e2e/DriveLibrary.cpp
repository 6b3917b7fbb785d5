#include "DriveLibrary.h"

#include "TestEnvironment.h"
#include "store/InfoFiles.h"
#include "store/clsFileBag.h"
#include "ui/listview/ListConstants.h"

#include <QColor>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QPainter>
#include <QProcess>

using Brimvault::clsFileBag;

namespace DriveLibrary {

bool PlaceGame(const QString& path, const QString& fixture, const QString& name, const QString& russianName)
{
    return QDir().mkpath(QFileInfo(path).absolutePath()) && QFile::copy(fixture, path)
        && WriteGameInfo(path, name, russianName);
}

bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName)
{
    clsFileBag bag;
    bag.SetCurrentFileName(Brimvault::InfoFiles::GameInfoFileName(gamePath));
    bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("Name")), name);
    bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("Name_RUSSIAN")), russianName);
    return bag.SaveFile();
}

bool WriteFlashMovie(const QString& path, const QColor& background)
{
    // The stage rectangle: 5 bits giving the field size, then four signed fields of that size, in twips.
    const int fieldBits = 16;
    const int stage[] = {0, 640 * 20, 0, 480 * 20};
    QByteArray rectangle;
    quint64 bits = 0;
    int bitCount = 0;
    auto put = [&](quint32 value, int width) {
        for (int i = width - 1; i >= 0; --i) {
            bits = (bits << 1) | ((value >> i) & 1u);
            if (++bitCount == 8) {
                rectangle.append(char(bits));
                bits = 0;
                bitCount = 0;
            }
        }
    };
    put(fieldBits, 5);
    for (int value : stage)
        put(quint32(value), fieldBits);
    if (bitCount > 0)
        put(0, 8 - bitCount);

    auto tag = [](int code, const QByteArray& data) -> QByteArray {
        const quint16 header = quint16((code << 6) | data.size());
        return QByteArray(1, char(header & 0xFF)) + char(header >> 8) + data;
    };
    QByteArray colour;
    colour.append(char(background.red())).append(char(background.green())).append(char(background.blue()));
    // 24 frames a second (8.8 fixed point), one frame: background colour, show frame, end.
    const QByteArray body = rectangle + QByteArray::fromHex("00180100") + tag(9, colour) + tag(1, {}) + tag(0, {});
    const quint32 length = quint32(8 + body.size());
    QByteArray movie("FWS\x0a");
    for (int shift = 0; shift < 32; shift += 8)
        movie.append(char((length >> shift) & 0xFF));
    movie += body;

    QFile file(path);
    return QDir().mkpath(QFileInfo(path).absolutePath()) && file.open(QIODevice::WriteOnly)
        && file.write(movie) == movie.size();
}

bool WriteRecordingRunner(const QString& scriptPath, const QString& logFile)
{
    QFile script(scriptPath);
    if (!script.open(QIODevice::WriteOnly))
        return false;
    script.write("#!/bin/sh\nprintf '%s|%s\\n' \"$(pwd)\" \"$*\" >> '" + QFile::encodeName(logFile) + "'\n");
    script.close();
    return script.setPermissions(QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
}

QList<QPair<QString, QString>> RecordedLaunches(const QString& logFile)
{
    QList<QPair<QString, QString>> launches;
    QFile log(logFile);
    if (!log.open(QIODevice::ReadOnly))
        return launches;
    for (const QByteArray& line : log.readAll().split('\n')) {
        const qsizetype bar = line.indexOf('|');
        if (bar > 0)
            launches.append({QString::fromLocal8Bit(line.left(bar)), QString::fromLocal8Bit(line.mid(bar + 1))});
    }
    return launches;
}

QColor AdvertisementColour()
{
    return {250, 200, 40};
}

bool WriteDueAdvertisement(const QString& reclamaFolder, const QString& clickAddress)
{
    if (!QDir().mkpath(reclamaFolder))
        return false;
    QImage picture(480, 300, QImage::Format_RGB32);
    picture.fill(AdvertisementColour());
    {
        QPainter painter(&picture);
        painter.setPen(QColor(40, 40, 120));
        QFont font = painter.font();
        font.setPixelSize(48);
        font.setBold(true);
        painter.setFont(font);
        painter.drawText(
            picture.rect().adjusted(0, 0, 0, -20), Qt::AlignHCenter | Qt::AlignBottom, QStringLiteral("Summer Sale"));
    }
    if (!picture.save(QDir(reclamaFolder).filePath(QStringLiteral("Image_summer.png")), "PNG"))
        return false;
    clsFileBag bag;
    bag.SetCurrentFileName(QDir(reclamaFolder).filePath(QStringLiteral("Reclama.ifb")));
    bag.SetRecord(clsFileBag::MakeKey(QStringLiteral("image_summer"), QStringLiteral("URL")), clickAddress);
    bag.SetRecord(
        clsFileBag::MakeKey(QStringLiteral("image_summer"), QStringLiteral("DateShowFrom")), QStringLiteral("X.X.X"));
    bag.SetRecord(
        clsFileBag::MakeKey(QStringLiteral("image_summer"), QStringLiteral("DateShowTo")), QStringLiteral("X.X.X"));
    return bag.SaveFile();
}

QList<ListedGame> ListAsDiscovered(const QString& program, const QProcessEnvironment& environment)
{
    QProcess process;
    QProcessEnvironment headless = environment;
    headless.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    process.setProcessEnvironment(headless);
    process.start(program, {QStringLiteral("--list"), QStringLiteral("--json")});
    QList<ListedGame> games;
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit || process.exitCode() != 0) {
        qWarning("--list --json failed (exit %d): %s", process.exitCode(), process.readAllStandardError().constData());
        return games;
    }
    const QJsonArray entries = QJsonDocument::fromJson(process.readAllStandardOutput()).array();
    for (const QJsonValue& entry : entries) {
        const QJsonObject game = entry.toObject();
        games.append({game.value(QStringLiteral("caption")).toString(), game.value(QStringLiteral("path")).toString()});
    }
    return games;
}

qsizetype IndexOfPath(const QList<ListedGame>& games, const QString& path)
{
    for (qsizetype i = 0; i < games.size(); ++i) {
        if (QDir::cleanPath(games.at(i).path) == QDir::cleanPath(path))
            return i;
    }
    return -1;
}

QProcessEnvironment ProgramEnvironment(const TestEnvironment& environment, QProcessEnvironment base)
{
    const QString home = environment.path(QStringLiteral("home"));
    QDir().mkpath(home + QStringLiteral("/runtime"));
    QFile::setPermissions(
        home + QStringLiteral("/runtime"), QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
    base.insert(QStringLiteral("HOME"), home);
    base.insert(QStringLiteral("XDG_CONFIG_HOME"), home + QStringLiteral("/.config"));
    base.insert(QStringLiteral("XDG_DATA_HOME"), home + QStringLiteral("/.local/share"));
    base.insert(QStringLiteral("XDG_CACHE_HOME"), home + QStringLiteral("/.cache"));
    base.insert(QStringLiteral("XDG_RUNTIME_DIR"), home + QStringLiteral("/runtime"));
    base.insert(QStringLiteral("QTWEBENGINE_DISABLE_SANDBOX"), QStringLiteral("1"));
    base.insert(QStringLiteral("QTWEBENGINE_CHROMIUM_FLAGS"), QStringLiteral("--disable-gpu"));
    // Every dialog is worked by hand here.
    base.remove(QStringLiteral("BRIMVAULT_DIALOG_ANSWER"));
    base.remove(QStringLiteral("BRIMVAULT_PROMPT_LOG"));
    base.remove(QStringLiteral("BRIMVAULT_WINDOW_REPORT"));
    return base;
}

} // namespace DriveLibrary

namespace ListPicture {

namespace {

// The first icon's centre lies this far into the list; cells follow every ListGrid::CellWidth pixels.
constexpr int FirstIconCentreX = 39;
constexpr int FirstIconCentreY = 30;
constexpr int CellHeight = 76;
// Below the first row the list shows its bare background.
constexpr QPoint BackgroundSample(8, 200);
constexpr int ChannelTolerance = 40;
constexpr int PixelsOfAnItem = 15;
// Left of the 32-pixel icon but inside the selection frame, which spans most of the 80-pixel cell.
constexpr int SelectionSampleLeft = 28;

bool differs(QRgb a, QRgb b)
{
    return qAbs(qRed(a) - qRed(b)) > ChannelTolerance || qAbs(qGreen(a) - qGreen(b)) > ChannelTolerance
        || qAbs(qBlue(a) - qBlue(b)) > ChannelTolerance;
}

} // namespace

QRect CellRect(const QPoint& listOrigin, int index)
{
    const int width = Brimvault::ListGrid::CellWidth;
    return {listOrigin.x() + index * width + 2, listOrigin.y() + 4, width - 4, CellHeight};
}

QPoint IconCentre(const QPoint& listOrigin, int index)
{
    return listOrigin + QPoint(FirstIconCentreX + index * Brimvault::ListGrid::CellWidth, FirstIconCentreY);
}

bool CellShowsItem(const QImage& screen, const QPoint& listOrigin, int index)
{
    const QRect cell = CellRect(listOrigin, index).intersected(screen.rect());
    if (cell.isEmpty())
        return false;
    const QRgb background = screen.pixel(listOrigin + BackgroundSample);
    int different = 0;
    for (int y = cell.top(); y <= cell.bottom(); ++y) {
        for (int x = cell.left(); x <= cell.right(); ++x) {
            if (differs(screen.pixel(x, y), background))
                ++different;
        }
    }
    return different >= PixelsOfAnItem;
}

bool ItemLooksSelected(const QImage& screen, const QPoint& listOrigin, int index)
{
    const QPoint besideIcon = IconCentre(listOrigin, index) - QPoint(SelectionSampleLeft, 0);
    return screen.rect().contains(besideIcon)
        && differs(screen.pixel(besideIcon), screen.pixel(listOrigin + BackgroundSample));
}

int ItemsInFirstRow(const QImage& screen, const QPoint& listOrigin, int cellsPerRow)
{
    int items = 0;
    while (items < cellsPerRow && CellShowsItem(screen, listOrigin, items))
        ++items;
    return items;
}

double ChangedShare(const QImage& before, const QImage& after, const QRect& area)
{
    const QRect inside = area.intersected(before.rect()).intersected(after.rect());
    if (inside.isEmpty())
        return 0;
    qint64 changed = 0;
    for (int y = inside.top(); y <= inside.bottom(); ++y) {
        for (int x = inside.left(); x <= inside.right(); ++x) {
            if (before.pixel(x, y) != after.pixel(x, y))
                ++changed;
        }
    }
    return double(changed) / (qint64(inside.width()) * inside.height());
}

} // namespace ListPicture
