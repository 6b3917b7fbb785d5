#include "TestEnvironment.h"
#include "TestFiles.h"
#include "TestSuite.h"
#include "icons/PeModule.h"
#include "icons/cFileIcon.h"

#include <QtEndian>

using namespace Brimvault;

namespace {

constexpr quint32 RsrcRva = 0x1000;
constexpr quint32 Subdirectory = 0x80000000u;

template <typename T>
void put(QByteArray& bytes, qint64 at, T value)
{
    if (bytes.size() < at + qint64(sizeof(T)))
        bytes.resize(at + qint64(sizeof(T)), '\0');
    qToLittleEndian<T>(value, bytes.data() + at);
}

// A resource directory at `at`: its counts, then the (name or id, target) pairs as given.
void putDirectory(
    QByteArray& rsrc, qint64 at, quint16 named, quint16 ids, const QList<std::pair<quint32, quint32>>& entries)
{
    put<quint16>(rsrc, at + 12, named);
    put<quint16>(rsrc, at + 14, ids);
    for (qsizetype i = 0; i < entries.size(); ++i) {
        put<quint32>(rsrc, at + 16 + 8 * i, entries.at(i).first);
        put<quint32>(rsrc, at + 20 + 8 * i, entries.at(i).second);
    }
}

void putName(QByteArray& rsrc, qint64 at, const QString& name)
{
    put<quint16>(rsrc, at, quint16(name.size()));
    for (qsizetype i = 0; i < name.size(); ++i)
        put<quint16>(rsrc, at + 2 + 2 * i, name.at(i).unicode());
}

// A 32-bit PE image whose only section holds `rsrc` at the given file offset.
QByteArray peWith(const QByteArray& rsrc, quint32 rawPointer = 0x200, quint32 rawSize = 0)
{
    rawSize = rawSize ? rawSize : quint32(rsrc.size());
    QByteArray pe = QByteArray("MZ").leftJustified(rawPointer, '\0');
    put<quint32>(pe, 0x3C, 0x40);
    pe.replace(0x40, 4, QByteArray("PE\0\0", 4));
    put<quint16>(pe, 0x44, 0x14C);
    put<quint16>(pe, 0x46, 1); // sections
    put<quint16>(pe, 0x54, 224); // optional header size
    put<quint16>(pe, 0x58, 0x10B);
    put<quint32>(pe, 0x58 + 60, rawPointer); // size of headers
    put<quint32>(pe, 0x58 + 92, 16);
    put<quint32>(pe, 0x58 + 112, RsrcRva);
    put<quint32>(pe, 0x58 + 116, quint32(rsrc.size()));
    const qint64 section = 0x58 + 224;
    pe.replace(section, 6, QByteArray(".rsrc\0", 6));
    put<quint32>(pe, section + 8, quint32(qMax<qsizetype>(rsrc.size(), rawSize)));
    put<quint32>(pe, section + 12, RsrcRva);
    put<quint32>(pe, section + 16, rawSize);
    put<quint32>(pe, section + 20, rawPointer);
    return pe + rsrc.left(rawSize);
}

// Types 3 and 14: a one-image group 1 (1 × 1, 1-bit, 48 bytes) and its image 1, which lies `padding` further on.
QByteArray validIconTree(qint64 padding = 0)
{
    QByteArray rsrc;
    putDirectory(rsrc, 0, 0, 2, {{3, Subdirectory | 0x30}, {14, Subdirectory | 0x60}});
    putDirectory(rsrc, 0x30, 0, 1, {{1, Subdirectory | 0x48}});
    putDirectory(rsrc, 0x48, 0, 1, {{0x409, 0xC0}});
    putDirectory(rsrc, 0x60, 0, 1, {{1, Subdirectory | 0x78}});
    putDirectory(rsrc, 0x78, 0, 1, {{0x409, 0xD0}});
    const qint64 image = 0x100 + padding;
    put<quint32>(rsrc, 0xC0, quint32(RsrcRva + image));
    put<quint32>(rsrc, 0xC4, 48);
    put<quint32>(rsrc, 0xD0, RsrcRva + 0xE0);
    put<quint32>(rsrc, 0xD4, 20);
    rsrc.resize(0xE0, '\0');
    rsrc += QByteArray::fromHex("0000 0100 0100 01010200 0100 0100 30000000 0100"); // the group, at 0xE0
    rsrc.resize(image, '\0');
    rsrc += QByteArray::fromHex("28000000 01000000 02000000 0100 0100") + QByteArray(32, '\0');
    return rsrc;
}

} // namespace

class TestPeModule : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    QString written(const QByteArray& bytes)
    {
        const QString path = m_env.path(QStringLiteral("crafted.exe"));
        return WriteFile(path, bytes) ? path : QString();
    }

private Q_SLOTS:
    void validTreeLoads()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadMainIconFromEXE(written(peWith(validIconTree()))));
        QCOMPARE(icon.ResourceID(), QVariant(1));
        QCOMPARE(icon.ImageSize(1), 48);
    }

    void namedEntriesListedFirstWhateverTheStoredOrder()
    {
        QByteArray rsrc;
        putDirectory(rsrc, 0, 1, 2,
            {{9, Subdirectory | 0x40}, {Subdirectory | 0x30, Subdirectory | 0x40}, {4, Subdirectory | 0x40}});
        putName(rsrc, 0x30, QStringLiteral("Zed"));
        putDirectory(rsrc, 0x40, 0, 0, {});
        const auto module = PeModule::fromBytes(peWith(rsrc)).module;
        QVERIFY(module);
        QStringList types;
        for (const ResourceKey& key : module->resourceTypes())
            types.append(key.named ? key.name : QString::number(key.id));
        QCOMPARE(types, QStringList({QStringLiteral("Zed"), QStringLiteral("9"), QStringLiteral("4")}));
    }

    void malformedTreesEndCleanly_data()
    {
        QTest::addColumn<QByteArray>("pe");
        QTest::addColumn<int>("types");
        QByteArray selfLoop;
        putDirectory(selfLoop, 0, 0, 1, {{14, Subdirectory}});
        QTest::newRow("directory pointing at itself") << peWith(selfLoop) << 1;
        QByteArray hugeCount;
        putDirectory(hugeCount, 0, 0xFFFF, 0xFFFF, {{14, Subdirectory | 0x20}});
        QTest::newRow("counts past the end") << peWith(hugeCount) << 1;
        QByteArray outside = validIconTree();
        put<quint32>(outside, 0xC0, 0x7FFF0000u);
        QTest::newRow("image data outside every section") << peWith(outside) << 2;
        QByteArray overflow = validIconTree();
        put<quint32>(overflow, 0xC0, 0xFFFFFFF0u);
        put<quint32>(overflow, 0xC4, 0x100);
        QTest::newRow("data range wrapping around") << peWith(overflow) << 2;
        QTest::newRow("image in the zero-filled tail") << peWith(validIconTree(), 0x200, 0x100) << 2;
        // Every type points at the same long run of entries, shifted by one entry each time.
        QByteArray overlapping;
        QList<std::pair<quint32, quint32>> entries;
        for (quint32 i = 0; i < 2000; ++i)
            entries.append({i + 1, Subdirectory | (16 + 8 * i)});
        putDirectory(overlapping, 0, 0, 2000, entries);
        QTest::newRow("overlapping directories") << peWith(overlapping) << 2000;
        QByteArray longName;
        putDirectory(longName, 0, 1, 0, {{Subdirectory | 0x20, Subdirectory | 0x18}});
        putName(longName, 0x20, QString(0x7FF0, u'A'));
        put<quint16>(longName, 0x20, 0xFFFF);
        QTest::newRow("name longer than the file") << peWith(longName) << 1;
    }

    void malformedTreesEndCleanly()
    {
        QFETCH(QByteArray, pe);
        QFETCH(int, types);
        const auto module = PeModule::fromBytes(pe).module;
        QVERIFY(module);
        const QList<ResourceKey> found = module->resourceTypes();
        QCOMPARE(found.size(), types);
        for (const ResourceKey& key : found)
            QVERIFY(key.name.size() <= 512);
        QVERIFY(module->allResources().size() <= pe.size() / 16); // never more leaves than the file has room for
        cFileIcon icon;
        QVERIFY(!icon.LoadMainIconFromEXE(written(pe)));
        QCOMPARE(icon.ImageCount(), 0);
    }

    void fileShrinkingUnderTheReader()
    {
        // The icon lies 64 KiB in, past what opening the file reads.
        const QString path = written(peWith(validIconTree(0x10000)));
        const auto module = PeModule::open(path).module;
        QVERIFY(module);
        QFile::resize(path, 0x8000);
        QVERIFY(module->findResource(ResourceKey::fromId(14), ResourceKey::fromId(1)));
        const auto image = module->findResource(ResourceKey::fromId(3), ResourceKey::fromId(1));
        QVERIFY(image);
        QCOMPARE(image->size, 48u);
        QVERIFY(!image->data);
    }

    void notExecutables_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        const QByteArray valid = peWith(validIconTree());
        const auto changed = [&valid](qint64 at, const QByteArray& bytes) {
            QByteArray out = valid;
            return out.replace(at, bytes.size(), bytes);
        };
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("no PE signature") << changed(0x41, "X");
        QTest::newRow("unknown optional header") << changed(0x58, QByteArray("\x07\x01", 2));
        QTest::newRow("header offset past the end") << changed(0x3C, "\xf0\xff\xff\xff");
        QTest::newRow("section table past the end") << changed(0x46, "\xff\xff");
    }

    void notExecutables()
    {
        QFETCH(QByteArray, bytes);
        const auto opened = PeModule::fromBytes(bytes);
        QVERIFY(!opened.module);
        QCOMPARE(opened.error, PeError::BadFormat);
    }
};

BV_REGISTER_TEST(TestPeModule);
#include "tst_pemodule.moc"
