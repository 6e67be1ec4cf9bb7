#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/clock.h"
#include "platform/linux/process/process_identity.h"

namespace zal {

/// One collection as its file tells it.
struct DumpProgressRecord {
  enum class State {
    running,
    done,
    failed,
    cutOff,  ///< it went without a word: given up, or its agent ended first
  };
  struct Step {
    std::string name;
    std::optional<WallTime> began;  ///< nothing: not yet, or passed over
  };
  struct Missing {
    std::string what;
    std::string why;
  };
  std::string service;
  std::string directory;
  WallTime began{};
  ProcessIdentity agent;
  std::vector<Step> steps;
  std::size_t currentStep = 0;  ///< the last one that began, counted from 1; 0: none did
  std::vector<Missing> missing;
  State state = State::running;
  std::string archivePath;        ///< when done
  std::string reason;             ///< when failed
  std::optional<WallTime> ended;  ///< nothing while it runs, or when the end was not written
};

/// The record that a file's text holds: docs/runtime-directory.md. A last line without its end and
/// lines that are not understood are passed over; nothing when the text does not begin with a record's
/// first line. Whatever stands in it, nothing worse happens. Knows nothing of processes: a record
/// without an end is running.
[[nodiscard]] std::optional<DumpProgressRecord> parseDumpProgress(std::string_view text);

// The lines, each with its end. Pure functions.

[[nodiscard]] std::string progressBeginText(std::string_view service, std::string_view directory,
                                            const std::vector<std::string>& steps, WallTime now,
                                            const ProcessIdentity& agent);
[[nodiscard]] std::string progressStepText(std::size_t number, WallTime now);
[[nodiscard]] std::string progressMissingText(std::string_view what, std::string_view why);
[[nodiscard]] std::string progressDoneText(std::string_view archivePath, WallTime now);
[[nodiscard]] std::string progressFailedText(std::string_view reason, WallTime now);
[[nodiscard]] std::string progressCutOffText(WallTime now);

}  // namespace zal
