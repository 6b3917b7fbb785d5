#include "i18n/LanguageFile.h"
#include "i18n/LocalizerState.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "support/ProgramFolder.h"

#include <QDir>
#include <QFileInfo>
#include <algorithm>

namespace Brimvault::modLocalizer {

namespace {

const QString kSection = QStringLiteral("LocaleSettings");
const QString kFileNameKey = QStringLiteral("LngFileName");
const QString kShortNameKey = QStringLiteral("LngNik");

// Paths may come from a Windows installation's settings, so both separators end a folder.
QString FileNameOf(const QString& path)
{
    const qsizetype slash = std::max(path.lastIndexOf(u'\\'), path.lastIndexOf(u'/'));
    return path.mid(slash + 1);
}

void StoreChoice(const QString& fileName, const QString& shortName)
{
    SaveSetting(AppTitle(), kSection, kFileNameKey, fileName);
    SaveSetting(AppTitle(), kSection, kShortNameKey, shortName);
}

// Names stored on Windows may differ in letter case from the file on a case-sensitive file system.
QString PathInProgramFolder(const QString& fileName)
{
    const QDir folder(ProgramFolder());
    if (folder.exists(fileName))
        return folder.filePath(fileName);
    const QStringList names = folder.entryList(QDir::Files | QDir::Readable);
    for (const QString& name : names) {
        if (name.compare(fileName, Qt::CaseInsensitive) == 0)
            return folder.filePath(name);
    }
    return folder.filePath(fileName);
}

void LoadChosenFile(const QString& fileName, const QString& shortName)
{
    detail::SetShortLanguageName(shortName);
    LoadLanguageFile(PathInProgramFolder(fileName));
}

} // namespace

QString ShortNameFromFileName(const QString& fileName)
{
    QString shortName = fileName;
    shortName.remove(AppTitle() + u'_', Qt::CaseInsensitive);
    shortName.remove(QStringLiteral(".lng"), Qt::CaseInsensitive);
    return shortName.toUpper();
}

QList<LanguageFileInfo> ListLanguageFiles()
{
    QList<LanguageFileInfo> files;
    QDir folder(ProgramFolder());
    // NTFS lists names alphabetically; sorting gives the same order on every file system, which also makes
    // the start-up choice between two files of one character set predictable.
    const QStringList names
        = folder.entryList({QStringLiteral("*.lng")}, QDir::Files | QDir::Readable, QDir::Name | QDir::IgnoreCase);
    for (const QString& name : names) {
        const LanguageFileContent content = ReadLanguageFile(folder.filePath(name));
        if (content.isUsable())
            files.append({name, content.language, content.charset});
    }
    return files;
}

void ChooseLanguageFile(const QString& path)
{
    if (path.isEmpty()) {
        StoreChoice(BuiltInLanguageName(), BuiltInShortName());
        detail::SetShortLanguageName(BuiltInShortName());
        LoadLanguageFile(QString());
        return;
    }
    const QString fileName = FileNameOf(path);
    const QString shortName = ShortNameFromFileName(fileName);
    StoreChoice(fileName, shortName);
    detail::SetShortLanguageName(shortName);
    LoadLanguageFile(path);
}

void InitLocalizer(ChoiceStorage storage)
{
    const bool store = storage == ChoiceStorage::Store;
    const QString storedFile = FileNameOf(GetSetting(AppTitle(), kSection, kFileNameKey).trimmed());
    QString storedShortName = GetSetting(AppTitle(), kSection, kShortNameKey);

    // The built-in language counts as no choice: a language file matching the system's character set wins.
    if (!storedFile.isEmpty() && storedFile.compare(BuiltInLanguageName(), Qt::CaseInsensitive) != 0) {
        if (storedShortName.isEmpty())
            storedShortName = ShortNameFromFileName(storedFile);
        LoadChosenFile(storedFile, storedShortName);
        return;
    }

    const qint16 systemCharset = GetSystemCharset();
    for (const LanguageFileInfo& file : ListLanguageFiles()) {
        if (file.charset == systemCharset) {
            const QString shortName = ShortNameFromFileName(file.fileName);
            if (store)
                StoreChoice(file.fileName, shortName);
            LoadChosenFile(file.fileName, shortName);
            return;
        }
    }
    UseBuiltInLanguage();
    if (!store)
        return;
    if (storedFile.isEmpty())
        SaveSetting(AppTitle(), kSection, kFileNameKey, BuiltInLanguageName());
    if (storedShortName.isEmpty())
        SaveSetting(AppTitle(), kSection, kShortNameKey, BuiltInShortName());
}

} // namespace Brimvault::modLocalizer
