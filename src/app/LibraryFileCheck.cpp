#include "app/LibraryFileCheck.h"

#include <QFile>
#include <QFileInfo>

#if defined(Q_OF_ELF)
#include <elf.h>

#include <cstring>
#endif

namespace Brimvault {

#if defined(Q_OF_ELF)

namespace {

#if QT_POINTER_SIZE == 8
using ElfHeader = Elf64_Ehdr;
using ProgramHeader = Elf64_Phdr;
constexpr unsigned char OwnClass = ELFCLASS64;
#else
using ElfHeader = Elf32_Ehdr;
using ProgramHeader = Elf32_Phdr;
constexpr unsigned char OwnClass = ELFCLASS32;
#endif

// Offsets and sizes come from the file: added in 64 bits, so that no sum can wrap past the file's end.
bool inside(quint64 offset, quint64 count, quint64 entrySize, quint64 fileSize)
{
    if (entrySize != 0 && count > fileSize / entrySize)
        return false;
    const quint64 length = count * entrySize;
    return offset <= fileSize && length <= fileSize - offset;
}

template <typename T>
bool readAt(QFile& file, quint64 offset, T& value)
{
    QByteArray bytes;
    if (file.seek(qint64(offset)))
        bytes = file.read(qint64(sizeof(T)));
    if (bytes.size() != qsizetype(sizeof(T)))
        return false;
    std::memcpy(&value, bytes.constData(), sizeof(T));
    return true;
}

} // namespace

std::optional<QString> LibraryFileProblem(const QString& path)
{
    const QFileInfo info(path);
    if (!info.isFile())
        return QStringLiteral("%1 is not a file").arg(path);
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return QStringLiteral("%1 cannot be read: %2").arg(path, file.errorString());
    const quint64 fileSize = quint64(file.size());

    ElfHeader header {};
    if (!readAt(file, 0, header) || std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0)
        return QStringLiteral("%1 is not a shared library").arg(path);
    if (header.e_ident[EI_CLASS] != OwnClass || header.e_type != ET_DYN)
        return QStringLiteral("%1 is not a shared library for this system").arg(path);
    if (header.e_phentsize != sizeof(ProgramHeader) || header.e_phnum == 0
        || !inside(header.e_phoff, header.e_phnum, header.e_phentsize, fileSize))
        return QStringLiteral("%1 is damaged: its program headers are missing").arg(path);
    if (header.e_shnum != 0 && !inside(header.e_shoff, header.e_shnum, header.e_shentsize, fileSize))
        return QStringLiteral("%1 is cut off").arg(path);

    for (quint64 i = 0; i < header.e_phnum; ++i) {
        ProgramHeader segment {};
        if (!readAt(file, quint64(header.e_phoff) + i * sizeof(ProgramHeader), segment))
            return QStringLiteral("%1 is damaged: its program headers are missing").arg(path);
        if (segment.p_type == PT_LOAD && !inside(segment.p_offset, 1, segment.p_filesz, fileSize))
            return QStringLiteral("%1 is cut off").arg(path);
    }
    return std::nullopt;
}

#else

std::optional<QString> LibraryFileProblem(const QString&)
{
    return std::nullopt;
}

#endif

} // namespace Brimvault
