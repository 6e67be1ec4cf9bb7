#include "platform/linux/config/host_paths.h"

#include <filesystem>

#include "platform/linux/config/path_text.h"

namespace zal {
namespace {

constexpr std::string_view kFileName = "lirra.toml";
constexpr std::string_view kSystemDirectory = "/etc/lirra";
constexpr std::string_view kReportDirectoryName = "/DiagnosticReports";

std::string below(std::string directory, std::string_view name) {
  if (!directory.ends_with('/')) directory += '/';
  return directory.append(name);
}

std::string userDirectory(const HostEnvironment& environment, std::string_view variable,
                          std::string_view fallbackBelowHome) {
  std::string directory = environment.directoryVariable(variable);
  if (directory.empty()) directory = below(environment.homeDirectory, fallbackBelowHome);
  return below(std::move(directory), "lirra");
}

std::string stateDirectory(const HostEnvironment& environment) {
  if (environment.isSystem()) return "/var/lib/lirra";
  return userDirectory(environment, "XDG_STATE_HOME", ".local/state");
}

std::string runtimeRoot(const HostEnvironment& environment) {
  const std::string runtime = environment.directoryVariable("XDG_RUNTIME_DIR");
  if (!runtime.empty()) return below(runtime, "lirra");
  if (environment.isSystem()) return "/run/lirra";
  return below(stateDirectory(environment), "run");
}

}  // namespace

std::vector<std::string> configurationFileCandidates(const HostEnvironment& environment) {
  const std::string named = environment.variable("LIRRA_CONFIG");
  if (!named.empty()) return {named};
  return {below(userDirectory(environment, "XDG_CONFIG_HOME", ".config"), kFileName),
          below(std::string(kSystemDirectory), kFileName)};
}

std::optional<std::string> configurationFile(const HostEnvironment& environment) {
  const auto candidates = configurationFileCandidates(environment);
  if (candidates.size() == 1) return candidates.front();
  for (const std::string& candidate : candidates) {
    std::error_code error;
    // A file that is there but cannot be looked at must be complained about, not passed over.
    const auto status = std::filesystem::status(candidate, error);
    if (status.type() != std::filesystem::file_type::not_found) return candidate;
  }
  return std::nullopt;
}

std::string preferenceDirectory(const HostEnvironment& environment) {
  const auto file = configurationFile(environment);
  if (file) return parentDirectory(*file);
  if (environment.isSystem()) return std::string(kSystemDirectory);
  return parentDirectory(configurationFileCandidates(environment).front());
}

std::optional<std::string> socketPath(const HostEnvironment& environment) {
  constexpr std::string_view kName = "com.vendel.lirra";
  std::string named = environment.variable("LIRRA_SOCKET");
  if (!named.empty()) return named;
  const std::string runtime = environment.directoryVariable("XDG_RUNTIME_DIR");
  if (!runtime.empty()) return below(runtime, kName);
  if (environment.isSystem()) return below("/run", kName);
  return std::nullopt;
}

DirectoryRoots defaultDirectoryRoots(const HostEnvironment& environment) {
  DirectoryRoots roots;
  const std::string state = stateDirectory(environment);
  const bool system = environment.isSystem();
  roots.UserLogRoot = system ? "/var/log/lirra" : below(state, "Logs");
  roots.WirelessLogRoot = below(state, "Wireless/Logs");
  roots.RootReportRoot = system ? "/var/crash" : below(state, "Root/DiagnosticReports");
  roots.SystemLogRoot = system ? "/var/log" : below(state, "System/Logs");
  roots.NetworkConfigRoot = system ? "/etc/network" : below(state, "NetworkConfiguration");
  const std::string caches =
      system ? "/var/cache/lirra" : userDirectory(environment, "XDG_CACHE_HOME", ".cache");
  roots.MediaLogCacheDir = below(caches, "Media");
  roots.LocationCacheDir = below(caches, "Location");
  roots.RuntimeRoot = runtimeRoot(environment);
  roots.StateRoot = state;
  return roots;
}

void fillDependentRoots(DirectoryRoots& roots) {
  const auto fill = [](std::string& root, const std::string& logRoot, std::string_view name) {
    if (root.empty()) root = logRoot + std::string(name);
  };
  fill(roots.MobileLogRoot, roots.UserLogRoot, "");
  fill(roots.DiagnosticReportRoot, roots.MobileLogRoot, kReportDirectoryName);
  fill(roots.WirelessReportRoot, roots.WirelessLogRoot, kReportDirectoryName);
  fill(roots.SystemReportRoot, roots.SystemLogRoot, kReportDirectoryName);
}

}  // namespace zal
