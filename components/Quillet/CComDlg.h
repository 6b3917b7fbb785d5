#pragma once

#include <QObject>
#include <QString>
#include <QStringList>

namespace Brimvault {

// The common file and folder dialogs of the dialog library, owned by the window passed in.
//
// Unattended runs: while the environment variable BRIMVAULT_DIALOG_ANSWER is set, no dialog is shown and
// every dialog answers its value at once (an empty value answers as a cancelled dialog).
class CComDlg : public QObject {
    Q_OBJECT
public:
    // Flags of the open and save dialogs that change what they accept.
    static constexpr int OFN_OVERWRITEPROMPT = 0x2;
    static constexpr int OFN_FILEMUSTEXIST = 0x1000;

    explicit CComDlg(QObject* parent = nullptr);

    // sFilter holds label and pattern pairs separated by "|" ("EXE files (*.exe)|*.exe|..."), patterns
    // separated by ";"; nFilterIndex picks the pair shown first, counting from 1. Returns the chosen file,
    // or an empty text when the user cancelled.
    Q_INVOKABLE QString ShowOpenSaveDialog(QObject* frmOwner, const QString& sTitle, const QString& sFilter,
        int nFilterIndex, const QString& sInitDir, int lFlags, bool bSave);

    // Returns the chosen folder without a trailing separator, or an empty text when the user cancelled.
    Q_INVOKABLE QString BrowseForFolder(QObject* frmOwner, const QString& sTitle, const QString& sInitDir);

    // "All files (*.exe;*.swf)|*.exe;*.swf" becomes "All files (*.exe *.swf)": the dialogs' own form.
    static QStringList NameFilters(const QString& sFilter);
};

} // namespace Brimvault
