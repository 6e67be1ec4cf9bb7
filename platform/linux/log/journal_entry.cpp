#include "platform/linux/log/journal_entry.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>

#include "platform/linux/wire/little_endian.h"

namespace zal {
namespace {

constexpr int kLeastUrgent = 7;

void appendLengthOf(std::string& target, std::string_view value) {
  std::array<char, 8> length;
  storeLittle(length.data(), value.size(), length.size());
  target.append(length.data(), length.size());
}

void appendClientField(std::string& target, std::string_view nameLine, std::string_view value) {
  target.append(nameLine);
  appendLengthOf(target, value);
  target.append(value) += '\n';
}

}  // namespace

void appendJournalEntryHead(std::string& target, const LogRecord& record, std::string_view processId) {
  target.append("PRIORITY=");
  target += static_cast<char>('0' + std::clamp(record.level, 0, kLeastUrgent));
  target.append("\nSYSLOG_IDENTIFIER=zalloggingagent\n");
  if (record.processInformation) target.append("SYSLOG_PID=").append(processId) += '\n';
  if (record.time != 0) {
    std::array<char, 24> digits;
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), record.time).ptr;
    target.append("ZAL_TIME=").append(digits.data(), static_cast<std::size_t>(end - digits.data())) += '\n';
  }
  appendClientField(target, "ZAL_TYPE\n", record.type);
  appendClientField(target, "ZAL_CATEGORY\n", record.category);
  target.append("MESSAGE\n");
  appendLengthOf(target, record.line);
}

void appendJournalEntry(std::string& target, const LogRecord& record, std::string_view processId) {
  appendJournalEntryHead(target, record, processId);
  target.append(record.line).append(kJournalEntryTail);
}

}  // namespace zal
