#pragma once

#include <QList>
#include <QObject>
#include <QUrl>

// Catches every address the code under test hands to the user's browser or file manager (file, http and https
// through QDesktopServices) for as long as it lives, in order.
class UrlCatcher : public QObject {
    Q_OBJECT
public:
    UrlCatcher();
    ~UrlCatcher() override;

    QList<QUrl> opened;

public Q_SLOTS:
    void open(const QUrl& url) { opened.append(url); }
};
