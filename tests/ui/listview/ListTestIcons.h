#pragma once

#include <QColor>
#include <QPixmap>

// Game-like 32 x 32 pictures with transparent corners, drawn for the tests.
QPixmap makeTestIcon(const QColor& color, QChar letter);
