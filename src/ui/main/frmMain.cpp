#include "ui/main/frmMain.h"

#include "store/SettingsStore.h"

#include <QFont>
#include <QLabel>
#include <QListWidget>
#include <QVBoxLayout>

namespace Brimvault {

frmMain::frmMain(QWidget* parent)
    : QWidget(parent)
{
    setObjectName(QStringLiteral("frmMain"));
    setWindowTitle(AppTitle());
    resize(800, 600);

    m_productName = new QLabel(AppTitle(), this);
    m_productName->setObjectName(QStringLiteral("Label3"));
    QFont titleFont(QStringLiteral("Arial Black"));
    titleFont.setPointSize(20);
    m_productName->setFont(titleFont);

    m_listView = new QListWidget(this);
    m_listView->setObjectName(QStringLiteral("ListView1"));
    m_listView->setViewMode(QListView::IconMode);
    m_listView->setResizeMode(QListView::Adjust);
    m_listView->setMovement(QListView::Static);
    m_listView->setIconSize(QSize(48, 48));

    auto* layout = new QVBoxLayout(this);
    layout->addWidget(m_productName);
    layout->addWidget(m_listView, 1);
}

frmMain::~frmMain() = default;

} // namespace Brimvault
