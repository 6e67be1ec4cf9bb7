#include "tests/support/emulated_modem.h"

#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <stdexcept>

namespace zal::testing {
namespace {

constexpr const char* kPython = "/usr/bin/python3";
constexpr const char* kModemManager = "org.freedesktop.ModemManager1";
constexpr const char* kModemManagerPath = "/org/freedesktop/ModemManager1";
constexpr const char* kModem = "org.freedesktop.ModemManager1.Modem";
constexpr const char* kPolkit = "org.freedesktop.PolicyKit1";

std::string program() { return ZAL_TEST_SUPPORT_DIRECTORY "/at_emulator.py"; }

std::string newSocketName() {
  static std::atomic<int> count{0};
  return "abstract:lirra-test-" + std::to_string(::getpid()) + "-" + std::to_string(++count);
}

void require(bool isThere, const std::string& what) {
  if (!isThere) throw std::runtime_error(what);
}

}  // namespace

EmulatedModem::EmulatedModem(const std::vector<std::string>& settings) : _socketName(newSocketName()) {
  const std::string printed = _directory.path() + "/printed";
  std::vector<std::string> command{kPython,     program(),   "--abstract",
                                   _socketName, "--control", _directory.path() + "/control"};
  command.insert(command.end(), settings.begin(), settings.end());
  _program = std::make_unique<ChildProgram>(
      ChildProgram::Options{.command = std::move(command), .output = printed, .errors = printed});
  require(
      eventually([&] { return std::filesystem::exists(printed) && readFile(printed).starts_with("ready"); }),
      "the emulated modem does not come up");
}

void EmulatedModem::set(const std::vector<std::string>& settings) {
  std::vector<std::string> words{kPython, program(), "--tell", _directory.path() + "/control"};
  words.insert(words.end(), settings.begin(), settings.end());
  const std::string trouble = outputOf(words);
  require(trouble.empty(), trouble);
}

RealModemManager::RealModemManager(const PrivateBus& bus, const EmulatedModem& modem, int state)
    : _bus(bus), _socketName(modem.socketName()), _state(state) {
  startAgain();
}

void RealModemManager::startAgain() {
  _polkit = std::make_unique<MockedService>(
      _bus, kPolkit, std::vector<std::string>{"-m", "dbusmock", "--system", "-t", "polkitd"});
  allow(true);
  start();
}

std::string RealModemManager::obstacle() {
  if (std::string missing = MockedService::obstacle(); !missing.empty()) return missing;
  return std::filesystem::exists("/usr/sbin/ModemManager") ? "" : "ModemManager is not installed";
}

void RealModemManager::allow(bool isAllowed) {
  require(_bus.busctl({"call", kPolkit, "/org/freedesktop/PolicyKit1/Authority", "org.freedesktop.DBus.Mock",
                       "AllowUnknown", "b", isAllowed ? "true" : "false"})
              .empty(),
          "polkit cannot be told");
}

std::string RealModemManager::property(const std::string& name) const {
  return _bus.busctl({"get-property", kModemManager, _path, kModem, name});
}

std::string RealModemManager::mmcli(const std::vector<std::string>& words) const {
  std::vector<std::string> command{"mmcli"};
  command.insert(command.end(), words.begin(), words.end());
  return outputOf(command, {{"DBUS_SYSTEM_BUS_ADDRESS", _bus.address()}});
}

std::string RealModemManager::call(const std::string& interface, const std::string& method,
                                   const std::vector<std::string>& arguments) {
  std::vector<std::string> words{"call", kModemManager, _path, interface, method};
  words.insert(words.end(), arguments.begin(), arguments.end());
  return _bus.busctl(words);
}

void RealModemManager::start() {
  _program = std::make_unique<ChildProgram>(ChildProgram::Options{
      .command = {"/usr/sbin/ModemManager", "--debug", "--test-enable", "--test-no-udev", "--test-no-qrtr",
                  "--test-no-suspend-resume", "--log-file=/dev/null"},
      .environment = {{"DBUS_SYSTEM_BUS_ADDRESS", _bus.address()}}});
  require(eventually([&] { return _bus.hasOwner(kModemManager); }), "ModemManager does not come up");
  const std::string refusal =
      _bus.busctl({"call", kModemManager, kModemManagerPath, "org.freedesktop.ModemManager1.Test",
                   "SetProfile", "ssas", "test-0", "generic", "1", _socketName});
  require(refusal.empty(), refusal);
  _path = std::string(kModemManagerPath) + "/Modem/0";
  require(eventually([&] { return property("State").starts_with("i "); }), "no modem comes up");
  (void)call(kModem, "Enable", {"b", "true"});
  require(eventually([&] { return property("State") == "i " + std::to_string(_state); }),
          "the modem stays in the state " + property("State"));
}

}  // namespace zal::testing
