#include "ProgressWindow.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>
#include <QtTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestProgressWindow : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void followsProgress();
    void cancelButtonStopsTheInstall();
    void closingTheWindowStopsTheInstall();
    void finishingCannotBeCancelled();
};

void TestProgressWindow::followsProgress()
{
    ProgressWindow window;
    window.setGame(u"Space Rocks"_s);
    window.show();
    QVERIFY(QTest::qWaitForWindowExposed(&window));
    QVERIFY(window.findChild<QLabel*>()->text().contains(u"Space Rocks"));
    auto* bar = window.findChild<QProgressBar*>();
    QTRY_VERIFY_WITH_TIMEOUT((window.showProgress(250, 1000), bar->value() == bar->maximum() / 4), 2000);
    QTRY_VERIFY_WITH_TIMEOUT((window.showProgress(1000, 1000), bar->value() == bar->maximum()), 2000);
    QVERIFY(!window.cancelled());
}

void TestProgressWindow::cancelButtonStopsTheInstall()
{
    ProgressWindow window;
    window.show();
    QVERIFY(window.showProgress(1, 10));
    auto* cancel = window.findChild<QDialogButtonBox*>()->button(QDialogButtonBox::Cancel);
    QVERIFY(cancel);
    QTest::mouseClick(cancel, Qt::LeftButton);
    QVERIFY(window.cancelled());
    QVERIFY(!window.showProgress(2, 10));
}

void TestProgressWindow::closingTheWindowStopsTheInstall()
{
    ProgressWindow window;
    window.show();
    QVERIFY(QTest::qWaitForWindowExposed(&window));
    window.close();
    // The window stays until the unpacking has stopped and cleaned up behind itself.
    QVERIFY(window.isVisible());
    QVERIFY(!window.showProgress(2, 10));
}

void TestProgressWindow::finishingCannotBeCancelled()
{
    ProgressWindow window;
    window.show();
    window.setFinishing();
    QVERIFY(!window.findChild<QDialogButtonBox*>()->isEnabled());
    auto* bar = window.findChild<QProgressBar*>();
    QCOMPARE(bar->value(), bar->maximum());
}

QTEST_MAIN(TestProgressWindow)
#include "tst_progresswindow.moc"
