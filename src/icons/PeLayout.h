#pragma once

// Byte layouts of the PE image, its resource directory, icon files and version blocks. Private to src/icons.

#include <QtGlobal>

namespace Brimvault::detail {

// DOS and PE headers
constexpr quint16 DosMagic = 0x5A4D; // "MZ"
constexpr qint64 DosPeOffsetField = 0x3C;
constexpr quint32 PeSignature = 0x00004550; // "PE\0\0"
constexpr qint64 FileHeaderSize = 20;
constexpr qint64 FileHeaderSectionCount = 2;
constexpr qint64 FileHeaderOptionalSize = 16;
constexpr quint16 OptionalMagic32 = 0x10B;
constexpr quint16 OptionalMagic64 = 0x20B;
constexpr qint64 Optional32DataDirCount = 92;
constexpr qint64 Optional32DataDirs = 96;
constexpr qint64 Optional64DataDirCount = 108;
constexpr qint64 Optional64DataDirs = 112;
constexpr qint64 OptionalSizeOfHeaders = 60;
constexpr quint32 ResourceDataDirIndex = 2;
constexpr qint64 DataDirSize = 8;

// Section header (40 bytes)
constexpr qint64 SectionHeaderSize = 40;
constexpr qint64 SectionVirtualSize = 8;
constexpr qint64 SectionVirtualAddress = 12;
constexpr qint64 SectionRawSize = 16;
constexpr qint64 SectionRawPointer = 20;

// Resource directory
constexpr qint64 ResDirHeaderSize = 16;
constexpr qint64 ResDirNamedCount = 12;
constexpr qint64 ResDirIdCount = 14;
constexpr qint64 ResDirEntrySize = 8;
constexpr quint32 ResHighBit = 0x80000000u;
constexpr qint64 ResDataEntrySize = 16;
// Longer names are cut: no real file has them, and a crafted file could otherwise make every entry cost 128 KiB.
constexpr quint16 MaxResourceNameLength = 512;

// Icon file header and directory entry
constexpr qint64 IconHeaderSize = 6;
constexpr qint64 IconDirEntrySize = 16;
constexpr qint64 GroupEntrySize = 14;

// Bitmap information header inside an icon image
constexpr qint64 BmpHeaderSize = 40;
constexpr qint64 BmpWidth = 4;
constexpr qint64 BmpHeight = 8;
constexpr qint64 BmpPlanes = 12;
constexpr qint64 BmpBitCount = 14;
constexpr qint64 BmpCompression = 16;
constexpr qint64 BmpClrUsed = 32;
constexpr quint32 BmpBitFields = 3;
constexpr int MaxDecodedSide = 1024;

// VS_VERSIONINFO nodes
constexpr qint64 VersionNodeHeader = 6;
constexpr int VersionTreeDepth = 8;

} // namespace Brimvault::detail
