#include "catalogue/ListedPaths.h"

namespace Brimvault {

namespace {

constexpr qsizetype RunLength = 4;
constexpr int TableBits = 20;

quint64 runHash(const QChar* run)
{
    quint64 packed = 0;
    for (qsizetype i = 0; i < RunLength; ++i)
        packed = (packed << 16) | run[i].unicode();
    return (packed * 0x9E3779B97F4A7C15ull) >> (64 - TableBits);
}

} // namespace

ListedPaths::ListedPaths()
    : m_runs((quint64(1) << TableBits) / 64, 0)
{ }

void ListedPaths::append(const QString& upperPath)
{
    const qsizetype start = qMax<qsizetype>(0, m_text.size() - (RunLength - 1));
    m_text += u'\t';
    m_text += upperPath;
    noteRunsFrom(start);
}

void ListedPaths::noteRunsFrom(qsizetype start)
{
    const QChar* chars = m_text.constData();
    for (qsizetype i = start; i + RunLength <= m_text.size(); ++i) {
        const quint64 bit = runHash(chars + i);
        m_runs[bit / 64] |= quint64(1) << (bit % 64);
    }
}

bool ListedPaths::mayContain(const QString& text) const
{
    const QChar* chars = text.constData();
    for (qsizetype i = 0; i + RunLength <= text.size(); ++i) {
        const quint64 bit = runHash(chars + i);
        if (!(m_runs[bit / 64] & (quint64(1) << (bit % 64))))
            return false;
    }
    return true;
}

bool ListedPaths::containsPiece(const QString& text) const
{
    return mayContain(text) && m_text.contains(text);
}

} // namespace Brimvault
