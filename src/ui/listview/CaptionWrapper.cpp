#include "ui/listview/CaptionWrapper.h"

#include <QFontMetricsF>

#include <cmath>

namespace Brimvault {

namespace {

// Latin, Greek and Cyrillic without combining marks: each character's advance adds up to the line's width.
constexpr char16_t TableLimit = 0x0530;

bool isSimple(char16_t c)
{
    return c < TableLimit && !(c >= 0x0300 && c < 0x0370) && !(c >= 0x0483 && c < 0x048A);
}

bool isBlank(char16_t c)
{
    return c == u' ';
}

} // namespace

CaptionWrapper::CaptionWrapper(const QFont& font)
{
    setFont(font);
}

CaptionWrapper::~CaptionWrapper() = default;

void CaptionWrapper::setFont(const QFont& font)
{
    m_font = font;
    m_metrics = std::make_unique<QFontMetricsF>(font);
    m_lineSpacing = int(std::ceil(m_metrics->lineSpacing()));
    m_ascent = int(std::ceil(m_metrics->ascent()));
    m_advances.assign(TableLimit, -1.0f);
}

qreal CaptionWrapper::advance(char16_t c) const
{
    float& cached = m_advances[c];
    if (cached < 0)
        cached = float(m_metrics->horizontalAdvance(QChar(c)));
    return cached;
}

// Fills the prefix sums of the text's advances; false when the text needs shaping and is measured whole.
bool CaptionWrapper::fillPrefix(QStringView text) const
{
    m_prefix.resize(std::size_t(text.size()) + 1);
    m_prefix[0] = 0;
    for (qsizetype i = 0; i < text.size(); ++i) {
        const char16_t c = text[i].unicode();
        if (!isSimple(c))
            return false;
        m_prefix[std::size_t(i) + 1] = m_prefix[std::size_t(i)] + advance(c);
    }
    return true;
}

template <typename Emit>
void CaptionWrapper::breakLines(QStringView text, qreal width, Emit&& emit) const
{
    const bool simple = fillPrefix(text);
    auto widthOf = [&](qsizetype from, qsizetype to) -> qreal {
        if (simple)
            return m_prefix[std::size_t(to)] - m_prefix[std::size_t(from)];
        return m_metrics->horizontalAdvance(text.mid(from, to - from).toString());
    };
    auto nextBoundary = [&](qsizetype i) {
        return (i + 1 < text.size() && text[i].isHighSurrogate() && text[i + 1].isLowSurrogate()) ? i + 2 : i + 1;
    };

    qsizetype paragraph = 0;
    while (paragraph <= text.size()) {
        qsizetype end = text.indexOf(u'\n', paragraph);
        const qsizetype next = end < 0 ? text.size() + 1 : end + 1;
        if (end < 0)
            end = text.size();
        qsizetype stop = end;
        if (stop > paragraph && text[stop - 1] == u'\r')
            --stop;

        qsizetype lineStart = paragraph;
        bool emitted = false;
        while (lineStart < stop || !emitted) {
            // Take whole words while they fit; trailing blanks never count.
            qsizetype fitEnd = lineStart;
            qsizetype i = lineStart;
            while (i < stop) {
                qsizetype wordStart = i;
                while (wordStart < stop && isBlank(text[wordStart].unicode()))
                    ++wordStart;
                qsizetype wordEnd = wordStart;
                while (wordEnd < stop && !isBlank(text[wordEnd].unicode()))
                    ++wordEnd;
                if (wordEnd == wordStart || widthOf(lineStart, wordEnd) > width)
                    break;
                fitEnd = wordEnd;
                i = wordEnd;
            }
            if (fitEnd == lineStart) {
                qsizetype wordStart = lineStart;
                while (wordStart < stop && isBlank(text[wordStart].unicode()))
                    ++wordStart;
                qsizetype wordEnd = wordStart;
                while (wordEnd < stop && !isBlank(text[wordEnd].unicode()))
                    ++wordEnd;
                if (wordEnd == wordStart) {
                    // Nothing but blanks remains.
                    if (!emitted)
                        emit(lineStart, 0, 0.0);
                    emitted = true;
                    break;
                }
                // A word wider than the line is broken between characters; each line takes one at least.
                fitEnd = nextBoundary(lineStart);
                while (fitEnd < wordEnd) {
                    const qsizetype candidate = nextBoundary(fitEnd);
                    if (widthOf(lineStart, candidate) > width)
                        break;
                    fitEnd = candidate;
                }
                // A hyphen that fits ends the line, as any word-wrapping text widget breaks after it.
                if (fitEnd < wordEnd) {
                    for (qsizetype hyphen = fitEnd - 1; hyphen > lineStart; --hyphen) {
                        if (text[hyphen] == u'-') {
                            fitEnd = hyphen + 1;
                            break;
                        }
                    }
                }
            }
            emit(lineStart, fitEnd - lineStart, widthOf(lineStart, fitEnd));
            emitted = true;
            lineStart = fitEnd;
            while (lineStart < stop && isBlank(text[lineStart].unicode()))
                ++lineStart;
        }
        paragraph = next;
    }
}

QList<CaptionWrapper::Line> CaptionWrapper::wrap(QStringView text, qreal width) const
{
    QList<Line> lines;
    breakLines(text, width, [&](qsizetype start, qsizetype length, qreal lineWidth) {
        lines.append(Line {start, length, lineWidth});
    });
    return lines;
}

int CaptionWrapper::lineCount(QStringView text, qreal width) const
{
    int count = 0;
    breakLines(text, width, [&](qsizetype, qsizetype, qreal) { ++count; });
    return count;
}

int CaptionWrapper::height(QStringView text, qreal width) const
{
    return std::max(1, lineCount(text, width)) * m_lineSpacing;
}

} // namespace Brimvault
