#include "support/UserPrompt.h"

#include <cstdio>

namespace Brimvault {

namespace {
PromptHandler& promptHandler()
{
    static PromptHandler handler;
    return handler;
}
InputHandler& inputHandler()
{
    static InputHandler handler;
    return handler;
}
} // namespace

void SetPromptHandler(PromptHandler handler)
{
    promptHandler() = std::move(handler);
}

void SetInputHandler(InputHandler handler)
{
    inputHandler() = std::move(handler);
}

PromptAnswer ShowPrompt(const PromptRequest& request)
{
    if (promptHandler())
        return promptHandler()(request);
    std::fprintf(stderr, "%s: %s\n", qPrintable(request.title), qPrintable(request.text));
    switch (request.buttons) {
    case PromptButtons::Ok:
    case PromptButtons::OkCancel:
        return PromptAnswer::Ok;
    case PromptButtons::YesNo:
    case PromptButtons::YesNoCancel:
        return PromptAnswer::Yes;
    }
    return PromptAnswer::Ok;
}

PromptAnswer CancellingAnswer(PromptButtons buttons)
{
    switch (buttons) {
    case PromptButtons::Ok:
        return PromptAnswer::Ok;
    case PromptButtons::YesNo:
        return PromptAnswer::No;
    case PromptButtons::OkCancel:
    case PromptButtons::YesNoCancel:
        break;
    }
    return PromptAnswer::Cancel;
}

std::optional<QString> AskInput(const InputRequest& request)
{
    if (inputHandler())
        return inputHandler()(request);
    return std::nullopt;
}

} // namespace Brimvault
