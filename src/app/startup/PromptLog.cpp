#include "app/startup/TestHooks.h"

#include "support/UserPrompt.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>

namespace Brimvault::TestHooks {

namespace {

QString iconName(PromptIcon icon)
{
    switch (icon) {
    case PromptIcon::Critical:
        return QStringLiteral("critical");
    case PromptIcon::Question:
        return QStringLiteral("question");
    case PromptIcon::Exclamation:
        return QStringLiteral("exclamation");
    case PromptIcon::Information:
        return QStringLiteral("information");
    case PromptIcon::None:
        break;
    }
    return QStringLiteral("none");
}

QString buttonsName(PromptButtons buttons)
{
    switch (buttons) {
    case PromptButtons::OkCancel:
        return QStringLiteral("okcancel");
    case PromptButtons::YesNo:
        return QStringLiteral("yesno");
    case PromptButtons::YesNoCancel:
        return QStringLiteral("yesnocancel");
    case PromptButtons::Ok:
        break;
    }
    return QStringLiteral("ok");
}

// Appended and flushed at once, so the file is complete even when the program dies right after.
void appendLine(const QString& logPath, const QJsonObject& entry)
{
    QFile log(logPath);
    if (!log.open(QIODevice::WriteOnly | QIODevice::Append))
        return;
    log.write(QJsonDocument(entry).toJson(QJsonDocument::Compact) + '\n');
}

} // namespace

bool InstallPromptLogIfRequested()
{
    const QString logPath = qEnvironmentVariable("BRIMVAULT_PROMPT_LOG");
    if (logPath.isEmpty())
        return false;
    SetPromptHandler([logPath](const PromptRequest& request) {
        appendLine(logPath,
            {{QStringLiteral("kind"), QStringLiteral("message")}, {QStringLiteral("title"), request.title},
                {QStringLiteral("text"), request.text}, {QStringLiteral("icon"), iconName(request.icon)},
                {QStringLiteral("buttons"), buttonsName(request.buttons)}});
        // Never the button that goes ahead: an unattended run must not remove or overwrite anything.
        return CancellingAnswer(request.buttons);
    });
    SetInputHandler([logPath](const InputRequest& request) -> std::optional<QString> {
        appendLine(logPath,
            {{QStringLiteral("kind"), QStringLiteral("input")}, {QStringLiteral("title"), request.title},
                {QStringLiteral("text"), request.prompt}});
        return std::nullopt;
    });
    return true;
}

} // namespace Brimvault::TestHooks
