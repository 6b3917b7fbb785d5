#include "MovieFiles.h"

#include "TestFiles.h"

#include <QColor>
#include <QString>

namespace {

void appendLe(QByteArray& out, quint32 value, int bytes)
{
    for (int i = 0; i < bytes; ++i)
        out += char((value >> (8 * i)) & 0xff);
}

// A RECT record: five bits giving the field width, then xMin, xMax, yMin, yMax in twips.
QByteArray rect(int width, int height)
{
    const int values[] = {0, width * 20, 0, height * 20};
    int fieldBits = 1;
    while ((qMax(values[1], values[3]) >> (fieldBits - 1)) > 0)
        ++fieldBits;
    QByteArray out;
    int bitCount = 0;
    const auto put = [&](int value, int count) {
        for (int i = count - 1; i >= 0; --i, ++bitCount) {
            if (bitCount % 8 == 0)
                out += '\0';
            if ((value >> i) & 1)
                out[out.size() - 1] = char(out.back() | (0x80 >> (bitCount % 8)));
        }
    };
    put(fieldBits, 5);
    for (int value : values)
        put(value, fieldBits);
    return out;
}

QByteArray action(char code, const QByteArray& data)
{
    QByteArray out(1, code);
    appendLe(out, quint32(data.size()), 2);
    return out + data;
}

} // namespace

SwfBuilder::SwfBuilder(quint8 version, int widthPixels, int heightPixels, double frameRate)
    : m_version(version)
    , m_width(widthPixels)
    , m_height(heightPixels)
    , m_frameRate(frameRate)
{ }

void SwfBuilder::setBackgroundColor(quint8 red, quint8 green, quint8 blue)
{
    const char rgb[] = {char(red), char(green), char(blue)};
    addTag(9, QByteArray(rgb, 3));
}

void SwfBuilder::showFrame()
{
    addTag(1, {});
    ++m_frames;
}

void SwfBuilder::doAction(const QByteArray& actions)
{
    addTag(12, actions + '\0');
}

QByteArray SwfBuilder::bytes() const
{
    QByteArray body = rect(m_width, m_height);
    appendLe(body, quint32(m_frameRate * 256.0), 2);
    appendLe(body, m_frames, 2);
    body += m_tags + QByteArray(2, '\0');
    QByteArray swf("FWS");
    swf += char(m_version);
    appendLe(swf, quint32(8 + body.size()), 4);
    return swf + body;
}

QByteArray SwfBuilder::push(const QVariantList& items)
{
    QByteArray data;
    for (const QVariant& item : items) {
        if (item.typeId() == QMetaType::QString) {
            data += '\0' + item.toString().toUtf8() + '\0';
        } else {
            data += '\x07';
            appendLe(data, quint32(item.toInt()), 4);
        }
    }
    return action('\x96', data);
}

QByteArray SwfBuilder::externalCall(const QString& function, int stacked)
{
    // GetVariable "flash", GetMember "external", GetMember "ExternalInterface", CallMethod "call".
    return push({function, stacked + 1}) + push({QStringLiteral("flash")}) + '\x1c' + push({QStringLiteral("external")})
        + '\x4e' + push({QStringLiteral("ExternalInterface")}) + '\x4e' + push({QStringLiteral("call")}) + '\x52';
}

QByteArray SwfBuilder::pop()
{
    return QByteArray(1, '\x17');
}

QByteArray SwfBuilder::getUrl(const QByteArray& url, const QByteArray& target)
{
    return action('\x83', url + '\0' + target + '\0');
}

void SwfBuilder::addTag(quint16 code, const QByteArray& data)
{
    if (data.size() < 63) {
        appendLe(m_tags, quint32((code << 6) | data.size()), 2);
    } else {
        appendLe(m_tags, quint32((code << 6) | 63), 2);
        appendLe(m_tags, quint32(data.size()), 4);
    }
    m_tags += data;
}

bool WriteFlashMovie(const QString& path, const QColor& background)
{
    SwfBuilder movie(10, 640, 480, 24.0);
    movie.setBackgroundColor(quint8(background.red()), quint8(background.green()), quint8(background.blue()));
    movie.showFrame();
    return WriteFile(path, movie.bytes());
}
