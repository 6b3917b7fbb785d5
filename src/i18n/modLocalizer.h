#pragma once

#include <QList>
#include <QString>
#include <QStringList>

// Numbered texts with built-in English defaults, replaced by the texts of a language file. One language is
// in force for the whole program. Windows re-set their captions through ApplyLanguage (i18n/ApplyLanguage.h),
// which also holds SwitchLanguage, the operation behind the language dialog.
namespace Brimvault::modLocalizer {

// Name and short name of the built-in language, also stored as the choice of it.
QString BuiltInLanguageName(); // "English (Default)"
QString BuiltInShortName(); // "ENG"

// The text of `number` in the language in force, else `defaultText`; then each pair of `replacements`
// (placeholder, value) is substituted, and "|t" becomes a tab and "|n" a line break (CR LF).
QString Translate(int number, const QString& defaultText, const QStringList& replacements = {});
// The same with the built-in English text of the number as the default (i18n/BuiltInTexts.h).
QString Translate(int number);

// Reads one language file into the module. An empty path, a missing or unusable file puts the built-in
// language in force instead, without a message. The short name is left to the caller (SwitchLanguage).
void LoadLanguageFile(const QString& path);
void UseBuiltInLanguage();

// Program start: loads the stored language choice; without one, the first language file written for the
// system's character set is chosen and stored. Call once, before the first window is shown.
// Commands that must not write anything pass ChoiceStorage::ReadOnly: the same language, nothing stored.
enum class ChoiceStorage { Store, ReadOnly };
void InitLocalizer(ChoiceStorage storage = ChoiceStorage::Store);

// Stores the choice of a language file ("" for the built-in language) under "LocaleSettings", sets the
// short name and loads the file. SwitchLanguage does this and then re-captions every open window.
void ChooseLanguageFile(const QString& path);

// "Brimvault_Russian.lng" gives "RUSSIAN": the title prefix and the extension dropped, upper-cased.
QString ShortNameFromFileName(const QString& fileName);

struct LanguageFileInfo {
    QString fileName; // without folder
    QString languageName;
    qint16 charset = 0;
};
// The usable "*.lng" files of the program's folder, by name (the order the Windows file system lists them
// in, on every file system). Files that would be refused on loading are left out.
QList<LanguageFileInfo> ListLanguageFiles();

// The Windows font character set of the user's locale. On Windows-less systems it is derived from the
// locale: the environment variable BRIMVAULT_LOCALE (a locale name such as "ru_RU") when set, else
// QLocale(), which QLocale::setDefault changes. Returns 0 for locales written in the Western code page.
qint16 GetSystemCharset();

// State of the language in force.
bool UsesBuiltInTexts();
QString LanguageName();
QString ShortLanguageName();
qint16 LanguageCharset();
// The help file of the language in force (its "helpfile" setting in the program's folder). For the built-in
// language, and for files without that setting, the program's folder + program file name + ".html"
// (".hlp" on Windows).
QString HelpFilePath();

} // namespace Brimvault::modLocalizer
