#include "PromptRecorder.h"

using namespace Brimvault;

static PromptAnswer Fit(PromptAnswer wanted, PromptButtons buttons)
{
    const bool agree = wanted == PromptAnswer::Yes || wanted == PromptAnswer::Ok;
    if (buttons == PromptButtons::Ok)
        return PromptAnswer::Ok;
    if (buttons == PromptButtons::OkCancel)
        return agree ? PromptAnswer::Ok : PromptAnswer::Cancel;
    if (buttons == PromptButtons::YesNo)
        return agree ? PromptAnswer::Yes : PromptAnswer::No;
    return wanted == PromptAnswer::Ok ? PromptAnswer::Yes : wanted;
}

PromptRecorder::PromptRecorder(PromptAnswer given)
    : answer(given)
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
