#include "tests/e2e/agent_sandbox.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <map>
#include <regex>
#include <sstream>
#include <stdexcept>

#include "platform/linux/log/rotation_names.h"
#include "platform/linux/notifications/notification_file.h"

namespace zal::testing {
namespace {

constexpr const char* kSystemVersion = R"(<?xml version="1.0" encoding="UTF-8"?>
<plist version="1.0"><dict>
<key>ProductBuildVersion</key><string>21A5</string>
<key>ProductVersion</key><string>7.1</string>
<key>ProductName</key><string>Test OS</string>
</dict></plist>
)";

/// A stackshot stops every thread that it sees: among process ids of its own it sees none of this machine.
void writeStackshotTool(const std::string& path, const std::string& program) {
  writeFile(path, "#!/bin/sh\nexec " + ownProcessIds() + " '" + program + "' \"$@\"\n");
  std::filesystem::permissions(path, std::filesystem::perms(0755));
}

/// The content of an archive's one member; empty when there is no archive.
std::string unzipped(const std::string& archive) {
  if (!std::filesystem::exists(archive)) return "";
  const std::string command = "unzip -p '" + archive + "'";
  FILE* const output = ::popen(command.c_str(), "r");
  if (output == nullptr) throw std::runtime_error("cannot run unzip");
  std::string text;
  char buffer[65536];
  for (std::size_t count = 0; (count = std::fread(buffer, 1, sizeof buffer, output)) > 0;)
    text.append(buffer, count);
  if (::pclose(output) != 0) throw std::runtime_error("unzip failed for " + archive);
  return text;
}

}  // namespace

std::string ownProcessIds() {
  return std::string("unshare") + (::geteuid() == 0 ? "" : " --user --map-root-user") +
         " --pid --fork --mount-proc";
}

AgentSandbox::AgentSandbox() : stateRoot(_directory / "state"), bus("unix:path=" + (_directory / "no-bus")) {
  for (const char* name : {"run", "config", "home", "tmp", "state", "tools"}) {
    std::filesystem::create_directories(_directory / name);
  }
  writeFile(_directory / "config/version.plist", kSystemVersion);
  const std::filesystem::path programs = std::filesystem::path(ZAL_AGENT_PATH).parent_path();
  for (const char* name : {"tessel", "secretlist", "lirra-modemdump", "lirra-wifidump"}) {
    std::filesystem::create_symlink(programs / name, _directory / ("tools/" + std::string(name)));
  }
  writeStackshotTool(_directory / "tools/lirra-stackshot", programs / "lirra-stackshot");
  setSwitches({"CallLogging"});
}

void AgentSandbox::writeConfiguration() const {
  std::ostringstream text;
  text << "[roots]\n";
  const std::pair<const char*, std::string> roots[] = {
      {"UserLogRoot", logRoot()},
      {"DiagnosticReportRoot", reportRoot()},
      {"WirelessLogRoot", _directory / "wireless"},
      {"RootReportRoot", _directory / "root-reports"},
      {"SystemLogRoot", _directory / "system"},
      {"NetworkConfigRoot", _directory / "network"},
      {"LocationCacheDir", _directory / "location"},
      {"TemporaryRoot", _directory / "tmp"},
      {"VarLogRoot", _directory / "var-log"},
      {"RuntimeRoot", _directory / "runtime"},
      {"StateRoot", _directory / "home/kept"},
  };
  for (const auto& [key, value] : roots) text << key << " = '" << value << "'\n";
  text << "[log]\n" << logSettings;
  text << "[disk]\n" << diskSettings;
  text << "[commands]\n" << commandSettings << "toolDirectory = '" << (_directory / "tools") << "'\n";
  text << "[device]\nSystemVersionFile = '" << (_directory / "config/version.plist") << "'\n" << settings;
  writeFile(configurationFile(), text.str());
}

void AgentSandbox::setSwitches(const std::vector<std::string>& switchedOn) const {
  std::string text;
  for (const std::string& key : switchedOn) text += key + " = true\n";
  const std::string file = _directory / "config/com.vendel.logging.toml";
  writeFile(file + ".new", text);
  std::filesystem::rename(file + ".new", file);
}

void AgentSandbox::postPreferencesChanged() const {
  const auto error =
      postNotification(notificationDirectory(_directory / "runtime"), "kLirraSyncLoggingPrefs");
  if (error) throw std::runtime_error("cannot post: " + error.message());
}

std::vector<std::string> AgentSandbox::environment() const {
  std::vector<std::string> result = {
      "PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin",
      "HOME=" + _directory / "home",
      "TZ=CEST-2",
      "LIRRA_SOCKET=" + socketPath(),
      "LIRRA_CONFIG=" + configurationFile(),
      "DBUS_SYSTEM_BUS_ADDRESS=" + bus,
      "DBUS_SESSION_BUS_ADDRESS=" + bus,
  };
  for (const char* name : {"ASAN_OPTIONS", "UBSAN_OPTIONS", "TSAN_OPTIONS", "LSAN_OPTIONS"}) {
    if (const char* value = std::getenv(name)) result.push_back(std::string(name) + "=" + value);
  }
  return result;
}

std::string AgentSandbox::sessionDirectory(const std::string& type) const {
  std::vector<std::string> found;
  std::error_code none;
  for (const auto& entry : std::filesystem::directory_iterator(reportRoot() + "/" + type, none)) {
    found.push_back(entry.path());
  }
  return found.size() == 1 ? found[0] : "";
}

std::string AgentSandbox::sessionFile(const std::string& type, const std::string& name) const {
  std::error_code none;
  for (const auto& entry : std::filesystem::directory_iterator(sessionDirectory(type), none)) {
    if (entry.path().filename().string().starts_with(name + " (")) return readFile(entry.path());
  }
  return "";
}

std::string AgentSandbox::wholeLogSet(const std::string& type, const std::string& suffix) const {
  const std::string directory = logRoot() + "/" + type + "/";
  const std::string name = type + suffix + ".log";
  std::string text;
  for (int generation = kGenerations; generation >= 1; --generation) {
    text += unzipped(directory + generationName(name, generation));
  }
  // A ready archive makes the pending file of its number superfluous.
  std::map<std::uint64_t, std::string> waiting;
  std::error_code none;
  for (const auto& entry : std::filesystem::directory_iterator(directory, none)) {
    const auto leftover = parseRotationLeftover(entry.path().filename().string());
    if (!leftover || leftover->fileName != name || leftover->kind == RotationLeftover::Kind::unfinishedZip)
      continue;
    std::string& path = waiting[leftover->sequence];
    if (path.empty() || leftover->kind == RotationLeftover::Kind::ready) path = entry.path();
  }
  for (const auto& [sequence, path] : waiting)
    text += path.ends_with(".zip") ? unzipped(path) : readFile(path);
  return text + readFile(directory + name);
}

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) lines.push_back(line);
  return lines;
}

std::string withoutTimes(const std::string& text) {
  static const std::regex entryTime(R"(\d\d:\d\d:\d\d\.\d\d\d  \(\d{4}-\d\d-\d\d\) \(CEST\))");
  return std::regex_replace(text, entryTime, "TIME");
}

}  // namespace zal::testing
