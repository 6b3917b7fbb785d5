#pragma once

#include "icons/cFileIcon.h"

#include "PeFixtures.h"

// A valid icon file: the main icon of a built executable fixture; empty when the fixture is missing.
inline QByteArray ValidIconFile()
{
    Brimvault::cFileIcon icon;
    return icon.LoadMainIconFromEXE(PeFixture(QStringLiteral("multi64.exe"))) ? icon.toIconFile() : QByteArray();
}
