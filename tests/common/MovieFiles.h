#pragma once

#include <QByteArray>

class QString;

// Small uncompressed Flash movies written byte by byte: a 640 x 480 stage at 24 frames a second, then tags.
class SwfBuilder {
public:
    void addTag(quint16 code, const QByteArray& data);
    void showFrame();
    // A DoAction tag with the given AVM1 actions; the closing ActionEnd is added here.
    void doAction(const QByteArray& actions) { addTag(12, actions + '\0'); }
    QByteArray bytes() const;

    // flash.external.ExternalInterface.call(function, ...): the `stacked` values already pushed are its further
    // arguments; the answer is left on the stack.
    static QByteArray externalCall(const QString& function, int stacked = 0);
    static QByteArray getUrl(const QByteArray& url, const QByteArray& target);

private:
    quint16 m_frames = 0;
    QByteArray m_tags;
};
