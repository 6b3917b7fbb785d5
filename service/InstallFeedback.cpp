#include "InstallFeedback.h"

#include <QByteArray>
#include <QtGlobal>

#include <cstdio>

namespace Brimvault {

namespace {

class ConsoleFeedback : public InstallFeedback {
public:
    void phase(InstallPhase phase, const QString& gameFolder) override
    {
        m_gameFolder = gameFolder;
        if (phase == InstallPhase::Finishing && m_large)
            PrintToStandardError(QStringLiteral("Finishing the installation of \"%1\"...").arg(m_gameFolder));
    }

    bool progress(qint64 done, qint64 total) override
    {
        if (total < LargePackageBytes)
            return true;
        if (!m_large) {
            m_large = true;
            PrintToStandardError(QStringLiteral("Installing \"%1\" (%2 MB)...").arg(m_gameFolder).arg(total >> 20));
        }
        const int percent = int(done * 100 / total);
        if (percent / 10 > m_lastTenth) {
            m_lastTenth = percent / 10;
            PrintToStandardError(QStringLiteral("Unpacking: %1%").arg(m_lastTenth * 10));
        }
        return true;
    }

    void failed(const QString& reason) override
    {
        PrintToStandardError(QStringLiteral("The game was not installed: %1").arg(reason));
    }

private:
    QString m_gameFolder;
    bool m_large = false;
    int m_lastTenth = 0;
};

} // namespace

InstallFeedback::~InstallFeedback() = default;

bool DisplayAvailable()
{
#if defined(Q_OS_WIN) || defined(Q_OS_MACOS)
    const QByteArray platform = qgetenv("QT_QPA_PLATFORM");
    return !platform.startsWith("offscreen") && !platform.startsWith("minimal");
#else
    const QByteArray platform = qgetenv("QT_QPA_PLATFORM");
    if (platform.startsWith("offscreen") || platform.startsWith("minimal"))
        return false;
    return !qEnvironmentVariableIsEmpty("DISPLAY") || !qEnvironmentVariableIsEmpty("WAYLAND_DISPLAY");
#endif
}

void PreferOffscreenFallback()
{
#if !defined(Q_OS_WIN) && !defined(Q_OS_MACOS)
    if (!qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        return;
    qputenv("QT_QPA_PLATFORM",
        qEnvironmentVariableIsEmpty("WAYLAND_DISPLAY") ? QByteArray("xcb;offscreen")
                                                       : QByteArray("wayland;xcb;offscreen"));
#endif
}

std::unique_ptr<InstallFeedback> MakeConsoleFeedback()
{
    return std::make_unique<ConsoleFeedback>();
}

void PrintToStandardError(const QString& text)
{
    const QByteArray line = text.toLocal8Bit() + '\n';
    std::fwrite(line.constData(), 1, size_t(line.size()), stderr);
    std::fflush(stderr);
}

} // namespace Brimvault
