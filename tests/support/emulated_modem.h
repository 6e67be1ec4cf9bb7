#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tests/support/child_program.h"
#include "tests/support/private_bus.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// The AT emulator (at_emulator.py), on an abstract socket of the test's own.
class EmulatedModem {
 public:
  /// `settings` as the emulator's own help has them: {"csq=20", "sim=pin"}.
  explicit EmulatedModem(const std::vector<std::string>& settings = {});
  [[nodiscard]] const std::string& socketName() const { return _socketName; }
  /// They hold when it returns.
  void set(const std::vector<std::string>& settings);

 private:
  const TemporaryDirectory _directory;
  const std::string _socketName;
  std::unique_ptr<ChildProgram> _program;
};

/// The real ModemManager on a private bus, with one modem and a played polkit that allows everything.
class RealModemManager {
 public:
  /// Waits until the modem is there; enables it and waits until it is in the state, ModemManager's
  /// number: 8 is registered, 2 locked, -1 failed.
  RealModemManager(const PrivateBus& bus, const EmulatedModem& modem, int state = 8);

  /// Why there can be none on this machine; empty where there can. For GTEST_SKIP.
  [[nodiscard]] static std::string obstacle();

  /// Whether polkit says yes from now on.
  void allow(bool isAllowed);
  /// One property of the modem as busctl prints it: "i 8".
  [[nodiscard]] std::string property(const std::string& name) const;
  /// What mmcli prints with the words.
  [[nodiscard]] std::string mmcli(const std::vector<std::string>& words) const;
  /// What the bus answers to a method of the modem, called with busctl's words.
  std::string call(const std::string& interface, const std::string& method,
                   const std::vector<std::string>& arguments);

  void hang() { _program->signal(19); }
  void goOn() { _program->signal(18); }
  void kill() { _program.reset(); }
  /// A new process after kill(), with the same modem; waits as the constructor does.
  void start();
  /// The same after the bus was restarted, which polkit did not live through either.
  void startAgain();

 private:
  const PrivateBus& _bus;
  const std::string _socketName;
  const int _state;
  std::unique_ptr<MockedService> _polkit;
  std::unique_ptr<ChildProgram> _program;
  std::string _path;  ///< the modem's
};

}  // namespace zal::testing
