#include "IconTestSupport.h"
#include "TestEnvironment.h"
#include "icons/NumberedError.h"
#include "icons/cFileIcon.h"

#include <QFile>
#include <QTest>
#include <QtEndian>

using namespace Brimvault;
using IconTest::blankBitmap;
using IconTest::buildIconFile;

class TestFileIcon : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    QString write(const QString& name, const QByteArray& bytes)
    {
        const QString path = m_env.path(name);
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly) || file.write(bytes) != bytes.size())
            qFatal("cannot write %s", qPrintable(path));
        return path;
    }

    static QByteArray readAll(const QString& path)
    {
        QFile file(path);
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }

    // Runs f and answers the NumberedError it raised, or number 0 when none.
    template <typename F>
    static NumberedError raised(F f)
    {
        try {
            f();
        } catch (const NumberedError& error) {
            return error;
        }
        return NumberedError(0, QString(), QString());
    }

    static QByteArray threeImageIcon()
    {
        return buildIconFile({{16, 16, 16, 1, 4, blankBitmap(16, 16, 4)}, {32, 32, 0, 1, 8, blankBitmap(32, 32, 8)},
            {48, 48, 0, 1, 32, blankBitmap(48, 48, 32)}});
    }

private Q_SLOTS:
    void loadRefusesBrokenFiles_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<QString>("message");
        QTest::addColumn<int>("countAfter");

        const QByteArray image = blankBitmap(16, 16, 4);
        QByteArray shortImages = buildIconFile({{16, 16, 16, 1, 4, image}});
        shortImages.chop(10);
        QByteArray hugeSize = buildIconFile({{16, 16, 16, 1, 4, image}});
        qToLittleEndian<quint32>(0xFFFFFFF0u, hugeSize.data() + 6 + 8);
        QByteArray pastEnd = buildIconFile({{16, 16, 16, 1, 4, image}});
        qToLittleEndian<quint32>(0x7FFFFFF0u, pastEnd.data() + 6 + 12);
        QByteArray missingEntry = buildIconFile({{16, 16, 16, 1, 4, image}}).left(6 + 16);
        qToLittleEndian<quint16>(2, missingEntry.data() + 4);

        QTest::newRow("no images") << QByteArray("\0\0\1\0\0\0", 6) << "Icon contains no images." << 0;
        QTest::newRow("negative count") << QByteArray("\0\0\1\0\xff\xff", 6) << "Icon contains no images." << -1;
        QTest::newRow("reserved set") << QByteArray("\1\0\1\0\1\0", 6) << "File is not icon type (reserved member is 0)"
                                      << 1;
        QTest::newRow("cursor") << QByteArray("\0\0\2\0\1\0", 6) << "File is not icon type (idType <> IMAGE_ICON)" << 1;
        QTest::newRow("empty file") << QByteArray() << "File is not icon type (idType <> IMAGE_ICON)" << 0;
        QTest::newRow("png named .ico") << QByteArray("\x89PNG\r\n\x1a\n", 8)
                                        << "File is not icon type (reserved member is 0)" << 0x0A0D;
        QTest::newRow("directory short") << missingEntry << "Icon Directory Array is Corrupt." << 0;
        QTest::newRow("image short") << shortImages << "Icon Images Array is Corrupt." << 0;
        QTest::newRow("size beyond file") << hugeSize << "Icon Images Array is Corrupt." << 0;
        QTest::newRow("offset beyond file") << pastEnd << "Icon Images Array is Corrupt." << 0;
    }

    void loadRefusesBrokenFiles()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(QString, message);
        QFETCH(int, countAfter);
        const QString path = write(QStringLiteral("broken.ico"), bytes);
        cFileIcon icon;
        QVERIFY(!icon.LoadIcon(path));
        QCOMPARE(icon.lastLoadMessage(), message);
        QCOMPARE(icon.Filename(), path);
        QCOMPARE(icon.ImageCount(), countAfter);
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.ImageWidth(1));
    }

    void loadMissingFileFails()
    {
        cFileIcon icon;
        QVERIFY(!icon.LoadIcon(m_env.path(QStringLiteral("nowhere/none.ico"))));
        QCOMPARE(icon.ImageCount(), 0);
        QCOMPARE(icon.lastLoadMessage(), QStringLiteral("File is not icon type (idType <> IMAGE_ICON)"));
    }

    void packedFileRoundTripsByteForByte_data()
    {
        QTest::addColumn<QString>("path");
        QTest::newRow("built here") << write(QStringLiteral("three.ico"), threeImageIcon());
        if (IconTest::fixturesBuilt()) {
            QTest::newRow("icotool, five images with PNG") << IconTest::iconInput(QStringLiteral("main.ico"));
            QTest::newRow("icotool, 32-bit") << IconTest::iconInput(QStringLiteral("other.ico"));
        }
    }

    void packedFileRoundTripsByteForByte()
    {
        QFETCH(QString, path);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(path));
        const QString copy = m_env.path(QStringLiteral("copy.ico"));
        QVERIFY(icon.SaveIcon(copy));
        QCOMPARE(icon.Filename(), copy);
        QCOMPARE(readAll(copy), readAll(path));
        QCOMPARE(icon.toIconFile(), readAll(path));
    }

    void loadKeepsOffsetsAsGiven()
    {
        // A gap between directory and image: the offset is kept, the image read from where it points.
        QByteArray bytes = buildIconFile({{16, 16, 16, 1, 4, blankBitmap(16, 16, 4)}});
        bytes.insert(22, QByteArray(10, 'x'));
        qToLittleEndian<quint32>(32, bytes.data() + 6 + 12);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("gap.ico"), bytes)));
        QCOMPARE(icon.entry(1).dwImageOffset, 32u);
        QCOMPARE(icon.imageBytes(1), blankBitmap(16, 16, 4));
    }

    // Large files: a directory or images that lie beyond what one read takes in, or straddle its end.
    void loadReadsLargeFilesWhole_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QTest::addColumn<int>("count");

        QList<IconTest::FakeImage> many;
        for (int i = 0; i < 5000; ++i) {
            QByteArray image = blankBitmap(1, 1, 1);
            image[40] = char(i % 256); // each image its own bytes
            image[41] = char(i / 256);
            many.append({1, 1, 2, 1, 1, image});
        }
        QTest::newRow("5,000 images, directory past the first read") << buildIconFile(many) << 5000;

        QByteArray farImage = buildIconFile({{16, 16, 16, 1, 4, blankBitmap(16, 16, 4)}});
        farImage.insert(22, QByteArray(200000, 'x'));
        qToLittleEndian<quint32>(22 + 200000, farImage.data() + 6 + 12);
        QTest::newRow("image far past the first read") << farImage << 1;

        QByteArray straddling = buildIconFile({{32, 32, 0, 1, 8, blankBitmap(32, 32, 8)},
            {48, 48, 0, 1, 32, blankBitmap(48, 48, 32)}, {255, 255, 0, 1, 32, blankBitmap(255, 255, 32)}});
        QVERIFY(straddling.size() > 65536);
        QTest::newRow("image across the end of the first read") << straddling << 3;
    }

    void loadReadsLargeFilesWhole()
    {
        QFETCH(QByteArray, bytes);
        QFETCH(int, count);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("large.ico"), bytes)));
        QCOMPARE(icon.ImageCount(), count);
        for (int i = 1; i <= count; ++i) {
            const IconDirEntry& entry = icon.entry(i);
            QCOMPARE(icon.imageBytes(i), bytes.mid(entry.dwImageOffset, entry.dwBytesInRes));
        }
    }

    void loadRefusesAFolder()
    {
        cFileIcon icon;
        QVERIFY(!icon.LoadIcon(m_env.root()));
        QCOMPARE(icon.ImageCount(), 0);
    }

    void queries_data()
    {
        QTest::addColumn<int>("colourCount");
        QTest::addColumn<int>("bitCount");
        QTest::addColumn<qint64>("expected");
        QTest::newRow("32-bit") << 0 << 32 << qint64(-1);
        QTest::newRow("8-bit") << 0 << 8 << qint64(256);
        QTest::newRow("4-bit with count") << 16 << 4 << qint64(16);
        QTest::newRow("4-bit without count") << 0 << 4 << qint64(16);
        QTest::newRow("24-bit") << 0 << 24 << qint64(16777216);
        QTest::newRow("bit count 0") << 0 << 0 << qint64(1);
        QTest::newRow("count wins over bits") << 2 << 32 << qint64(2);
    }

    void queries()
    {
        QFETCH(int, colourCount);
        QFETCH(int, bitCount);
        QFETCH(qint64, expected);
        const QByteArray image = blankBitmap(24, 16, 8);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(
            QStringLiteral("q.ico"), buildIconFile({{24, 16, quint8(colourCount), 1, quint16(bitCount), image}}))));
        QCOMPARE(icon.ImageColourCount(1), expected);
        QCOMPARE(icon.ImageWidth(1), 24);
        QCOMPARE(icon.ImageHeight(1), 16);
        QCOMPARE(icon.ImageSize(1), int(image.size()));
    }

    void queriesOutsideTheImagesRaise_data()
    {
        QTest::addColumn<int>("index");
        QTest::newRow("0") << 0;
        QTest::newRow("past the end") << 4;
        QTest::newRow("negative") << -1;
    }

    void queriesOutsideTheImagesRaise()
    {
        QFETCH(int, index);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("three.ico"), threeImageIcon())));
        const NumberedError error = raised([&] { icon.ImageColourCount(index); });
        QCOMPARE(error.number(), SubscriptOutOfRange);
        QVERIFY(error.source().endsWith(QStringLiteral(".cFileIcon")));
    }

    void saveErrors()
    {
        cFileIcon neverLoaded;
        NumberedError error = raised([&] { neverLoaded.SaveIcon(); });
        QCOMPARE(error.number(), 0x8004041Bu);
        QCOMPARE(error.message(), QStringLiteral("No filename specified."));
        QCOMPARE(error.source(), ErrorSource(QStringLiteral("cFileIcon")));

        error = raised([&] { neverLoaded.SaveIcon(m_env.path(QStringLiteral("empty.ico"))); });
        QCOMPARE(error.number(), 0x8004041Cu);
        QCOMPARE(error.message(), QStringLiteral("Icon contains no images."));
        QVERIFY(!QFile::exists(m_env.path(QStringLiteral("empty.ico"))));

        cFileIcon icon;
        icon.AddImage(16, 16, 2);
        error = raised([&] { icon.SaveIcon(m_env.path(QStringLiteral("no/such/folder/x.ico"))); });
        QCOMPARE(error.number(), 0x8004041Cu);
        QCOMPARE(error.message(), QStringLiteral("Couldn't open file for writing."));
    }

    void saveUsesTheLoadedNameByDefault()
    {
        const QString path = write(QStringLiteral("again.ico"), threeImageIcon());
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(path));
        icon.RemoveImage(3);
        QVERIFY(icon.SaveIcon());
        cFileIcon reread;
        QVERIFY(reread.LoadIcon(path));
        QCOMPARE(reread.ImageCount(), 2);
    }

    void addImageToEmptyIcon()
    {
        cFileIcon icon;
        icon.AddImage(32, 32, 16);
        QCOMPARE(icon.ImageCount(), 1);
        const IconDirEntry& e = icon.entry(1);
        QCOMPARE(int(e.bWidth), 32);
        QCOMPARE(int(e.bHeight), 32);
        QCOMPARE(int(e.bColorCount), 16);
        QCOMPARE(int(e.bReserved), 0);
        QCOMPARE(int(e.wPlanes), 1);
        QCOMPARE(int(e.wBitCount), 4);
        QCOMPARE(e.dwBytesInRes, 744u);
        QCOMPARE(e.dwImageOffset, 22u);
        const QByteArray image = icon.imageBytes(1);
        QCOMPARE(image.size(), 744);
        QCOMPARE(qFromLittleEndian<quint32>(image.constData()), 40u);
        QCOMPARE(qFromLittleEndian<qint32>(image.constData() + 4), 32);
        QCOMPARE(qFromLittleEndian<qint32>(image.constData() + 8), 64);
        QCOMPARE(qFromLittleEndian<quint16>(image.constData() + 14), quint16(4));
        QCOMPARE(image.mid(40).count('\0'), 744 - 40);
    }

    void addImageKinds_data()
    {
        QTest::addColumn<int>("colours");
        QTest::addColumn<int>("bitCount");
        QTest::addColumn<int>("storedCount");
        QTest::addColumn<int>("size");
        // 40 + 4 × colours + colour rows + mask rows, for a 16 × 16 image.
        QTest::newRow("2") << 2 << 1 << 2 << 40 + 8 + 64 + 64;
        QTest::newRow("16") << 16 << 4 << 16 << 40 + 64 + 128 + 64;
        QTest::newRow("256") << 256 << 8 << 0 << 40 + 1024 + 256 + 64;
        QTest::newRow("other") << 0 << 24 << 0 << 40 + 0 + 768 + 64;
        QTest::newRow("other, colours counted") << 5 << 24 << 0 << 40 + 20 + 768 + 64;
    }

    void addImageKinds()
    {
        QFETCH(int, colours);
        QFETCH(int, bitCount);
        QFETCH(int, storedCount);
        QFETCH(int, size);
        cFileIcon icon;
        icon.AddImage(16, 16, colours);
        QCOMPARE(int(icon.entry(1).wBitCount), bitCount);
        QCOMPARE(int(icon.entry(1).bColorCount), storedCount);
        QCOMPARE(icon.ImageSize(1), size);
        const QByteArray white("\xff\xff\xff\0", 4);
        QCOMPARE(icon.imageBytes(1).mid(44, 4) == white, bitCount == 1);
    }

    void addImageToOneImageIconKeepsTheQuirk()
    {
        cFileIcon icon;
        icon.AddImage(16, 16, 2);
        icon.AddImage(32, 32, 16);
        QCOMPARE(icon.entry(1).dwImageOffset, 22u);
        QCOMPARE(icon.entry(2).dwImageOffset, 0u);
    }

    void addImageShiftsOffsetsPastTheDirectory()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("three.ico"), threeImageIcon())));
        QList<quint32> before;
        for (int i = 1; i <= 3; ++i)
            before.append(icon.entry(i).dwImageOffset);
        icon.AddImage(64, 64, 256);
        QCOMPARE(icon.ImageCount(), 4);
        for (int i = 1; i <= 3; ++i)
            QCOMPARE(icon.entry(i).dwImageOffset, before.at(i - 1) + 16);
        QCOMPARE(icon.entry(4).dwImageOffset, icon.entry(3).dwImageOffset + icon.entry(3).dwBytesInRes);
        // Packed back to back, the result loads again and matches.
        const QString path = m_env.path(QStringLiteral("four.ico"));
        QVERIFY(icon.SaveIcon(path));
        cFileIcon reread;
        QVERIFY(reread.LoadIcon(path));
        QCOMPARE(reread.imageBytes(4), icon.imageBytes(4));
    }

    void addImageRefusesADuplicate()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("three.ico"), threeImageIcon())));
        const NumberedError error = raised([&] { icon.AddImage(32, 32, 256); });
        QCOMPARE(error.number(), 0x80040419u);
        QCOMPARE(error.message(), QStringLiteral("Icon already exists."));
        QCOMPARE(icon.ImageCount(), 3);
        QCOMPARE(icon.entry(1).dwImageOffset, 54u);
    }

    void addImageRefusesImpossibleSizes()
    {
        cFileIcon icon;
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(-1, 16, 16));
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.AddImage(16, 16, 0x7FFFFFFF));
        QCOMPARE(icon.ImageCount(), 0);
    }

    void removeImage_data()
    {
        QTest::addColumn<int>("index");
        QTest::addColumn<QList<int>>("keptWidths");
        QTest::addColumn<bool>("packed");
        QTest::newRow("first") << 1 << QList<int> {32, 48} << true;
        QTest::newRow("middle") << 2 << QList<int> {16, 48} << true;
        QTest::newRow("last") << 3 << QList<int> {16, 32} << true;
        // Not found: the count still falls and the last place goes, offsets untouched.
        QTest::newRow("outside") << 7 << QList<int> {16, 32} << false;
    }

    void removeImage()
    {
        QFETCH(int, index);
        QFETCH(QList<int>, keptWidths);
        QFETCH(bool, packed);
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("three.ico"), threeImageIcon())));
        icon.RemoveImage(index);
        QCOMPARE(icon.ImageCount(), 2);
        for (int i = 1; i <= 2; ++i) {
            QCOMPARE(icon.ImageWidth(i), keptWidths.at(i - 1));
            QCOMPARE(qFromLittleEndian<qint32>(icon.imageBytes(i).constData() + 4), keptWidths.at(i - 1));
        }
        if (packed) {
            QCOMPARE(icon.entry(1).dwImageOffset, 6u + 32u);
            QCOMPARE(icon.entry(2).dwImageOffset, icon.entry(1).dwImageOffset + icon.entry(1).dwBytesInRes);
        } else {
            QCOMPARE(icon.entry(1).dwImageOffset, 6u + 48u);
        }
    }

    void removingTheOnlyImageEmptiesTheIcon()
    {
        cFileIcon icon;
        icon.AddImage(32, 32, 16);
        icon.RemoveImage(5);
        QCOMPARE(icon.ImageCount(), 0);
        QVERIFY_THROWS_EXCEPTION(NumberedError, icon.entry(1));
    }

    void cloneCopiesEverything()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadIcon(write(QStringLiteral("three.ico"), threeImageIcon())));
        cFileIcon target;
        target.AddImage(8, 8, 2);
        icon.CloneTo(target);
        QCOMPARE(target.Filename(), icon.Filename());
        QCOMPARE(target.ImageCount(), 3);
        QCOMPARE(target.toIconFile(), icon.toIconFile());
        icon.RemoveImage(1);
        QCOMPARE(target.ImageCount(), 3);
        QCOMPARE(target.imageBytes(1), blankBitmap(16, 16, 4));
    }
};

QTEST_GUILESS_MAIN(TestFileIcon)
#include "tst_cfileicon.moc"
