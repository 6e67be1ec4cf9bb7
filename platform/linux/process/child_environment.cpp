#include "platform/linux/process/child_environment.h"

#include <unistd.h>

#include <algorithm>
#include <array>

namespace zal {
namespace {

constexpr std::array<std::string_view, 18> kNames = {"PATH",
                                                     "HOME",
                                                     "USER",
                                                     "LOGNAME",
                                                     "SHELL",
                                                     "TZ",
                                                     "LANG",
                                                     "LANGUAGE",
                                                     "DISPLAY",
                                                     "WAYLAND_DISPLAY",
                                                     "XAUTHORITY",
                                                     "XDG_RUNTIME_DIR",
                                                     "ASAN_OPTIONS",
                                                     "LSAN_OPTIONS",
                                                     "TSAN_OPTIONS",
                                                     "UBSAN_OPTIONS",
                                                     "DBUS_SYSTEM_BUS_ADDRESS",
                                                     "DBUS_SESSION_BUS_ADDRESS"};

}  // namespace

bool isForChildren(std::string_view name) {
  return name.starts_with("LC_") || std::find(kNames.begin(), kNames.end(), name) != kNames.end();
}

ChildEnvironment::ChildEnvironment() : ChildEnvironment(environ) {}

ChildEnvironment::ChildEnvironment(char* const* variables) {
  for (; variables != nullptr && *variables != nullptr; ++variables) {
    const std::string_view text(*variables);
    const std::size_t equals = text.find('=');
    if (equals != std::string_view::npos && isForChildren(text.substr(0, equals)))
      _variables.emplace_back(text);
  }
  for (std::string& variable : _variables) _pointers.push_back(variable.data());
  _pointers.push_back(nullptr);
}

}  // namespace zal
