#pragma once

#include <QWidget>

class QLabel;
class QListWidget;

namespace Brimvault {

// The program's only main window: a title area with the product name and the list of games below it.
class frmMain : public QWidget {
    Q_OBJECT
public:
    explicit frmMain(QWidget* parent = nullptr);
    ~frmMain() override;

    QListWidget* ListView1() const { return m_listView; }

private:
    QLabel* m_productName = nullptr;
    QListWidget* m_listView = nullptr;
};

} // namespace Brimvault
