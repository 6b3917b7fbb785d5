// Load-time scaling of a form designed in twips, and the list's place in the main window.
#include "ui/main/FormScaling.h"
#include "ui/main/MainWindowDesign.h"

#include <QLabel>
#include <QMenu>
#include <QTest>

#include "TestSuite.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

class TestFormScaling : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void factorsFromTheScreen_data()
    {
        QTest::addColumn<double>("twipsPerPixelX");
        QTest::addColumn<double>("twipsPerPixelY");
        QTest::addColumn<double>("factorX");
        QTest::addColumn<double>("factorY");
        QTest::addColumn<bool>("identity");
        QTest::newRow("96 dpi") << 15.0 << 15.0 << 1.0 << 1.0 << true;
        QTest::newRow("120 dpi") << 12.0 << 12.0 << 0.8 << 0.8 << false;
        QTest::newRow("72 dpi") << 20.0 << 20.0 << 4.0 / 3.0 << 4.0 / 3.0 << false;
        QTest::newRow("only vertical differs") << 15.0 << 12.0 << 1.0 << 0.8 << false;
    }
    void factorsFromTheScreen()
    {
        QFETCH(double, twipsPerPixelX);
        QFETCH(double, twipsPerPixelY);
        QFETCH(double, factorX);
        QFETCH(double, factorY);
        QFETCH(bool, identity);
        const FormScaling::Factors factors = FormScaling::ScreenFactors({twipsPerPixelX, twipsPerPixelY});
        QCOMPARE(factors.x, factorX);
        QCOMPARE(factors.y, factorY);
        QCOMPARE(factors.isIdentity(), identity);
    }

    // A control keeps its designed size in pixels: loaded at 12 twips per pixel it comes out 1.25 times
    // larger, and the factor 0.8 takes it back.
    void scalingKeepsTheDesignedPixels()
    {
        const FormScaling::TwipsPerPixel at120 {12.0, 12.0};
        const QRect designTwips(300, 600, 1500, 450);
        QWidget form;
        form.setGeometry(FormScaling::TwipsToPixels(QRect(0, 0, 6000, 4500), at120));
        auto* label = new QLabel(&form);
        label->setGeometry(FormScaling::TwipsToPixels(designTwips, at120));
        QFont font = label->font();
        font.setPointSizeF(10);
        label->setFont(font);
        QCOMPARE(label->geometry(), QRect(25, 50, 125, 38));

        FormScaling::ScaleForm(&form, FormScaling::ScreenFactors(at120));
        QCOMPARE(label->geometry(), QRect(20, 40, 100, 30));
        QCOMPARE(form.size(), QSize(400, 300));
        QCOMPARE(label->font().pointSizeF(), 8.0);
    }

    void scalingLeavesWhatHasNoPlaceOnTheForm()
    {
        QWidget form;
        form.resize(400, 300);
        auto* menu = new QMenu(&form);
        menu->setGeometry(10, 10, 100, 100);
        auto* pixelFont = new QLabel(&form);
        QFont font = pixelFont->font();
        font.setPixelSize(20);
        pixelFont->setFont(font);
        auto* inner = new QLabel(pixelFont);
        inner->setGeometry(5, 5, 50, 50);

        FormScaling::ScaleForm(&form, {1.0, 1.0});
        QCOMPARE(form.size(), QSize(400, 300));

        FormScaling::ScaleForm(&form, {0.5, 0.5});
        QCOMPARE(form.size(), QSize(200, 150));
        QCOMPARE(menu->geometry(), QRect(10, 10, 100, 100));
        QCOMPARE(pixelFont->font().pixelSize(), 20);
        // Only the form's own controls move: a control's children keep their place inside it.
        QCOMPARE(inner->geometry(), QRect(5, 5, 50, 50));
    }

    void listPlaceInTheWindow_data()
    {
        QTest::addColumn<QSize>("client");
        QTest::addColumn<double>("twipsPerPixel");
        QTest::addColumn<QRect>("expected");
        QTest::newRow("designed size") << QSize(760, 552) << 15.0 << QRect(13, 84, 743, 464);
        QTest::newRow("small") << QSize(400, 300) << 15.0 << QRect(13, 84, 383, 212);
        QTest::newRow("120 dpi") << QSize(760, 552) << 12.0 << QRect(17, 105, 738, 442);
        QTest::newRow("just wide enough") << QSize(18, 89) << 15.0 << QRect(13, 84, 1, 1);
        QTest::newRow("narrower than 260 twips") << QSize(17, 400) << 15.0 << QRect();
        QTest::newRow("lower than 1320 twips") << QSize(400, 88) << 15.0 << QRect();
    }
    void listPlaceInTheWindow()
    {
        QFETCH(QSize, client);
        QFETCH(double, twipsPerPixel);
        QFETCH(QRect, expected);
        QCOMPARE(MainWindowDesign::ListViewGeometry(client, {twipsPerPixel, twipsPerPixel}), expected);
    }
};

BV_REGISTER_TEST(TestFormScaling);

// The main window's parts that run without the window: form scaling, the dialog library, the language dialog.
int main(int argc, char** argv)
{
    return RunRegisteredTests(argc, argv);
}
#include "tst_formscaling.moc"
