#pragma once

#include "i18n/modLocalizer.h"

#include <QDialog>
#include <QList>

class QComboBox;
class QLabel;
class QPushButton;

namespace Brimvault {

// The modal language dialog: the built-in language and every usable language file, the language in force
// preselected; OK switches the whole program to the chosen one, Cancel changes nothing.
class frmLanguages : public QDialog {
    Q_OBJECT
public:
    explicit frmLanguages(QWidget* parent = nullptr);
    ~frmLanguages() override;

    Q_INVOKABLE void ChangeLocalizeCaptions();

    // Loads the dialog, then shows it modally. Without language files only the message "Language files not
    // found" is shown and the dialog answers Rejected at once.
    int exec() override;

    QComboBox* cbLanguages() const { return m_cbLanguages; }
    QLabel* labLanguages() const { return m_labLanguages; }
    QPushButton* cmdOK() const { return m_cmdOK; }
    QPushButton* cmdCancel() const { return m_cmdCancel; }

private:
    // False when there is nothing to choose from (after the message).
    bool load();
    void cmdOKClick();

    QComboBox* m_cbLanguages = nullptr;
    QLabel* m_labLanguages = nullptr;
    QPushButton* m_cmdOK = nullptr;
    QPushButton* m_cmdCancel = nullptr;
    QList<modLocalizer::LanguageFileInfo> m_languages;
};

} // namespace Brimvault
