#include "CComDlg.h"

#include <QDir>
#include <QFileDialog>
#include <QRegularExpression>

#include <optional>

namespace Brimvault {

namespace {

std::optional<QString> unattendedAnswer()
{
    if (!qEnvironmentVariableIsSet("BRIMVAULT_DIALOG_ANSWER"))
        return std::nullopt;
    return qEnvironmentVariable("BRIMVAULT_DIALOG_ANSWER");
}

QWidget* ownerWidget(QObject* frmOwner)
{
    auto* widget = qobject_cast<QWidget*>(frmOwner);
    return widget ? widget->window() : nullptr;
}

QString chosenPath(const QFileDialog& dialog)
{
    const QStringList files = dialog.selectedFiles();
    return files.isEmpty() ? QString() : QDir::toNativeSeparators(files.first());
}

} // namespace

CComDlg::CComDlg(QObject* parent)
    : QObject(parent)
{ }

QStringList CComDlg::NameFilters(const QString& sFilter)
{
    static const QRegularExpression trailingPatterns(QStringLiteral("\\s*\\([^()]*\\)\\s*$"));
    const QStringList parts = sFilter.split(u'|');
    QStringList filters;
    for (qsizetype i = 0; i + 1 < parts.size(); i += 2) {
        QString label = parts.at(i);
        label.remove(trailingPatterns);
        QStringList patterns = parts.at(i + 1).split(u';', Qt::SkipEmptyParts);
        for (QString& pattern : patterns)
            pattern = pattern.trimmed();
        filters.append(label.trimmed() + QStringLiteral(" (") + patterns.join(u' ') + u')');
    }
    return filters;
}

QString CComDlg::ShowOpenSaveDialog(QObject* frmOwner, const QString& sTitle, const QString& sFilter, int nFilterIndex,
    const QString& sInitDir, int lFlags, bool bSave)
{
    if (const std::optional<QString> answer = unattendedAnswer())
        return *answer;

    QFileDialog dialog(ownerWidget(frmOwner), sTitle, sInitDir);
    dialog.setObjectName(QStringLiteral("CComDlgFileDialog"));
    const QStringList filters = NameFilters(sFilter);
    if (!filters.isEmpty()) {
        dialog.setNameFilters(filters);
        dialog.selectNameFilter(filters.value(qBound(1, nFilterIndex, int(filters.size())) - 1));
    }
    if (bSave) {
        dialog.setAcceptMode(QFileDialog::AcceptSave);
        dialog.setFileMode(QFileDialog::AnyFile);
        dialog.setOption(QFileDialog::DontConfirmOverwrite, !(lFlags & OFN_OVERWRITEPROMPT));
    } else {
        dialog.setAcceptMode(QFileDialog::AcceptOpen);
        dialog.setFileMode((lFlags & OFN_FILEMUSTEXIST) ? QFileDialog::ExistingFile : QFileDialog::AnyFile);
    }
    if (dialog.exec() != QDialog::Accepted)
        return {};
    return chosenPath(dialog);
}

QString CComDlg::BrowseForFolder(QObject* frmOwner, const QString& sTitle, const QString& sInitDir)
{
    if (const std::optional<QString> answer = unattendedAnswer())
        return *answer;

    QFileDialog dialog(ownerWidget(frmOwner), sTitle, sInitDir);
    dialog.setObjectName(QStringLiteral("CComDlgFolderDialog"));
    dialog.setFileMode(QFileDialog::Directory);
    dialog.setOption(QFileDialog::ShowDirsOnly, true);
    if (dialog.exec() != QDialog::Accepted)
        return {};
    QString folder = chosenPath(dialog);
    // A drive or file-system root keeps its separator, as the shell's folder browser gives it.
    while (folder.size() > 1 && (folder.endsWith(u'/') || folder.endsWith(u'\\')) && !folder.endsWith(u":\\"))
        folder.chop(1);
    return folder;
}

} // namespace Brimvault
