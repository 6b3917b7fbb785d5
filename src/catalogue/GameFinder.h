#pragma once

#include <QHash>
#include <QString>

#include <vector>

namespace Brimvault {

// Finding games as the user types. Text is folded once per game (letter case and accents dropped, so é is
// e and ё is е), so that a key press costs a scan of prepared text, not a rebuild.
namespace GameFinder {

QString Fold(QStringView text);

// What a game is found by: its caption with every blank dropped (list building breaks long names with
// blanks of its own), and the words of its file name, each preceded by one blank.
struct FindKey {
    QString caption;
    QString nameWords;
};
FindKey MakeFindKey(const QString& caption, const QString& path);

// What was typed. An empty query (blanks only) finds everything.
class Query {
public:
    explicit Query(const QString& typed = QString());
    bool isEmpty() const { return m_compact.isEmpty(); }
    // The caption contains the text, or a word of the file name starts with it.
    bool matches(const FindKey& key) const;

private:
    QString m_compact;
    QString m_wordStart;
};

// Find keys kept by list position, made again when the text at that position is no longer the same one (a
// rename, a removal, a new list). A key press then costs two pointer comparisons per game.
class KeyCache {
public:
    const FindKey& keyAt(int index, const QString& caption, const QString& path);
    void clear() { m_keys.clear(); }

private:
    struct Entry {
        QString caption;
        QString path;
        FindKey key;
    };
    std::vector<Entry> m_keys;
};

} // namespace GameFinder
} // namespace Brimvault
