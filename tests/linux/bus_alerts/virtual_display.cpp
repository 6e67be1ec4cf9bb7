#include "tests/linux/bus_alerts/virtual_display.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <stdexcept>

#include "tests/support/private_bus.h"

namespace zal::testing {

std::string VirtualDisplay::obstacle() {
  for (const char* const program : {"Xvfb", "xdotool", "import", "identify"}) {
    if (!std::filesystem::exists(std::string("/usr/bin/") + program)) {
      return std::string(program) + " is not installed";
    }
  }
  return {};
}

VirtualDisplay::VirtualDisplay() {
  const std::string number = _directory / "number";
  // Without repeated keys: on a slow host one that is pressed for long would become several letters.
  _server = std::make_unique<ChildProgram>(
      ChildProgram::Options{.command = {"/usr/bin/Xvfb", "-displayfd", "1", "-screen", "0", "480x800x24",
                                        "-nolisten", "tcp", "-noreset", "-r"},
                            .output = number});
  if (!eventually([&] { return readFile(number).ends_with('\n'); })) {
    throw std::runtime_error("the virtual display does not come up");
  }
  std::string name = ":" + readFile(number);
  name.pop_back();
  ::setenv("DISPLAY", name.c_str(), 1);
  // With these letters on it; for others xdotool changes the keyboard between two of them, which programs
  // may notice too late.
  (void)outputOf({"/usr/bin/setxkbmap", "de"});
}

VirtualDisplay::~VirtualDisplay() {
  ::unsetenv("DISPLAY");
  _server->signal(15);  // it removes its socket and its lock
  _server->waitForExit();
}

std::string VirtualDisplay::act(const std::vector<std::string>& words) const {
  std::vector<std::string> command{"/usr/bin/xdotool"};
  command.insert(command.end(), words.begin(), words.end());
  return outputOf(command);
}

std::string VirtualDisplay::windowOf(const std::string& windowClass) const {
  const std::string found = act({"search", "--onlyvisible", "--class", windowClass});
  const bool isNumber = !found.empty() && std::all_of(found.begin(), found.end(), [](char c) {
    return (c >= '0' && c <= '9') || c == '\n';
  });
  return isNumber ? found.substr(0, found.find('\n')) : "";
}

void VirtualDisplay::click(const std::string& window, int button) const {
  act({"mousemove", "--window", window, "--polar", "0", "0", "click", std::to_string(button)});
}

void VirtualDisplay::photograph(const std::string& path) const {
  std::filesystem::create_directories(std::filesystem::path(path).parent_path());
  (void)outputOf({"/usr/bin/import", "-window", "root", path});
}

int coloursOf(const std::string& picture) {
  return std::atoi(outputOf({"/usr/bin/identify", "-format", "%k", picture}).c_str());
}

}  // namespace zal::testing
