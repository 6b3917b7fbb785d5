#pragma once

#include <QFont>
#include <QList>
#include <QStringView>

#include <memory>
#include <vector>

class QFontMetricsF;

namespace Brimvault {

// Breaks captions into lines of a fixed width: at blanks where possible, anywhere inside a word that is
// wider than a whole line, and at line feeds. Measuring thousands of captions must stay cheap, so simple
// scripts are measured from a table of character advances; text that needs shaping is measured whole.
class CaptionWrapper {
public:
    struct Line {
        qsizetype start = 0;
        qsizetype length = 0;
        qreal width = 0;
    };

    explicit CaptionWrapper(const QFont& font = QFont());
    ~CaptionWrapper();

    void setFont(const QFont& font);
    const QFont& font() const { return m_font; }
    int lineSpacing() const { return m_lineSpacing; }
    int ascent() const { return m_ascent; }

    QList<Line> wrap(QStringView text, qreal width) const;
    int lineCount(QStringView text, qreal width) const;
    // Height of the caption box: one line at least, as an empty caption still takes a line.
    int height(QStringView text, qreal width) const;

private:
    template <typename Emit>
    void breakLines(QStringView text, qreal width, Emit&& emit) const;
    bool fillPrefix(QStringView text) const;
    qreal advance(char16_t c) const;

    QFont m_font;
    std::unique_ptr<QFontMetricsF> m_metrics;
    int m_lineSpacing = 0;
    int m_ascent = 0;
    mutable std::vector<float> m_advances;
    mutable std::vector<qreal> m_prefix;
};

} // namespace Brimvault
