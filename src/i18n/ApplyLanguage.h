#pragma once

class QString;
class QWidget;

namespace Brimvault::modLocalizer {

// Every window of the program has `Q_INVOKABLE void ChangeLocalizeCaptions()`, which sets its captions
// through Translate. ApplyLanguage calls it when `force` is set or a language file is in force. Fonts need
// no change: Qt fonts are Unicode, so the language's character set only lives in the module.
// Returns true when the window's captions were set.
bool ApplyLanguage(QWidget* window, bool force);

// Re-captions every top-level window that has ChangeLocalizeCaptions.
void ApplyLanguageToAllWindows();

// Switches the whole program to a language file ("" for the built-in language): stores the choice, loads
// the file and re-captions every open window.
void SwitchLanguage(const QString& path);

} // namespace Brimvault::modLocalizer
