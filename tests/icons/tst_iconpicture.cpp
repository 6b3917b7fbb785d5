#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "icons/IconImageDecoder.h"
#include "icons/cFileIcon.h"

#include <QFile>
#include <QImage>
#include <QPainter>
#include <QTest>
#include <QtEndian>

using namespace Brimvault;
using IconTest::blankBitmap;
using IconTest::buildIconFile;

class TestIconPicture : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    cFileIcon load(const QByteArray& bytes)
    {
        const QString path = m_env.path(QStringLiteral("picture.ico"));
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly))
            qFatal("cannot write");
        file.write(bytes);
        file.close();
        cFileIcon icon;
        if (!icon.LoadIcon(path))
            qFatal("cannot load");
        return icon;
    }

    // A 4 × 2 1-bit image: colour bits from `colour` (a byte per row), mask bits from `mask`.
    static QByteArray oneBit(quint8 colourRow0, quint8 colourRow1, quint8 maskRow0, quint8 maskRow1)
    {
        QByteArray image = blankBitmap(4, 2, 1);
        image[44] = char(255);
        image[45] = char(255);
        image[46] = char(255);
        // Bottom-up: stored row 0 is the picture's last row.
        image[48] = char(colourRow1);
        image[52] = char(colourRow0);
        image[56] = char(maskRow1);
        image[60] = char(maskRow0);
        return image;
    }

private Q_SLOTS:
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
        QTest::newRow("closest depth on a 16-bit display")
            << QList<QList<int>> {{32, 0, 32}, {32, 0, 24}, {32, 0, 4}} << 16 << 2;
    }

    void bestImage()
    {
        QFETCH(QList<QList<int>>, images);
        QFETCH(int, depth);
        QFETCH(int, best);
        QList<IconTest::FakeImage> fakeImages;
        for (const QList<int>& image : images)
            fakeImages.append({quint8(image.at(0)), quint8(image.at(0)), quint8(image.at(1)), 1, quint16(image.at(2)),
                blankBitmap(4, 4, 4)});
        const cFileIcon icon = load(buildIconFile(fakeImages));
        QCOMPARE(icon.bestIconIndex(depth), best);
    }

    void bestOfNothingIsOne()
    {
        cFileIcon icon;
        QCOMPARE(icon.bestIconIndex(32), 1);
        QVERIFY(icon.BestIconPicture().isNull());
        QVERIFY(icon.displayDepth() > 0);
    }

    void maskMakesTransparency()
    {
        // Row 0: colour 1000, mask 0011; row 1: colour 0000, mask 1000.
        const cFileIcon icon = load(buildIconFile({{4, 2, 2, 1, 1, oneBit(0x80, 0x00, 0x30, 0x80)}}));
        const QImage picture = icon.IconHandle(1);
        QCOMPARE(picture.size(), QSize(4, 2));
        QCOMPARE(picture.pixel(0, 0), qRgba(255, 255, 255, 255));
        QCOMPARE(picture.pixel(1, 0), qRgba(0, 0, 0, 255));
        QCOMPARE(qAlpha(picture.pixel(2, 0)), 0);
        QCOMPARE(qAlpha(picture.pixel(3, 0)), 0);
        QCOMPARE(qAlpha(picture.pixel(0, 1)), 0);
        QCOMPARE(picture.pixel(1, 1), qRgba(0, 0, 0, 255));
    }

    void drawingMaskThenColourShowsTheBackground()
    {
        const cFileIcon icon = load(buildIconFile({{4, 2, 2, 1, 1, oneBit(0x80, 0x00, 0x30, 0x80)}}));
        QImage canvas(8, 4, QImage::Format_RGB32);
        canvas.fill(qRgb(10, 200, 30));
        QPainter painter(&canvas);
        icon.DrawIconImage(painter, 1, true, 2, 1, 0, 0, SRCAND);
        icon.DrawIconImage(painter, 1, false, 2, 1, 0, 0, SRCINVERT);
        painter.end();
        QCOMPARE(canvas.pixel(2, 1), qRgb(255, 255, 255));
        QCOMPARE(canvas.pixel(3, 1), qRgb(0, 0, 0));
        QCOMPARE(canvas.pixel(4, 1), qRgb(10, 200, 30));
        QCOMPARE(canvas.pixel(2, 2), qRgb(10, 200, 30));
        QCOMPARE(canvas.pixel(0, 0), qRgb(10, 200, 30));
        // Stretched to 8 × 4, each pixel covers two by two.
        QImage big(8, 4, QImage::Format_RGB32);
        big.fill(Qt::blue);
        QPainter stretch(&big);
        icon.DrawIconImage(stretch, 1, false, 0, 0, 8, 4, SRCCOPY);
        stretch.end();
        QCOMPARE(big.pixel(1, 1), qRgb(255, 255, 255));
        QCOMPARE(big.pixel(2, 1), qRgb(0, 0, 0));
    }

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
        if (!IconTest::fixturesBuilt())
            QSKIP("fixtures were not built");
        QFETCH(int, index);
        QFETCH(QString, png);
        QFETCH(bool, alpha);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(IconTest::iconInput(QStringLiteral("main.ico"))));
        const QImage ours = icon.IconPicture(index);
        const QImage source = QImage(IconTest::iconInput(png)).convertToFormat(QImage::Format_ARGB32);
        QVERIFY(!source.isNull());
        QCOMPARE(ours.size(), source.size());
        for (int y = 0; y < source.height(); ++y) {
            for (int x = 0; x < source.width(); ++x) {
                const QRgb want = source.pixel(x, y);
                const QRgb got = ours.pixel(x, y);
                if (alpha && qAlpha(want) == 0) {
                    QCOMPARE(qAlpha(got), 0);
                } else if (alpha) {
                    QCOMPARE(got, want);
                } else if (qAlpha(want) <= 127) {
                    QCOMPARE(qAlpha(got), 0); // icotool's threshold puts it into the mask
                } else {
                    QCOMPARE(got, want | 0xFF000000u);
                }
            }
        }
    }

    void bestPictureOfTheFixture()
    {
        if (!IconTest::fixturesBuilt())
            QSKIP("fixtures were not built");
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(IconTest::iconInput(QStringLiteral("main.ico"))));
        // Images: 16 1-bit, 32 4-bit, 48 8-bit, 32 32-bit, 256 PNG.
        QCOMPARE(icon.bestIconIndex(32), 4);
        QCOMPARE(icon.bestIconIndex(4), 2);
        QCOMPARE(icon.bestIconIndex(8), 2);
        const QImage best = icon.BestIconPicture();
        QCOMPARE(best.size(), QSize(32, 32));
    }

    void oddImages_data()
    {
        QTest::addColumn<QByteArray>("image");
        QTest::addColumn<QSize>("size");
        QTest::addColumn<int>("alphaAt00");

        QTest::newRow("no AND mask") << blankBitmap(8, 8, 8, false) << QSize(8, 8) << 255;
        QTest::newRow("with AND mask") << blankBitmap(8, 8, 8, true) << QSize(8, 8) << 255;
        QTest::newRow("non-square") << blankBitmap(16, 32, 4) << QSize(16, 32) << 255;
        QByteArray topDown = blankBitmap(4, 2, 1);
        qToLittleEndian<qint32>(-4, topDown.data() + 8);
        topDown[56] = char(0x80); // mask row 0 is the top row when stored top-down
        QTest::newRow("top-down") << topDown << QSize(4, 2) << 0;
        QByteArray alpha32 = blankBitmap(2, 2, 32);
        alpha32[40 + 8 + 3] = char(77); // stored row 1 is the top row
        QTest::newRow("32-bit, alpha wins over mask") << alpha32 << QSize(2, 2) << 77;
        QTest::newRow("24-bit") << blankBitmap(3, 3, 24) << QSize(3, 3) << 255;
        QTest::newRow("16-bit") << blankBitmap(3, 3, 16) << QSize(3, 3) << 255;
        QByteArray truncated = blankBitmap(32, 32, 8);
        truncated.chop(200);
        QTest::newRow("colour bits cut short") << truncated << QSize(0, 0) << -1;
        QByteArray twoBit = blankBitmap(8, 8, 1);
        qToLittleEndian<quint16>(2, twoBit.data() + 14);
        QTest::newRow("2-bit") << twoBit << QSize(0, 0) << -1;
        QByteArray huge = blankBitmap(8, 8, 1);
        qToLittleEndian<qint32>(0x7FFFFFFF, huge.data() + 4);
        QTest::newRow("absurd width") << huge << QSize(0, 0) << -1;
        QByteArray bigPalette = blankBitmap(8, 8, 8);
        qToLittleEndian<quint32>(0xFFFFFFFFu, bigPalette.data() + 32);
        QTest::newRow("palette past the end") << bigPalette << QSize(0, 0) << -1;
        QByteArray rle = blankBitmap(8, 8, 8);
        qToLittleEndian<quint32>(1, rle.data() + 16);
        QTest::newRow("compressed") << rle << QSize(0, 0) << -1;
        QTest::newRow("header only") << blankBitmap(8, 8, 8).left(40) << QSize(0, 0) << -1;
        QTest::newRow("too short for a header") << QByteArray(12, '\0') << QSize(0, 0) << -1;
        QTest::newRow("broken PNG") << QByteArray("\x89PNG\r\n\x1a\n\0\0\0\rIHDR", 16) << QSize(0, 0) << -1;
    }

    void oddImages()
    {
        QFETCH(QByteArray, image);
        QFETCH(QSize, size);
        QFETCH(int, alphaAt00);
        // Directory entries of real files are not always right: planes and bit count 0 here.
        const cFileIcon icon = load(buildIconFile({{0, 0, 0, 0, 0, image}}));
        const QImage picture = icon.IconHandle(1);
        QCOMPARE(picture.size(), size);
        if (!size.isEmpty())
            QCOMPARE(qAlpha(picture.pixel(0, 0)), alphaAt00);
        QImage canvas(4, 4, QImage::Format_RGB32);
        canvas.fill(Qt::white);
        QPainter painter(&canvas);
        icon.DrawIconImage(painter, 1, false, 0, 0);
        icon.DrawIconImage(painter, 7, false, 0, 0); // no such image: nothing happens
        painter.end();
    }
};

QTEST_MAIN(TestIconPicture)
#include "tst_iconpicture.moc"
