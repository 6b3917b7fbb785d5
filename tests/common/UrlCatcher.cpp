#include "UrlCatcher.h"

#include <QDesktopServices>

static const char* const CaughtSchemes[] = {"file", "http", "https"};

UrlCatcher::UrlCatcher()
{
    for (const char* scheme : CaughtSchemes)
        QDesktopServices::setUrlHandler(QString::fromLatin1(scheme), this, "open");
}

UrlCatcher::~UrlCatcher()
{
    for (const char* scheme : CaughtSchemes)
        QDesktopServices::unsetUrlHandler(QString::fromLatin1(scheme));
}
