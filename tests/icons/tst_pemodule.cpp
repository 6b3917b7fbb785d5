#include "PeFixtures.h"
#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/PeModule.h"
#include "icons/cFileIcon.h"

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

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

} // namespace

class TestPeModule : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    cFileIcon mainIcon(const QByteArray& pe)
    {
        const QString path = m_env.path(u"crafted.exe"_s);
        cFileIcon icon;
        if (WriteFile(path, pe))
            icon.LoadMainIconFromEXE(path);
        return icon;
    }

private Q_SLOTS:
    // Its resources start where the section before ends.
    void validTreeLoads() { QCOMPARE(mainIcon(peWith(validIconTree())).ImageSize(1), 48); }

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
        QCOMPARE(mainIcon(pe).ImageCount(), 0);
    }
};

BV_REGISTER_TEST(TestPeModule);
#include "tst_pemodule.moc"
