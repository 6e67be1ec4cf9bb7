#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/alerts/runtime_alert_store.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "tests/linux/loop/run_until.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// A store on a real loop and a real directory, and the people who answer there.
class AlertStoreFixture : public ::testing::Test {
 protected:
  struct Given {
    int code;
    Value text;
    bool operator==(const Given&) const = default;
  };
  static UserAlert question(const std::string& title = "Title") {
    UserAlert alert;
    alert.identifier = "kind";
    alert.title = title;
    alert.message = "Please describe the problem briefly";
    alert.defaultButton = "OK";
    alert.alternateButton = "Cancel";
    alert.textField = UserAlert::TextField{"", "untouched"};
    return alert;
  }
  static UserAlert notice(const std::string& title = "Done") {
    UserAlert alert;
    alert.title = title;
    alert.message = "Started";
    alert.defaultButton = "OK";
    return alert;
  }
  UserAlerts::Listener keep(std::vector<Given>& where) {
    return [&where](const AlertResponse& response) {
      where.push_back({response.code, response.textFieldValue});
    };
  }
  void post(UserAlert alert) { store->post(std::move(alert), keep(given)); }
  void runUntil(const std::function<bool()>& condition) { testing::runUntil(loop, condition); }
  /// Lets everything happen that was posted so far.
  void settle() {
    bool done = false;
    loop.post([&] { done = true; });
    runUntil([&] { return done; });
  }
  std::optional<std::string> answer(const std::string& id, const std::string& button,
                                    const std::optional<std::string>& text = std::nullopt) const {
    return answerAlert(directory, id, button, text);
  }
  /// What a stranger puts into the directory.
  void drop(const std::string& name, const std::string& content) const {
    writeFile(root / "elsewhere", content);
    std::filesystem::rename(root / "elsewhere", directory + "/" + name);
  }
  std::string states() const {
    std::string text;
    for (const AlertRecord& record : listAlerts(directory)) {
      text.append(record.id).append(" ").append(alertStateText(record.state)).append("\n");
    }
    return text;
  }
  /// A process that has ended and is buried.
  static ProcessIdentity endedProcess() {
    const pid_t child = ::fork();
    if (child == 0) ::_exit(0);
    ::waitpid(child, nullptr, 0);
    return {child, 1};
  }
  void leaveRecord(const std::string& id, AlertState state, const ProcessIdentity& agent) const {
    AlertRecord record;
    record.alert = question("Old " + id);
    record.posted = clock.wallNow();
    record.agent = agent;
    record.state = state;
    writeFile(directory + "/" + id + ".toml", alertRecordText(record));
  }
  std::string recordText(const std::string& id) const { return readFile(directory + "/" + id + ".toml"); }
  std::unique_ptr<RuntimeAlertStore> makeStore() {
    return std::make_unique<RuntimeAlertStore>(loop.context(), loop, clock, log, directory);
  }

  TemporaryDirectory root;
  const std::string directory = alertDirectory(root / "run");
  RecordingAgentLog log;
  std::vector<Given> given;
  LinuxRunLoop loop;
  LinuxClock clock;
  std::unique_ptr<RuntimeAlertStore> store = makeStore();
};

}  // namespace zal::testing
