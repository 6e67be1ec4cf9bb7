#include "platform/linux/tessel/tessel.h"

#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <memory>
#include <variant>

#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/tessel/arguments.h"
#include "platform/linux/tessel/journal_source.h"
#include "platform/linux/tessel/kernel_source.h"
#include "platform/linux/tessel/line_output.h"
#include "platform/linux/tessel/syslog_source.h"

namespace zal::tessel {
namespace {

constexpr int kDone = 0;
constexpr int kNoLog = 1;
constexpr int kWrongUsage = 2;

int fail(int code, const std::string& trouble) {
  (void)LineOutput(STDERR_FILENO).write("tessel: " + trouble + "\n");
  return code;
}

/// The best place there is; `trouble` collects what is wrong with those before it.
std::unique_ptr<LogSource> openSource(const Arguments& arguments, const Clock& clock, std::string& trouble) {
  const auto note = [&](const std::string& one) { trouble += (trouble.empty() ? "" : "; ") + one; };
  const bool usual = !arguments.namesASource();
  std::string one;
  if (usual || arguments.journalDirectory) {
    if (auto journal = JournalSource::open(arguments.journalDirectory, clock, one)) return journal;
    note(one);
  }
  if (usual || arguments.syslogFile) {
    const std::vector<std::string> paths =
        usual ? std::vector<std::string>{"/var/log/syslog", "/var/log/messages"}
              : std::vector{*arguments.syslogFile};
    one.clear();
    if (auto syslog = SyslogSource::open(paths, clock, one)) return syslog;
    note(one);
  }
  if (usual || arguments.kernelLog) {
    if (auto kernel = KernelSource::open(arguments.kernelLog.value_or("/dev/kmsg"), clock, one))
      return kernel;
    note(one);
  }
  return nullptr;
}

/// Nothing is older than 1970, however far back was asked for.
std::optional<WallTime> oldestWanted(std::optional<std::chrono::seconds> lookBack, const Clock& clock) {
  if (!lookBack) return std::nullopt;
  const WallTime now = clock.wallNow();
  return now - std::min(*lookBack, std::chrono::floor<std::chrono::seconds>(now.time_since_epoch()));
}

}  // namespace

int run(const std::vector<std::string>& words) {
  const auto parsed = parseArguments(words);
  if (const auto* trouble = std::get_if<std::string>(&parsed))
    return fail(kWrongUsage, *trouble + "; see tessel --help");
  const auto& arguments = std::get<Arguments>(parsed);
  LineOutput output(STDOUT_FILENO);
  if (arguments.help) return output.write(helpText()) ? kDone : fail(kNoLog, output.trouble());

  const LinuxClock clock;
  std::string trouble;
  const auto source = openSource(arguments, clock, trouble);
  if (!source) return fail(kNoLog, "no log can be read: " + trouble);
  if (arguments.follow) return fail(kNoLog, source->follow(output));
  const auto failed = source->print(oldestWanted(arguments.lookBack, clock), output);
  return failed ? fail(kNoLog, *failed) : kDone;
}

}  // namespace zal::tessel
