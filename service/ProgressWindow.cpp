#include "ProgressWindow.h"

#include "InstallFeedback.h"

#include "store/SettingsStore.h"

#include <QCloseEvent>
#include <QCoreApplication>
#include <QDialogButtonBox>
#include <QLabel>
#include <QMessageBox>
#include <QProgressBar>
#include <QPushButton>
#include <QVBoxLayout>

namespace Brimvault {

namespace {

constexpr qint64 RepaintIntervalMs = 40;

class WindowFeedback : public InstallFeedback {
public:
    void phase(InstallPhase phase, const QString& gameFolder) override
    {
        if (!gameFolder.isEmpty())
            m_gameFolder = gameFolder;
        if (phase == InstallPhase::Finishing && m_window)
            m_window->setFinishing();
    }

    bool progress(qint64 done, qint64 total) override
    {
        if (total < LargePackageBytes)
            return true;
        if (!m_window) {
            m_window = std::make_unique<ProgressWindow>();
            m_window->setGame(m_gameFolder);
            m_window->show();
        }
        return m_window->showProgress(done, total);
    }

    void failed(const QString& reason) override
    {
        m_window.reset();
        PrintToStandardError(QStringLiteral("The game was not installed: %1").arg(reason));
        QMessageBox::critical(nullptr, AppTitle(), QStringLiteral("The game was not installed.\n\n%1").arg(reason));
    }

private:
    QString m_gameFolder;
    std::unique_ptr<ProgressWindow> m_window;
};

} // namespace

ProgressWindow::ProgressWindow(QWidget* parent)
    : QWidget(parent, Qt::Dialog)
    , m_label(new QLabel(this))
    , m_bar(new QProgressBar(this))
{
    setWindowTitle(AppTitle());
    setMinimumWidth(380);
    m_bar->setRange(0, 1000);
    m_bar->setTextVisible(true);
    auto* buttons = new QDialogButtonBox(QDialogButtonBox::Cancel, this);
    connect(buttons, &QDialogButtonBox::rejected, this, [this] { m_cancelled = true; });
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(m_label);
    layout->addWidget(m_bar);
    layout->addWidget(buttons);
    m_sinceRepaint.start();
}

void ProgressWindow::setGame(const QString& gameFolder)
{
    m_label->setText(QStringLiteral("Installing \"%1\"...").arg(gameFolder));
}

void ProgressWindow::setFinishing()
{
    m_bar->setValue(m_bar->maximum());
    m_label->setText(QStringLiteral("Finishing the installation..."));
    if (auto* buttons = findChild<QDialogButtonBox*>())
        buttons->setEnabled(false);
    QCoreApplication::processEvents();
}

bool ProgressWindow::showProgress(qint64 done, qint64 total)
{
    if (m_sinceRepaint.elapsed() >= RepaintIntervalMs) {
        m_sinceRepaint.restart();
        m_bar->setValue(total > 0 ? int(done * 1000 / total) : 0);
        QCoreApplication::processEvents();
    }
    return !m_cancelled;
}

void ProgressWindow::closeEvent(QCloseEvent* event)
{
    m_cancelled = true;
    event->ignore();
}

std::unique_ptr<InstallFeedback> MakeWindowFeedback()
{
    return std::make_unique<WindowFeedback>();
}

} // namespace Brimvault
