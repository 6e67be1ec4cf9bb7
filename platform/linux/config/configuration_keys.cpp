#include "platform/linux/config/configuration_keys.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <utility>

#include "platform/linux/config/path_text.h"

namespace zal {
namespace {

std::string takePathInto(const toml::node& value, const std::string& home, std::string& target) {
  const auto text = value.value_exact<std::string>();
  if (!text) return "wants a path in quotes";
  if (text->empty()) return "is empty, but must be an absolute path";
  if (text->find('\0') != std::string::npos) return "has a NUL character in its path";
  if (*text == "~" || text->starts_with("~/")) {
    target = withoutTrailingSlashes(home + text->substr(1));
    return {};
  }
  if (!text->starts_with('/')) return "must be an absolute path, not \"" + *text + "\"";
  target = withoutTrailingSlashes(*text);
  return {};
}

bool consistsOf(std::string_view text, std::string_view punctuation) {
  return std::all_of(text.begin(), text.end(), [&](char c) {
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') ||
           punctuation.find(c) != std::string_view::npos;
  });
}

// What is wrong with a text, else "". They end up in command lines, so nothing there may be more than a name.

std::string faultOfHost(const std::string& text) {
  constexpr std::size_t kLongestHostName = 253;
  if (consistsOf(text, ".:_-") && !text.starts_with('-') && text.size() <= kLongestHostName) return {};
  return "wants a host name or an address";
}

std::string faultOfIpv4Address(const std::string& text) {
  in_addr address{};
  if (text.empty() || ::inet_pton(AF_INET, text.c_str(), &address) == 1) return {};
  return "wants an IPv4 address";
}

/// The kernel knows a program by the first 15 bytes of its name only, and it is by name that this one
/// is ended.
std::string faultOfProgramName(const std::string& text) {
  constexpr std::size_t kLongestProcessName = 15;
  const bool isPlain = consistsOf(text, "._+-") && !text.starts_with('-') && !text.starts_with('.');
  if (!text.empty() && isPlain && text.size() <= kLongestProcessName) return {};
  return "wants a program's name of 1 to 15 letters, digits and . _ + -";
}

std::string faultOfFileName(const std::string& text) {
  const bool isPlain = text != "." && text != ".." && text.find('/') == std::string::npos &&
                       text.find('\0') == std::string::npos;
  return isPlain ? std::string() : "wants a plain file name";
}

template <auto Root>
std::string takeRoot(const toml::node& value, const std::string& home, Configuration& configuration) {
  return takePathInto(value, home, configuration.roots.*Root);
}

template <auto Field>
std::string takePath(const toml::node& value, const std::string& home, Configuration& configuration) {
  return takePathInto(value, home, configuration.*Field);
}

template <auto Section, auto Field>
std::string takeText(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  const auto text = value.value_exact<std::string>();
  if (!text) return "wants a text in quotes";
  configuration.*Section.*Field = *text;
  return {};
}

/// A text that the check finds no fault with.
template <auto Section, auto Field, std::string (*FaultOf)(const std::string&)>
std::string takeChecked(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  const auto text = value.value_exact<std::string>();
  if (!text) return "wants a text in quotes";
  std::string fault = FaultOf(*text);
  if (fault.empty()) configuration.*Section.*Field = *text;
  return fault;
}

template <auto Section, auto Field>
std::string takePathOf(const toml::node& value, const std::string& home, Configuration& configuration) {
  return takePathInto(value, home, configuration.*Section.*Field);
}

/// One of two words.
template <class Target>
std::string takeWord(const toml::node& value, const std::pair<std::string_view, Target>& first,
                     const std::pair<std::string_view, Target>& second, Target& target) {
  const auto text = value.value_exact<std::string>();
  for (const auto& [word, meaning] : {first, second}) {
    if (text != word) continue;
    target = meaning;
    return {};
  }
  return "wants \"" + std::string(first.first) + "\" or \"" + std::string(second.first) + "\"";
}

std::string takeProfile(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  return takeWord<CommandProfile>(value, {"linux", CommandProfile::linux},
                                  {"literal", CommandProfile::literal}, configuration.commands.profile);
}

std::string takeCompression(const toml::node& value, const std::string& /*home*/,
                            Configuration& configuration) {
  return takeWord<ArchiveCompression>(value, {"small", ArchiveCompression::small},
                                      {"fast", ArchiveCompression::fast}, configuration.archiveCompression);
}

template <class Target>
std::string takeFlagInto(const toml::node& value, Target& target) {
  const auto flag = value.value_exact<bool>();
  if (!flag) return "wants true or false";
  target = *flag;
  return {};
}

template <auto Field>
std::string takeFlagOf(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  return takeFlagInto(value, configuration.*Field);
}

template <auto Section, auto Field>
std::string takeFlag(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  return takeFlagInto(value, configuration.*Section.*Field);
}

template <auto Section, auto Field, std::int64_t Least, std::int64_t Most>
std::string takeCount(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  const auto number = value.value_exact<std::int64_t>();
  if (!number || *number < Least || *number > Most) {
    return "wants a whole number from " + std::to_string(Least) + " to " + std::to_string(Most);
  }
  using Target = std::remove_reference_t<decltype(configuration.*Section.*Field)>;
  configuration.*Section.*Field = static_cast<Target>(*number);
  return {};
}

std::string takeCategories(const toml::node& value, const std::string& /*home*/,
                           Configuration& configuration) {
  constexpr const char* kWanted = "wants a list of texts in quotes";
  const toml::array* list = value.as_array();
  if (list == nullptr) return kWanted;
  std::vector<std::string> categories;
  for (const toml::node& element : *list) {
    auto text = element.value_exact<std::string>();
    if (!text) return kWanted;
    categories.push_back(std::move(*text));
  }
  configuration.log.categories = std::move(categories);
  return {};
}

template <auto Field>
std::string takeDuration(const toml::node& value, const std::string& /*home*/, Configuration& configuration) {
  constexpr double kMost = 31'536'000;  // a year
  const auto seconds = value.value<double>();
  if (!value.is_number() || !seconds || !(*seconds >= 0.001 && *seconds <= kMost)) {
    return "wants a number of seconds from 0.001 to 31536000";
  }
  configuration.*Field = std::chrono::milliseconds{std::llround(*seconds * 1000.0)};
  return {};
}

constexpr std::int64_t kLargestBlock = 1LL << 30;
constexpr std::int64_t kLargestMemory = 1LL << 40;
constexpr std::int64_t kLargestSize = 1LL << 50;
constexpr std::int64_t kWhole = 100;  // percent

constexpr ConfigurationKey kKeys[] = {
    {"roots", "UserLogRoot", takeRoot<&DirectoryRoots::UserLogRoot>},
    {"roots", "MobileLogRoot", takeRoot<&DirectoryRoots::MobileLogRoot>},
    {"roots", "DiagnosticReportRoot", takeRoot<&DirectoryRoots::DiagnosticReportRoot>},
    {"roots", "WirelessLogRoot", takeRoot<&DirectoryRoots::WirelessLogRoot>},
    {"roots", "WirelessReportRoot", takeRoot<&DirectoryRoots::WirelessReportRoot>},
    {"roots", "RootReportRoot", takeRoot<&DirectoryRoots::RootReportRoot>},
    {"roots", "SystemLogRoot", takeRoot<&DirectoryRoots::SystemLogRoot>},
    {"roots", "SystemReportRoot", takeRoot<&DirectoryRoots::SystemReportRoot>},
    {"roots", "NetworkConfigRoot", takeRoot<&DirectoryRoots::NetworkConfigRoot>},
    {"roots", "MediaLogCacheDir", takeRoot<&DirectoryRoots::MediaLogCacheDir>},
    {"roots", "LocationCacheDir", takeRoot<&DirectoryRoots::LocationCacheDir>},
    {"roots", "TemporaryRoot", takeRoot<&DirectoryRoots::TemporaryRoot>},
    {"roots", "UartLogFile", takeRoot<&DirectoryRoots::UartLogFile>},
    {"roots", "VarLogRoot", takeRoot<&DirectoryRoots::VarLogRoot>},
    {"roots", "RuntimeRoot", takeRoot<&DirectoryRoots::RuntimeRoot>},
    {"roots", "StateRoot", takeRoot<&DirectoryRoots::StateRoot>},
    {"endpoints", "reportHost", takeText<&Configuration::endpoints, &Endpoints::reportServer>},
    {"endpoints", "cellPingServer", takeText<&Configuration::endpoints, &Endpoints::cellPingServer>},
    {"endpoints", "wifiPingServer", takeText<&Configuration::endpoints, &Endpoints::wifiPingServer>},
    {"endpoints", "makerWebHost",
     takeChecked<&Configuration::endpoints, &Endpoints::makerWebHost, faultOfHost>},
    {"endpoints", "searchWebHost",
     takeChecked<&Configuration::endpoints, &Endpoints::searchWebHost, faultOfHost>},
    {"endpoints", "farsite", takeChecked<&Configuration::endpoints, &Endpoints::farsite, faultOfIpv4Address>},
    {"endpoints", "pushCourierHost1",
     takeChecked<&Configuration::endpoints, &Endpoints::pushCourierHost1, faultOfHost>},
    {"endpoints", "pushCourierHost2",
     takeChecked<&Configuration::endpoints, &Endpoints::pushCourierHost2, faultOfHost>},
    {"endpoints", "pushCourierHost6",
     takeChecked<&Configuration::endpoints, &Endpoints::pushCourierHost6, faultOfHost>},
    {"interfaces", "wifi", takeText<&Configuration::interfaces, &Interfaces::wifi>},
    {"interfaces", "cellular", takeText<&Configuration::interfaces, &Interfaces::cellular>},
    {"ipc", "group", takeText<&Configuration::ipc, &IpcSettings::group>},
    {"ipc", "maximumPayload",
     takeCount<&Configuration::ipc, &IpcSettings::maximumPayload, 1024, kLargestBlock>},
    {"ipc", "maximumReplyBacklog",
     takeCount<&Configuration::ipc, &IpcSettings::maximumReplyBacklog, 1024, kLargestBlock>},
    {"bus", "enabled", takeFlag<&Configuration::bus, &BusSettings::enabled>},
    {"blackbox", "enabled", takeFlag<&Configuration::blackBox, &BlackBoxSettings::enabled>},
    {"blackbox", "sync", takeFlag<&Configuration::blackBox, &BlackBoxSettings::sync>},
    {"memory", "session", takeCount<&Configuration::memory, &MemorySettings::session, 65536, kLargestMemory>},
    {"memory", "peer", takeCount<&Configuration::memory, &MemorySettings::peer, 65536, kLargestMemory>},
    {"memory", "total", takeCount<&Configuration::memory, &MemorySettings::total, 65536, kLargestMemory>},
    {"disk", "size", takeCount<&Configuration::disk, &DiskSettings::size, 0, kLargestSize>},
    {"disk", "share", takeCount<&Configuration::disk, &DiskSettings::share, 0, kWhole>},
    {"disk", "keepFree", takeCount<&Configuration::disk, &DiskSettings::keepFree, 0, kWhole>},
    {"watchdog", "limit", takeCount<&Configuration::watchdog, &WatchdogSettings::limit, 0, 60000>},
    {"log", "categories", takeCategories},
    {"log", "rotationSize", takeCount<&Configuration::log, &LogSettings::rotationSize, 1024, kLargestBlock>},
    {"log", "maximumOpenFiles", takeCount<&Configuration::log, &LogSettings::maximumOpenFiles, 1, 65536>},
    {"log", "journal", takeFlag<&Configuration::log, &LogSettings::journal>},
    {"log", "journalSocket", takePathOf<&Configuration::log, &LogSettings::journalSocket>},
    {"commands", "profile", takeProfile},
    {"commands", "systemLogReader",
     takeChecked<&Configuration::commands, &CommandSettings::systemLogReader, faultOfProgramName>},
    {"commands", "toolDirectory", takePathOf<&Configuration::commands, &CommandSettings::toolDirectory>},
    {"collection", "cloudSyncLog",
     takeChecked<&Configuration::collection, &CollectionSettings::cloudSyncLog, faultOfFileName>},
    {"collection", "pairedDeviceLog1",
     takePathOf<&Configuration::collection, &CollectionSettings::pairedDeviceLog1>},
    {"collection", "pairedDeviceLog2",
     takePathOf<&Configuration::collection, &CollectionSettings::pairedDeviceLog2>},
    {"collection", "pairedDeviceDirectory",
     takePathOf<&Configuration::collection, &CollectionSettings::pairedDeviceDirectory>},
    {"collection", "pushLogDirectory",
     takePathOf<&Configuration::collection, &CollectionSettings::pushLogDirectory>},
    {"alerts", "screen", takeFlag<&Configuration::alerts, &AlertSettings::screen>},
    {"archive", "compression", takeCompression},
    {"device", "SystemVersionFile", takePath<&Configuration::systemVersionFile>},
    {"device", "internalInstall", takeFlagOf<&Configuration::internalInstall>},
    {"device", "videoCallsOverCellular", takeFlagOf<&Configuration::videoCallsOverCellular>},
    {"testing", "inactivityLimit", takeDuration<&Configuration::inactivityLimit>},
    {"testing", "closingStageDelay", takeDuration<&Configuration::closingStageDelay>},
    {"testing", "delayedEnd", takeDuration<&Configuration::delayedEnd>},
};

}  // namespace

std::span<const ConfigurationKey> configurationKeys() { return kKeys; }

bool isOpenSection(std::string_view section) { return section == "commands"; }

std::string takeOpenKey(std::string_view key, const toml::node& value, Configuration& configuration) {
  const auto text = value.value_exact<std::string>();
  if (value.is_table()) return "wants its dots inside quotes: \"" + std::string(key) + "...\"";
  if (!text) return "wants a text in quotes";
  if (text->find('\0') != std::string::npos) return "has a NUL character in its text";
  configuration.commands.rows[std::string(key)] = *text;
  return {};
}

}  // namespace zal
