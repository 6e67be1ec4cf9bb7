#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "platform/log_facility.h"

namespace zal {

// How records stand in a log file: docs/log-format.md. Pure functions.

/// What every line of a text but its first begins with. No record begins like that, so what a client
/// writes after a line break cannot pass for a record.
inline constexpr std::string_view kContinuationMark = "    | ";

/// Appends the text with its further lines marked and its control characters (but tab) escaped as
/// "\x1b". Does not end the last line. `linePrefix` goes before each mark.
void appendMarkedText(std::string& target, std::string_view text, std::string_view linePrefix = {});

/// Appends the text as part of one line: line breaks are escaped like all other control characters.
void appendOneLine(std::string& target, std::string_view text);

/// Appends one record with its line end. `timeText` is the local time as it shall stand there,
/// `processText` what a record with process information has before its line.
void appendRecord(std::string& target, const LogRecord& record, std::string_view timeText,
                  std::string_view processText);

/// Where the first record that begins after `offset` begins; the text's size when there is none.
/// `offset` itself counts as inside a record.
[[nodiscard]] std::size_t nextRecordStart(std::string_view text, std::size_t offset);
/// How many records begin in the text, the first of which must begin at its start.
[[nodiscard]] std::size_t countRecords(std::string_view text);

}  // namespace zal
