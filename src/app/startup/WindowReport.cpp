#include "app/startup/TestHooks.h"

#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/ClickLabel.h"
#include "ui/main/frmMain.h"

#include <QAction>
#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QLabel>
#include <QMenu>
#include <QSaveFile>
#include <QTimer>

#include <memory>

namespace Brimvault::TestHooks {

namespace {

QString pictureKind(const QPixmap& picture, const QImage& noIcon)
{
    if (picture.isNull())
        return QStringLiteral("none");
    return picture.toImage() == noIcon ? QStringLiteral("no-icon") : QStringLiteral("picture");
}

QJsonArray menuCaptions(const QMenu* menu)
{
    QJsonArray captions;
    if (!menu)
        return captions;
    for (const QAction* action : menu->actions()) {
        if (!action->isSeparator())
            captions.append(action->text());
    }
    return captions;
}

QJsonObject describe(frmMain* window)
{
    SimpleListView* list = window->ListView1();
    const QImage noIcon = window->imgNoIcon()->Picture().toImage();
    QJsonArray items;
    for (int i = 0; i < list->loadedCount(); ++i) {
        items.append(QJsonObject {{QStringLiteral("caption"), list->labN(i).text()},
            {QStringLiteral("data"), list->labN(i).tag()},
            {QStringLiteral("picture"), pictureKind(list->imgN(i).Picture(), noIcon)}});
    }
    return {{QStringLiteral("title"), window->windowTitle()}, {QStringLiteral("visible"), window->isVisible()},
        {QStringLiteral("actions"), window->labActions()->text()},
        {QStringLiteral("menu"), menuCaptions(window->mnuActions())}, {QStringLiteral("items"), items}};
}

} // namespace

void ReportWindowWhenFilled(frmMain* window)
{
    const QString reportPath = qEnvironmentVariable("BRIMVAULT_WINDOW_REPORT");
    if (reportPath.isEmpty() || !window)
        return;
    const auto filled = std::make_shared<bool>(false);
    QObject::connect(window, &frmMain::listRebuilt, window, [filled] { *filled = true; });
    auto* poll = new QTimer(window);
    QObject::connect(poll, &QTimer::timeout, window, [window, poll, filled, reportPath] {
        if (!*filled || window->tmrIcons()->isActive() || window->pendingIcons() > 0)
            return;
        poll->stop();
        QSaveFile report(reportPath);
        if (report.open(QIODevice::WriteOnly)) {
            report.write(QJsonDocument(describe(window)).toJson());
            report.commit();
        }
        QCoreApplication::exit(0);
    });
    poll->start(20);
}

} // namespace Brimvault::TestHooks
