#include "app/startup/modMain.h"

#include "app/CompanionComponents.h"
#include "app/startup/TestHooks.h"
#include "i18n/modLocalizer.h"
#include "ui/main/frmMain.h"

#include <QPointer>

namespace Brimvault::modMain {

namespace {

QPointer<frmMain>& mainWindow()
{
    static QPointer<frmMain> window;
    return window;
}

} // namespace

void Main()
{
    for (const CompanionComponent& component : CompanionComponents()) {
        if (!CheckComponent(component.prefix))
            return;
    }

    try {
        modLocalizer::InitLocalizer();
    } catch (...) {
        // A language that cannot be set up leaves the built-in texts in force.
    }

    if (!mainWindow()) {
        mainWindow() = new frmMain;
        mainWindow()->setAttribute(Qt::WA_DeleteOnClose);
    }
    mainWindow()->show();
    TestHooks::ReportWindowWhenFilled(mainWindow());
}

} // namespace Brimvault::modMain
