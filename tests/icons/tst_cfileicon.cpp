#include "IconTests.h"
#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/cFileIcon.h"

using namespace Brimvault;

namespace {

// 16 × 16 4-bit (296 bytes), 32 × 32 8-bit (2216) and 48 × 48 32-bit (9640): packed from offset 54.
const QList<IconImage> ThreeImages {{16, 16, 16, 1, 4, BlankBitmap(16, 16, 4)},
    {32, 32, 0, 1, 8, BlankBitmap(32, 32, 8)}, {48, 48, 0, 1, 32, BlankBitmap(48, 48, 32)}};

QList<quint32> offsets(const cFileIcon& icon)
{
    QList<quint32> out;
    for (int i = 1; i <= icon.ImageCount(); ++i)
        out.append(icon.entry(i).dwImageOffset);
    return out;
}

} // namespace

class TestFileIcon : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;
    int m_files = 0;

    QString written(const QByteArray& bytes)
    {
        const QString path = m_env.path(QStringLiteral("%1.ico").arg(++m_files));
        return WriteFile(path, bytes) ? path : QString();
    }

private Q_SLOTS:
    void loadRefusesBrokenFiles_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("message");
        QTest::addColumn<int>("countAfter");
        const QByteArray one = BuildIconFile(ThreeImages.mid(0, 1));
        const QString notIcon = QStringLiteral("File is not icon type (idType <> IMAGE_ICON)");
        const QString reserved = QStringLiteral("File is not icon type (reserved member is 0)");
        const QString badImages = QStringLiteral("Icon Images Array is Corrupt.");
        QTest::newRow("no images") << written({"\0\0\1\0\0\0", 6}) << "Icon contains no images." << 0;
        QTest::newRow("negative count") << written({"\0\0\1\0\xff\xff", 6}) << "Icon contains no images." << -1;
        QTest::newRow("reserved set") << written({"\1\0\1\0\1\0", 6}) << reserved << 1;
        QTest::newRow("cursor") << written({"\0\0\2\0\1\0", 6}) << notIcon << 1;
        QTest::newRow("png named .ico") << written({"\x89PNG\r\n\x1a\n", 8}) << reserved << 0x0A0D;
        QTest::newRow("empty file") << written({}) << notIcon << 0;
        QTest::newRow("missing file") << m_env.path(QStringLiteral("nowhere/none.ico")) << notIcon << 0;
        QTest::newRow("a folder") << m_env.root() << notIcon << 0;
        QTest::newRow("directory short") << written(Patched<quint16>(one.left(22), 4, 2))
                                         << "Icon Directory Array is Corrupt." << 0;
        QTest::newRow("image short") << written(one.chopped(10)) << badImages << 0;
        QTest::newRow("size beyond file") << written(Patched<quint32>(one, 14, 0xFFFFFFF0u)) << badImages << 0;
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
        QTest::newRow("three images") << BuildIconFile(ThreeImages);
        QTest::newRow("5,000 images") << BuildIconFile(many);
        QTest::newRow("image across 64 KiB")
            << BuildIconFile(ThreeImages.mid(1) + QList<IconImage> {{255, 255, 0, 1, 32, BlankBitmap(255, 255, 32)}});
        QTest::newRow("icotool, five images with PNG") << ReadFile(IconInput(QStringLiteral("main.ico")));
        QTest::newRow("icotool, 32-bit") << ReadFile(IconInput(QStringLiteral("other.ico")));
    }

    void packedFileRoundTripsByteForByte()
    {
        QFETCH(QByteArray, bytes);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(bytes)));
        const QString copy = m_env.path(QStringLiteral("copy.ico"));
        QVERIFY(icon.SaveIcon(copy));
        QCOMPARE(icon.Filename(), copy);
        QCOMPARE(ReadFile(copy), bytes);
        QCOMPARE(icon.toIconFile(), bytes);
    }

    void loadKeepsOffsetsAsGiven()
    {
        QByteArray bytes = BuildIconFile(ThreeImages.mid(0, 1));
        bytes.insert(22, QByteArray(200000, 'x'));
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(Patched<quint32>(bytes, 18, 200022))));
        QCOMPARE(offsets(icon), QList<quint32> {200022});
        QCOMPARE(icon.imageBytes(1), BlankBitmap(16, 16, 4));
    }

    void queries_data()
    {
        QTest::addColumn<int>("colourCount");
        QTest::addColumn<int>("bitCount");
        QTest::addColumn<qint64>("expected");
        QTest::newRow("32-bit") << 0 << 32 << qint64(-1);
        QTest::newRow("8-bit") << 0 << 8 << qint64(256);
        QTest::newRow("24-bit") << 0 << 24 << qint64(16777216);
        QTest::newRow("bit count 0") << 0 << 0 << qint64(1);
        QTest::newRow("count wins over bits") << 2 << 32 << qint64(2);
    }

    void queries()
    {
        QFETCH(int, colourCount);
        QFETCH(int, bitCount);
        QFETCH(qint64, expected);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(
            written(BuildIconFile({{24, 16, quint8(colourCount), 1, quint16(bitCount), BlankBitmap(24, 16, 8)}}))));
        QCOMPARE(icon.ImageColourCount(1), expected);
        QCOMPARE(QList<int>({icon.ImageWidth(1), icon.ImageHeight(1), icon.ImageSize(1)}), QList<int>({24, 16, 1512}));
        for (int outside : {0, 2}) {
            const NumberedError error = Raised([&] { icon.ImageColourCount(outside); });
            QCOMPARE(error.number(), SubscriptOutOfRange);
            QVERIFY(error.source().endsWith(QStringLiteral(".cFileIcon")));
        }
    }

    void saveErrors()
    {
        cFileIcon icon;
        NumberedError error = Raised([&] { icon.SaveIcon(); });
        QCOMPARE(error.number(), 0x8004041Bu);
        QCOMPARE(error.message(), QStringLiteral("No filename specified."));
        QCOMPARE(error.source(), ErrorSource(QStringLiteral("cFileIcon")));
        error = Raised([&] { icon.SaveIcon(m_env.path(QStringLiteral("empty.ico"))); });
        QCOMPARE(error.number(), 0x8004041Cu);
        QCOMPARE(error.message(), QStringLiteral("Icon contains no images."));
        QVERIFY(!QFile::exists(m_env.path(QStringLiteral("empty.ico"))));
        icon.AddImage(16, 16, 2);
        error = Raised([&] { icon.SaveIcon(m_env.path(QStringLiteral("no/such/folder/x.ico"))); });
        QCOMPARE(error.number(), 0x8004041Cu);
        QCOMPARE(error.message(), QStringLiteral("Couldn't open file for writing."));
        error = Raised([&] { icon.SaveIcon(QStringLiteral("/dev/full")); });
        QCOMPARE(error.number(), 0x8004041Du);
        QCOMPARE(error.message(), QStringLiteral("General failure writing icon."));
    }

    void addImage_data()
    {
        QTest::addColumn<int>("side");
        QTest::addColumn<int>("colours");
        QTest::addColumn<int>("bitCount");
        QTest::addColumn<int>("storedCount");
        QTest::addColumn<int>("size");
        // 40 + 4 × colours + colour rows + mask rows.
        QTest::newRow("32 × 32, 16") << 32 << 16 << 4 << 16 << 744;
        QTest::newRow("2") << 16 << 2 << 1 << 2 << 40 + 8 + 64 + 64;
        QTest::newRow("256") << 16 << 256 << 8 << 0 << 40 + 1024 + 256 + 64;
        QTest::newRow("other") << 16 << 0 << 24 << 0 << 40 + 0 + 768 + 64;
        QTest::newRow("other, colours counted") << 16 << 5 << 24 << 0 << 40 + 20 + 768 + 64;
    }

    // A blank image: header, black palette (but white for colour 1 of a 1-bit image), zero bits, at offset 22.
    void addImage()
    {
        QFETCH(int, side);
        QFETCH(int, colours);
        QFETCH(int, bitCount);
        QFETCH(int, storedCount);
        QFETCH(int, size);
        cFileIcon icon;
        icon.AddImage(side, side, colours);
        QByteArray image = BlankBitmap(side, side, bitCount).left(16).leftJustified(size, '\0');
        if (bitCount == 1)
            image.replace(44, 3, "\xff\xff\xff");
        const QByteArray expected
            = BuildIconFile({{quint8(side), quint8(side), quint8(storedCount), 1, quint16(bitCount), image}});
        QCOMPARE(icon.toIconFile(), Patched<quint16>(expected, 2, 0)); // a new object's header says type 0
    }

    void addImageOffsets()
    {
        cFileIcon icon;
        icon.AddImage(16, 16, 2);
        icon.AddImage(32, 32, 16);
        QCOMPARE(offsets(icon), QList<quint32>({22, 0})); // a one-image icon is not shifted
        QVERIFY(icon.LoadIcon(written(BuildIconFile(ThreeImages))));
        icon.AddImage(64, 64, 256);
        QCOMPARE(icon.toIconFile(),
            BuildIconFile(ThreeImages + QList<IconImage> {{64, 64, 0, 1, 8, BlankBitmap(64, 64, 8)}}));
    }

    void addImageRefuses()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(BuildIconFile(ThreeImages))));
        const NumberedError error = Raised([&] { icon.AddImage(32, 32, 256); });
        QCOMPARE(error.number(), 0x80040419u);
        QCOMPARE(error.message(), QStringLiteral("Icon already exists."));
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(-1, 16, 16));
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(16, 16, 0x7FFFFFFF));
        QCOMPARE(icon.toIconFile(), BuildIconFile(ThreeImages));
    }

    void removeImage_data()
    {
        QTest::addColumn<int>("index");
        QTest::addColumn<QList<IconImage>>("kept");
        QTest::newRow("first") << 1 << ThreeImages.mid(1);
        QTest::newRow("middle") << 2 << QList<IconImage> {ThreeImages.at(0), ThreeImages.at(2)};
        QTest::newRow("last") << 3 << ThreeImages.mid(0, 2);
    }

    // Saved under the name it was loaded from, packed again.
    void removeImage()
    {
        QFETCH(int, index);
        QFETCH(QList<IconImage>, kept);
        const QString path = written(BuildIconFile(ThreeImages));
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(path));
        icon.RemoveImage(index);
        QVERIFY(icon.SaveIcon());
        QCOMPARE(ReadFile(path), BuildIconFile(kept));
    }

    void removeImageOutsideOrFromOneImage()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(BuildIconFile(ThreeImages))));
        icon.RemoveImage(7); // not found: the count still falls and the last place goes, offsets untouched
        QCOMPARE(offsets(icon), QList<quint32>({54, 350}));
        QCOMPARE(icon.imageBytes(2), BlankBitmap(32, 32, 8));
        cFileIcon one;
        one.AddImage(32, 32, 16);
        one.RemoveImage(5);
        QCOMPARE(one.ImageCount(), 0);
        QVERIFY_THROWS_EXCEPTION(NumberedError, one.entry(1));
    }

    void cloneCopiesEverything()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(written(BuildIconFile(ThreeImages))));
        cFileIcon target;
        target.AddImage(8, 8, 2);
        icon.CloneTo(target);
        icon.RemoveImage(1);
        QCOMPARE(target.Filename(), icon.Filename());
        QCOMPARE(target.toIconFile(), BuildIconFile(ThreeImages));
    }
};

BV_REGISTER_TEST(TestFileIcon);
#include "tst_cfileicon.moc"
