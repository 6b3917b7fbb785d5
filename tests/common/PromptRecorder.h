#pragma once

#include "support/UserPrompt.h"

#include <QList>
#include <QString>
#include <optional>

// Records every message box and input box the code under test shows and answers it, for as long as it lives.
// A box with only OK is answered OK; a question gets `answer` (Yes/Ok and No/Cancel stand for each other when
// the box lacks that button). An input box returns `inputText`; an empty optional is the user cancelling.
class PromptRecorder {
public:
    explicit PromptRecorder(Brimvault::PromptAnswer answer = Brimvault::PromptAnswer::Yes);
    ~PromptRecorder();
    Q_DISABLE_COPY(PromptRecorder)

    // The texts of the recorded message boxes, in order.
    QStringList texts() const;

    QList<Brimvault::PromptRequest> prompts;
    QList<Brimvault::InputRequest> inputs;
    Brimvault::PromptAnswer answer;
    std::optional<QString> inputText;
};
