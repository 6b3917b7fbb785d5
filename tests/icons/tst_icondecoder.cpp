// The row-wise icon image decoder against the per-pixel one it replaced: the same pictures from real icon
// files and executables, from every kind of bitmap, and the same refusals for broken and mutated images.
#include "IconTestSupport.h"
#include "ReferenceIconDecoder.h"
#include "TestEnvironment.h"
#include "icons/IconImageDecoder.h"
#include "icons/cFileIcon.h"

#include <QImage>
#include <QRandomGenerator>
#include <QTest>
#include <QtEndian>

using namespace Brimvault;

namespace {

struct BitmapShape {
    int width;
    int height;
    int bitCount;
    bool withMask;
};

// A bitmap of the given shape with every palette, pixel and mask byte random.
QByteArray randomBitmap(const BitmapShape& shape, QRandomGenerator& random)
{
    QByteArray bitmap = IconTest::blankBitmap(shape.width, shape.height, shape.bitCount, shape.withMask);
    for (qsizetype i = 40; i < bitmap.size(); ++i)
        bitmap[i] = char(random.bounded(256));
    return bitmap;
}

QString shapeName(const BitmapShape& shape)
{
    return QStringLiteral("%1x%2, %3-bit%4")
        .arg(shape.width)
        .arg(shape.height)
        .arg(shape.bitCount)
        .arg(shape.withMask ? QString() : QStringLiteral(", no mask"));
}

void addIconImages(const QString& label, const cFileIcon& icon)
{
    for (int i = 1; i <= icon.ImageCount(); ++i)
        QTest::addRow("%s, image %d", qPrintable(label), i) << icon.imageBytes(i);
}

} // namespace

class TestIconDecoder : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    static void compareWithReference(const QByteArray& image)
    {
        const IconImageDecoder::Bitmaps expected = IconTest::ReferenceIconDecoder::Decode(image);
        const IconImageDecoder::Bitmaps actual = IconImageDecoder::Decode(image);
        QCOMPARE(actual.colour.isNull(), expected.colour.isNull());
        QCOMPARE(actual.colour, expected.colour);
        QCOMPARE(actual.mask, expected.mask);
        QCOMPARE(actual.composed.format(), expected.composed.format());
        QCOMPARE(actual.composed, expected.composed);
        QCOMPARE(IconImageDecoder::DecodePicture(image), expected.composed);
    }

private Q_SLOTS:
    void realIconsDecodeAsBefore_data()
    {
        QTest::addColumn<QByteArray>("image");
        if (!IconTest::fixturesBuilt())
            QSKIP("icon fixtures were not built (mingw-w64 or icoutils missing)");
        for (const char* name : {"main.ico", "other.ico", "small.ico"}) {
            cFileIcon icon;
            QVERIFY(icon.LoadIcon(IconTest::iconInput(QString::fromLatin1(name))));
            addIconImages(QString::fromLatin1(name), icon);
        }
        for (const char* name : {"multi64.exe", "multi32.exe", "twogroups64.exe"}) {
            cFileIcon icon;
            QVERIFY(icon.LoadMainIconFromEXE(IconTest::peFixture(QString::fromLatin1(name))));
            addIconImages(QString::fromLatin1(name), icon);
        }
    }

    void realIconsDecodeAsBefore()
    {
        QFETCH(QByteArray, image);
        compareWithReference(image);
        QVERIFY(!IconImageDecoder::DecodePicture(image).isNull());
    }

    void everyKindOfBitmapDecodesAsBefore_data()
    {
        QTest::addColumn<QByteArray>("image");
        QRandomGenerator random(20261122);
        const QList<BitmapShape> shapes {{1, 1, 1, true}, {9, 3, 1, true}, {33, 2, 1, false}, {1, 1, 4, true},
            {7, 5, 4, true}, {16, 16, 4, false}, {3, 3, 8, true}, {32, 32, 8, true}, {5, 2, 8, false}, {5, 4, 16, true},
            {32, 32, 16, false}, {3, 7, 24, true}, {31, 31, 24, true}, {6, 6, 24, false}, {2, 3, 32, true},
            {32, 32, 32, true}, {17, 9, 32, false}};
        for (const BitmapShape& shape : shapes) {
            const QByteArray bottomUp = randomBitmap(shape, random);
            QTest::addRow("%s", qPrintable(shapeName(shape))) << bottomUp;
            QByteArray topDown = bottomUp;
            qToLittleEndian<qint32>(-2 * shape.height, topDown.data() + 8);
            QTest::addRow("%s, top-down", qPrintable(shapeName(shape))) << topDown;
        }

        // 32-bit images without any alpha are drawn by their mask instead.
        QByteArray noAlpha = randomBitmap({12, 12, 32, true}, random);
        for (int pixel = 0; pixel < 12 * 12; ++pixel)
            noAlpha[40 + 4 * pixel + 3] = 0;
        QTest::newRow("32-bit, alpha all zero") << noAlpha;
        QByteArray oneAlpha = noAlpha;
        oneAlpha[40 + 4 * 143 + 3] = 1;
        QTest::newRow("32-bit, one pixel with alpha") << oneAlpha;

        QByteArray shortPalette = randomBitmap({8, 8, 8, true}, random);
        qToLittleEndian<quint32>(3, shortPalette.data() + 32); // indices from 3 up lie past the palette
        QTest::newRow("8-bit, three palette colours") << shortPalette;
        QByteArray twoOfSixteen = randomBitmap({8, 8, 4, true}, random);
        qToLittleEndian<quint32>(2, twoOfSixteen.data() + 32);
        QTest::newRow("4-bit, two palette colours") << twoOfSixteen;
        QByteArray usedColours = randomBitmap({4, 4, 24, true}, random);
        qToLittleEndian<quint32>(2, usedColours.data() + 32);
        usedColours.insert(40, QByteArray(8, '\x5a'));
        QTest::newRow("24-bit with a palette before the bits") << usedColours;

        for (int bitCount : {16, 32}) {
            QByteArray bitFields = randomBitmap({6, 6, bitCount, true}, random);
            qToLittleEndian<quint32>(3, bitFields.data() + 16);
            bitFields.insert(40, QByteArray(12, '\x11'));
            QTest::addRow("%d-bit with bit fields", bitCount) << bitFields;
        }
        QByteArray longHeader = randomBitmap({5, 5, 8, true}, random);
        qToLittleEndian<quint32>(108, longHeader.data());
        longHeader.insert(40, QByteArray(68, '\0'));
        QTest::newRow("version 4 header") << longHeader;
        QByteArray shortMask = randomBitmap({8, 8, 8, true}, random);
        shortMask.chop(1);
        QTest::newRow("mask one byte short: drawn opaque") << shortMask;
    }

    void everyKindOfBitmapDecodesAsBefore()
    {
        QFETCH(QByteArray, image);
        compareWithReference(image);
        QVERIFY(!IconImageDecoder::DecodePicture(image).isNull());
    }

    void brokenImagesAreRefusedAsBefore_data()
    {
        QTest::addColumn<QByteArray>("image");
        QRandomGenerator random(7);
        const QByteArray whole = randomBitmap({5, 3, 8, true}, random);
        // Header, palette, then 3 rows of 8 bytes; an image cut in its mask is drawn opaque, so it is not here.
        const qsizetype colourEnd = 40 + 4 * 256 + 3 * 8;
        for (qsizetype length = 0; length < colourEnd; length += 3)
            QTest::addRow("cut to %lld bytes", qlonglong(length)) << whole.left(length);

        const auto withField = [&whole](qsizetype offset, qint32 value) {
            QByteArray changed = whole;
            qToLittleEndian<qint32>(value, changed.data() + offset);
            return changed;
        };
        QTest::newRow("header size 12") << withField(0, 12);
        QTest::newRow("header size past the end") << withField(0, 0x7FFFFFFF);
        QTest::newRow("width 0") << withField(4, 0);
        QTest::newRow("negative width") << withField(4, -5);
        QTest::newRow("width past the limit") << withField(4, 1025);
        QTest::newRow("height 1 (half is 0)") << withField(8, 1);
        QTest::newRow("height past the limit") << withField(8, 2 * 1025);
        QTest::newRow("most negative height") << withField(8, std::numeric_limits<qint32>::min());
        QTest::newRow("run-length compressed") << withField(16, 1);
        QTest::newRow("bit fields on 8 bits") << withField(16, 3);
        QTest::newRow("palette of 2^32 - 1") << withField(32, -1);
        QByteArray twoBit = whole;
        qToLittleEndian<quint16>(2, twoBit.data() + 14);
        QTest::newRow("2-bit") << twoBit;
        QTest::newRow("PNG signature only") << QByteArray("\x89PNG\r\n\x1a\n", 8);
    }

    void brokenImagesAreRefusedAsBefore()
    {
        QFETCH(QByteArray, image);
        compareWithReference(image);
        QVERIFY(IconImageDecoder::DecodePicture(image).isNull());
    }

    // Random damage to valid images: whatever the old decoder made of them, the new one makes too.
    void mutatedImagesDecodeAsBefore_data()
    {
        QTest::addColumn<QByteArray>("image");
        QRandomGenerator random(1122);
        const QList<BitmapShape> shapes {
            {7, 5, 1, true}, {9, 4, 4, true}, {6, 6, 8, true}, {5, 3, 16, true}, {4, 4, 24, true}, {4, 3, 32, true}};
        for (int row = 0; row < 240; ++row) {
            QByteArray image = randomBitmap(shapes.at(row % shapes.size()), random);
            for (int change = 0; change < 1 + row % 4; ++change) {
                // Mostly the header, where a changed byte moves or resizes everything after it.
                const qsizetype at = random.bounded(4) == 0 ? random.bounded(int(image.size())) : random.bounded(40);
                image[at] = char(random.bounded(256));
            }
            if (row % 5 == 0)
                image.chop(random.bounded(int(image.size())));
            QTest::addRow("mutation %d", row) << image;
        }
    }

    void mutatedImagesDecodeAsBefore()
    {
        QFETCH(QByteArray, image);
        compareWithReference(image);
    }
};

QTEST_MAIN(TestIconDecoder)
#include "tst_icondecoder.moc"
