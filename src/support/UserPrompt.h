#pragma once

#include <QString>
#include <functional>
#include <optional>

namespace Brimvault {

// Every message box and input box of the program goes through this seam: the window layer installs
// real dialogs, tests install handlers that record the question and answer it.
enum class PromptIcon { None, Critical, Question, Exclamation, Information };
enum class PromptButtons { Ok, OkCancel, YesNo, YesNoCancel };
enum class PromptAnswer { Ok, Cancel, Yes, No };

struct PromptRequest {
    QString text;
    QString title;
    PromptIcon icon = PromptIcon::None;
    PromptButtons buttons = PromptButtons::Ok;
};

struct InputRequest {
    QString prompt;
    QString title;
    QString defaultText;
};

using PromptHandler = std::function<PromptAnswer(const PromptRequest&)>;
// An empty optional means the user cancelled.
using InputHandler = std::function<std::optional<QString>(const InputRequest&)>;

void SetPromptHandler(PromptHandler handler);
void SetInputHandler(InputHandler handler);

// The answer of a box closed without a click (Escape, the title bar): its cancelling button, No for Yes/No,
// OK for a box that has only OK.
PromptAnswer CancellingAnswer(PromptButtons buttons);

// Without an installed handler the text goes to standard error and the first button is the answer.
PromptAnswer ShowPrompt(const PromptRequest& request);
std::optional<QString> AskInput(const InputRequest& request);

} // namespace Brimvault
