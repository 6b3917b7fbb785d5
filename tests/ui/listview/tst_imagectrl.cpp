#include "ui/listview/ImageCtrl.h"

#include "ListTestIcons.h"
#include "TestEnvironment.h"

#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;

namespace {

QColor shownAt(ImageCtrl& control, int x, int y)
{
    return control.grab().toImage().pixelColor(x, y);
}

} // namespace

class TestImageCtrl : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void initTestCase() { m_environment = std::make_unique<TestEnvironment>(); }

    void startsEmptyAt32Pixels()
    {
        ImageCtrl control;
        QCOMPARE(control.size(), QSize(32, 32));
        QVERIFY(control.Data().isEmpty());
        QVERIFY(control.Picture().isNull());
        QVERIFY(control.hdc());
        control.SetData(QStringLiteral("C:\\Games\\chess.exe"));
        QCOMPARE(control.Data(), QStringLiteral("C:\\Games\\chess.exe"));
    }

    void transparentPartsShowTheBackColor_data()
    {
        QTest::addColumn<QColor>("back");
        QTest::newRow("list colour") << QColor(92, 120, 184);
        QTest::newRow("selection colour") << QColor(190, 209, 237);
    }
    void transparentPartsShowTheBackColor()
    {
        QFETCH(QColor, back);
        ImageCtrl control;
        const QPixmap picture = makeTestIcon(QColor(200, 40, 40), u'C');
        control.SetBackColor(back);
        control.SetPicture(picture);
        QCOMPARE(control.BackColor(), back);
        QCOMPARE(shownAt(control, 0, 0), back); // transparent corner
        QCOMPARE(shownAt(control, 16, 28), picture.toImage().pixelColor(16, 28)); // opaque body
    }

    void emptyPictureKeepsTheSurfaceUntilTheColourChanges()
    {
        ImageCtrl control;
        control.SetBackColor(QColor(92, 120, 184));
        const QPixmap picture = makeTestIcon(QColor(40, 160, 40), u'M');
        const QColor body = picture.toImage().pixelColor(16, 28);
        control.SetPicture(picture);
        control.SetPicture(QPixmap());
        QVERIFY(control.Picture().isNull());
        QCOMPARE(shownAt(control, 16, 28), body);
        control.SetBackColor(QColor(10, 20, 30));
        QCOMPARE(shownAt(control, 16, 28), QColor(10, 20, 30));
    }

    void newBackColorRedrawsTheIconAtOnce()
    {
        ImageCtrl control;
        const QPixmap picture = makeTestIcon(QColor(40, 40, 200), u'H');
        control.SetPicture(picture);
        control.SetBackColor(QColor(0, 0, 0));
        QCOMPARE(shownAt(control, 0, 0), QColor(0, 0, 0));
        QCOMPARE(shownAt(control, 16, 28), picture.toImage().pixelColor(16, 28));
    }

    void twoControlsShareOnePicture()
    {
        const QPixmap picture = makeTestIcon(QColor(120, 40, 160), u'S');
        ImageCtrl first;
        ImageCtrl second;
        first.SetPicture(picture);
        second.SetPicture(picture);
        QCOMPARE(first.Picture().cacheKey(), picture.cacheKey());
        QCOMPARE(second.Picture().cacheKey(), picture.cacheKey());
        first.SetBackColor(Qt::white);
        second.SetBackColor(Qt::black);
        QCOMPARE(shownAt(first, 0, 0), QColor(Qt::white));
        QCOMPARE(shownAt(second, 0, 0), QColor(Qt::black));
    }

    void largerPicturesAreDrawnAtIconSize()
    {
        QPixmap big(64, 64);
        big.fill(Qt::red);
        ImageCtrl control;
        control.SetPicture(big);
        QCOMPARE(shownAt(control, 31, 31), QColor(Qt::red));
    }

    void mouseEventsPassThroughUnchanged()
    {
        ImageCtrl control;
        control.show();
        QVERIFY(QTest::qWaitForWindowExposed(&control));
        QSignalSpy down(&control, &ImageCtrl::MouseDown);
        QSignalSpy up(&control, &ImageCtrl::MouseUp);
        QSignalSpy click(&control, &ImageCtrl::Click);
        QSignalSpy doubleClick(&control, &ImageCtrl::DblClick);
        QTest::mouseClick(&control, Qt::RightButton, Qt::ControlModifier, QPoint(7, 9));
        QCOMPARE(down.count(), 1);
        QCOMPARE(down.at(0), (QList<QVariant> {qint16(2), qint16(2), 7.0f, 9.0f}));
        QCOMPARE(up.count(), 1);
        QCOMPARE(click.count(), 1);
        QTest::mouseDClick(&control, Qt::LeftButton, {}, QPoint(3, 3));
        QTest::mouseRelease(&control, Qt::LeftButton, {}, QPoint(3, 3));
        QCOMPARE(doubleClick.count(), 1);
    }

private:
    std::unique_ptr<TestEnvironment> m_environment;
};

QTEST_MAIN(TestImageCtrl)

#include "tst_imagectrl.moc"
