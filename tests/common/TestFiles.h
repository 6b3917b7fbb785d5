#pragma once

#include <QByteArray>
#include <QMap>
#include <QStandardPaths>
#include <QString>

// Files and trees for tests. Every writer makes the missing parent folders and fails the test (qFatal is
// not used: the caller QVERIFYs the result) rather than leaving half a fixture behind.

bool WriteFile(const QString& path, const QByteArray& bytes = QByteArrayLiteral("MZ"));
QByteArray ReadFile(const QString& path);
// A file its owner may run (a shell script by default).
bool WriteExecutable(const QString& path, const QByteArray& bytes = QByteArrayLiteral("#!/bin/sh\nexit 0\n"));
bool MakeNamedPipe(const QString& path);
QByteArray RandomBytes(qsizetype size, quint32 seed);

// Every file below root (relative path -> bytes; folders as "path/" with empty bytes, links as their
// target prefixed with "->"), for "nothing was changed" checks.
QMap<QString, QByteArray> SnapshotTree(const QString& root);

// A tool or fixture the test needs: fails the test with what to install when it is missing, never skips.
// Use as: REQUIRE_TOOL("wrestool", "icoutils");
#define REQUIRE_TOOL(program, debianPackage)                                                                           \
    do {                                                                                                               \
        if (QStandardPaths::findExecutable(QStringLiteral(program)).isEmpty())                                         \
            QFAIL(qPrintable(QStringLiteral("%1 is missing: install the Debian package %2 (make test does)")           \
                                 .arg(QStringLiteral(program), QStringLiteral(debianPackage))));                       \
    } while (false)
#define REQUIRE_FIXTURE(condition, what)                                                                               \
    do {                                                                                                               \
        if (!(condition))                                                                                              \
            QFAIL(qPrintable(QStringLiteral("missing %1: build it with make test").arg(QStringLiteral(what))));        \
    } while (false)
