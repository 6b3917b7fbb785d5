#include "icons/VersionResource.h"

#include "icons/ByteReader.h"
#include "icons/PeLayout.h"
#include "icons/PeModule.h"

namespace Brimvault {

using namespace detail;

namespace {

constexpr quint16 RtVersion = 16;
constexpr quint16 VersionInfoId = 1;

qint64 align4(qint64 offset)
{
    return (offset + 3) & ~qint64(3);
}

} // namespace

VersionResource::VersionResource(QByteArray block)
    : m_block(std::move(block))
{ }

std::optional<VersionResource> VersionResource::fromFile(const QString& path)
{
    const PeModule::OpenResult opened = PeModule::open(path);
    if (!opened.module)
        return std::nullopt;
    const ResourceKey type = ResourceKey::fromId(RtVersion);
    auto found = opened.module->findResource(type, ResourceKey::fromId(VersionInfoId));
    if (!found) {
        const auto names = opened.module->resourceNames(type);
        if (names && !names->isEmpty())
            found = opened.module->findResource(type, names->first());
    }
    if (!found || !found->data || found->data->isEmpty())
        return std::nullopt;
    return VersionResource(found->data->toByteArray());
}

std::optional<VersionResource::Node> VersionResource::nodeAt(qint64 at, qint64 limit) const
{
    const ByteReader reader {QByteArrayView(m_block)};
    const auto length = reader.u16(at);
    if (!length || *length < VersionNodeHeader || at + *length > limit)
        return std::nullopt;
    Node node;
    node.start = at;
    node.end = at + *length;
    node.valueLength = *reader.u16(at + 2);
    node.type = *reader.u16(at + 4);
    qint64 keyEnd = at + VersionNodeHeader;
    while (keyEnd + 1 < node.end && reader.u16(keyEnd).value_or(0) != 0)
        keyEnd += 2;
    const QByteArrayView key = reader.bytesUpTo(at + VersionNodeHeader, keyEnd - at - VersionNodeHeader);
    node.key = QString::fromUtf16(reinterpret_cast<const char16_t*>(key.data()), key.size() / 2);
    node.valueStart = qMin(align4(keyEnd + 2), node.end);
    const qint64 valueBytes = node.type == 1 ? qint64(node.valueLength) * 2 : node.valueLength;
    node.childrenStart = qMin(align4(node.valueStart + valueBytes), node.end);
    return node;
}

std::optional<VersionResource::Node> VersionResource::find(const QString& path) const
{
    auto node = nodeAt(0, m_block.size());
    if (!node)
        return std::nullopt;
    const QStringList parts = path.split(u'\\', Qt::SkipEmptyParts);
    if (parts.size() > VersionTreeDepth)
        return std::nullopt;
    for (const QString& part : parts) {
        std::optional<Node> match;
        qint64 at = node->childrenStart;
        while (at < node->end && !match) {
            const auto child = nodeAt(at, node->end);
            if (!child)
                break;
            if (child->key.compare(part, Qt::CaseInsensitive) == 0)
                match = child;
            // Every node is at least six bytes long, so the walk always moves on.
            at = align4(child->end);
        }
        if (!match)
            return std::nullopt;
        node = match;
    }
    return node;
}

std::optional<QByteArray> VersionResource::queryValue(const QString& path) const
{
    const auto node = find(path);
    if (!node)
        return std::nullopt;
    const qint64 valueBytes = node->type == 1 ? qint64(node->valueLength) * 2 : node->valueLength;
    return m_block.mid(node->valueStart, qMin(valueBytes, node->end - node->valueStart));
}

std::optional<QString> VersionResource::queryString(const QString& path) const
{
    const auto node = find(path);
    if (!node)
        return std::nullopt;
    // Compilers disagree on whether a text's length counts characters or bytes: read up to the NUL instead.
    const ByteReader reader {QByteArrayView(m_block)};
    qint64 end = node->valueStart;
    while (end + 1 < node->end && reader.u16(end).value_or(0) != 0)
        end += 2;
    const QByteArrayView text = reader.bytesUpTo(node->valueStart, end - node->valueStart);
    return QString::fromUtf16(reinterpret_cast<const char16_t*>(text.data()), text.size() / 2);
}

const QStringList& VersionFieldNames()
{
    static const QStringList names {
        QStringLiteral("CompanyName"),
        QStringLiteral("FileDescription"),
        QStringLiteral("FileVersion"),
        QStringLiteral("InternalName"),
        QStringLiteral("LegalCopyright"),
        QStringLiteral("OriginalFileName"),
        QStringLiteral("ProductName"),
        QStringLiteral("ProductVersion"),
    };
    return names;
}

std::optional<VersionStrings> ReadVersionStrings(const VersionResource& block)
{
    const auto translation = block.queryValue(QStringLiteral("\\VarFileInfo\\Translation"));
    if (!translation || translation->size() < 4)
        return std::nullopt;
    const auto byte = [&](int i) { return quint32(quint8(translation->at(i))); };
    const quint32 number = byte(3) * 256 + byte(2) + byte(0) * 65536 + byte(1) * 16777216;
    VersionStrings strings;
    strings.translation = QString::number(number, 16).rightJustified(8, u'0').toUpper();
    for (const QString& field : VersionFieldNames()) {
        const auto value
            = block.queryString(QStringLiteral("\\StringFileInfo\\") + strings.translation + u'\\' + field);
        strings.values.append(value.value_or(QString()));
    }
    return strings;
}

std::optional<VersionStrings> ReadVersionStrings(const QString& path)
{
    const auto block = VersionResource::fromFile(path);
    if (!block)
        return std::nullopt;
    return ReadVersionStrings(*block);
}

} // namespace Brimvault
