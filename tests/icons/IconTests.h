#pragma once

#include "icons/NumberedError.h"

#include <QByteArray>
#include <QtEndian>

// Runs f and answers the NumberedError it raised, or one numbered 0 when none.
template <typename F>
Brimvault::NumberedError Raised(F f)
{
    try {
        f();
    } catch (const Brimvault::NumberedError& error) {
        return error;
    }
    return Brimvault::NumberedError(0, QString(), QString());
}

// The bytes with a little-endian value written over them at `at`.
template <typename T>
QByteArray Patched(QByteArray bytes, qsizetype at, T value)
{
    qToLittleEndian<T>(value, bytes.data() + at);
    return bytes;
}
