#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/IconImageDecoder.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"

#include <QImage>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// 16 × 16 4-bit (296 bytes), 32 × 32 8-bit (2216) and 48 × 48 32-bit (9640): packed from offset 54.
const QList<IconImage> ThreeImages {{16, 16, 16, 1, 4, BlankBitmap(16, 16, 4)},
    {32, 32, 0, 1, 8, BlankBitmap(32, 32, 8)}, {48, 48, 0, 1, 32, BlankBitmap(48, 48, 32)}};

// What AddImage makes: header, black palette (but white for colour 1 of a 1-bit image) and zero bits, `size` bytes.
QByteArray blank(int side, int bitCount, int size)
{
    QByteArray image = BlankBitmap(side, side, bitCount).left(16).leftJustified(size, '\0');
    return bitCount == 1 ? image.replace(44, 3, "\xff\xff\xff") : image;
}

// An icon bitmap: the 40-byte header with biClrUsed = colours, then palette, colour rows and mask rows (both
// bottom-up) given in hex.
QByteArray bitmap(int width, int height, int bitCount, int colours, const char* hex)
{
    return Patched<quint32>(BlankBitmap(width, height, bitCount).left(40), 32, colours) + QByteArray::fromHex(hex);
}

// Pixels as AARRGGBB, top row first, rows split by " | "; "" for a null picture.
QString pixels(const QImage& picture)
{
    QStringList rows;
    for (int y = 0; y < picture.height(); ++y) {
        rows.append(QString());
        for (int x = 0; x < picture.width(); ++x)
            rows.last() += u"%1 "_s.arg(picture.pixel(x, y), 8, 16, QLatin1Char('0'));
    }
    return rows.join(u"| "_s).trimmed();
}

// Rows 110 / 010 (bottom / top) in black and white; the mask shows the screen through the bottom row's last pixel.
const QByteArray OneBit = bitmap(3, 2, 1, 0, "00000000ffffff00 c0000000 40000000 20000000 00000000");

} // namespace

class TestFileIcon : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;
    int m_files = 0;

    QString written(const QByteArray& bytes)
    {
        const QString path = m_env.path(u"%1.ico"_s.arg(++m_files));
        return WriteFile(path, bytes) ? path : QString();
    }

    cFileIcon loaded(const QByteArray& iconFile)
    {
        cFileIcon icon;
        if (!icon.LoadIcon(written(iconFile)))
            qFatal("cannot load an icon");
        return icon;
    }

    // A raised error as "number (hex) message object".
    static QString failure(const std::function<void()>& f)
    {
        try {
            f();
        } catch (const NumberedError& error) {
            return u"%1 %2 %3"_s.arg(
                QString::number(error.number(), 16), error.message(), error.source().section(u'.', -1));
        }
        return u"nothing raised"_s;
    }

private Q_SLOTS:
    void loadRefusesBrokenFiles_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("message");
        QTest::addColumn<int>("countAfter");
        const QByteArray one = BuildIconFile(ThreeImages.mid(0, 1));
        const QString notIcon = u"File is not icon type (idType <> IMAGE_ICON)"_s;
        const QString badImages = u"Icon Images Array is Corrupt."_s;
        QTest::newRow("no images") << written(BuildIconFile({})) << "Icon contains no images." << 0;
        QTest::newRow("reserved set") << written(Patched<quint16>(one, 0, 1))
                                      << "File is not icon type (reserved member is 0)" << 1;
        QTest::newRow("cursor") << written(BuildIconFile(ThreeImages.mid(0, 1), 2)) << notIcon << 1;
        QTest::newRow("missing file") << m_env.path(u"nowhere/none.ico"_s) << notIcon << 0;
        QTest::newRow("directory short") << written(Patched<quint16>(one.left(22), 4, 2))
                                         << "Icon Directory Array is Corrupt." << 0;
        QTest::newRow("offset beyond file") << written(Patched<quint32>(one, 18, 0x7FFFFFF0u)) << badImages << 0;
    }

    void loadRefusesBrokenFiles()
    {
        QFETCH(QString, path);
        QFETCH(QString, message);
        QFETCH(int, countAfter);
        cFileIcon icon;
        QVERIFY(!icon.LoadIcon(path));
        QCOMPARE(icon.lastLoadMessage(), message);
        QCOMPARE(icon.Filename(), path);
        QCOMPARE(icon.ImageCount(), countAfter);
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.ImageWidth(1));
    }

    // Also files whose directory or images lie beyond, or across, what one read of the file takes in.
    void packedFileRoundTripsByteForByte_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QList<IconImage> many;
        for (int i = 0; i < 5000; ++i)
            many.append({1, 1, 2, 1, 1, Patched<quint16>(BlankBitmap(1, 1, 1), 40, quint16(i))});
        QTest::newRow("5,000 images") << BuildIconFile(many);
        QTest::newRow("image across 64 KiB")
            << BuildIconFile(ThreeImages + QList<IconImage> {{255, 255, 0, 1, 32, BlankBitmap(255, 255, 32)}});
        QTest::newRow("icotool, five images with PNG") << ReadFile(IconInput(u"main.ico"_s));
    }

    void packedFileRoundTripsByteForByte()
    {
        QFETCH(QByteArray, bytes);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(bytes)));
        const QString copy = m_env.path(u"copy.ico"_s);
        QVERIFY(icon.SaveIcon(copy));
        QCOMPARE(icon.Filename(), copy);
        QCOMPARE(ReadFile(copy), bytes);
    }

    // The last image too; colour counts from the entry's colours, else its bit count.
    void queries()
    {
        QList<IconImage> images;
        for (const auto& [colours, bits] : QList<std::pair<int, int>> {{0, 32}, {0, 8}, {0, 24}, {0, 0}, {2, 32}})
            images.append({24, 16, quint8(colours), 1, quint16(bits), BlankBitmap(24, 16, 8)});
        const cFileIcon icon = loaded(BuildIconFile(images));
        QList<qint64> counts;
        for (int i = 1; i <= 5; ++i)
            counts.append(icon.ImageColourCount(i));
        QCOMPARE(counts, QList<qint64>({-1, 256, 16777216, 1, 2}));
        QCOMPARE(QList<int>({icon.ImageWidth(5), icon.ImageHeight(5), icon.ImageSize(5)}), QList<int>({24, 16, 1512}));
        for (int outside : {0, 6})
            QCOMPARE(failure([&] { icon.ImageColourCount(outside); }), u"9 Subscript out of range cFileIcon"_s);
    }

    void editErrors()
    {
        cFileIcon icon;
        QCOMPARE(failure([&] { icon.SaveIcon({}); }), u"8004041b No filename specified. cFileIcon"_s);
        QCOMPARE(failure([&] { icon.SaveIcon(m_env.path(u"empty.ico"_s)); }),
            u"8004041c Icon contains no images. cFileIcon"_s);
        QVERIFY(!QFile::exists(m_env.path(u"empty.ico"_s)));
        icon.AddImage(16, 16, 2);
        QCOMPARE(failure([&] { icon.SaveIcon(m_env.path(u"no/such/folder/x.ico"_s)); }),
            u"8004041c Couldn't open file for writing. cFileIcon"_s);
        QCOMPARE(
            failure([&] { icon.SaveIcon(u"/dev/full"_s); }), u"8004041d General failure writing icon. cFileIcon"_s);
        QVERIFY(icon.LoadIcon(written(BuildIconFile(ThreeImages))));
        QCOMPARE(failure([&] { icon.AddImage(32, 32, 256); }), u"80040419 Icon already exists. cFileIcon"_s);
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(-1, 16, 16));
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(16, 16, 0x7FFFFFFF));
        QCOMPARE(icon.toIconFile(), BuildIconFile(ThreeImages));
    }

    void edits_data()
    {
        QTest::addColumn<QByteArray>("start"); // an icon file loaded first
        QTest::addColumn<QList<QList<int>>>("adds"); // side, colours
        QTest::addColumn<int>("remove");
        QTest::addColumn<QByteArray>("expected"); // a new object's header says type 0
        const QByteArray three = BuildIconFile(ThreeImages);
        const IconImage two {16, 16, 2, 1, 1, blank(16, 1, 40 + 8 + 64 + 64)};
        const IconImage sixteen {32, 32, 16, 1, 4, blank(32, 4, 744)};
        QTest::newRow("add 1 × 1, 2: rows of one bit take a word")
            << QByteArray() << QList<QList<int>> {{1, 2}} << 0 << BuildIconFile({{1, 1, 2, 1, 1, blank(1, 1, 56)}}, 0);
        QTest::newRow("add other, colours counted") << QByteArray() << QList<QList<int>> {{16, 5}} << 0
                                                    << BuildIconFile({{16, 16, 0, 1, 24, blank(16, 24, 892)}}, 0);
        // With one image there, nothing shifts and the second lands at offset 0.
        QTest::newRow("add to one image")
            << QByteArray() << QList<QList<int>> {{16, 2}, {32, 16}} << 0
            << Patched<quint32>(Patched<quint32>(BuildIconFile({two, sixteen}, 0), 18, 22), 34, 0);
        QTest::newRow("add to three") << three << QList<QList<int>> {{64, 256}} << 0
                                      << BuildIconFile(ThreeImages
                                             + QList<IconImage> {{64, 64, 0, 1, 8, BlankBitmap(64, 64, 8)}});
        QTest::newRow("remove middle") << three << QList<QList<int>>() << 2
                                       << BuildIconFile({ThreeImages.at(0), ThreeImages.at(2)});
    }

    void edits()
    {
        QFETCH(QByteArray, start);
        QFETCH(QList<QList<int>>, adds);
        QFETCH(int, remove);
        QFETCH(QByteArray, expected);
        cFileIcon icon;
        QVERIFY(start.isEmpty() || icon.LoadIcon(written(start)));
        for (const QList<int>& add : adds)
            icon.AddImage(add.at(0), add.at(0), add.at(1));
        if (remove)
            icon.RemoveImage(remove);
        QCOMPARE(icon.toIconFile(), expected);
    }

    void decodes_data()
    {
        QTest::addColumn<QByteArray>("image");
        QTest::addColumn<QString>("expected");
        const QString oneBit = u"ff000000 ffffffff ff000000 | ffffffff ffffffff 00000000"_s;
        QTest::newRow("1-bit") << OneBit << oneBit;
        QTest::newRow("1-bit, top-down") << Patched<qint32>(OneBit, 8, -4)
                                         << "ffffffff ffffffff 00000000 | ff000000 ffffffff ff000000";
        QTest::newRow("1-bit, mask one byte short: opaque")
            << OneBit.chopped(1) << "ff000000 ffffffff ff000000 | ffffffff ffffffff ff000000";
        QTest::newRow("1-bit, version 4 header")
            << Patched<quint32>(OneBit.left(40) + QByteArray(68, '\0') + OneBit.mid(40), 0, 108) << oneBit;
        QTest::newRow("4-bit, three palette colours")
            << bitmap(3, 2, 4, 3, "0000ff00 00ff0000 ff000000 01200000 21000000 00000000 00000000")
            << "ff0000ff ff00ff00 ffff0000 | ffff0000 ff00ff00 ff0000ff";
        QTest::newRow("8-bit, index past the palette is black")
            << bitmap(3, 2, 8, 2, "0000ff00 00ff0000 00010500 01000000 00000000 00000000")
            << "ff00ff00 ffff0000 ffff0000 | ffff0000 ff00ff00 ff000000";
        // 0x4101 holds 16, 8 and 1 of 31.
        QTest::newRow("16-bit") << bitmap(3, 2, 16, 0, "007ce0031f000000 e07f0141ffff0000 00000000 00000000")
                                << "ffffff00 ff834108 ffffffff | ffff0000 ff00ff00 ff0000ff";
        QTest::newRow("16-bit with bit fields")
            << Patched<quint32>(bitmap(1, 1, 16, 0, "007c0000 e0030000 1f000000 e0030000 00000000"), 16, 3)
            << "ff00ff00";
        QTest::newRow("24-bit") << bitmap(2, 2, 24, 0, "0000ff00ff000000 ff00001020300000 00000000 00000000")
                                << "ff0000ff ff302010 | ffff0000 ff00ff00";
        QTest::newRow("32-bit, no alpha: mask used")
            << bitmap(2, 2, 32, 0, "0000ff0000ff0000 ff00000000000000 40000000 80000000")
            << "00000000 ff000000 | ffff0000 00000000";
        QTest::newRow("32-bit with bit fields")
            << Patched<quint32>(bitmap(1, 1, 32, 0, "0000ff00 00ff0000 ff000000 11223344 00000000"), 16, 3)
            << "44332211";

        // Refused, never read past the end: the image cut short, or a header field out of range.
        const QByteArray base = BlankBitmap(5, 3, 8);
        for (qsizetype length : {qsizetype(0), qsizetype(39), qsizetype(40 + 4 * 256 + 3 * 8 - 1)})
            QTest::addRow("cut to %lld bytes", qlonglong(length)) << base.left(length) << "";
        for (const auto& [at, value] :
            QList<std::pair<int, qint32>> {{0, 12}, {0, 0x7FFFFFFF}, {4, 0}, {4, -5}, {4, 1025}, {8, 1}, {8, 2 * 1025},
                {8, std::numeric_limits<qint32>::min()}, {16, 1}, {16, 3}, {32, -1}, {14, 2}})
            QTest::addRow("%d at offset %d", value, at) << Patched<qint32>(base, at, value) << "";
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
        QVERIFY(icon.LoadIcon(IconInput(u"main.ico"_s)));
        QCOMPARE(icon.BestIconPicture().size(), QSize(32, 32)); // not the 48 or 256 wide images
        const QImage source = QImage(IconInput(png)).convertToFormat(QImage::Format_ARGB32);
        const IconImageDecoder::Bitmaps bitmaps = IconImageDecoder::Decode(icon.imageBytes(index));
        QCOMPARE(icon.IconPicture(index), bitmaps.composed);
        QImage mask(source.size(), QImage::Format_RGB32), composed = source;
        for (int y = 0; y < source.height(); ++y) {
            for (int x = 0; x < source.width(); ++x) {
                const QRgb want = source.pixel(x, y);
                const bool shows = qAlpha(want) < 128; // icotool's threshold for the AND mask
                mask.setPixel(x, y, shows ? 0xFFFFFFFFu : 0xFF000000u);
                composed.setPixel(x, y, alpha ? want : (shows ? 0u : want | 0xFF000000u));
            }
        }
        QCOMPARE(bitmaps.mask.convertToFormat(QImage::Format_RGB32), mask);
        // Premultiplied, so that what hides under full transparency does not count.
        QCOMPARE(bitmaps.composed.convertToFormat(QImage::Format_ARGB32_Premultiplied),
            composed.convertToFormat(QImage::Format_ARGB32_Premultiplied));
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
        QTest::newRow("closest width without 32") << QList<QList<int>> {{16, 0, 8}, {48, 0, 8}, {24, 0, 8}} << 8 << 3;
        QTest::newRow("no other width after a 32") << QList<QList<int>> {{32, 2, 1}, {31, 0, 32}} << 32 << 1;
        QTest::newRow("no images") << QList<QList<int>> {} << 32 << 1;
    }

    void bestImage()
    {
        QFETCH(QList<QList<int>>, images);
        QFETCH(int, depth);
        QFETCH(int, best);
        QList<IconImage> fakes;
        for (const QList<int>& image : images)
            fakes.append({quint8(image.at(0)), quint8(image.at(0)), quint8(image.at(1)), 1, quint16(image.at(2)),
                BlankBitmap(4, 4, 4)});
        cFileIcon icon = images.isEmpty() ? cFileIcon() : loaded(BuildIconFile(fakes));
        QCOMPARE(icon.bestIconIndex(depth), best);
        QCOMPARE(icon.BestIconPicture().isNull(), images.isEmpty());
    }
};

BV_REGISTER_TEST(TestFileIcon);
#include "tst_cfileicon.moc"
