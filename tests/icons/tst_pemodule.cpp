#include "TestEnvironment.h"
#include "icons/PeModule.h"
#include "icons/cFileIcon.h"

#include <QFile>
#include <QTest>
#include <QtEndian>

using namespace Brimvault;

namespace {

constexpr quint32 RsrcRva = 0x1000;

void put8(QByteArray& bytes, qint64 at, quint8 value)
{
    if (bytes.size() < at + 1)
        bytes.resize(at + 1, '\0');
    bytes[at] = char(value);
}

void put16(QByteArray& bytes, qint64 at, quint16 value)
{
    if (bytes.size() < at + 2)
        bytes.resize(at + 2, '\0');
    qToLittleEndian(value, bytes.data() + at);
}

void put32(QByteArray& bytes, qint64 at, quint32 value)
{
    if (bytes.size() < at + 4)
        bytes.resize(at + 4, '\0');
    qToLittleEndian(value, bytes.data() + at);
}

// A resource directory header at `at` followed by its entries: (name or id, target) pairs, written as given.
void putDirectory(
    QByteArray& rsrc, qint64 at, quint16 named, quint16 ids, const QList<QPair<quint32, quint32>>& entries)
{
    put16(rsrc, at + 12, named);
    put16(rsrc, at + 14, ids);
    for (qsizetype i = 0; i < entries.size(); ++i) {
        put32(rsrc, at + 16 + 8 * i, entries.at(i).first);
        put32(rsrc, at + 16 + 8 * i + 4, entries.at(i).second);
    }
}

void putDataEntry(QByteArray& rsrc, qint64 at, quint32 rva, quint32 size)
{
    put32(rsrc, at, rva);
    put32(rsrc, at + 4, size);
}

void putName(QByteArray& rsrc, qint64 at, const QString& name)
{
    put16(rsrc, at, quint16(name.size()));
    for (qsizetype i = 0; i < name.size(); ++i)
        put16(rsrc, at + 2 + 2 * i, name.at(i).unicode());
}

// A 32-bit PE image whose only section holds `rsrc` at the given file offset.
QByteArray peWith(const QByteArray& rsrc, quint32 rawPointer = 0x200, quint32 rawSize = 0)
{
    if (rawSize == 0)
        rawSize = quint32(rsrc.size());
    QByteArray pe(rawPointer, '\0');
    pe[0] = 'M';
    pe[1] = 'Z';
    put32(pe, 0x3C, 0x40);
    pe.replace(0x40, 4, QByteArray("PE\0\0", 4));
    put16(pe, 0x44, 0x14C);
    put16(pe, 0x46, 1); // sections
    put16(pe, 0x54, 224); // optional header size
    const qint64 optional = 0x58;
    put16(pe, optional, 0x10B);
    put32(pe, optional + 60, rawPointer); // size of headers
    put32(pe, optional + 92, 16);
    put32(pe, optional + 96 + 2 * 8, RsrcRva);
    put32(pe, optional + 96 + 2 * 8 + 4, quint32(rsrc.size()));
    const qint64 section = optional + 224;
    pe.replace(section, 6, QByteArray(".rsrc\0", 6));
    put32(pe, section + 8, quint32(qMax<qsizetype>(rsrc.size(), rawSize)));
    put32(pe, section + 12, RsrcRva);
    put32(pe, section + 16, rawSize);
    put32(pe, section + 20, rawPointer);
    pe.resize(rawPointer, '\0');
    return pe + rsrc.left(rawSize);
}

// Types 14 then 3 (a one-image group "#1" with image 1), the image bytes last: a minimal, valid tree.
QByteArray validIconTree(qint64 padding = 0)
{
    QByteArray rsrc;
    putDirectory(rsrc, 0, 0, 2, {{3, 0x80000000u | 0x30}, {14, 0x80000000u | 0x60}});
    putDirectory(rsrc, 0x30, 0, 1, {{1, 0x80000000u | 0x48}});
    putDirectory(rsrc, 0x48, 0, 1, {{0x409, 0xC0}});
    putDirectory(rsrc, 0x60, 0, 1, {{1, 0x80000000u | 0x78}});
    putDirectory(rsrc, 0x78, 0, 1, {{0x409, 0xD0}});
    const qint64 image = 0x100 + padding;
    putDataEntry(rsrc, 0xC0, quint32(RsrcRva + image), 48);
    putDataEntry(rsrc, 0xD0, RsrcRva + 0xE0, 20);
    // group: 0, 1, 1 image; entry 1 × 1, 2 colours, planes 1, 1 bit, 48 bytes, id 1
    put16(rsrc, 0xE0 + 2, 1);
    put16(rsrc, 0xE0 + 4, 1);
    put8(rsrc, 0xE6, 1);
    put8(rsrc, 0xE7, 1);
    put8(rsrc, 0xE8, 2);
    put16(rsrc, 0xEA, 1);
    put16(rsrc, 0xEC, 1);
    put32(rsrc, 0xEE, 48);
    put16(rsrc, 0xF2, 1);
    put32(rsrc, image, 40);
    put32(rsrc, image + 4, 1);
    put32(rsrc, image + 8, 2);
    put16(rsrc, image + 12, 1);
    put16(rsrc, image + 14, 1);
    rsrc.resize(image + 48, '\0');
    return rsrc;
}

QString keyText(const ResourceKey& key)
{
    return key.named ? key.name : QString::number(key.id);
}

} // namespace

class TestPeModule : public QObject {
    Q_OBJECT

private:
    TestEnvironment m_env;

    QString write(const QByteArray& bytes)
    {
        const QString path = m_env.path(QStringLiteral("crafted.exe"));
        QFile file(path);
        if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate) || file.write(bytes) != bytes.size())
            qFatal("cannot write");
        return path;
    }

private Q_SLOTS:
    void validTreeLoads()
    {
        cFileIcon icon;
        QVERIFY(icon.LoadMainIconFromEXE(write(peWith(validIconTree()))));
        QCOMPARE(icon.ResourceID(), QVariant(1));
        QCOMPARE(icon.ImageSize(1), 48);
    }

    void namedEntriesListedFirstWhateverTheStoredOrder()
    {
        QByteArray rsrc;
        putDirectory(rsrc, 0, 1, 2,
            {{9, 0x80000000u | 0x40}, {0x80000000u | 0x30, 0x80000000u | 0x40}, {4, 0x80000000u | 0x40}});
        putName(rsrc, 0x30, QStringLiteral("Zed"));
        putDirectory(rsrc, 0x40, 0, 0, {});
        const auto module = PeModule::fromBytes(peWith(rsrc)).module;
        QVERIFY(module);
        QStringList types;
        for (const ResourceKey& key : module->resourceTypes())
            types.append(keyText(key));
        QCOMPARE(types, QStringList({QStringLiteral("Zed"), QStringLiteral("9"), QStringLiteral("4")}));
    }

    void malformedTreesEndCleanly_data()
    {
        QTest::addColumn<QByteArray>("pe");
        QTest::addColumn<int>("types");

        QByteArray selfLoop;
        putDirectory(selfLoop, 0, 0, 1, {{14, 0x80000000u}});
        QTest::newRow("directory pointing at itself") << peWith(selfLoop) << 1;

        QByteArray hugeCount;
        putDirectory(hugeCount, 0, 0xFFFF, 0xFFFF, {{14, 0x80000000u | 0x20}});
        QTest::newRow("counts past the end") << peWith(hugeCount) << 1;

        QByteArray outside = validIconTree();
        putDataEntry(outside, 0xC0, 0x7FFF0000u, 48);
        QTest::newRow("image data outside every section") << peWith(outside) << 2;

        QByteArray overflow = validIconTree();
        putDataEntry(overflow, 0xC0, 0xFFFFFFF0u, 0x100);
        QTest::newRow("data range wrapping around") << peWith(overflow) << 2;

        QTest::newRow("image in the zero-filled tail") << peWith(validIconTree(), 0x200, 0x100) << 2;

        // Every type points at the same long run of entries, shifted by one entry each time.
        QByteArray overlapping;
        QList<QPair<quint32, quint32>> entries;
        for (quint32 i = 0; i < 2000; ++i)
            entries.append({i + 1, 0x80000000u | (16 + 8 * i)});
        putDirectory(overlapping, 0, 0, 2000, entries);
        QTest::newRow("overlapping directories") << peWith(overlapping) << 2000;

        QByteArray longName;
        putDirectory(longName, 0, 1, 0, {{0x80000000u | 0x20, 0x80000000u | 0x18}});
        putName(longName, 0x20, QString(0xFFFF, u'A').left(0x7FF0));
        put16(longName, 0x20, 0xFFFF);
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
        // A full walk never lists more leaves than the file has room for.
        QVERIFY(module->allResources().size() <= pe.size() / 16);
        cFileIcon icon;
        QVERIFY(!icon.LoadMainIconFromEXE(write(pe)));
        QCOMPARE(icon.ImageCount(), 0);
    }

    void fileShrinkingUnderTheReader()
    {
        // The icon lies 64 KiB in, past what opening the file reads.
        const QByteArray pe = peWith(validIconTree(0x10000));
        const QString path = write(pe);
        const auto module = PeModule::open(path).module;
        QVERIFY(module);
        QFile::resize(path, 0x8000);
        const auto group = module->findResource(ResourceKey::fromId(14), ResourceKey::fromId(1));
        QVERIFY(group);
        const auto image = module->findResource(ResourceKey::fromId(3), ResourceKey::fromId(1));
        QVERIFY(image);
        QCOMPARE(image->size, 48u);
        QVERIFY(!image->data);
    }

    void notExecutables_data()
    {
        QTest::addColumn<QByteArray>("bytes");
        QByteArray noSignature = peWith(validIconTree());
        noSignature[0x41] = 'X';
        QByteArray badMagic = peWith(validIconTree());
        put16(badMagic, 0x58, 0x107);
        QByteArray farHeader = peWith(validIconTree());
        put32(farHeader, 0x3C, 0xFFFFFFF0u);
        QByteArray manySections = peWith(validIconTree());
        put16(manySections, 0x46, 0xFFFF);
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("MZ only") << QByteArray("MZ");
        QTest::newRow("no PE signature") << noSignature;
        QTest::newRow("unknown optional header") << badMagic;
        QTest::newRow("header offset past the end") << farHeader;
        QTest::newRow("section table past the end") << manySections;
    }

    void notExecutables()
    {
        QFETCH(QByteArray, bytes);
        const auto opened = PeModule::fromBytes(bytes);
        QVERIFY(!opened.module);
        QCOMPARE(opened.error, PeError::BadFormat);
    }
};

QTEST_GUILESS_MAIN(TestPeModule)
#include "tst_pemodule.moc"
