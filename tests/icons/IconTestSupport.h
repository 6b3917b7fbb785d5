#pragma once

#include <QByteArray>
#include <QJsonObject>
#include <QString>
#include <QStringList>
#include <optional>

// Fixtures and independent reference readers (wrestool, pefile) for the icon tests.
namespace IconTest {

// A fixture executable built from tests/icons/fixtures, or an icon made from its pictures.
QString peFixture(const QString& name);
QString iconInput(const QString& name);
bool fixturesBuilt();

// wrestool's extraction of one group icon as an icon file, cut to the bytes its directory covers (wrestool pads
// its output with zeros). Nothing when wrestool is missing or fails.
std::optional<QByteArray> wrestoolGroup(const QString& exe, const QString& groupName);
bool haveWrestool();

// pefile's reading of a file (see pe_reference.py); nothing when python3 with pefile is missing.
std::optional<QJsonObject> pefileReading(const QString& exe);
bool havePefile();

// The bytes an icon file's directory accounts for.
QByteArray meaningfulIconBytes(const QByteArray& iconFile);

// Windows executables that packages on this machine installed, one per distinct content, at most maxFiles.
QStringList realPeFiles(int maxFiles);

// A small icon file assembled in memory: entries (width, height, colours, bit count) with the given images.
struct FakeImage {
    quint8 width;
    quint8 height;
    quint8 colours;
    quint16 planes;
    quint16 bitCount;
    QByteArray bytes;
};
QByteArray buildIconFile(const QList<FakeImage>& images);
// A bottom-up icon bitmap: 40-byte header, palette, colour bits and (optionally) the AND mask, all zero.
QByteArray blankBitmap(int width, int height, int bitCount, bool withMask = true);

} // namespace IconTest
