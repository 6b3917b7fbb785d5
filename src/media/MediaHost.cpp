#include "media/MediaHost.h"

#include "i18n/modLocalizer.h"
#include "support/UserPrompt.h"

#include <QCoreApplication>
#include <QDir>
#include <QLibrary>
#include <QtGlobal>

namespace Brimvault::MediaHost {

namespace {

const EntryPoints* g_linkedIn = nullptr;

QString moduleFileName()
{
#ifdef Q_OS_WIN
    return QStringLiteral("brimvault-media.dll");
#else
    return QStringLiteral("brimvault-media.so");
#endif
}

const EntryPoints* loadModule()
{
    // Beside the program's own file: the module is part of the same build, wherever the data folders point.
    QLibrary module(QDir(QCoreApplication::applicationDirPath()).filePath(moduleFileName()));
    // Every symbol now, so that a mismatched module fails here rather than in the middle of a call.
    module.setLoadHints(QLibrary::ResolveAllSymbolsHint);
    using Entry = const EntryPoints* (*)();
    const auto entry = reinterpret_cast<Entry>(module.resolve(EntryPointsSymbol));
    if (!entry) {
        qWarning("The media host cannot be loaded: %s", qPrintable(module.errorString()));
        return nullptr;
    }
    // The module stays loaded for the rest of the run: its windows outlive any one call.
    return entry();
}

} // namespace

const EntryPoints* Get()
{
    if (g_linkedIn)
        return g_linkedIn;
    static const EntryPoints* const loaded = loadModule();
    return loaded;
}

void ReportFlashMissing()
{
    ShowPrompt({QStringLiteral("Macromedia Shockwave Flash Control not installed properly."),
        modLocalizer::Translate(1020, QStringLiteral("Brimvault")), PromptIcon::Critical});
}

void Provide(const EntryPoints* linkedIn)
{
    g_linkedIn = linkedIn;
}

} // namespace Brimvault::MediaHost
