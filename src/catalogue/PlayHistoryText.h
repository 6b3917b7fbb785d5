#pragma once

#include <QString>

namespace Brimvault {

struct PlayRecord;

namespace PlayHistoryText {

// "Last played 23/11/2026 23:15, played for 3 h 12 min (14 times)" or "Never played", in the language in
// force; the date in the user's locale.
QString Summary(const PlayRecord& record);
// "3 h 12 min", "5 min".
QString Duration(qint64 seconds);

} // namespace PlayHistoryText
} // namespace Brimvault
