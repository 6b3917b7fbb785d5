#include "PromptRecorder.h"

using namespace Brimvault;

namespace {

PromptAnswer Fit(PromptAnswer wanted, PromptButtons buttons)
{
    const bool agree = wanted == PromptAnswer::Yes || wanted == PromptAnswer::Ok;
    switch (buttons) {
    case PromptButtons::Ok:
        return PromptAnswer::Ok;
    case PromptButtons::OkCancel:
        return agree ? PromptAnswer::Ok : PromptAnswer::Cancel;
    case PromptButtons::YesNo:
        return agree ? PromptAnswer::Yes : PromptAnswer::No;
    case PromptButtons::YesNoCancel:
        return wanted == PromptAnswer::Ok ? PromptAnswer::Yes : wanted;
    }
    return wanted;
}

} // namespace

PromptRecorder::PromptRecorder(PromptAnswer answer)
    : answer(answer)
{
    SetPromptHandler([this](const PromptRequest& request) {
        prompts.append(request);
        return Fit(this->answer, request.buttons);
    });
    SetInputHandler([this](const InputRequest& request) {
        inputs.append(request);
        return inputText;
    });
}

PromptRecorder::~PromptRecorder()
{
    SetPromptHandler({});
    SetInputHandler({});
}

QStringList PromptRecorder::texts() const
{
    QStringList result;
    for (const PromptRequest& request : prompts)
        result.append(request.text);
    return result;
}
