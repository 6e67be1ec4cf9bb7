#include "platform/linux/log/linux_agent_log.h"

#include <execinfo.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <utility>

#include "platform/linux/log/log_set_name.h"
#include "platform/linux/log/record_text.h"

namespace zal {
namespace {

// Severities as syslog counts them.
constexpr int kWarning = 4;
constexpr int kNotice = 5;
constexpr int kInformation = 6;
constexpr std::size_t kMostEarlyLines = 100;
constexpr int kMostFrames = 64;

void writeAll(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t count = ::write(descriptor, text.data(), text.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return;  // nobody is left who could be told
    text.remove_prefix(static_cast<std::size_t>(count));
  }
}

std::string categoryLabel(std::string_view category) {
  return category.empty() ? std::string() : std::string(category) + ": ";
}

}  // namespace

LinuxAgentLog::LinuxAgentLog(RunLoop& mainLoop, Options options)
    : _mainLoop(mainLoop), _options(std::move(options)) {}

void LinuxAgentLog::setLogFacility(PlatformLogFacility* facility) {
  _facility = facility;
  if (facility == nullptr) return;
  for (Line& line : std::exchange(_early, {})) _keep(std::move(line));
}

bool LinuxAgentLog::isEnabled(std::string_view category) const {
  return std::find(_options.categories.begin(), _options.categories.end(), category) !=
         _options.categories.end();
}

void LinuxAgentLog::log(std::string_view category, std::string_view text) {
  if (isEnabled(category)) _say(kInformation, categoryLabel(category), text);
}

void LinuxAgentLog::notice(std::string_view text) { _say(kNotice, "", text); }

void LinuxAgentLog::warning(std::string_view text) { _say(kWarning, "warning: ", text); }

void LinuxAgentLog::console(std::string_view category, std::string_view text) {
  _print(kInformation, categoryLabel(category), text);
}

void LinuxAgentLog::backtrace() {
  std::array<void*, kMostFrames> frames;
  const int count = ::backtrace(frames.data(), kMostFrames);
  const std::unique_ptr<char*, decltype(&std::free)> symbols(::backtrace_symbols(frames.data(), count),
                                                             &std::free);
  std::string text = "backtrace:";
  for (int i = 0; i < count; ++i) {
    text += '\n';
    text += symbols ? symbols.get()[i] : "(no symbol)";
  }
  warning(text);
}

void LinuxAgentLog::_say(int level, std::string_view label, std::string_view text) {
  _print(level, label, text);
  Line line{level, std::string(label).append(text)};
  if (std::this_thread::get_id() == _mainThread) {
    _keep(std::move(line));
  } else {
    _mainLoop.post([this, kept = std::move(line)]() mutable { _keep(std::move(kept)); });
  }
}

void LinuxAgentLog::_print(int level, std::string_view label, std::string_view text) const {
  // The journal takes each line for a message, so each carries the priority, and the label already
  // stands in it as a word.
  const std::string prefix =
      _options.forJournal ? "<" + std::to_string(level) + ">" : std::string("zalloggingagent: ");
  std::string whole = _options.forJournal && level == kWarning ? std::string() : std::string(label);
  whole += text;  // a label may come from a client and is escaped like the text
  std::string output = prefix;
  appendMarkedText(output, whole, _options.forJournal ? prefix : std::string_view());
  output += '\n';
  writeAll(_options.descriptor, output);
}

void LinuxAgentLog::_keep(Line line) {
  // A facility that complains about this very line is heard on standard error only.
  if (_isRecording) return;
  if (_facility == nullptr) {
    if (_early.size() < kMostEarlyLines) _early.push_back(std::move(line));
    return;
  }
  _isRecording = true;
  _facility->record({line.level, kDefaultLogSetName, kDefaultLogSetName, true, line.text, 0});
  _isRecording = false;
}

}  // namespace zal
