#pragma once

#include <QRgb>

namespace Brimvault::ListGrid {

inline constexpr int CellWidth = 80;
inline constexpr int RowGap = 14;
inline constexpr int CaptionGap = RowGap / 2;
inline constexpr int IconSize = 32;
inline constexpr int CaptionWidth = 64;
inline constexpr int SelectionMargin = 3;
inline constexpr int HighlightMilliseconds = 2300;
inline constexpr int MaxItems = 32767;

inline constexpr QRgb FrameFillColor = qRgb(190, 209, 237);
inline constexpr QRgb FrameBorderColor = qRgb(224, 224, 224);
inline constexpr QRgb CaptionColor = qRgb(255, 255, 255);
inline constexpr QRgb SelectedCaptionColor = qRgb(0, 0, 0);

// Colours are persisted the way the host's design data keeps them: 0x00BBGGRR.
inline constexpr quint32 DefaultBackColorValue = 0x00B8785Cu;

constexpr QRgb colorFromStored(quint32 value)
{
    return qRgb(int(value & 0xFFu), int((value >> 8) & 0xFFu), int((value >> 16) & 0xFFu));
}

constexpr quint32 colorToStored(QRgb color)
{
    return quint32(qRed(color)) | (quint32(qGreen(color)) << 8) | (quint32(qBlue(color)) << 16);
}

} // namespace Brimvault::ListGrid
