#pragma once

#include <QColor>
#include <QPixmap>

// A game-like 32 x 32 picture with transparent corners: a rounded square of `color` with a white letter.
QPixmap GamePicture(const QColor& color, QChar letter);
