#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// A real message bus of the test's own, on which everybody may do everything. It is there when the
/// constructor returns.
class PrivateBus {
 public:
  /// `type` as the bus's configuration knows it: "system", "session". Services that the bus may start
  /// have their files in `services`, a directory that may be filled later, until the first one is
  /// asked for.
  /// `policy` is the part of that configuration that says who may do what.
  explicit PrivateBus(const std::string& type = "system", const std::string& policy = kEverythingAllowed);
  static constexpr const char* kEverythingAllowed =
      "<policy context=\"default\"><allow send_destination=\"*\" eavesdrop=\"true\"/>"
      "<allow eavesdrop=\"true\"/><allow own=\"*\"/><allow user=\"*\"/></policy>";

  /// Why there can be none on this machine; empty where there can. For GTEST_SKIP.
  [[nodiscard]] static std::string obstacle();

  [[nodiscard]] std::string address() const { return "unix:path=" + _directory.path() + "/bus"; }
  [[nodiscard]] std::string servicesDirectory() const { return _directory.path() + "/services"; }
  /// Ends the daemon at once; everybody is disconnected and the socket file is gone.
  void kill();
  /// A new daemon at the same address.
  void start();
  /// Other users of this machine too, for as long as the test lasts.
  void letEverybodyConnect() const;
  [[nodiscard]] bool isRunning() const { return _daemon != nullptr; }
  /// It neither reads nor answers until goOn().
  void hang() { _daemon->signal(19); }
  void goOn() { _daemon->signal(18); }

  /// Whether somebody has the name.
  [[nodiscard]] bool hasOwner(const std::string& name) const;
  /// What `busctl --address=... WORDS` prints; its messages too.
  [[nodiscard]] std::string busctl(const std::vector<std::string>& words) const;

 private:
  TemporaryDirectory _directory;
  std::unique_ptr<ChildProgram> _daemon;
};

/// A service played by python3-dbusmock on a private bus: a template, or a script of the test's own
/// that is given as words. It has its name when the constructor returns; it goes with the object.
class MockedService {
 public:
  /// `words` follow `/usr/bin/python3`: {"-m", "dbusmock", "--system", "-t", "networkmanager"}. Both
  /// bus variables lead to the bus.
  MockedService(const PrivateBus& bus, const std::string& name, std::vector<std::string> words);

  /// Why none can be played on this machine; empty where it can. For GTEST_SKIP.
  [[nodiscard]] static std::string obstacle();

  /// It neither reads nor answers until goOn().
  void hang() { _program->signal(19); }
  void goOn() { _program->signal(18); }
  void kill();

 private:
  std::unique_ptr<ChildProgram> _program;
};

/// The words' output and messages, without the last line break; words[0] is looked for in PATH.
[[nodiscard]] std::string outputOf(const std::vector<std::string>& words,
                                   const std::map<std::string, std::string>& environment = {});

}  // namespace zal::testing
