#pragma once

#include "ui/main/FormScaling.h"

#include <QColor>
#include <QLatin1String>
#include <QRect>

class QSize;

// The main window's design: positions in twips at 96 dots per inch (15 twips to a pixel), fonts, colours.
namespace Brimvault::MainWindowDesign {

inline constexpr QRect FormTwips(0, 0, 11400, 8280);
inline constexpr QRect EmblemTwips(195, 150, 840, 840);
inline constexpr QRect Label3Twips(1140, 120, 5700, 660);
inline constexpr QRect Label2Twips(1170, 150, 5700, 660);
inline constexpr QRect Label4Twips(1170, 810, 7200, 300);
inline constexpr QRect ImgActionsTwips(9000, 330, 480, 480);
inline constexpr QRect LabActionsTwips(9570, 330, 1500, 480);
inline constexpr QRect HiddenImageTwips(0, 0, 480, 480);
inline constexpr QRect ListViewTwips(200, 1260, 11140, 6960);

inline constexpr qreal TitlePointSize = 22;
inline constexpr qreal CopyrightPointSize = 9.5;
inline constexpr qreal ActionsPointSize = 11;
inline constexpr qreal CaptionPointSize = 8;
inline constexpr int ActionsImageSize = 32;
inline constexpr int ActionsGapPixels = 6;

// The list's margins: left 200, top 1260, and 60 twips right and below (the width and height lose 260 and
// 1320 twips of the client area).
inline constexpr int ListLeft = 200;
inline constexpr int ListTop = 1260;
inline constexpr int ListWidthLoss = 260;
inline constexpr int ListHeightLoss = 1320;

// The list's place for a client area of the given size in pixels; an empty size when the window is too small.
QRect ListViewGeometry(const QSize& clientPixels, FormScaling::TwipsPerPixel screen);

inline constexpr int IconTimerIntervalMs = 10;
inline constexpr int BandGapPixels = 5;

// Started once the list is filled, without waiting; found in the program's folder first, then on the path.
inline constexpr QLatin1String ServiceUpdateCommand("BrimvaultService.exe -U");

QColor BandTopColor();
QColor BandBottomColor();
QColor BandEdgeColor();
QColor FrameColor();

} // namespace Brimvault::MainWindowDesign
