// Icons on screens of more than one device pixel per unit: the list draws the icon file's image made for the
// real pixels (64 at 200%), not its 32-pixel image blown up. Run at 100% and, as its own test, at 200%.
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QImageReader>
#include <QProcess>
#include <QSignalSpy>
#include <QTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// Each size its own pattern, so that an image scaled from another size cannot pass for it.
QImage patterned(int size)
{
    QImage image(size, size, QImage::Format_ARGB32);
    for (int y = 0; y < size; ++y) {
        for (int x = 0; x < size; ++x) {
            const bool odd = ((x / (size / 32)) + (y / (size / 32))) % 2;
            image.setPixel(x, y, size == 64 ? (odd ? 0xFF102080 : 0xFFF0E040) : (odd ? 0xFF20A040 : 0xFFE04030));
        }
    }
    return image;
}

} // namespace

class TestScreenIcons : public QObject {
    Q_OBJECT

    TestEnvironment m_env;
    QString m_iconFile;

private Q_SLOTS:
    void initTestCase()
    {
        REQUIRE_TOOL("icotool", "icoutils");
        QStringList arguments {u"-c"_s, u"-o"_s};
        m_iconFile = m_env.path(u"commonappdata/Brimvault/Sharp/sharp.ico"_s);
        arguments << m_iconFile;
        for (int size : {32, 64, 256}) {
            const QString png = m_env.path(u"icon%1.png"_s.arg(size));
            QVERIFY(patterned(size).save(png));
            arguments << png;
        }
        QVERIFY(WriteFile(m_env.path(u"commonappdata/Brimvault/Sharp/sharp.exe"_s)));
        QCOMPARE(QProcess::execute(u"icotool"_s, arguments), 0);
    }

    void iconIsDrawnFromTheImageForTheRealPixels()
    {
        frmMain window;
        QSignalSpy rebuilt(&window, &frmMain::listRebuilt);
        window.show();
        QVERIFY(rebuilt.wait(10000));
        SimpleListView* list = window.ListView1();
        int game = 0;
        while (game < list->layoutState().itemCount && !list->labN(game).tag().endsWith(u"sharp.exe"_s))
            ++game;
        QTRY_VERIFY(!list->imgN(game).Picture().isNull());

        const qreal ratio = list->devicePixelRatioF();
        QImageReader reader(m_iconFile);
        QImage expected;
        for (int i = 0; i < reader.imageCount() && expected.isNull(); ++i) {
            reader.jumpToImage(i);
            const QImage image = reader.read();
            if (image.width() == qRound(32 * ratio))
                expected = image.convertToFormat(QImage::Format_ARGB32);
        }
        QVERIFY2(!expected.isNull(), "the icon file has no image for this scale");
        const QRect icon = list->imgN(game).geometry().toRect();
        const QImage shown = list->grab().toImage().convertToFormat(QImage::Format_ARGB32);
        QImage drawn = shown.copy(QRect(icon.topLeft() * ratio, expected.size()));
        drawn.setDevicePixelRatio(1);
        QCOMPARE(drawn, expected);
    }
};

BV_REGISTER_TEST(TestScreenIcons);

#include "tst_screenicons.moc"
