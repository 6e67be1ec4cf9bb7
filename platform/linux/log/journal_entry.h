#pragma once

#include <string>
#include <string_view>

#include "platform/log_facility.h"

namespace zal {

// One record in the journal's native protocol: fields one after the other, either
//
//     NAME=value\n                                     our own values, which have no line break
//     NAME\n | length (64 bits, little-endian) | value | \n      whatever came from a client
//
// The second form takes any bytes, so no text can end its field and begin another. Pure functions.

/// All of the entry but the bytes of its last field's value, MESSAGE, and the line feed behind them:
/// the line is large now and then, and need not be copied to be sent. `processId` goes into records
/// with process information.
void appendJournalEntryHead(std::string& target, const LogRecord& record, std::string_view processId);

/// What stands behind the line.
inline constexpr std::string_view kJournalEntryTail = "\n";

/// The whole entry.
void appendJournalEntry(std::string& target, const LogRecord& record, std::string_view processId);

}  // namespace zal
