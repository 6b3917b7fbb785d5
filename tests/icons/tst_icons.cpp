#include "PeFixtures.h"
#include "ProgramRun.h"
#include "RealPeFiles.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "app/clsFileVersion.h"
#include "icons/IconCommands.h"
#include "icons/IconImageDecoder.h"
#include "icons/NumberedError.h"
#include "icons/PeModule.h"
#include "icons/VersionResource.h"
#include "icons/cFileIcon.h"
#include "icons/cResources.h"

#include <QImage>
#include <QJsonArray>
#include <QProcess>
#include <QRegularExpression>
#include <QTextStream>

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

QString keyText(const ResourceKey& key)
{
    return key.named ? key.name : QString::number(key.id);
}

constexpr quint32 Sub = 0x80000000u;

QByteArray put(const QByteArray& bytes, qint64 at, quint32 value)
{
    return Patched<quint32>(bytes.leftJustified(qMax(bytes.size(), at + 4), '\0'), at, value);
}

// The bytes with a resource directory at `at`: named and id counts, then (name or id, target) pairs.
QByteArray putDirectory(QByteArray rsrc, qint64 at, quint16 named, quint16 ids, const QList<quint32>& pairs)
{
    rsrc = put(rsrc, at + 12, named | quint32(ids) << 16);
    for (qsizetype i = 0; i < pairs.size(); ++i)
        rsrc = put(rsrc, at + 16 + 4 * i, pairs.at(i));
    return rsrc;
}

// A 32-bit image: a 4 KiB section at 0x1000 with nothing in the file, then one at 0x2000 whose first `rawSize`
// bytes of `rsrc` lie at file offset 0x200.
QByteArray peWith(const QByteArray& rsrc, qint64 rawSize = -1)
{
    rawSize = rawSize < 0 ? rsrc.size() : rawSize;
    QByteArray pe("MZ");
    // PE header at 0x40; i386, two sections; optional header of 224 bytes; headers' size; 16 directories,
    // the resource one; the section table at 0x138.
    for (const auto& [at, value] :
        QList<std::pair<qint64, quint32>> {{0x3C, 0x40}, {0x40, 0x4550}, {0x44, 0x2014C}, {0x54, 224}, {0x58, 0x10B},
            {0x94, 0x200}, {0xB4, 16}, {0xC8, 0x2000}, {0xCC, quint32(rsrc.size())}, {0x140, 0x1000}, {0x144, 0x1000},
            {0x168, quint32(qMax(rsrc.size(), rawSize))}, {0x16C, 0x2000}, {0x170, quint32(rawSize)}, {0x174, 0x200}})
        pe = put(pe, at, value);
    return pe.leftJustified(0x200, '\0') + rsrc.left(rawSize);
}

// Types 3 and 14: a one-image group 1 (1 × 1, 1-bit, 48 bytes) and its image 1, which lies `padding` further on.
QByteArray validIconTree(quint32 padding = 0)
{
    QByteArray rsrc = putDirectory({}, 0, 0, 2, {3, Sub | 0x30, 14, Sub | 0x60});
    rsrc = putDirectory(rsrc, 0x30, 0, 1, {1, Sub | 0x48});
    rsrc = putDirectory(rsrc, 0x48, 0, 1, {0x409, 0xC0});
    rsrc = putDirectory(rsrc, 0x60, 0, 1, {1, Sub | 0x78});
    rsrc = putDirectory(rsrc, 0x78, 0, 1, {0x409, 0xD0});
    for (const auto& [at, value] :
        QList<std::pair<qint64, quint32>> {{0xC0, 0x2100 + padding}, {0xC4, 48}, {0xD0, 0x20E0}, {0xD4, 20}})
        rsrc = put(rsrc, at, value);
    rsrc = rsrc.leftJustified(0xE0, '\0') + QByteArray::fromHex("0000 0100 0100 01010200 0100 0100 30000000 0100");
    return rsrc.leftJustified(0x100 + padding, '\0') + QByteArray::fromHex("28000000 01000000 02000000 0100 0100")
        + QByteArray(32, '\0');
}

QByteArray text(const QString& value)
{
    return QByteArray(reinterpret_cast<const char*>(value.utf16()), value.size() * 2).append(2, '\0');
}

QByteArray padded(QByteArray bytes)
{
    return bytes.append((4 - bytes.size() % 4) % 4, '\0');
}

// A VS_VERSIONINFO node: length, value length, type, key, padding, value, padding, children.
QByteArray node(
    const QString& key, const QByteArray& value, quint16 type, quint16 valueLength, const QByteArray& children = {})
{
    const QByteArray out = padded(padded(LittleEndian(quint16(0), valueLength, type) + text(key)) + value) + children;
    return Patched<quint16>(out, 0, quint16(out.size()));
}

// A version block whose string table `table` holds CompanyName = value (value length as given), translated
// 0419/04E3.
QByteArray versionBlock(const QString& table, const QByteArray& value, quint16 valueLength)
{
    const QByteArray translation = node(u"Translation"_s, QByteArray("\x19\x04\xe3\x04", 4), 0, 4);
    const QByteArray strings
        = node(u"StringFileInfo"_s, {}, 1, 0, node(table, {}, 1, 0, node(u"CompanyName"_s, value, 1, valueLength)));
    return node(
        u"VS_VERSION_INFO"_s, QByteArray(52, '\0'), 0, 52, strings + node(u"VarFileInfo"_s, {}, 1, 0, translation));
}

} // namespace

class TestIcons : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;
    int m_files = 0;

    QString written(const QByteArray& bytes)
    {
        const QString path = m_env.path(u"%1.ico"_s.arg(++m_files));
        return WriteFile(path, bytes) ? path : QString();
    }

    cFileIcon craftedMainIcon(const QByteArray& pe)
    {
        cFileIcon icon;
        icon.LoadMainIconFromEXE(written(pe));
        return icon;
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
    void initTestCase()
    {
        PeFixture(u"multi64.exe"_s); // fails the run, naming what to install, when not built
        REQUIRE_TOOL("wrestool", "icoutils");
    }

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
        cFileIcon icon;
        QVERIFY(!icon.LoadIcon(path));
        QTEST(icon.lastLoadMessage(), "message");
        QCOMPARE(icon.Filename(), path);
        QTEST(icon.ImageCount(), "countAfter");
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
        cFileIcon icon;
        QVERIFY(start.isEmpty() || icon.LoadIcon(written(start)));
        for (const QList<int>& add : adds)
            icon.AddImage(add.at(0), add.at(0), add.at(1));
        if (remove)
            icon.RemoveImage(remove);
        QTEST(icon.toIconFile(), "expected");
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
        QList<IconImage> fakes;
        for (const QList<int>& image : images)
            fakes.append({quint8(image.at(0)), quint8(image.at(0)), quint8(image.at(1)), 1, quint16(image.at(2)),
                BlankBitmap(4, 4, 4)});
        cFileIcon icon = images.isEmpty() ? cFileIcon() : loaded(BuildIconFile(fakes));
        QTEST(icon.bestIconIndex(depth), "best");
        QCOMPARE(icon.BestIconPicture().isNull(), images.isEmpty());
    }

    void mainIcon_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QVariant>("resourceId");
        QTest::addColumn<QString>("reason"); // why --extract-icon finds none
        // Groups 1 to 3 lack an image, disagree on a size, or use an id above 32767.
        QTest::newRow("first three groups broken") << PeFixture(u"broken64.exe"_s) << QVariant(4) << "";
        QTest::newRow("only group broken")
            << PeFixture(u"badsize64.exe"_s) << QVariant() << "none of the file's 1 icon groups loads completely";
        QTest::newRow("no group") << PeFixture(u"ver_ru32.exe"_s) << QVariant() << "the file has no icon";
        QTest::newRow("no resources") << PeFixture(u"nores64.exe"_s) << QVariant() << "the file has no resources";
        QTest::newRow("missing file") << m_env.path(u"none.exe"_s) << QVariant()
                                      << "The system cannot find the file specified.";
        QTest::newRow("not an executable")
            << IconInput(u"main.ico"_s) << QVariant() << "the file is not a valid Win32 application.";
    }

    // The main icon, and the --extract-icon command that saves it, against wrestool's extraction.
    void mainIcon()
    {
        QFETCH(QString, file);
        QFETCH(QVariant, resourceId);
        QFETCH(QString, reason);
        cFileIcon icon;
        icon.AddImage(16, 16, 2); // a previous icon is always replaced
        QCOMPARE(icon.LoadMainIconFromEXE(file), resourceId.isValid());
        QCOMPARE(icon.Filename(), file);
        QCOMPARE(icon.ResourceID(), resourceId);
        QCOMPARE(icon.ImageCount(), resourceId.isValid() ? 1 : 0); // both groups hold one image

        const QString out = m_env.path(u"main.ico"_s);
        QFile::remove(out);
        QString err;
        QTextStream errStream(&err);
        QCOMPARE(IconCommands::ExtractIcon(file, out, errStream), reason.isEmpty() ? 0 : 1);
        QCOMPARE(err, reason.isEmpty() ? QString() : file + u": "_s + reason + u'\n');
        if (resourceId.isValid())
            QCOMPARE(ReadFile(out), WrestoolGroup(file, resourceId.toString()).value_or("wrestool failed"));
        else
            QVERIFY(!QFile::exists(out));
    }

    // An id the file lacks gives way to the name, which matches without regard to case.
    void groupByName()
    {
        const QString file = PeFixture(u"twogroups32.exe"_s);
        cFileIcon icon;
        QVERIFY(icon.LoadIconFromEXE(file, 99, u"appicon"_s));
        QCOMPARE(icon.toIconFile(), WrestoolGroup(file, u"APPICON"_s).value_or("wrestool failed"));
    }

    // Group icons are type 14; the type after it has no name.
    void typeNames()
    {
        QCOMPARE(cResources::ResourceTypeName(14), u"Group Icon"_s);
        QCOMPARE(cResources::ResourceTypeName(15), u"Other (15)"_s);
    }

    // Fixtures and executables no one here built (whatever packages on this machine installed), read by pefile
    // and wrestool: the resource directory leaf by leaf, the lists and the main icon.
    void agreesWithPefile_data()
    {
        QTest::addColumn<QString>("file");
        for (const char* name : {"multi32.exe", "multi64.exe", "twogroups64.exe", "ver_ru32.exe", "ver_nodesc64.exe"})
            QTest::newRow(name) << PeFixture(QString::fromLatin1(name));
        const QStringList real = RealPeFiles({}, 120);
        REQUIRE_FIXTURE(!real.isEmpty(), "Windows executables: install mingw-w64");
        for (const QString& file : real)
            QTest::newRow(qPrintable(file)) << file;
    }

    void agreesWithPefile()
    {
        QFETCH(QString, file);
        const auto reference = PefileReading(file);
        QVERIFY(reference && !reference->contains(u"error"_s));
        // Leaf by leaf as "type/name/language/size/offset", and each type with its names as cResources lists them.
        QStringList leaves, wantedLists;
        for (const QJsonValue& value : reference->value(u"resources"_s).toArray()) {
            const QStringList leaf = value.toVariant().toStringList();
            leaves.append(leaf.join(u'/'));
            if (wantedLists.isEmpty() || !wantedLists.last().startsWith(leaf[0] + u':'))
                wantedLists.append(leaf[0] + u':');
            if (!wantedLists.last().endsWith(u' ' + leaf[1]))
                wantedLists.last() += u' ' + leaf[1];
        }
        const auto module = PeModule::fromBytes(ReadFile(file)).module;
        QVERIFY(module);
        QStringList ours;
        for (const ResourceLeaf& leaf : module->allResources())
            ours.append(QStringList {keyText(leaf.type), keyText(leaf.name), QString::number(leaf.language),
                QString::number(leaf.size), QString::number(leaf.fileOffset)}
                            .join(u'/'));
        QCOMPARE(ours, leaves);

        cResources resources;
        resources.setFile(file);
        if (reference->value(u"resources"_s).isNull())
            QVERIFY_THROWS_EXCEPTION(NumberedError, resources.GetResourceTypes()); // no resource section
        else
            QCOMPARE(resources.GetResourceTypes(), wantedLists.size());
        QStringList lists;
        for (int t = 1; t <= resources.ResourceTypeCount(); ++t) {
            lists.append(resources.ResourceType(t).toString() + u':');
            resources.GetResourceNames(t); // filled again below, not added to
            for (int n = 1, names = resources.GetResourceNames(t); n <= names; ++n)
                lists.last() += u' ' + resources.ResourceName(t, n).toString();
        }
        QCOMPARE(lists, wantedLists);
        const QString groups = wantedLists.filter(QRegularExpression(u"^14:"_s)).value(0);
        QCOMPARE(resources.IndexOfResourceType(14), wantedLists.indexOf(groups) + 1);
        QVERIFY_THROWS_EXCEPTION(NumberedError, resources.ResourceType(lists.size() + 1));

        // The main icon: the first group, as wrestool extracts it.
        const QString group = groups.section(u' ', 1, 1);
        cFileIcon icon;
        QCOMPARE(icon.LoadMainIconFromEXE(file), !group.isEmpty());
        if (!group.isEmpty()) {
            QCOMPARE(icon.ResourceID().toString(), group);
            QCOMPARE(icon.toIconFile(), WrestoolGroup(file, group).value_or("wrestool failed"));
        }
    }

    // Its resources start where the section before ends.
    void validTreeLoads() { QCOMPARE(craftedMainIcon(peWith(validIconTree())).ImageSize(1), 48); }

    // "types" is how many resource types are listed, or -1 when the file is refused.
    void malformedFilesEndCleanly_data()
    {
        QTest::addColumn<QByteArray>("pe");
        QTest::addColumn<int>("types");
        const QByteArray valid = peWith(validIconTree());
        QTest::newRow("empty") << QByteArray() << -1;
        QTest::newRow("no PE signature") << QByteArray(valid).replace(0x41, 1, "X") << -1;
        QTest::newRow("unknown optional header") << Patched<quint16>(valid, 0x58, 0x107) << -1;
        QTest::newRow("header offset past the end") << Patched<quint32>(valid, 0x3C, 0xFFFFFFF0u) << -1;
        QTest::newRow("section table past the end") << Patched<quint16>(valid, 0x46, 0xFFFF) << -1;
        QTest::newRow("directory pointing at itself") << peWith(putDirectory({}, 0, 0, 1, {14, Sub})) << 1;
        QTest::newRow("counts past the end") << peWith(putDirectory({}, 0, 0xFFFF, 0xFFFF, {14, Sub | 0x20})) << 1;
        QTest::newRow("image data outside every section") << peWith(put(validIconTree(), 0xC0, 0x7FFF0000u)) << 2;
        QTest::newRow("data range wrapping around")
            << peWith(put(put(validIconTree(), 0xC0, 0xFFFFFFF0u), 0xC4, 0x100)) << 2;
        QTest::newRow("image in the zero-filled tail") << peWith(validIconTree(), 0x100) << 2;
        // Every type points at the same long run of entries, shifted by one entry each time.
        QList<quint32> entries;
        for (quint32 i = 0; i < 2000; ++i)
            entries += {i + 1, Sub | (16 + 8 * i)};
        QTest::newRow("overlapping directories") << peWith(putDirectory({}, 0, 0, 2000, entries)) << 2000;
        const QByteArray longName = put(putDirectory({}, 0, 1, 0, {Sub | 0x20, Sub | 0x18}), 0x20, 0xFFFF);
        QTest::newRow("name longer than the file") << peWith(longName + QByteArray(0xFFF0, 'A')) << 1;
    }

    void malformedFilesEndCleanly()
    {
        QFETCH(QByteArray, pe);
        QFETCH(int, types);
        const auto opened = PeModule::fromBytes(pe);
        QCOMPARE(bool(opened.module), types >= 0);
        if (!opened.module) {
            QCOMPARE(opened.error, PeError::BadFormat);
            return;
        }
        const QList<ResourceKey> found = opened.module->resourceTypes();
        QCOMPARE(found.size(), types);
        for (const ResourceKey& key : found)
            QVERIFY(key.name.size() <= 512);
        QVERIFY(opened.module->allResources().size() <= pe.size() / 16); // no more leaves than the file has room for
        QCOMPARE(craftedMainIcon(pe).ImageCount(), 0);
    }

    // Each field has its own place in the line; a file without version information empties them all.
    void getAllHasItsOwnOrder()
    {
        clsFileVersion version;
        QVERIFY(version.ReadVersion(PeFixture(u"multi32.exe"_s)));
        QCOMPARE(version.FullFileName(), PeFixture(u"multi32.exe"_s));
        QCOMPARE(version.GetAll(),
            u"Marble Cascade Deluxe; 1.2; marble; Marble Cascade; 1.2.3.4; Fixture Works; (c) Fixture Works; marble.exe"_s);
        QVERIFY(!version.ReadVersion(PeFixture(u"twogroups64.exe"_s)));
        QCOMPARE(version.GetAll(), u"; ; ; ; ; ; ; "_s);
    }

    // "company" is what the string table gives for CompanyName, "-" when no strings are read.
    void blockQueries_data()
    {
        QTest::addColumn<QByteArray>("block");
        QTest::addColumn<QString>("company");
        const QByteArray acme = text(u"Acme"_s);
        QTest::newRow("plain") << versionBlock(u"041904E3"_s, acme, 5) << "Acme";
        QTest::newRow("keys in other case") << versionBlock(u"041904e3"_s, acme, 5) << "Acme";
        QTest::newRow("length in bytes") << versionBlock(u"041904E3"_s, acme, 10) << "Acme";
        QTest::newRow("text with a NUL inside")
            << versionBlock(u"041904E3"_s, text(u"Ac"_s) + text(u"me"_s), 6) << "Ac";
        QTest::newRow("table under another name") << versionBlock(u"040904B0"_s, acme, 5) << "";
        const QByteArray vars
            = node(u"VarFileInfo"_s, {}, 1, 0, node(u"Translation"_s, QByteArray("\x09\x04", 2), 0, 2));
        QTest::newRow("empty") << QByteArray() << "-";
        QTest::newRow("short translation") << node(u"VS_VERSION_INFO"_s, QByteArray(52, '\0'), 0, 52, vars) << "-";
        QTest::newRow("children of length 0") << node(u"VS_VERSION_INFO"_s, {}, 0, 0, QByteArray(64, '\0')) << "-";
        QTest::newRow("length past the end")
            << Patched<quint16>(node(u"VS_VERSION_INFO"_s, {}, 0, 0, vars), 0, 0xFFFF) << "-";
    }

    void blockQueries()
    {
        QFETCH(QByteArray, block);
        QFETCH(QString, company);
        const auto strings = ReadVersionStrings(VersionResource(block));
        QCOMPARE(strings ? strings->values.at(0) : u"-"_s, company);
        QCOMPARE(strings ? strings->translation : u"-"_s, company == u"-" ? u"-"_s : u"041904E3"_s);
    }

    // Both commands through the real program: what they print, and a one-line reason on standard error.
    void theProgramRunsBothCommands()
    {
        QProcess process;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert(u"XDG_RUNTIME_DIR"_s, m_env.root()); // else Qt's start-up note shares standard error
        process.setProcessEnvironment(environment);
        const auto run = [&process](const QStringList& arguments) {
            process.start(ProgramPath(), arguments);
            return process.waitForFinished(60000) ? process.exitCode() : -1;
        };
        QCOMPARE(run({u"--version-info"_s, PeFixture(u"ver_ru32.exe"_s)}), 0);
        QCOMPARE(QString::fromUtf8(process.readAllStandardOutput()),
            u"Translation=041904E3\nCompanyName=Студия Пример\nFileDescription=Весёлые шарики\nFileVersion=2.0.0.1\n"
            "InternalName=\nLegalCopyright=\nOriginalFileName=\nProductName=Шарики\nProductVersion=\n"_s);
        QCOMPARE(run({u"--extract-icon"_s, PeFixture(u"multi64.exe"_s), m_env.path(u"no/folder/out.ico"_s)}), 1);
        QCOMPARE(process.readAllStandardError(),
            (m_env.path(u"no/folder/out.ico"_s) + u": Couldn't open file for writing.\n"_s).toUtf8());
    }
};

BV_REGISTER_TEST(TestIcons);
#include "tst_icons.moc"
