#pragma once

#include <QMenu>
#include <QPointer>
#include <QString>
#include <QWidget>

#include <memory>

class QAction;
class QLabel;
class QMimeData;
class QTimer;

namespace Brimvault {

namespace ReclamaSchedule {
enum class UnloadMode;
}

class ClickLabel;
class GameLauncher;
class IconCacheBuilder;
class ImageCtrl;
class InstallFolderMemory;
class ItemMenuDelay;
class ListBuilder;
class ListFinder;
class ServiceSignalWatcher;
class SimpleListView;
struct GameEntry;

// The program's only main window: a title area with the product name, the copyright line and the Actions
// button, and the icon list of games below it. The catalogue logic it runs lives in the catalogue and game
// action libraries; the window only shows their results.
class frmMain : public QWidget {
    Q_OBJECT
public:
    explicit frmMain(QWidget* parent = nullptr);
    ~frmMain() override;

    // Sets every caption in the language in force.
    Q_INVOKABLE void ChangeLocalizeCaptions();

    // Empties the list and fills it again by discovery; the icons still missing follow on tmrIcons.
    void RebuildList();

    // The commands of both menus, as their items run them.
    void mnuAddFileClick();
    void mnuAddFolderClick();
    void mnuInstallClick();
    void mnuGetMoreGamesClick();
    void mnuRemoveFileClick();
    void mnuRemoveAllFilesClick();
    void mnuLanguageClick();
    void mnuHelpClick();
    void mnuAboutClick();
    void mnuOpenGameClick();
    void mnuRenameGameClick();
    // "Order" in the Actions menu: kept in the settings store, then the list is built again in that order.
    void chooseOrder(int order);
    // Shows mnuActions at the pointer, as a click on the Actions button does.
    void ShowActionsMenu();
    // The keyboard's ways to the menus: mnuActions under the Actions button, mnuItemPopup at the current icon,
    // each with its first item active.
    void showActionsMenuFromKeyboard();
    void showItemMenuFromKeyboard();

    SimpleListView* ListView1() const { return m_listView; }
    QLabel* Label2() const { return m_label2; }
    QLabel* Label3() const { return m_label3; }
    QLabel* Label4() const { return m_label4; }
    ClickLabel* imgActions() const { return m_imgActions; }
    ClickLabel* labActions() const { return m_labActions; }
    ImageCtrl* imgOnLine() const { return m_imgOnLine; }
    ImageCtrl* imgSWF() const { return m_imgSWF; }
    ImageCtrl* imgNoIcon() const { return m_imgNoIcon; }
    ImageCtrl* imgGbStels() const { return m_imgGbStels; }
    QMenu* mnuActions() const { return m_mnuActions; }
    QMenu* mnuItemPopup() const { return m_mnuItemPopup; }
    // An item of either menu by its name ("mnuAddFile"), or null.
    QAction* menuItem(const QString& name) const;
    QTimer* tmrIcons() const { return m_tmrIcons; }
    ListFinder* finder() const { return m_finder; }

    bool isClosing() const { return m_closing; }
    // The list items still waiting for their icons.
    qsizetype pendingIcons() const;
    QString lastAddFileFolder() const { return m_lastAddFileFolder; }

Q_SIGNALS:
    // Discovery has filled the list (also when it was stopped by closing).
    void listRebuilt();
    // A Flash movie is to be played in a new media host window.
    void flashMovieRequested(const QString& path, const QString& caption);
    // The window starts to close: the advertisement that is due follows.
    void closing();

protected:
    bool event(QEvent* event) override;
    void showEvent(QShowEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    // Construction
    void createControls();
    void createMenus();
    void placeControls();
    QAction* addMenuItem(QMenu* menu, const char* name, void (frmMain::*command)());
    void connectGameActions();
    void captionMenus();
    void createOrderMenu();
    void checkStoredOrder();
    QString itemToolTip(int index) const;
    void connectMediaHost();
    void createKeyboardMenus();

    // Every close runs this once: the closing flag stops discovery and the icon builder, then the advertisement
    // that is due shows when the mode allows one.
    void queryUnload(ReclamaSchedule::UnloadMode mode);
    void showDueReclama(ReclamaSchedule::UnloadMode mode);
    void sessionEnding();

    // Discovery and waiting for the service let events run, so the window may be asked to close meanwhile.
    void enterBusy();
    void leaveBusy();

    // Loading and layout
    void formLoad();
    void finishLoading();
    void layoutListView();
    void keepActionsButtonAtRightEdge();

    // Catalogue
    void addEntry(const GameEntry& entry);
    void addListItem(const GameEntry& entry);
    void tmrIconsTimer();
    void startIconTimerIfNeeded();
    void listDragDrop(const QMimeData* dropped, qint32& effect);
    void listEnterKey(QString& itemData);
    void listMouseUp(qint16 button);
    void showItemMenu();
    QString currentCaption() const;

    SimpleListView* m_listView = nullptr;
    QLabel* m_label2 = nullptr;
    QLabel* m_label3 = nullptr;
    QLabel* m_label4 = nullptr;
    ClickLabel* m_imgActions = nullptr;
    ClickLabel* m_labActions = nullptr;
    ImageCtrl* m_imgOnLine = nullptr;
    ImageCtrl* m_imgSWF = nullptr;
    ImageCtrl* m_imgNoIcon = nullptr;
    ImageCtrl* m_imgGbStels = nullptr;
    QTimer* m_tmrIcons = nullptr;
    ItemMenuDelay* m_tmrMenu = nullptr;
    ServiceSignalWatcher* m_tmrRegTest = nullptr;

    // Pop-up menus are windows of their own; they are not the window's children, so that code closing all
    // top-level windows at once never meets them twice.
    QPointer<QMenu> m_mnuActions;
    QPointer<QMenu> m_mnuItemPopup;

    std::unique_ptr<ListBuilder> m_builder;
    std::unique_ptr<IconCacheBuilder> m_iconBuilder;
    std::unique_ptr<InstallFolderMemory> m_installFolder;
    GameLauncher* m_launcher = nullptr;
    ListFinder* m_finder = nullptr;
    QMenu* m_mnuOrder = nullptr;

    QString m_lastAddFileFolder;
    int m_actionsRightMargin = 0;
    bool m_closing = false;
    bool m_loaded = false;
    // Discovery lets events run; a rebuild asked for meanwhile runs after it, and a close waits for it.
    int m_busy = 0;
    bool m_rebuildRunning = false;
    bool m_rebuildAgain = false;
    bool m_deleteWhenIdle = false;
};

} // namespace Brimvault
