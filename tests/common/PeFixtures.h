#pragma once

#include <QByteArray>
#include <QDataStream>
#include <QJsonObject>
#include <QList>
#include <QString>
#include <QtEndian>
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
// in stored order or null}, or {"error"} when pefile refuses the file.
std::optional<QJsonObject> PefileReading(const QString& exe);

// An icon file assembled in memory, images packed back to back after the directory; `type` 2 makes a cursor file.
struct IconImage {
    quint8 width, height, colours;
    quint16 planes, bitCount;
    QByteArray bytes;
};
QByteArray BuildIconFile(const QList<IconImage>& images, quint16 type = 1);
// A bottom-up icon bitmap: the 40-byte header, then palette, colour rows and mask rows, all zero.
QByteArray BlankBitmap(int width, int height, int bitCount);

// The values in little-endian order, as Windows files store them.
template <typename... T>
QByteArray LittleEndian(T... values)
{
    QByteArray out;
    QDataStream stream(&out, QDataStream::WriteOnly);
    stream.setByteOrder(QDataStream::LittleEndian);
    (stream << ... << values);
    return out;
}

// The bytes with a little-endian value written over them at `at`.
template <typename T>
QByteArray Patched(QByteArray bytes, qsizetype at, T value)
{
    qToLittleEndian<T>(value, bytes.data() + at);
    return bytes;
}
