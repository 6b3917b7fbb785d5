#pragma once

#include <QElapsedTimer>
#include <QWidget>

class QLabel;
class QProgressBar;

namespace Brimvault {

// The small window that follows a large package while it unpacks. Closing it or pressing Cancel asks
// the install to stop; the games folder then stays as it was.
class ProgressWindow : public QWidget {
    Q_OBJECT
public:
    explicit ProgressWindow(QWidget* parent = nullptr);

    void setGame(const QString& gameFolder);
    void setFinishing();
    // Lets the window paint and answer at most every few dozen milliseconds; false once cancelled.
    bool showProgress(qint64 done, qint64 total);
    bool cancelled() const { return m_cancelled; }

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    QLabel* m_label = nullptr;
    QProgressBar* m_bar = nullptr;
    QElapsedTimer m_sinceRepaint;
    bool m_cancelled = false;
};

} // namespace Brimvault
