#pragma once

#include <QIcon>
#include <QObject>
#include <QString>

namespace Brimvault {

// The about box of the dialog library: the caller sets what it shows, then calls ShowAbout.
class clsAbout : public QObject {
    Q_OBJECT
    Q_PROPERTY(QString Caption READ Caption WRITE SetCaption)
    Q_PROPERTY(QString Copyright READ Copyright WRITE SetCopyright)
    Q_PROPERTY(QString Version READ Version WRITE SetVersion)
    Q_PROPERTY(QIcon Icon READ Icon WRITE SetIcon)

public:
    explicit clsAbout(QObject* parent = nullptr);

    QString Caption() const { return m_caption; }
    void SetCaption(const QString& value) { m_caption = value; }
    QString Copyright() const { return m_copyright; }
    void SetCopyright(const QString& value) { m_copyright = value; }
    QString Version() const { return m_version; }
    void SetVersion(const QString& value) { m_version = value; }
    QIcon Icon() const { return m_icon; }
    void SetIcon(const QIcon& value) { m_icon = value; }

    // Shows the box modally over the active window and returns when the user closes it.
    Q_INVOKABLE void ShowAbout();

private:
    QString m_caption;
    QString m_copyright;
    QString m_version;
    QIcon m_icon;
};

} // namespace Brimvault
