#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/IconImageDecoder.h"
#include "icons/cFileIcon.h"

#include <QImage>
#include <QPainter>
#include <QtEndian>

using namespace Brimvault;

namespace {

// An icon bitmap: the 40-byte header with biClrUsed = colours, then palette, colour rows and mask rows (both
// bottom-up) given in hex.
QByteArray bitmap(int width, int height, int bitCount, int colours, const char* hex)
{
    QByteArray out = BlankBitmap(width, height, bitCount).left(40);
    qToLittleEndian<quint32>(quint32(colours), out.data() + 32);
    return out + QByteArray::fromHex(hex);
}

QByteArray withField(QByteArray image, int offset, qint32 value)
{
    qToLittleEndian<qint32>(value, image.data() + offset);
    return image;
}

// Pixels as AARRGGBB, top row first, rows split by " | "; "" for a null picture.
QString pixels(const QImage& picture)
{
    QStringList rows;
    for (int y = 0; y < picture.height(); ++y) {
        QStringList row;
        for (int x = 0; x < picture.width(); ++x)
            row.append(QStringLiteral("%1").arg(picture.pixel(x, y), 8, 16, QLatin1Char('0')));
        rows.append(row.join(u' '));
    }
    return rows.join(QStringLiteral(" | "));
}

// Rows 110 / 010 (bottom / top) in black and white; the mask shows the screen through the bottom row's last pixel.
const QByteArray OneBit = bitmap(3, 2, 1, 0, "00000000ffffff00 c0000000 40000000 20000000 00000000");

} // namespace

class TestIconPicture : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    cFileIcon loaded(const QByteArray& iconFile)
    {
        const QString path = m_env.path(QStringLiteral("picture.ico"));
        cFileIcon icon;
        if (!WriteFile(path, iconFile) || !icon.LoadIcon(path))
            qFatal("cannot load %s", qPrintable(path));
        return icon;
    }

private Q_SLOTS:
    void decodes_data()
    {
        QTest::addColumn<QByteArray>("image");
        QTest::addColumn<QString>("expected");
        const QString oneBit = QStringLiteral("ff000000 ffffffff ff000000 | ffffffff ffffffff 00000000");
        QTest::newRow("1-bit") << OneBit << oneBit;
        QTest::newRow("1-bit, top-down") << withField(OneBit, 8, -4)
                                         << "ffffffff ffffffff 00000000 | ff000000 ffffffff ff000000";
        QTest::newRow("1-bit, mask one byte short: opaque")
            << OneBit.chopped(1) << "ff000000 ffffffff ff000000 | ffffffff ffffffff ff000000";
        QTest::newRow("1-bit, version 4 header")
            << withField(OneBit.left(40) + QByteArray(68, '\0') + OneBit.mid(40), 0, 108) << oneBit;
        QTest::newRow("4-bit, three palette colours")
            << bitmap(3, 2, 4, 3, "0000ff00 00ff0000 ff000000 01200000 21000000 00000000 00000000")
            << "ff0000ff ff00ff00 ffff0000 | ffff0000 ff00ff00 ff0000ff";
        QTest::newRow("8-bit, index past the palette is black")
            << bitmap(3, 2, 8, 2, "0000ff00 00ff0000 00010500 01000000 00000000 00000000")
            << "ff00ff00 ffff0000 ffff0000 | ffff0000 ff00ff00 ff000000";
        QTest::newRow("16-bit") << bitmap(3, 2, 16, 0, "007ce0031f000000 e07f0000ffff0000 00000000 00000000")
                                << "ffffff00 ff000000 ffffffff | ffff0000 ff00ff00 ff0000ff";
        QTest::newRow("16-bit with bit fields")
            << withField(bitmap(1, 1, 16, 0, "007c0000 e0030000 1f000000 e0030000 00000000"), 16, 3) << "ff00ff00";
        QTest::newRow("24-bit") << bitmap(2, 2, 24, 0, "0000ff00ff000000 ff00001020300000 00000000 00000000")
                                << "ff0000ff ff302010 | ffff0000 ff00ff00";
        QTest::newRow("32-bit with alpha: mask unused")
            << bitmap(2, 2, 32, 0, "0000ff8000ff0000 ff0000ff00000000 40000000 80000000")
            << "ff0000ff 00000000 | 80ff0000 0000ff00";
        QTest::newRow("32-bit, no alpha: mask used")
            << bitmap(2, 2, 32, 0, "0000ff0000ff0000 ff00000000000000 40000000 80000000")
            << "00000000 ff000000 | ffff0000 00000000";

        const QByteArray base = BlankBitmap(5, 3, 8);
        const qsizetype colourEnd = 40 + 4 * 256 + 3 * 8;
        for (qsizetype length : {qsizetype(0), qsizetype(12), qsizetype(39), qsizetype(40 + 1023), colourEnd - 1})
            QTest::addRow("cut to %lld bytes", qlonglong(length)) << base.left(length) << "";
        QTest::newRow("header size 12") << withField(base, 0, 12) << "";
        QTest::newRow("header size past the end") << withField(base, 0, 0x7FFFFFFF) << "";
        QTest::newRow("width 0") << withField(base, 4, 0) << "";
        QTest::newRow("negative width") << withField(base, 4, -5) << "";
        QTest::newRow("width past 1024") << withField(base, 4, 1025) << "";
        QTest::newRow("height 1 (half is 0)") << withField(base, 8, 1) << "";
        QTest::newRow("height past 1024") << withField(base, 8, 2 * 1025) << "";
        QTest::newRow("most negative height") << withField(base, 8, std::numeric_limits<qint32>::min()) << "";
        QTest::newRow("run-length compressed") << withField(base, 16, 1) << "";
        QTest::newRow("bit fields on 8 bits") << withField(base, 16, 3) << "";
        QTest::newRow("palette of 2^32 - 1") << withField(base, 32, -1) << "";
        QTest::newRow("2-bit") << withField(base, 14, 2) << "";
        QTest::newRow("PNG signature only") << QByteArray("\x89PNG\r\n\x1a\n", 8) << "";
        QTest::newRow("broken PNG") << QByteArray("\x89PNG\r\n\x1a\n\0\0\0\rIHDR", 16) << "";
    }

    // Through an icon whose directory entry says nothing (size, planes and bit count 0): the bitmap's own header
    // counts.
    void decodes()
    {
        QFETCH(QByteArray, image);
        QFETCH(QString, expected);
        const cFileIcon icon = loaded(BuildIconFile({{0, 0, 0, 0, 0, image}}));
        QCOMPARE(pixels(icon.IconHandle(1)), expected);
        QCOMPARE(pixels(IconImageDecoder::Decode(image).composed), expected);
    }

    // icotool made the fixture icon from these pictures: what it put into colour bits, mask and alpha comes back.
    void fixtureImagesMatchTheirPictures_data()
    {
        QTest::addColumn<int>("index");
        QTest::addColumn<QString>("png");
        QTest::addColumn<bool>("alpha");
        QTest::newRow("1-bit") << 1 << "mono16.png" << false;
        QTest::newRow("4-bit") << 2 << "c16_32.png" << false;
        QTest::newRow("8-bit") << 3 << "c256_48.png" << false;
        QTest::newRow("32-bit alpha") << 4 << "rgba32.png" << true;
        QTest::newRow("PNG entry") << 5 << "big256.png" << true;
    }

    void fixtureImagesMatchTheirPictures()
    {
        QFETCH(int, index);
        QFETCH(QString, png);
        QFETCH(bool, alpha);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(IconInput(QStringLiteral("main.ico"))));
        const QImage source = QImage(IconInput(png)).convertToFormat(QImage::Format_ARGB32);
        QVERIFY(!source.isNull());
        const IconImageDecoder::Bitmaps bitmaps = IconImageDecoder::Decode(icon.imageBytes(index));
        QCOMPARE(icon.IconPicture(index), bitmaps.composed);
        QCOMPARE(bitmaps.composed.size(), source.size());
        for (int y = 0; y < source.height(); ++y) {
            for (int x = 0; x < source.width(); ++x) {
                const QRgb want = source.pixel(x, y);
                const bool shows = qAlpha(want) < 128; // icotool's threshold for the AND mask
                QCOMPARE(bitmaps.mask.pixel(x, y), shows ? 0xFFFFFFFFu : 0xFF000000u);
                const QRgb composed = alpha ? want : (shows ? 0u : want | 0xFF000000u);
                if (qAlpha(composed) == 0)
                    QCOMPARE(qAlpha(bitmaps.composed.pixel(x, y)), 0);
                else
                    QCOMPARE(bitmaps.composed.pixel(x, y), composed);
                if (!shows)
                    QCOMPARE(bitmaps.colour.pixel(x, y), want | 0xFF000000u);
            }
        }
    }

    void bestImage_data()
    {
        QTest::addColumn<QList<QList<int>>>("images"); // width, colour count, bit count
        QTest::addColumn<int>("depth");
        QTest::addColumn<int>("best");
        QTest::newRow("32 wide beats closer depth")
            << QList<QList<int>> {{16, 0, 8}, {48, 0, 32}, {32, 16, 4}} << 32 << 3;
        QTest::newRow("exact match returns at once")
            << QList<QList<int>> {{16, 0, 8}, {48, 0, 32}, {32, 16, 4}, {32, 0, 32}} << 32 << 4;
        QTest::newRow("closest depth among 32 wide")
            << QList<QList<int>> {{32, 2, 1}, {32, 0, 8}, {32, 16, 4}} << 24 << 2;
        QTest::newRow("ties keep the first") << QList<QList<int>> {{32, 0, 8}, {32, 0, 8}} << 16 << 1;
        QTest::newRow("closest width without 32") << QList<QList<int>> {{16, 0, 8}, {48, 0, 8}, {24, 0, 8}} << 8 << 3;
        QTest::newRow("256 counts as width 0") << QList<QList<int>> {{0, 0, 32}, {64, 0, 32}} << 32 << 1;
        QTest::newRow("no other width after a 32") << QList<QList<int>> {{32, 2, 1}, {31, 0, 32}} << 32 << 1;
        QTest::newRow("no images") << QList<QList<int>> {} << 32 << 1;
    }

    void bestImage()
    {
        QFETCH(QList<QList<int>>, images);
        QFETCH(int, depth);
        QFETCH(int, best);
        cFileIcon icon;
        if (!images.isEmpty()) {
            QList<IconImage> fakes;
            for (const QList<int>& image : images)
                fakes.append({quint8(image.at(0)), quint8(image.at(0)), quint8(image.at(1)), 1, quint16(image.at(2)),
                    BlankBitmap(4, 4, 4)});
            icon = loaded(BuildIconFile(fakes));
        }
        QCOMPARE(icon.bestIconIndex(depth), best);
        QCOMPARE(icon.BestIconPicture().isNull(), images.isEmpty());
    }

    void bestPictureOfTheFixture()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(IconInput(QStringLiteral("main.ico"))));
        QCOMPARE(icon.BestIconPicture().size(), QSize(32, 32)); // not the 48 or 256 wide images
    }

    void drawingMaskThenColourShowsTheBackground()
    {
        const cFileIcon icon = loaded(BuildIconFile({{3, 2, 2, 1, 1, OneBit}}));
        QImage canvas(8, 4, QImage::Format_RGB32);
        canvas.fill(qRgb(10, 200, 30));
        QPainter painter(&canvas);
        icon.DrawIconImage(painter, 1, true, 2, 1, 0, 0, SRCAND);
        icon.DrawIconImage(painter, 1, false, 2, 1, 0, 0, SRCINVERT);
        icon.DrawIconImage(painter, 7, false, 0, 0); // no such image: nothing happens
        painter.end();
        QCOMPARE(pixels(canvas.copy(1, 1, 5, 2)),
            QStringLiteral(
                "ff0ac81e ff000000 ffffffff ff000000 ff0ac81e | ff0ac81e ffffffff ffffffff ff0ac81e ff0ac81e"));
        // Stretched to 6 × 4, each pixel covers two by two.
        QImage big(6, 4, QImage::Format_RGB32);
        QPainter stretch(&big);
        icon.DrawIconImage(stretch, 1, false, 0, 0, 6, 4, SRCCOPY);
        stretch.end();
        QCOMPARE(pixels(big.copy(0, 1, 6, 2)),
            QStringLiteral("ff000000 ff000000 ffffffff ffffffff ff000000 ff000000 | "
                           "ffffffff ffffffff ffffffff ffffffff ff000000 ff000000"));
    }
};

BV_REGISTER_TEST(TestIconPicture);
#include "tst_iconpicture.moc"
