#include "platform/linux/config/host_environment.h"

#include <pwd.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <system_error>

#include "platform/linux/config/path_text.h"

namespace zal {
namespace {

std::string homeFromUserDatabase(uid_t user) {
  std::array<char, 16384> buffer{};
  passwd entry{};
  passwd* found = nullptr;
  if (::getpwuid_r(user, &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr) return "/";
  return found->pw_dir;
}

}  // namespace

HostEnvironment HostEnvironment::ofThisProcess() {
  HostEnvironment environment;
  for (char** entry = environ; entry != nullptr && *entry != nullptr; ++entry) {
    const std::string_view text(*entry);
    const std::size_t equals = text.find('=');
    if (equals != std::string_view::npos) {
      environment.variables.emplace(text.substr(0, equals), text.substr(equals + 1));
    }
  }
  environment.userId = ::geteuid();
  environment.homeDirectory = environment.directoryVariable("HOME");
  if (environment.homeDirectory.empty()) {
    environment.homeDirectory = homeFromUserDatabase(environment.userId);
  }
  std::error_code unknown;  // no process file system
  const auto program = std::filesystem::read_symlink("/proc/self/exe", unknown);
  if (!unknown) environment.executableDirectory = parentDirectory(program.string());
  return environment;
}

std::string HostEnvironment::variable(std::string_view name) const {
  const auto found = variables.find(name);
  return found == variables.end() ? std::string() : found->second;
}

std::string HostEnvironment::directoryVariable(std::string_view name) const {
  const std::string value = variable(name);
  return value.starts_with('/') ? withoutTrailingSlashes(value) : std::string();
}

}  // namespace zal
