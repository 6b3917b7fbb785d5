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
    // The system's python3 first: the one on PATH may lack the Debian packages.
    QString path = QStandardPaths::findExecutable(program, {QStringLiteral("/usr/bin")});
    if (path.isEmpty())
        path = QStandardPaths::findExecutable(program);
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
    if (!out)
        return std::nullopt;
    return QJsonDocument::fromJson(*out).object();
}

QByteArray BuildIconFile(const QList<IconImage>& images)
{
    QByteArray out(6, '\0');
    qToLittleEndian<quint16>(1, out.data() + 2);
    qToLittleEndian<quint16>(quint16(images.size()), out.data() + 4);
    quint32 offset = 6 + 16 * quint32(images.size());
    for (const IconImage& image : images) {
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
    for (const IconImage& image : images)
        out.append(image.bytes);
    return out;
}

QByteArray BlankBitmap(int width, int height, int bitCount, bool withMask)
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
