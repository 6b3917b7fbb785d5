#pragma once

#include <QByteArray>
#include <QVariantList>

class QColor;
class QString;

// Small uncompressed Flash movies written byte by byte: header, stage size, frame rate and count, then tags.
class SwfBuilder {
public:
    SwfBuilder(quint8 version, int widthPixels, int heightPixels, double frameRate);

    void setBackgroundColor(quint8 red, quint8 green, quint8 blue);
    void showFrame();
    // A DoAction tag with the given AVM1 actions; the closing ActionEnd is added here.
    void doAction(const QByteArray& actions);
    QByteArray bytes() const;

    // AVM1 actions. push takes strings and integers.
    static QByteArray push(const QVariantList& items);
    // flash.external.ExternalInterface.call(function, ...): the `stacked` values already pushed are its further
    // arguments; the answer is left on the stack.
    static QByteArray externalCall(const QString& function, int stacked = 0);
    static QByteArray pop();
    static QByteArray getUrl(const QByteArray& url, const QByteArray& target);

private:
    void addTag(quint16 code, const QByteArray& data);

    quint8 m_version;
    int m_width;
    int m_height;
    double m_frameRate;
    quint16 m_frames = 0;
    QByteArray m_tags;
};

// A one-frame 640 x 480 movie that shows nothing but its background colour.
bool WriteFlashMovie(const QString& path, const QColor& background);
