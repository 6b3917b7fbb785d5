#pragma once

#include <QString>

#include <vector>

namespace Brimvault {

// The paths discovery has listed, as one text of tab-separated upper-case paths, and the question whether a
// text is a piece of it. The answer is exactly that of a substring search over the whole text; a table of
// the four-character runs seen so far answers most "no"s without the search.
class ListedPaths {
public:
    ListedPaths();

    void append(const QString& upperPath);
    bool containsPiece(const QString& text) const;

    const QString& text() const { return m_text; }

private:
    void noteRunsFrom(qsizetype start);
    bool mayContain(const QString& text) const;

    QString m_text;
    std::vector<quint64> m_runs; // one bit per hashed four-character run
};

} // namespace Brimvault
