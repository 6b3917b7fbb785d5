#include "ProgressWindow.h"

#include "TestSuite.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestProgressWindow : public QObject {
    Q_OBJECT
private Q_SLOTS:
    void followsProgress()
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
        // Finishing cannot be cancelled.
        window.setFinishing();
        QVERIFY(!window.findChild<QDialogButtonBox*>()->isEnabled());
    }

    // The Cancel button or closing the window stops the install; the window stays until the unpacking has
    // stopped and cleaned up behind itself.
    void cancelling_data()
    {
        QTest::addColumn<bool>("byButton");
        QTest::newRow("cancel button") << true;
        QTest::newRow("closing the window") << false;
    }
    void cancelling()
    {
        QFETCH(bool, byButton);
        ProgressWindow window;
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window));
        QVERIFY(window.showProgress(1, 10));
        if (byButton)
            QTest::mouseClick(window.findChild<QDialogButtonBox*>()->button(QDialogButtonBox::Cancel), Qt::LeftButton);
        else
            window.close();
        QVERIFY(window.cancelled());
        QVERIFY(window.isVisible());
        QVERIFY(!window.showProgress(2, 10));
    }
};
BV_REGISTER_TEST(TestProgressWindow);
#include "tst_progresswindow.moc"
