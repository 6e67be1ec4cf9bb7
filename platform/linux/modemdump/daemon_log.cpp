#include "platform/linux/modemdump/daemon_log.h"

#include <algorithm>
#include <cstdint>
#include <filesystem>
#include <system_error>
#include <vector>

#include "platform/linux/files/readable_text.h"
#include "platform/linux/helper/bounded_program.h"
#include "platform/linux/modemdump/modem_manager.h"

namespace zal::modemdump {
namespace {

constexpr std::uint64_t kMostFileBytes = std::uint64_t{1} << 20U;
constexpr std::string_view kEverything = "DEBUG";
constexpr const char* kName = "at.log";

/// While it lives ModemManager says everything, if it lets itself be told.
class LoudModemManager {
 public:
  LoudModemManager(SystemBus& bus, std::string usualLevel) : _bus(bus), _usualLevel(std::move(usualLevel)) {
    const auto answer = _bus.call(_method(), {std::string(kEverything)});
    if (const auto* trouble = std::get_if<Trouble>(&answer)) _trouble = trouble->text;
  }
  // A call without an answer in time may have come through all the same.
  ~LoudModemManager() { (void)_bus.callAtTheEnd(_method(), {_usualLevel}); }
  LoudModemManager(const LoudModemManager&) = delete;
  LoudModemManager& operator=(const LoudModemManager&) = delete;
  /// Why it says no more than usual; empty when it does.
  [[nodiscard]] const std::string& trouble() const { return _trouble; }

 private:
  static BusMethod _method() { return {kModemManager, kModemManagerPath, kModemManager, "SetLogging"}; }
  SystemBus& _bus;
  const std::string _usualLevel;
  std::string _trouble;
};

LogSettings settingsOfModemManager(SystemBus& bus, const std::string& root) {
  const auto answer = bus.call(
      {"org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "GetConnectionUnixProcessID"},
      {kModemManager});
  std::uint32_t process = 0;
  if (std::holds_alternative<Trouble>(answer) ||
      sd_bus_message_read(std::get<BusMessage>(answer).get(), "u", &process) < 0)
    return {};
  return logSettings(readableText(root + "/proc/" + std::to_string(process) + "/cmdline"));
}

/// The end of the file from a line's beginning on.
std::string endOfFile(const std::string& path) {
  std::error_code error;
  const auto size = std::filesystem::file_size(path, error);
  if (error) return {};
  const bool isCut = size > kMostFileBytes;
  const std::string text = readableText(path, isCut ? static_cast<long long>(size - kMostFileBytes) : 0);
  return isCut ? text.substr(text.find('\n') + 1) : text;
}

/// Where the daemons' lines are, one after the other: its own file, the journal, the syslog files.
void writeLines(const std::string& ownFile, const std::string& root, const std::string& remark,
                helper::DumpFiles& files, helper::Patience& patience) {
  const auto written = [&](const std::string& text, const std::string& source) {
    if (!text.empty()) files.write(kName, text, source + (remark.empty() ? "" : "; " + remark));
    return !text.empty();
  };
  if (!ownFile.empty()) {
    if (written(endOfFile(root + ownFile), ownFile)) return;
    files.missing(ownFile, "cannot be read or is empty");
  }
  const auto journal = helper::runBounded({"journalctl", "-q", "--no-pager", "-o", "short-precise", "--since",
                                           "-10m", "-t", "ModemManager", "-t", "ofonod"},
                                          patience);
  if (written(journal.output, "the journal")) return;
  files.missing("journalctl", journal.trouble.empty() ? "has no line of a modem's daemon" : journal.trouble);
  for (const char* const name : {"/var/log/syslog", "/var/log/messages"}) {
    if (written(modemLines(endOfFile(root + name)), name)) return;
    files.missing(name, "has no line of a modem's daemon, or cannot be read");
  }
}

}  // namespace

LogSettings logSettings(std::string_view commandLine) {
  std::vector<std::string> words;
  while (!commandLine.empty()) {
    words.emplace_back(commandLine.substr(0, commandLine.find('\0')));
    commandLine.remove_prefix(std::min(commandLine.size(), words.back().size() + 1));
  }
  LogSettings settings;
  for (std::size_t i = 1; i < words.size(); ++i) {
    const auto take = [&](std::string_view option, std::string& value) {
      if (words[i] == option && i + 1 < words.size()) value = words[i + 1];
      if (words[i].starts_with(std::string(option) + "=")) value = words[i].substr(option.size() + 1);
    };
    take("--log-level", settings.level);
    take("--log-file", settings.file);
    if (words[i] == "--debug") settings.level = kEverything;
  }
  if (!settings.file.starts_with('/')) settings.file.clear();
  return settings;
}

std::string modemLines(std::string_view syslog) {
  std::string lines;
  while (!syslog.empty()) {
    const std::string_view line = syslog.substr(0, syslog.find('\n'));
    if (line.find(" ModemManager[") != std::string_view::npos ||
        line.find(" ofonod[") != std::string_view::npos)
      lines += std::string(line) + "\n";
    syslog.remove_prefix(std::min(syslog.size(), line.size() + 1));
  }
  return lines;
}

void writeDaemonLog(SystemBus& bus, const ModemDaemon& daemon, const std::string& root,
                    std::chrono::milliseconds length, const std::function<void()>& meanwhile,
                    helper::DumpFiles& files, helper::Patience& patience) {
  LogSettings settings;
  std::string remark;
  if (daemon.kind == ModemDaemon::Kind::modemManager) {
    settings = settingsOfModemManager(bus, root);
    if (settings.level == kEverything) {
      meanwhile();
    } else {
      const LoudModemManager loud(bus, settings.level);
      meanwhile();
      if (loud.trouble().empty()) {
        patience.pause(length);
      } else {
        remark = "at its usual level: " + loud.trouble();
      }
    }
  }
  writeLines(settings.file, root, remark, files, patience);
}

}  // namespace zal::modemdump
