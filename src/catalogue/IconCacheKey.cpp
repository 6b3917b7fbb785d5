#include "catalogue/IconCacheKey.h"

#include "support/PathFunctions.h"

#include <QStringEncoder>

#include <limits>

namespace Brimvault {

namespace {

QStringEncoder eightBitEncoder()
{
#ifdef Q_OS_WIN
    return QStringEncoder(QStringConverter::System);
#else
    QStringEncoder encoder("windows-1252");
    return encoder.isValid() ? std::move(encoder) : QStringEncoder(QStringConverter::Latin1);
#endif
}

} // namespace

int EightBitCode(QChar character)
{
    const char16_t code = character.unicode();
    if (code < 0x80)
        return code;
    static thread_local QStringEncoder encoder = eightBitEncoder();
    const QByteArray bytes = encoder.encode(QStringView(&character, 1));
    encoder.resetState();
    // A character outside the code page is written as "?", as an 8-bit conversion does.
    if (bytes.size() != 1 || bytes.at(0) == '?' || bytes.at(0) == '\x1a')
        return u'?';
    return static_cast<unsigned char>(bytes.at(0));
}

QString IconCacheKey(const QString& path)
{
    qint64 odd = 0;
    qint64 even = 0;
    constexpr qint64 limit = std::numeric_limits<qint32>::max();
    for (qsizetype i = 0; i < path.size(); ++i) {
        (i % 2 == 0 ? odd : even) += EightBitCode(path.at(i));
        if (odd > limit || even > limit)
            return QString();
    }
    return GetFileName(path.toUpper(), false) + QString::number(odd) + QString::number(even);
}

QString IconCacheFile(const QString& iconsFolder, const QString& path)
{
    const QString key = IconCacheKey(path);
    if (iconsFolder.isEmpty() || key.isEmpty())
        return QString();
    return iconsFolder + key + QStringLiteral(".ico");
}

} // namespace Brimvault
