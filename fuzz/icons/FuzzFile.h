#pragma once

#include <QString>
#include <cstddef>
#include <cstdint>

// The readers under test take file names: each input is written to one scratch file, in memory where possible.
QString WriteFuzzInput(const uint8_t* data, size_t size);
