#include "catalogue/ListedPaths.h"

namespace Brimvault {

namespace {

constexpr qsizetype RunLength = 4;
constexpr int TableBits = 20;

quint64 tableBit(quint64 run)
{
    return (run * 0x9E3779B97F4A7C15ull) >> (64 - TableBits);
}

// Calls `visit` with the table bit of every four-character run of the text, each run packed into 64 bits;
// one character shifts in and the oldest falls out at each step.
template <typename Visit>
bool forEachRun(const QChar* chars, qsizetype size, Visit visit)
{
    quint64 run = 0;
    for (qsizetype i = 0; i < size; ++i) {
        run = (run << 16) | chars[i].unicode();
        if (i + 1 >= RunLength && !visit(tableBit(run)))
            return false;
    }
    return true;
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
    forEachRun(m_text.constData() + start, m_text.size() - start, [this](quint64 bit) {
        m_runs[bit / 64] |= quint64(1) << (bit % 64);
        return true;
    });
}

bool ListedPaths::mayContain(const QString& text) const
{
    return forEachRun(text.constData(), text.size(),
        [this](quint64 bit) { return (m_runs[bit / 64] & (quint64(1) << (bit % 64))) != 0; });
}

bool ListedPaths::containsPiece(const QString& text) const
{
    return mayContain(text) && m_text.contains(text);
}

} // namespace Brimvault
