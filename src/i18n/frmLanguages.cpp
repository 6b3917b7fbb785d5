#include "i18n/frmLanguages.h"

#include "i18n/ApplyLanguage.h"
#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"
#include "support/ProgramFolder.h"
#include "support/UserPrompt.h"

#include <QComboBox>
#include <QDialogButtonBox>
#include <QLabel>
#include <QPushButton>
#include <QVBoxLayout>

namespace Brimvault {

frmLanguages::frmLanguages(QWidget* parent)
    : QDialog(parent)
{
    setObjectName(QStringLiteral("frmLanguages"));
    setWindowFlag(Qt::WindowContextHelpButtonHint, false);
    setModal(true);
    QFont dialogFont = font();
    dialogFont.setFamilies({QStringLiteral("Verdana"), QStringLiteral("DejaVu Sans"), dialogFont.family()});
    setFont(dialogFont);

    m_labLanguages = new QLabel(this);
    m_labLanguages->setObjectName(QStringLiteral("labLanguages"));
    m_cbLanguages = new QComboBox(this);
    m_cbLanguages->setObjectName(QStringLiteral("cbLanguages"));
    m_cbLanguages->setMinimumWidth(260);
    m_labLanguages->setBuddy(m_cbLanguages);
    // The choice is the dialog's one question: the keyboard starts there.
    m_cbLanguages->setFocus();

    auto* buttons = new QDialogButtonBox(this);
    m_cmdOK = buttons->addButton(QString(), QDialogButtonBox::AcceptRole);
    m_cmdOK->setObjectName(QStringLiteral("cmdOK"));
    m_cmdOK->setDefault(true);
    m_cmdCancel = buttons->addButton(QString(), QDialogButtonBox::RejectRole);
    m_cmdCancel->setObjectName(QStringLiteral("cmdCancel"));
    connect(m_cmdOK, &QPushButton::clicked, this, &frmLanguages::cmdOKClick);
    connect(m_cmdCancel, &QPushButton::clicked, this, &QDialog::reject);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(18, 16, 18, 14);
    layout->setSpacing(8);
    layout->addWidget(m_labLanguages);
    layout->addWidget(m_cbLanguages);
    layout->addSpacing(10);
    layout->addWidget(buttons);
    layout->setSizeConstraint(QLayout::SetFixedSize);

    ChangeLocalizeCaptions();
}

frmLanguages::~frmLanguages() = default;

void frmLanguages::ChangeLocalizeCaptions()
{
    setWindowTitle(modLocalizer::Translate(10, QStringLiteral("Program language")));
    m_labLanguages->setText(modLocalizer::Translate(20, QStringLiteral("Please, select the language:")));
    m_cmdOK->setText(modLocalizer::Translate(30, QStringLiteral("OK")));
    m_cmdCancel->setText(modLocalizer::Translate(40, QStringLiteral("Cancel")));
}

int frmLanguages::exec()
{
    if (!load())
        return QDialog::Rejected;
    return QDialog::exec();
}

bool frmLanguages::load()
{
    modLocalizer::ApplyLanguage(this, true);
    m_languages = modLocalizer::ListLanguageFiles();
    if (m_languages.isEmpty()) {
        ShowPrompt({modLocalizer::Translate(50, QStringLiteral("Language files not found")),
            modLocalizer::Translate(1020, AppTitle()), PromptIcon::Exclamation, PromptButtons::Ok});
        return false;
    }

    const QString stored = GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngFileNameKey);
    int chosen = 0;
    m_cbLanguages->clear();
    m_cbLanguages->addItem(modLocalizer::BuiltInLanguageName(), 0);
    for (int i = 0; i < m_languages.size(); ++i) {
        m_cbLanguages->addItem(m_languages.at(i).languageName, i + 1);
        if (m_languages.at(i).fileName.compare(stored, Qt::CaseInsensitive) == 0)
            chosen = i + 1;
    }
    m_cbLanguages->setCurrentIndex(chosen);
    return true;
}

void frmLanguages::cmdOKClick()
{
    const int d = m_cbLanguages->currentData().toInt();
    QString path;
    if (d > 0 && d <= m_languages.size())
        path = ProgramFolder() + u'/' + m_languages.at(d - 1).fileName;
    modLocalizer::SwitchLanguage(path);
    accept();
}

} // namespace Brimvault
