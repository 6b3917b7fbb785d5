#pragma once

#include <QByteArray>
#include <QJsonObject>
#include <QList>
#include <QString>
#include <optional>

// Windows executables built here with mingw-w64 from tests/icons/fixtures (multi32.exe, multi64.exe, nores64.exe,
// ...). A fixture that was not built fails the running test, naming what to install, and gives an empty path.
QString PeFixture(const QString& name);
// The icon files and pictures those fixtures were made from (main.ico, other.ico, small.ico, mono16.png, ...).
QString IconInput(const QString& name);

// Independent readers. Each fails the running test naming the Debian package when its tool is missing.
// wrestool's extraction of one group icon as an icon file, cut to the bytes its directory covers.
std::optional<QByteArray> WrestoolGroup(const QString& exe, const QString& group);
// pefile's reading (tests/icons/pe_reference.py): {"resources": [[type, name, language, size, file offset], ...]
// in stored order, "version": {"translation", "fields"} or null}, or {"error"} when pefile refuses the file.
std::optional<QJsonObject> PefileReading(const QString& exe);

// An icon file assembled in memory, images packed back to back after the directory.
struct IconImage {
    quint8 width;
    quint8 height;
    quint8 colours;
    quint16 planes;
    quint16 bitCount;
    QByteArray bytes;
};
QByteArray BuildIconFile(const QList<IconImage>& images);
// A bottom-up icon bitmap: 40-byte header, palette, colour bits and (optionally) the AND mask, all zero.
QByteArray BlankBitmap(int width, int height, int bitCount, bool withMask = true);
