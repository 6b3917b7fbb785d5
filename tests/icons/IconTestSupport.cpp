#include "IconTestSupport.h"

#include "RealPeFiles.h"

#include <QCryptographicHash>
#include <QDir>
#include <QDirIterator>
#include <QFile>
#include <QFileInfo>
#include <QJsonDocument>
#include <QProcess>
#include <QSet>
#include <QStandardPaths>
#include <QtEndian>

namespace IconTest {

QString peFixture(const QString& name)
{
    return QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe/") + name;
}

QString iconInput(const QString& name)
{
    return QStringLiteral(ICON_INPUTS_DIR "/") + name;
}

bool fixturesBuilt()
{
    return QFileInfo::exists(peFixture(QStringLiteral("multi64.exe")));
}

bool haveWrestool()
{
    return !QStandardPaths::findExecutable(QStringLiteral("wrestool")).isEmpty();
}

QByteArray meaningfulIconBytes(const QByteArray& iconFile)
{
    if (iconFile.size() < 6)
        return iconFile;
    const int count = qFromLittleEndian<quint16>(iconFile.constData() + 4);
    qint64 end = 6 + 16 * qint64(count);
    for (int i = 0; i < count && 6 + 16 * (i + 1) <= iconFile.size(); ++i) {
        const char* entry = iconFile.constData() + 6 + 16 * i;
        end = qMax(end, qint64(qFromLittleEndian<quint32>(entry + 12)) + qFromLittleEndian<quint32>(entry + 8));
    }
    return iconFile.left(end);
}

std::optional<QByteArray> wrestoolGroup(const QString& exe, const QString& groupName)
{
    if (!haveWrestool())
        return std::nullopt;
    QProcess process;
    process.start(QStringLiteral("wrestool"),
        {QStringLiteral("-x"), QStringLiteral("-t14"), QStringLiteral("--name=") + groupName, exe});
    if (!process.waitForFinished(30000) || process.exitCode() != 0)
        return std::nullopt;
    const QByteArray out = process.readAllStandardOutput();
    if (out.isEmpty())
        return std::nullopt;
    return meaningfulIconBytes(out);
}

static QString systemPython()
{
    return QStringLiteral(BV_SYSTEM_PYTHON);
}

bool havePefile()
{
    static const bool available = [] {
        if (systemPython().isEmpty())
            return false;
        QProcess process;
        process.start(systemPython(), {QStringLiteral("-c"), QStringLiteral("import pefile")});
        return process.waitForFinished(30000) && process.exitCode() == 0;
    }();
    return available;
}

std::optional<QJsonObject> pefileReading(const QString& exe)
{
    if (!havePefile())
        return std::nullopt;
    QProcess process;
    process.start(systemPython(), {QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/icons/pe_reference.py"), exe});
    if (!process.waitForFinished(60000) || process.exitCode() != 0)
        return std::nullopt;
    return QJsonDocument::fromJson(process.readAllStandardOutput()).object();
}

QStringList realPeFiles(int maxFiles)
{
    return Brimvault::RealPeFiles({}, maxFiles);
}

QByteArray buildIconFile(const QList<FakeImage>& images)
{
    QByteArray out(6, '\0');
    qToLittleEndian<quint16>(1, out.data() + 2);
    qToLittleEndian<quint16>(quint16(images.size()), out.data() + 4);
    quint32 offset = 6 + 16 * quint32(images.size());
    for (const FakeImage& image : images) {
        QByteArray entry(16, '\0');
        entry[0] = char(image.width);
        entry[1] = char(image.height);
        entry[2] = char(image.colours);
        qToLittleEndian<quint16>(image.planes, entry.data() + 4);
        qToLittleEndian<quint16>(image.bitCount, entry.data() + 6);
        qToLittleEndian<quint32>(quint32(image.bytes.size()), entry.data() + 8);
        qToLittleEndian<quint32>(offset, entry.data() + 12);
        offset += quint32(image.bytes.size());
        out.append(entry);
    }
    for (const FakeImage& image : images)
        out.append(image.bytes);
    return out;
}

QByteArray blankBitmap(int width, int height, int bitCount, bool withMask)
{
    const int paletteColours = bitCount <= 8 ? 1 << bitCount : 0;
    const int colourRow = ((bitCount * width + 31) / 32) * 4;
    const int maskRow = ((width + 31) / 32) * 4;
    QByteArray out(40 + 4 * paletteColours + colourRow * height + (withMask ? maskRow * height : 0), '\0');
    qToLittleEndian<quint32>(40, out.data());
    qToLittleEndian<qint32>(width, out.data() + 4);
    qToLittleEndian<qint32>(height * 2, out.data() + 8);
    qToLittleEndian<quint16>(1, out.data() + 12);
    qToLittleEndian<quint16>(quint16(bitCount), out.data() + 14);
    return out;
}

} // namespace IconTest
