#include "PeFixtures.h"

#include <QFileInfo>
#include <QJsonDocument>
#include <QProcess>
#include <QStandardPaths>
#include <QTest>
#include <QtEndian>

namespace {

void failMissing(const QString& what, const char* package)
{
    QTest::qFail(qPrintable(QStringLiteral("%1 is missing: install the Debian package %2 and build with make test")
                                .arg(what, QLatin1String(package))),
        __FILE__, __LINE__);
}

std::optional<QByteArray> run(const QString& program, const QStringList& arguments, const char* package)
{
    // The system's python3: the one first on PATH may lack the Debian packages.
    const QString path = QStandardPaths::findExecutable(program, {QStringLiteral("/usr/bin")});
    if (path.isEmpty()) {
        failMissing(program, package);
        return std::nullopt;
    }
    QProcess process;
    process.start(path, arguments);
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit)
        return std::nullopt;
    if (process.exitCode() != 0) {
        if (process.readAllStandardError().contains("No module named"))
            failMissing(QStringLiteral("pefile"), package);
        return std::nullopt;
    }
    return process.readAllStandardOutput();
}

} // namespace

QString PeFixture(const QString& name)
{
    const QString path = QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe/") + name;
    if (QFileInfo::exists(path))
        return path;
    failMissing(QStringLiteral("the PE fixture ") + name, "mingw-w64 (with icoutils)");
    return {};
}

QString IconInput(const QString& name)
{
    return QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/icons/") + name;
}

std::optional<QByteArray> WrestoolGroup(const QString& exe, const QString& group)
{
    const auto out = run(QStringLiteral("wrestool"),
        {QStringLiteral("-x"), QStringLiteral("-t14"), QStringLiteral("--name=") + group, exe}, "icoutils");
    if (!out || out->size() < 6)
        return std::nullopt;
    // wrestool pads its output with zeros.
    const int count = qFromLittleEndian<quint16>(out->constData() + 4);
    qint64 end = 6 + 16 * qint64(count);
    for (int i = 0; i < count && 6 + 16 * (i + 1) <= out->size(); ++i) {
        const char* entry = out->constData() + 6 + 16 * i;
        end = qMax(end, qint64(qFromLittleEndian<quint32>(entry + 12)) + qFromLittleEndian<quint32>(entry + 8));
    }
    return out->left(end);
}

std::optional<QJsonObject> PefileReading(const QString& exe)
{
    const auto out = run(QStringLiteral("python3"),
        {QStringLiteral(BRIMVAULT_SOURCE_DIR "/tests/icons/pe_reference.py"), exe}, "python3-pefile");
    return out ? std::optional(QJsonDocument::fromJson(*out).object()) : std::nullopt;
}

QByteArray BuildIconFile(const QList<IconImage>& images, quint16 type)
{
    QByteArray out = LittleEndian(quint16(0), type, quint16(images.size())), bitmaps;
    const quint32 first = 6 + 16 * quint32(images.size());
    for (const IconImage& i : images) {
        out += LittleEndian(i.width, i.height, i.colours, quint8(0), i.planes, i.bitCount, quint32(i.bytes.size()),
            first + quint32(bitmaps.size()));
        bitmaps += i.bytes;
    }
    return out + bitmaps;
}

QByteArray BlankBitmap(int width, int height, int bitCount)
{
    const QByteArray header
        = LittleEndian(quint32(40), qint32(width), qint32(height * 2), quint16(1), quint16(bitCount));
    const int rows = ((bitCount * width + 31) / 32 + (width + 31) / 32) * 4 * height;
    return header.leftJustified(40 + 4 * (bitCount <= 8 ? 1 << bitCount : 0) + rows, '\0');
}
