#include "ui/main/QuilletCalls.h"

#include "app/ComponentObjects.h"

#include <QIcon>
#include <QWidget>

namespace Brimvault::QuilletCalls {

namespace {

QVariant owner(QWidget* widget)
{
    return QVariant::fromValue(static_cast<QObject*>(widget));
}

QVariant call(const QString& progId, const QString& method, const QVariantList& args)
{
    CreatedObject created = CreateObject(progId);
    if (!created)
        return {};
    return CallByName(created.object.get(), method, args).value;
}

} // namespace

void CenterForm(QWidget* form)
{
    call(QStringLiteral("Quillet.clsFormFuncs"), QStringLiteral("CenterForm"), {owner(form)});
}

void ShowAbout(const QString& caption, const QString& copyright, const QIcon& icon, const QString& version)
{
    CreatedObject about = CreateObject(QStringLiteral("Quillet.clsAbout"));
    if (!about)
        return;
    QObject* object = about.object.get();
    CallByName(object, QStringLiteral("Caption"), {caption}, CallType::Let);
    CallByName(object, QStringLiteral("Copyright"), {copyright}, CallType::Let);
    CallByName(object, QStringLiteral("Icon"), {QVariant::fromValue(icon)}, CallType::Let);
    CallByName(object, QStringLiteral("Version"), {version}, CallType::Let);
    CallByName(object, QStringLiteral("ShowAbout"));
}

void GetHelp(const QString& argument)
{
    call(QStringLiteral("Quillet.clsGetHelp"), QStringLiteral("GetHelp"), {argument});
}

QString ShowOpenDialog(
    QWidget* widget, const QString& title, const QString& filter, int filterIndex, const QString& initialFolder)
{
    return call(QStringLiteral("Quillet.CComDlg"), QStringLiteral("ShowOpenSaveDialog"),
        {owner(widget), title, filter, filterIndex, initialFolder, OpenExistingFileFlags, false})
        .toString();
}

QString BrowseForFolder(QWidget* widget, const QString& title)
{
    return call(QStringLiteral("Quillet.CComDlg"), QStringLiteral("BrowseForFolder"), {owner(widget), title, QString()})
        .toString();
}

} // namespace Brimvault::QuilletCalls
