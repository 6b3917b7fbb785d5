#include "app/startup/WidgetPrompts.h"

#include "app/startup/TestHooks.h"

#include "support/UserPrompt.h"

#include <QApplication>
#include <QInputDialog>
#include <QMessageBox>

namespace Brimvault {

namespace {

QMessageBox::Icon messageIcon(PromptIcon icon)
{
    switch (icon) {
    case PromptIcon::Critical:
        return QMessageBox::Critical;
    case PromptIcon::Question:
        return QMessageBox::Question;
    case PromptIcon::Exclamation:
        return QMessageBox::Warning;
    case PromptIcon::Information:
        return QMessageBox::Information;
    case PromptIcon::None:
        break;
    }
    return QMessageBox::NoIcon;
}

QMessageBox::StandardButtons messageButtons(PromptButtons buttons)
{
    switch (buttons) {
    case PromptButtons::Ok:
        break;
    case PromptButtons::OkCancel:
        return QMessageBox::Ok | QMessageBox::Cancel;
    case PromptButtons::YesNo:
        return QMessageBox::Yes | QMessageBox::No;
    case PromptButtons::YesNoCancel:
        return QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel;
    }
    return QMessageBox::Ok;
}

// Closing the box with Escape or the title bar counts as its cancelling button, as message boxes always did.
PromptAnswer answerFor(int clicked, PromptButtons buttons)
{
    switch (clicked) {
    case QMessageBox::Ok:
        return PromptAnswer::Ok;
    case QMessageBox::Yes:
        return PromptAnswer::Yes;
    case QMessageBox::No:
        return PromptAnswer::No;
    case QMessageBox::Cancel:
        return PromptAnswer::Cancel;
    default:
        break;
    }
    return CancellingAnswer(buttons);
}

PromptAnswer showMessageBox(const PromptRequest& request)
{
    QMessageBox box(messageIcon(request.icon), request.title, request.text, messageButtons(request.buttons),
        QApplication::activeWindow());
    if (request.buttons == PromptButtons::YesNo)
        box.setEscapeButton(QMessageBox::No);
    return answerFor(box.exec(), request.buttons);
}

std::optional<QString> showInputBox(const InputRequest& request)
{
    bool accepted = false;
    const QString text = QInputDialog::getText(
        QApplication::activeWindow(), request.title, request.prompt, QLineEdit::Normal, request.defaultText, &accepted);
    if (!accepted)
        return std::nullopt;
    return text;
}

} // namespace

void InstallWidgetPrompts()
{
    if (TestHooks::InstallPromptLogIfRequested())
        return;
    SetPromptHandler(showMessageBox);
    SetInputHandler(showInputBox);
}

} // namespace Brimvault
