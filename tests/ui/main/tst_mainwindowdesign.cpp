// The list's place in the main window; the scaling at load is seen on the real window at 96 and 120 dpi.
#include "TestSuite.h"
#include "ui/main/MainWindowDesign.h"

using namespace Brimvault;

class TestMainWindowDesign : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void listPlaceInTheWindow_data()
    {
        QTest::addColumn<QSize>("client");
        QTest::addColumn<QRect>("expected");
        QTest::newRow("small") << QSize(400, 300) << QRect(13, 84, 383, 212);
        QTest::newRow("just wide enough") << QSize(18, 89) << QRect(13, 84, 1, 1);
        QTest::newRow("narrower than 260 twips") << QSize(17, 400) << QRect();
        QTest::newRow("lower than 1320 twips") << QSize(400, 88) << QRect();
    }
    void listPlaceInTheWindow()
    {
        QFETCH(QSize, client);
        QTEST(MainWindowDesign::ListViewGeometry(client, {15.0, 15.0}), "expected");
    }
};

BV_REGISTER_TEST(TestMainWindowDesign);

int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
#include "tst_mainwindowdesign.moc"
