#include "i18n/modLocalizer.h"

#include "i18n/BuiltInTexts.h"
#include "i18n/LanguageFile.h"
#include "i18n/LocalizerState.h"
#include "support/ProgramFolder.h"

#include <QHash>

namespace Brimvault::modLocalizer {

namespace {

struct LocalizerState {
    bool useDefaults = true;
    QString languageName = BuiltInLanguageName();
    QString shortName = BuiltInShortName();
    qint16 charset = 0;
    QHash<QString, QString> texts;
    QString helpFilePath;
    bool initialised = false;
};

LocalizerState& State()
{
    static LocalizerState state;
    // The built-in state needs the program folder and the locale, which are not known at static init time.
    if (!state.initialised) {
        state.initialised = true;
        UseBuiltInLanguage();
    }
    return state;
}

QString DefaultHelpFilePath()
{
#ifdef Q_OS_WIN
    const QString extension = QStringLiteral(".hlp");
#else
    const QString extension = QStringLiteral(".html");
#endif
    return ProgramFolder() + u'/' + ProgramBaseName() + extension;
}

} // namespace

QString BuiltInLanguageName()
{
    return QStringLiteral("English (Default)");
}

QString BuiltInShortName()
{
    return QStringLiteral("ENG");
}

QString Translate(int number, const QString& defaultText, const QStringList& replacements)
{
    const LocalizerState& state = State();
    QString text = defaultText;
    if (!state.useDefaults)
        text = state.texts.value(QString::number(number), defaultText);
    for (qsizetype i = 0; i + 1 < replacements.size(); i += 2) {
        if (!replacements[i].isEmpty())
            text.replace(replacements[i], replacements[i + 1]);
    }
    text.replace(QStringLiteral("|t"), QStringLiteral("\t"));
    text.replace(QStringLiteral("|n"), QStringLiteral("\r\n"));
    return text;
}

QString Translate(int number)
{
    return Translate(number, BuiltInText(number));
}

void LoadLanguageFile(const QString& path)
{
    LocalizerState& state = State();
    state.useDefaults = true;
    state.languageName.clear();
    state.charset = 0;
    // A file without its own help gets the default help, not the help of the previous language.
    state.helpFilePath = DefaultHelpFilePath();

    // Read whole before anything is replaced, so the texts of two languages never mix.
    LanguageFileContent content = ReadLanguageFile(path);
    if (!content.isUsable()) {
        UseBuiltInLanguage();
        return;
    }
    state.useDefaults = false;
    state.languageName = content.language;
    state.charset = content.charset;
    state.texts = std::move(content.texts);
    if (!content.helpFile.isEmpty())
        state.helpFilePath = ProgramFolder() + u'/' + content.helpFile;
}

void UseBuiltInLanguage()
{
    LocalizerState& state = State();
    state.useDefaults = true;
    state.languageName = BuiltInLanguageName();
    state.shortName = BuiltInShortName();
    state.charset = GetSystemCharset();
    state.helpFilePath = DefaultHelpFilePath();
    state.texts.clear();
}

bool UsesBuiltInTexts()
{
    return State().useDefaults;
}

QString LanguageName()
{
    return State().languageName;
}

QString ShortLanguageName()
{
    return State().shortName;
}

qint16 LanguageCharset()
{
    return State().charset;
}

QString HelpFilePath()
{
    return State().helpFilePath;
}

void detail::SetShortLanguageName(const QString& shortName)
{
    State().shortName = shortName;
}

} // namespace Brimvault::modLocalizer
