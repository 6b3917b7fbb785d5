// The two menus of the main window, their captions, and the commands handed to the dialog library.
#include "ui/main/frmMain.h"

#include "i18n/frmLanguages.h"
#include "i18n/modLocalizer.h"
#include "store/SettingsStore.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/QuilletCalls.h"

#include <QAction>
#include <QCursor>
#include <QMenu>

namespace Brimvault {

namespace {

struct MenuCaption {
    const char* name;
    int number;
};

// Every menu item with the number of its caption; the built-in texts are the captions' defaults.
constexpr MenuCaption menuCaptions[] = {
    {"mnuAddFile", 1070},
    {"mnuAddFolder", 1080},
    {"mnuInstall", 1085},
    {"mnuGetMoreGames", 1200},
    {"mnuActionRemoveFile", 1090},
    {"mnuActionRemoveAllFiles", 1100},
    {"mnuLanguage", 1180},
    {"mnuHelp", 1110},
    {"mnuAbout", 1130},
    {"mnuOpenGame", 1270},
    {"mnuRenameGame", 1150},
    {"mnuRemoveFile", 1160},
    {"mnuOrderFound", 1320},
    {"mnuOrderName", 1330},
    {"mnuOrderRecent", 1340},
};

// Menu captions are plain text: an "&" in a translation is shown, not taken as a shortcut mark.
QString menuText(const QString& caption)
{
    QString text = caption;
    return text.replace(u'&', QStringLiteral("&&"));
}

} // namespace

QAction* frmMain::addMenuItem(QMenu* menu, const char* name, void (frmMain::*command)())
{
    QAction* action = menu->addAction(QString());
    action->setObjectName(QString::fromLatin1(name));
    connect(action, &QAction::triggered, this, command);
    return action;
}

void frmMain::createMenus()
{
    m_mnuActions = new QMenu;
    m_mnuActions->setObjectName(QStringLiteral("mnuActions"));
    addMenuItem(m_mnuActions, "mnuAddFile", &frmMain::mnuAddFileClick);
    addMenuItem(m_mnuActions, "mnuAddFolder", &frmMain::mnuAddFolderClick);
    addMenuItem(m_mnuActions, "mnuInstall", &frmMain::mnuInstallClick);
    m_mnuActions->addSeparator();
    createOrderMenu();
    m_mnuActions->addSeparator();
    addMenuItem(m_mnuActions, "mnuGetMoreGames", &frmMain::mnuGetMoreGamesClick);
    m_mnuActions->addSeparator();
    addMenuItem(m_mnuActions, "mnuActionRemoveFile", &frmMain::mnuRemoveFileClick);
    addMenuItem(m_mnuActions, "mnuActionRemoveAllFiles", &frmMain::mnuRemoveAllFilesClick);
    m_mnuActions->addSeparator();
    addMenuItem(m_mnuActions, "mnuLanguage", &frmMain::mnuLanguageClick);
    m_mnuActions->addSeparator();
    addMenuItem(m_mnuActions, "mnuHelp", &frmMain::mnuHelpClick);
    m_mnuActions->addSeparator();
    addMenuItem(m_mnuActions, "mnuAbout", &frmMain::mnuAboutClick);

    m_mnuItemPopup = new QMenu(QStringLiteral("ItemPopup"));
    m_mnuItemPopup->setObjectName(QStringLiteral("mnuItemPopup"));
    addMenuItem(m_mnuItemPopup, "mnuOpenGame", &frmMain::mnuOpenGameClick);
    m_mnuItemPopup->addSeparator();
    addMenuItem(m_mnuItemPopup, "mnuRenameGame", &frmMain::mnuRenameGameClick);
    addMenuItem(m_mnuItemPopup, "mnuRemoveFile", &frmMain::mnuRemoveFileClick);
}

QAction* frmMain::menuItem(const QString& name) const
{
    for (QMenu* menu : {m_mnuActions.data(), m_mnuItemPopup.data(), m_mnuOrder}) {
        if (auto* action = menu ? menu->findChild<QAction*>(name, Qt::FindDirectChildrenOnly) : nullptr)
            return action;
    }
    return nullptr;
}

void frmMain::captionMenus()
{
    m_mnuActions->setTitle(menuText(modLocalizer::Translate(1060)));
    m_mnuOrder->menuAction()->setText(menuText(modLocalizer::Translate(1310)));
    m_mnuOrder->setTitle(m_mnuOrder->menuAction()->text());
    for (const MenuCaption& caption : menuCaptions) {
        if (QAction* action = menuItem(QString::fromLatin1(caption.name)))
            action->setText(menuText(modLocalizer::Translate(caption.number)));
    }
}

void frmMain::ShowActionsMenu()
{
    m_mnuActions->popup(QCursor::pos());
}

void frmMain::showItemMenu()
{
    m_mnuItemPopup->popup(QCursor::pos());
}

void frmMain::mnuAboutClick()
{
    QuilletCalls::ShowAbout(modLocalizer::Translate(1020, AppTitle()), modLocalizer::Translate(690), windowIcon(),
        QStringLiteral("Version ") + QStringLiteral(BRIMVAULT_VERSION));
}

void frmMain::mnuHelpClick()
{
    QuilletCalls::GetHelp(modLocalizer::HelpFilePath());
}

void frmMain::mnuGetMoreGamesClick()
{
    QuilletCalls::GetHelp(AppTitle() + QStringLiteral("MoreGames"));
}

void frmMain::mnuLanguageClick()
{
    {
        frmLanguages dialog(this);
        dialog.exec();
    }
    // Whatever was chosen: the display names follow the language in force.
    m_listView->RemoveAll();
    RebuildList();
}

} // namespace Brimvault
