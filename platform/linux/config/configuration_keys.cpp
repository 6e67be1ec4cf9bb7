#include "platform/linux/config/configuration_keys.h"

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
    {"roots", "TemporaryRoot", takeRoot<&DirectoryRoots::TemporaryRoot>},
    {"roots", "UartLogFile", takeRoot<&DirectoryRoots::UartLogFile>},
    {"roots", "VarLogRoot", takeRoot<&DirectoryRoots::VarLogRoot>},
    {"roots", "RuntimeRoot", takeRoot<&DirectoryRoots::RuntimeRoot>},
    {"endpoints", "reportHost", takeText<&Configuration::endpoints, &Endpoints::reportServer>},
    {"endpoints", "cellPingServer", takeText<&Configuration::endpoints, &Endpoints::cellPingServer>},
    {"endpoints", "wifiPingServer", takeText<&Configuration::endpoints, &Endpoints::wifiPingServer>},
    {"interfaces", "wifi", takeText<&Configuration::interfaces, &Interfaces::wifi>},
    {"interfaces", "cellular", takeText<&Configuration::interfaces, &Interfaces::cellular>},
    {"ipc", "group", takeText<&Configuration::ipc, &IpcSettings::group>},
    {"ipc", "maximumPayload",
     takeCount<&Configuration::ipc, &IpcSettings::maximumPayload, 1024, kLargestBlock>},
    {"ipc", "maximumReplyBacklog",
     takeCount<&Configuration::ipc, &IpcSettings::maximumReplyBacklog, 1024, kLargestBlock>},
    {"log", "categories", takeCategories},
    {"log", "rotationSize", takeCount<&Configuration::log, &LogSettings::rotationSize, 1024, kLargestBlock>},
    {"log", "maximumOpenFiles", takeCount<&Configuration::log, &LogSettings::maximumOpenFiles, 1, 65536>},
    {"device", "SystemVersionFile", takePath<&Configuration::systemVersionFile>},
    {"testing", "inactivityLimit", takeDuration<&Configuration::inactivityLimit>},
    {"testing", "closingStageDelay", takeDuration<&Configuration::closingStageDelay>},
};

}  // namespace

std::span<const ConfigurationKey> configurationKeys() { return kKeys; }

}  // namespace zal
