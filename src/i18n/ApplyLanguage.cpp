#include "i18n/ApplyLanguage.h"

#include "i18n/modLocalizer.h"

#include <QApplication>
#include <QMetaObject>
#include <QPointer>
#include <QWidget>

namespace Brimvault::modLocalizer {

bool ApplyLanguage(QWidget* window, bool force)
{
    if (!window || (!force && UsesBuiltInTexts()))
        return false;
    // Looked up first so that a window without captions of its own is passed over without a warning.
    if (window->metaObject()->indexOfMethod("ChangeLocalizeCaptions()") < 0)
        return false;
    return QMetaObject::invokeMethod(window, "ChangeLocalizeCaptions", Qt::DirectConnection);
}

void ApplyLanguageToAllWindows()
{
    // A window's captions may open or close other windows, so hold them weakly.
    QList<QPointer<QWidget>> windows;
    for (QWidget* window : QApplication::topLevelWidgets())
        windows.append(window);
    // Forced: a switch back to the built-in language must re-set the captions too.
    for (const QPointer<QWidget>& window : windows) {
        if (window)
            ApplyLanguage(window, true);
    }
}

void SwitchLanguage(const QString& path)
{
    ChooseLanguageFile(path);
    ApplyLanguageToAllWindows();
}

} // namespace Brimvault::modLocalizer
