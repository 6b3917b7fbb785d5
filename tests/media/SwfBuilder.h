#pragma once

#include <QByteArray>
#include <QList>
#include <QVariant>

// Writes small uncompressed Flash movies byte by byte: header, frame size, frame rate and count, then tags.
class SwfBuilder {
public:
    SwfBuilder(quint8 version, int widthPixels, int heightPixels, double frameRate)
        : m_version(version)
        , m_width(widthPixels)
        , m_height(heightPixels)
        , m_frameRate(frameRate)
    { }

    void setBackgroundColor(quint8 red, quint8 green, quint8 blue)
    {
        QByteArray rgb;
        rgb += char(red);
        rgb += char(green);
        rgb += char(blue);
        addTag(9, rgb);
    }
    void showFrame()
    {
        addTag(1, {});
        ++m_frames;
    }
    // DoAction with the given AVM1 actions; the closing ActionEnd is added here.
    void doAction(const QByteArray& actions) { addTag(12, actions + '\0'); }

    QByteArray bytes() const
    {
        QByteArray body = rect(0, m_width * 20, 0, m_height * 20);
        const auto rate = static_cast<quint16>(m_frameRate * 256.0);
        appendLe16(body, rate);
        appendLe16(body, m_frames);
        body += m_tags;
        body += QByteArray(2, '\0'); // End tag

        QByteArray swf("FWS");
        swf += char(m_version);
        appendLe32(swf, quint32(8 + body.size()));
        return swf + body;
    }

    // AVM1: push strings and integers, then the flash.external.ExternalInterface object.
    static QByteArray push(const QList<QVariant>& items)
    {
        QByteArray data;
        for (const QVariant& item : items) {
            if (item.typeId() == QMetaType::QString) {
                data += '\0';
                data += item.toString().toUtf8();
                data += '\0';
            } else {
                data += '\x07';
                appendLe32(data, quint32(item.toInt()));
            }
        }
        QByteArray action("\x96", 1);
        appendLe16(action, quint16(data.size()));
        return action + data;
    }
    static QByteArray externalInterface()
    {
        return push({QStringLiteral("flash")}) + "\x1c" + push({QStringLiteral("external")}) + "\x4e"
            + push({QStringLiteral("ExternalInterface")}) + "\x4e";
    }
    static QByteArray callMethod(const QString& name) { return push({name}) + "\x52"; }
    static QByteArray pop() { return QByteArray("\x17", 1); }
    static QByteArray getUrl(const QByteArray& url, const QByteArray& target)
    {
        const QByteArray data = url + '\0' + target + '\0';
        QByteArray action("\x83", 1);
        appendLe16(action, quint16(data.size()));
        return action + data;
    }

private:
    void addTag(quint16 code, const QByteArray& data)
    {
        if (data.size() < 63) {
            appendLe16(m_tags, quint16((code << 6) | data.size()));
        } else {
            appendLe16(m_tags, quint16((code << 6) | 63));
            appendLe32(m_tags, quint32(data.size()));
        }
        m_tags += data;
    }

    static QByteArray rect(int xMin, int xMax, int yMin, int yMax)
    {
        int bitsPerValue = 1;
        for (int value : {xMin, xMax, yMin, yMax}) {
            int bits = 1;
            while ((value >> (bits - 1)) > 0)
                ++bits;
            bitsPerValue = qMax(bitsPerValue, bits);
        }
        QList<bool> bits;
        const auto put = [&bits](int value, int count) {
            for (int i = count - 1; i >= 0; --i)
                bits.append(((value >> i) & 1) != 0);
        };
        put(bitsPerValue, 5);
        for (int value : {xMin, xMax, yMin, yMax})
            put(value, bitsPerValue);
        QByteArray out((bits.size() + 7) / 8, '\0');
        for (int i = 0; i < bits.size(); ++i) {
            if (bits.at(i))
                out[i / 8] = char(out.at(i / 8) | (0x80 >> (i % 8)));
        }
        return out;
    }

    static void appendLe16(QByteArray& out, quint16 value)
    {
        out += char(value & 0xff);
        out += char(value >> 8);
    }
    static void appendLe32(QByteArray& out, quint32 value)
    {
        for (int i = 0; i < 4; ++i)
            out += char((value >> (8 * i)) & 0xff);
    }

    quint8 m_version;
    int m_width;
    int m_height;
    double m_frameRate;
    quint16 m_frames = 0;
    QByteArray m_tags;
};
