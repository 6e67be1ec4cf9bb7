#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/linux/stackshot/records.h"

namespace zal::stackshot {

/// What a report amounts to, added up process by process.
struct ReportTotals {
  std::size_t processes = 0;
  std::size_t kernelProcesses = 0;
  std::size_t endedProcesses = 0;
  std::size_t threads = 0;
  std::size_t leftOutThreads = 0;
  std::size_t stacks = 0;
  std::map<std::string, std::size_t> troubles;  ///< threads of processes that are not the kernel's, by reason

  void add(const ProcessRecord& process);
};

struct ReportHeader {
  std::string title;
  /// What it was asked for, in order: "Reason" and its text.
  std::vector<std::pair<std::string, std::string>> subject;
  std::optional<std::uint32_t> code;
  std::string time;
  std::string host;
  std::string kernel;
  std::string writer;
  std::int64_t microseconds = 0;             ///< that it took
  std::int64_t longestHoldMicroseconds = 0;  ///< of any thread
  std::string endedEarly;                    ///< why; empty when everything is in it
};

/// The lines above the processes, with an empty one at their end. Texts of others are escaped.
[[nodiscard]] std::string headerText(const ReportHeader& header, const ReportTotals& totals);
/// One process with its threads, and an empty line.
[[nodiscard]] std::string processText(const ProcessRecord& process);

}  // namespace zal::stackshot
