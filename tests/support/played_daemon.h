#pragma once

#include <map>
#include <string>
#include <vector>

#include "tests/support/private_bus.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// A daemon on a private bus that answers what the test writes, right or wrong. It has its name when
/// the constructor returns; it goes with the object.
///
///     PlayedDaemon daemon(bus, "org.example", {{"/ org.example.Sum(1, 2)", "(<3>,)"}});
class PlayedDaemon {
 public:
  using Answers = std::map<std::string, std::string>;

  /// "path interface.Method" or "path interface.Method(arguments as JSON)" to a tuple in GVariant
  /// text, "!error.name", or "?" for no answer at all.
  PlayedDaemon(const PrivateBus& bus, const std::string& name, Answers answers);

  /// Why none can be played on this machine; empty where it can. For GTEST_SKIP.
  [[nodiscard]] static std::string obstacle();

  /// From the next call on.
  void answer(const std::string& call, const std::string& answer);
  /// Each call that came, "path interface.Method(arguments)", in order.
  [[nodiscard]] std::vector<std::string> calls() const;
  void hang() { _service.hang(); }
  void goOn() { _service.goOn(); }
  void kill() { _service.kill(); }

 private:
  [[nodiscard]] std::string _file() const { return _directory / "answers"; }
  /// Writes the answers; gives the file.
  std::string _written();

  TemporaryDirectory _directory;
  Answers _answers;
  MockedService _service;
};

/// The GetAll and Get of one object's interface, for PlayedDaemon: the values as GVariant text, as in
/// {"Strength", "byte 0x49"}.
[[nodiscard]] PlayedDaemon::Answers playedProperties(const std::string& path, const std::string& interface,
                                                     const std::map<std::string, std::string>& values);

}  // namespace zal::testing
