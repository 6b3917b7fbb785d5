// Icons on screens of more than one device pixel per unit: the list draws the icon file's image made for the
// real pixels (64 at 200%), not its 32-pixel image blown up. Run at 100% and, as its own test, at 200%.
#include "MainWindowFixture.h"
#include "TestEnvironment.h"
#include "TestSuite.h"

#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/frmMain.h"

#include <QProcess>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// Each size its own colour, so that an image scaled from another size cannot pass for it.
QImage sized(int size)
{
    QImage image(size, size, QImage::Format_ARGB32);
    image.fill(size == 32 ? 0xFFE04030 : size == 64 ? 0xFF102080 : 0xFF20A040);
    return image;
}

} // namespace

class TestScreenIcons : public QObject {
    Q_OBJECT

    TestEnvironment m_env;

private Q_SLOTS:
    void initTestCase()
    {
        REQUIRE_TOOL("icotool", "icoutils");
        QStringList arguments {u"-c"_s, u"-o"_s, m_env.path(u"commonappdata/Brimvault/Sharp/sharp.ico"_s)};
        for (int size : {32, 64, 256}) {
            const QString png = m_env.path(u"icon%1.png"_s.arg(size));
            QVERIFY(sized(size).save(png));
            arguments << png;
        }
        QVERIFY(WriteFile(m_env.path(u"commonappdata/Brimvault/Sharp/sharp.exe"_s)));
        QCOMPARE(QProcess::execute(u"icotool"_s, arguments), 0);
    }

    void iconIsDrawnFromTheImageForTheRealPixels()
    {
        const auto window = OpenFilledWindow<frmMain>();
        SimpleListView* list = window->ListView1();
        const int game = 1; // the one game, after the online games
        QTRY_VERIFY(!list->imgN(game).Picture().isNull());

        // icotool wrote the file; the image of the size for the real pixels is what must show.
        const qreal ratio = list->devicePixelRatioF();
        const QImage expected = sized(qRound(32 * ratio));
        const QRect icon = list->imgN(game).geometry().toRect();
        const QImage shown = list->grab().toImage().convertToFormat(QImage::Format_ARGB32);
        QImage drawn = shown.copy(QRect(icon.topLeft() * ratio, expected.size()));
        drawn.setDevicePixelRatio(1);
        QCOMPARE(drawn, expected);
    }
};

BV_REGISTER_TEST(TestScreenIcons);

#include "tst_screenicons.moc"
