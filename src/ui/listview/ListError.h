#pragma once

#include <QString>

namespace Brimvault {

// An error an operation of the list hands back to its host; number 0 means none.
struct ListError {
    int number = 0;
    QString description;

    explicit operator bool() const { return number != 0; }

    static ListError missingElement(int index);
    static ListError overflow();
};

} // namespace Brimvault
