#pragma once

#include <QList>
#include <QString>

namespace Brimvault {

// The built-in English text of every numbered text the program shows; a language file replaces them by
// number. The numbers of the publisher's games (from 5001) carry their English names.
QString BuiltInText(int number);

// Every number that has a built-in text, ascending. A complete language file has a text for each of them.
QList<int> BuiltInTextNumbers();

} // namespace Brimvault
