#include "MovieFiles.h"

#include <QString>

namespace {

void appendLe(QByteArray& out, quint32 value, int bytes)
{
    for (int i = 0; i < bytes; ++i)
        out += char((value >> (8 * i)) & 0xff);
}

QByteArray action(char code, const QByteArray& data)
{
    QByteArray out(1, code);
    appendLe(out, quint32(data.size()), 2);
    return out + data;
}

QByteArray push(const QByteArray& text)
{
    return action('\x96', '\0' + text + '\0');
}

} // namespace

void SwfBuilder::addTag(quint16 code, const QByteArray& data)
{
    appendLe(m_tags, quint32((code << 6) | qMin<qsizetype>(data.size(), 63)), 2);
    if (data.size() >= 63)
        appendLe(m_tags, quint32(data.size()), 4);
    m_tags += data;
}

void SwfBuilder::showFrame()
{
    addTag(1, {});
    ++m_frames;
}

QByteArray SwfBuilder::bytes() const
{
    // The stage rectangle in twips, four 15-bit fields: 0, 12800, 0, 9600.
    QByteArray body = QByteArray::fromHex("78000640000012c000");
    appendLe(body, 24 << 8, 2);
    appendLe(body, m_frames, 2);
    body += m_tags + QByteArray(2, '\0');
    QByteArray swf("FWS\x08");
    appendLe(swf, quint32(8 + body.size()), 4);
    return swf + body;
}

QByteArray SwfBuilder::externalCall(const QString& function, int stacked)
{
    QByteArray count(1, '\x07');
    appendLe(count, quint32(stacked + 1), 4);
    // GetVariable "flash", GetMember "external", GetMember "ExternalInterface", CallMethod "call".
    return push(function.toUtf8()) + action('\x96', count) + push("flash") + '\x1c' + push("external") + '\x4e'
        + push("ExternalInterface") + '\x4e' + push("call") + '\x52';
}

QByteArray SwfBuilder::getUrl(const QByteArray& url, const QByteArray& target)
{
    return action('\x83', url + '\0' + target + '\0');
}
