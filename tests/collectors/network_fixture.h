#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "collectors/cellular_snapshot.h"
#include "collectors/command_runner.h"
#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/network_diagnostics.h"
#include "collectors/ping_runner.h"
#include "tests/support/fake_platform.h"

namespace zal::testing {

/// Network diagnostics over a fake host. Everything that it does is kept in `events`, in the order
/// of doing: "run LINE", "file SOURCE" for a link, a move or a copy, "plist PATH", "ping ADDRESS over
/// wifi|cellular". In all texts the temporary home is "~".
class NetworkFixture : public ::testing::Test {
 protected:
  NetworkFixture() {
    fake.configuration.commands.profile = CommandProfile::literal;
    fake.configuration.endpoints = {.reportServer = "report.example",
                                    .cellPingServer = "192.0.2.11",
                                    .wifiPingServer = "192.0.2.12",
                                    .makerWebHost = "maker.example",
                                    .searchWebHost = "search.example",
                                    .farsite = "192.0.2.13",
                                    .pushCourierHost1 = "courier1.example",
                                    .pushCourierHost2 = "courier2.example",
                                    .pushCourierHost6 = "courier6.example"};
    fake.telephony.reachable = true;
    fake.shell.respond = [this](const std::string& line) {
      note("run " + line);
      return 0;
    };
    fake.files.failWith = [this](const std::string& source) {
      note("file " + source);
      return std::error_code{};
    };
    std::filesystem::create_directories(fake.configuration.roots.SystemReportRoot + "/WiFi");
    std::filesystem::create_directories(fake.configuration.roots.VarLogRoot + "/wavetrap");
  }

  void note(const std::string& event) {
    _notePings();
    events.push_back(shortened(event));
  }
  std::string shortened(std::string text) const {
    const std::string& home = fake.home.path();
    for (std::size_t at = text.find(home); at != std::string::npos; at = text.find(home, at + 1)) {
      text.replace(at, home.size(), "~");
    }
    return text;
  }
  /// Everything that happened, a line each.
  std::string happened() {
    changeCaptures();
    _notePings();
    std::string text;
    for (const std::string& event : events) text += event + "\n";
    return text;
  }
  /// The pings so far, finished now: where each went, for how long, and the file it wrote. A test's
  /// own default time stands as 60.
  std::string finishedPings() {
    changeCaptures();
    _notePings();
    std::string text;
    for (const auto& test : fake.pings.tests) {
      if (test->handler) test->finish("done", true);
      fake.queues.runAll();
      text += pingText(*test) + " for " + std::to_string(static_cast<int>(test->seconds));
      for (const std::string& path : test->written) text += " into " + shortened(path);
      text += "\n";
    }
    return text;
  }
  /// Carries out what was asked of the captures so far.
  void changeCaptures() {
    while (fake.queues.runNext("network.captures")) {
    }
  }
  static std::string pingText(const ScriptedPings::Test& test) {
    return "ping " + test.address + (test.wifi ? " over wifi" : " over cellular");
  }
  void prefer(const std::string& key, bool value) {
    fake.preferences.stored[key] = value;
    fake.preferences.synchronize("com.vendel.logging");
  }
  void put(const std::string& name) { writeFile(fake.home / name, "content of " + name + "\n"); }
  std::string tree(const std::string& directory) const { return listTree(fake.home / directory); }

  FakePlatform fake;
  std::vector<std::string> events;

 private:
  class NotedPropertyLists : public PropertyListWriter {
   public:
    explicit NotedPropertyLists(NetworkFixture& owner) : _owner(owner) {}
    std::error_code write(const ValueMap& dictionary, const std::string& path) override {
      _owner.note("plist " + path);
      return _owner.fake.propertyLists.write(dictionary, path);
    }

   private:
    NetworkFixture& _owner;
  };

  void _notePings() {
    while (fake.queues.runNext("com.vendel.lirra.pingqueue")) {
    }
    for (; _notedPings < fake.pings.tests.size(); ++_notedPings) {
      events.push_back(pingText(*fake.pings.tests[_notedPings]));
    }
  }

  std::size_t _notedPings = 0;
  NotedPropertyLists _propertyLists{*this};
  CommandRunner _commands{fake.shell, fake.files, fake.agentLog};
  CommandTable _table{fake.configuration, fake.agentLog};
  FileCollector _files{fake.files, fake.agentLog, fake.configuration.roots};
  CellularSnapshot _cellular{fake.telephony, _propertyLists, fake.agentLog};

 protected:
  _ZalLoggingAgentPingRunner pings{fake.queues, fake.pings, fake.agentLog};
  NetworkDiagnostics network{{.configuration = fake.configuration,
                              .log = fake.agentLog,
                              .queues = fake.queues,
                              .preferences = fake.preferences,
                              .deviceSupport = fake.deviceSupport,
                              .shell = fake.shell,
                              .commands = _commands,
                              .table = _table,
                              .files = _files,
                              .cellular = _cellular,
                              .pings = pings}};
};

}  // namespace zal::testing
