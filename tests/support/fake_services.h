#pragma once

#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/agent_log.h"
#include "platform/crash_reporter.h"
#include "platform/device_registry.h"
#include "platform/log_facility.h"
#include "platform/network_status.h"
#include "platform/preference_store.h"
#include "platform/process_exit.h"
#include "platform/process_table.h"
#include "platform/system_notifications.h"
#include "platform/system_shell.h"
#include "platform/telephony.h"

namespace zal::testing {

/// Keeps every line as "log:CATEGORY: text", "notice: text", "warning: text" or
/// "console:CATEGORY: text"; log lines only of enabled categories. Not for several threads.
class RecordingAgentLog : public AgentLog {
 public:
  ~RecordingAgentLog() override;
  std::set<std::string, std::less<>> enabledCategories;
  std::vector<std::string> lines;
  int backtraces = 0;

  [[nodiscard]] bool isEnabled(std::string_view category) const override {
    return enabledCategories.contains(category);
  }
  void log(std::string_view category, std::string_view text) override {
    if (isEnabled(category)) _add("log:" + std::string(category) + ": ", text);
  }
  void notice(std::string_view text) override { _add("notice: ", text); }
  void warning(std::string_view text) override { _add("warning: ", text); }
  void console(std::string_view category, std::string_view text) override {
    _add("console:" + std::string(category) + ": ", text);
  }
  void backtrace() override { ++backtraces; }

 private:
  void _add(std::string prefix, std::string_view text) { lines.push_back(prefix.append(text)); }
};

class RecordingLogFacility : public PlatformLogFacility {
 public:
  ~RecordingLogFacility() override;
  struct Kept {
    int level;
    std::string type, category;
    bool processInformation;
    std::string line;
    std::uint64_t time;
    bool operator==(const Kept&) const = default;
  };
  std::vector<Kept> records;
  int flushes = 0;
  void record(const LogRecord& r) override {
    records.push_back({r.level, std::string(r.type), std::string(r.category), r.processInformation,
                       std::string(r.line), r.time});
  }
  void flush() override { ++flushes; }
};

class FakePreferences : public PreferenceStore {
 public:
  ~FakePreferences() override;
  /// What is stored; visible to readers after the next synchronize.
  std::map<std::string, bool, std::less<>> stored;
  std::vector<std::string> readKeys;
  int synchronizations = 0;
  void synchronize(std::string_view /*domain*/) override {
    ++synchronizations;
    _current = stored;
  }
  [[nodiscard]] std::optional<bool> boolean(std::string_view domain, std::string_view key) override {
    if (domain != "com.vendel.logging") return std::nullopt;
    readKeys.emplace_back(key);
    const auto found = _current.find(key);
    if (found == _current.end()) return std::nullopt;
    return found->second;
  }

 private:
  std::map<std::string, bool, std::less<>> _current;
};

class FakeSystemNotifications : public SystemNotifications {
 public:
  ~FakeSystemNotifications() override;
  std::vector<std::string> posts;
  std::multimap<std::string, std::function<void()>, std::less<>> observers;
  void observe(std::string name, std::function<void()> handler) override {
    observers.emplace(std::move(name), std::move(handler));
  }
  void post(std::string_view name) override {
    posts.emplace_back(name);
    auto [first, last] = observers.equal_range(name);
    for (; first != last; ++first) first->second();
  }
};

class RecordingCrashReporter : public CrashReporter {
 public:
  ~RecordingCrashReporter() override;
  struct Crash {
    pid_t process;
    std::uint32_t code;
    std::string message;
  };
  bool available = true;
  std::vector<Crash> crashes;
  std::vector<std::string> exceptions, stackshots;
  std::vector<std::uint32_t> stackshotCodes;
  bool simulateCrash(pid_t process, std::uint32_t code, std::string_view message) override {
    crashes.push_back({process, code, std::string(message)});
    return available;
  }
  bool simulateCrashForException(std::string_view description) override {
    exceptions.emplace_back(description);
    return available;
  }
  bool stackshot(std::string_view reason, std::uint32_t code) override {
    stackshots.emplace_back(reason);
    stackshotCodes.push_back(code);
    return available;
  }
};

/// Keeps the lines; `respond` may do what the command would have done and gives the status.
class ScriptedShell : public SystemShell {
 public:
  ~ScriptedShell() override;
  std::vector<std::string> commands;
  std::function<int(const std::string&)> respond;
  int PerformSystem(const std::string& commandLine) override {
    commands.push_back(commandLine);
    return respond ? respond(commandLine) : 0;
  }
};

class FakeProcessTable : public ProcessTable {
 public:
  ~FakeProcessTable() override;
  std::optional<std::vector<ProcessEntry>> table = std::vector<ProcessEntry>{};
  mutable int reads = 0;
  std::vector<FileWriter> writers;
  [[nodiscard]] std::optional<std::vector<ProcessEntry>> processes() const override {
    ++reads;
    return table;
  }
  [[nodiscard]] std::vector<FileWriter> writersBelow(const std::string& directory) const override {
    std::vector<FileWriter> found;
    for (const FileWriter& writer : writers) {
      if (writer.file.starts_with(directory + "/")) found.push_back(writer);
    }
    return found;
  }
};

class FakeDeviceRegistry : public DeviceRegistry {
 public:
  ~FakeDeviceRegistry() override;
  std::optional<std::string> bytes;
  int reads = 0;
  [[nodiscard]] std::optional<std::string> modelBytes() override {
    ++reads;
    return bytes;
  }
};

class FakeSystemVersion : public SystemVersion {
 public:
  ~FakeSystemVersion() override;
  std::optional<std::map<std::string, std::string>> values;
  int reads = 0;
  [[nodiscard]] std::optional<std::map<std::string, std::string>> read() override {
    ++reads;
    return values;
  }
};

class FakeNetworkStatus : public NetworkStatus {
 public:
  ~FakeNetworkStatus() override;
  bool associated = false;
  std::optional<Number> rssi, strength, rate;
  bool hangs = false;                ///< answers only when told to
  std::vector<WifiHandler> waiting;  ///< for that answer
  void sampleWifi(WifiHandler handler) override {
    if (hangs) {
      waiting.push_back(std::move(handler));
    } else {
      handler(WifiSignal{associated, rssi, strength, rate});
    }
  }
};

class FakeTelephony : public Telephony {
 public:
  ~FakeTelephony() override;
  bool reachable = false;
  std::optional<CellularSignal> signal;
  /// What the queries give; one that is not in here fails.
  std::map<CellularQuery, CellularAnswer> answers;
  std::vector<CellularQuery> asked;
  std::vector<std::string> basebandDumps;
  int open = 0;  ///< connections open right now
  [[nodiscard]] std::unique_ptr<TelephonyConnection> connect() override {
    if (!reachable) return nullptr;
    return std::make_unique<Connection>(*this);
  }
  void sampleSignal(SignalHandler handler) override { handler(reachable ? signal : std::nullopt); }

 private:
  class Connection : public TelephonyConnection {
   public:
    explicit Connection(FakeTelephony& owner) : _owner(owner) { ++_owner.open; }
    ~Connection() override { --_owner.open; }
    [[nodiscard]] std::optional<CellularSignal> signalStrength() override { return _owner.signal; }
    [[nodiscard]] std::optional<CellularAnswer> query(CellularQuery query) override {
      _owner.asked.push_back(query);
      const auto found = _owner.answers.find(query);
      if (found == _owner.answers.end()) return std::nullopt;
      return found->second;
    }
    void dumpBasebandState(std::string_view reason) override { _owner.basebandDumps.emplace_back(reason); }

   private:
    FakeTelephony& _owner;
  };
};

class RecordingProcessExit : public ProcessExit {
 public:
  ~RecordingProcessExit() override;
  std::vector<int> exits;
  void exit(int status) override { exits.push_back(status); }
};

}  // namespace zal::testing
