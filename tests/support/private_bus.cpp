#include "tests/support/private_bus.h"

#include <unistd.h>

#include <filesystem>
#include <stdexcept>

namespace zal::testing {
namespace {

constexpr const char* kDaemon = "/usr/bin/dbus-daemon";
constexpr const char* kPython = "/usr/bin/python3";

}  // namespace

std::string outputOf(const std::vector<std::string>& words,
                     const std::map<std::string, std::string>& environment) {
  const TemporaryDirectory directory;
  const std::string output = directory.path() + "/output";
  std::vector<std::string> command{"/usr/bin/env"};
  command.insert(command.end(), words.begin(), words.end());
  ChildProgram program({.command = command, .output = output, .errors = output, .environment = environment});
  program.waitForExit();
  std::string text = readFile(output);
  while (text.ends_with('\n')) text.pop_back();
  return text;
}

PrivateBus::PrivateBus(const std::string& type, const std::string& policy) {
  std::filesystem::create_directories(servicesDirectory());
  writeFile(_directory.path() + "/bus.conf",
            "<busconfig><type>" + type + "</type><listen>" + address() +
                "</listen><auth>EXTERNAL</auth><servicedir>" + servicesDirectory() +
                "</servicedir><limit name=\"max_connections_per_user\">1000</limit>" + policy +
                "</busconfig>\n");
  start();
}

std::string PrivateBus::obstacle() {
  return std::filesystem::exists(kDaemon) ? "" : "dbus-daemon is not installed";
}

void PrivateBus::kill() {
  _daemon.reset();
  ::unlink((_directory.path() + "/bus").c_str());
}

void PrivateBus::start() {
  if (!obstacle().empty()) return;  // a fixture's member is made before the fixture can skip
  const std::string printed = _directory.path() + "/address";
  ::unlink(printed.c_str());
  _daemon = std::make_unique<ChildProgram>(
      ChildProgram::Options{.command = {kDaemon, "--config-file=" + _directory.path() + "/bus.conf",
                                        "--nofork", "--nopidfile", "--print-address"},
                            .output = printed});
  if (!eventually([&] { return std::filesystem::exists(printed) && readFile(printed).ends_with('\n'); }))
    throw std::runtime_error("the private bus does not come up");
}

void PrivateBus::letEverybodyConnect() const {
  std::filesystem::permissions(_directory.path(), std::filesystem::perms::all);
}

bool PrivateBus::hasOwner(const std::string& name) const {
  return busctl({"call", "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                 "NameHasOwner", "s", name}) == "b true";
}

std::string PrivateBus::busctl(const std::vector<std::string>& words) const {
  std::vector<std::string> command{"busctl", "--address=" + address()};
  command.insert(command.end(), words.begin(), words.end());
  return outputOf(command);
}

MockedService::MockedService(const PrivateBus& bus, const std::string& name, std::vector<std::string> words) {
  words.insert(words.begin(), kPython);
  _program = std::make_unique<ChildProgram>(
      ChildProgram::Options{.command = std::move(words),
                            .environment = {{"DBUS_SYSTEM_BUS_ADDRESS", bus.address()},
                                            {"DBUS_SESSION_BUS_ADDRESS", bus.address()}}});
  if (!eventually([&] { return bus.hasOwner(name); })) {
    throw std::runtime_error("the service " + name + " does not come up");
  }
}

std::string MockedService::obstacle() {
  static const bool isThere = outputOf({kPython, "-c", "import dbusmock"}).empty();
  return isThere ? "" : "python3 cannot load dbusmock";
}

void MockedService::kill() { _program.reset(); }

}  // namespace zal::testing
