#pragma once

#include <QString>

// Ruffle as the build copies it beside the program (build/bin/ruffle): its script and its WebAssembly.
// Empty when it is there, else what is missing and how to install it.
QString MissingRuffle();

// Tests that play Flash fail, naming what to install, when Ruffle is missing.
#define REQUIRE_RUFFLE() QVERIFY2(MissingRuffle().isEmpty(), qPrintable(MissingRuffle()))

// A copy of the program's Ruffle files (host page, script, WebAssembly) in `folder`, to be damaged by a test.
bool CopyRuffleTo(const QString& folder);
