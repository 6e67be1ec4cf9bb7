#pragma once

#include <filesystem>
#include <map>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "cli/tool.h"
#include "tests/client_support/scripted_agent.h"
#include "tests/support/fake_kept_store.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// Archives that a test lays out: archive path to file name to text.
class ScriptedArchives final : public ArchiveReader {
 public:
  std::map<std::string, std::map<std::string, std::string>> archives;
  [[nodiscard]] std::optional<std::vector<SessionFile>> files(const std::string& archive) override {
    const auto found = archives.find(archive);
    if (found == archives.end()) return std::nullopt;
    std::vector<SessionFile> result;
    for (const auto& [name, text] : found->second) result.push_back({name, text.size()});
    return result;
  }
  [[nodiscard]] std::optional<std::string> text(const std::string& archive,
                                                const std::string& path) override {
    const auto found = archives.find(archive);
    if (found == archives.end() || !found->second.contains(path)) return std::nullopt;
    return found->second.at(path);
  }
  std::map<std::string, ArchiveInspection> inspections;
  [[nodiscard]] std::error_code inspect(const std::string& archive, ArchiveInspection& into) override {
    const auto found = inspections.find(archive);
    if (found == inspections.end()) return std::make_error_code(std::errc::no_such_file_or_directory);
    into = found->second;
    return {};
  }
};

/// A machine whose answers a test sets.
class ScriptedMachine final : public ToolHost {
 public:
  [[nodiscard]] const ToolSettings& settings() override { return toolSettings; }
  [[nodiscard]] std::optional<bool> preference(std::string_view key) override {
    const auto found = switches.find(key);
    return found == switches.end() ? std::nullopt : std::optional(found->second);
  }
  [[nodiscard]] std::optional<std::string> setPreference(std::string_view key, bool value) override {
    if (storeTrouble.empty()) switches[std::string(key)] = value;
    return storeTrouble.empty() ? std::nullopt : std::optional(storeTrouble);
  }
  [[nodiscard]] std::optional<std::string> postNotification(std::string_view name) override {
    posted.emplace_back(name);
    return postTrouble.empty() ? std::nullopt : std::optional(postTrouble);
  }
  [[nodiscard]] ArchiveReader& archives() override { return scriptedArchives; }
  [[nodiscard]] std::vector<PostedAlert> alerts() override { return postedAlerts; }
  [[nodiscard]] std::optional<std::string> answerAlert(const std::string& id, const std::string& button,
                                                       const std::optional<std::string>& text) override {
    answers.push_back(id + " " + button + (text ? " \"" + *text + "\"" : ""));
    return answerTrouble.empty() ? std::nullopt : std::optional(answerTrouble);
  }
  [[nodiscard]] std::vector<DumpView> dumps() override { return recordedDumps; }
  [[nodiscard]] std::optional<MemoryView> memory() override { return agentMemory; }
  [[nodiscard]] KeptStore& kept() override { return keptStore; }
  [[nodiscard]] bool isInteractive() const override { return terminal; }
  [[nodiscard]] std::size_t redrawWidth() const override { return terminal ? 60 : 0; }
  [[nodiscard]] bool outputIsTerminal() const override { return terminal; }
  [[nodiscard]] bool wantsColour() const override { return terminal; }
  [[nodiscard]] bool isSuperuser() const override { return false; }
  [[nodiscard]] std::int64_t processId() const override { return 4711; }
  [[nodiscard]] std::string absolutePath(const std::string& path) const override {
    return path.starts_with('/') ? path : workingDirectory + "/" + path;
  }
  /// Stands still but for pauses.
  [[nodiscard]] std::chrono::steady_clock::time_point now() const override { return moment; }
  [[nodiscard]] WallTime wallNow() const override { return wall; }
  [[nodiscard]] std::string timeText(WallTime of) const override {
    const auto days = std::chrono::floor<std::chrono::days>(wall - of).count();
    return std::to_string(days) + " days ago";
  }
  void pause(std::chrono::milliseconds duration) override {
    moment += duration;
    ++pauses;
    if (onPause) onPause();
  }

  ToolSettings toolSettings;
  ScriptedArchives scriptedArchives;
  std::map<std::string, bool, std::less<>> switches;
  std::vector<std::string> posted;
  std::string storeTrouble;
  std::string postTrouble;
  std::vector<PostedAlert> postedAlerts;
  std::vector<std::string> answers;
  std::string answerTrouble;
  std::vector<DumpView> recordedDumps;
  std::optional<MemoryView> agentMemory;
  FakeKeptStore keptStore;
  WallTime wall{std::chrono::seconds{1714651387}};
  std::string workingDirectory;
  bool terminal = false;
  std::chrono::steady_clock::time_point moment;
  int pauses = 0;
  std::function<void()> onPause;
};

/// Runs the tool with arguments as one would type them, split already.
class ToolFixture : public ::testing::Test {
 protected:
  ToolFixture() {
    machine.toolSettings.socketPath = directory / "agent";
    machine.toolSettings.roots.DiagnosticReportRoot = directory / "Reports";
    machine.toolSettings.preferenceFile = "/config/com.vendel.logging.toml";
    machine.workingDirectory = directory.path();
  }
  int run(const std::vector<std::string>& arguments, const std::string& input = "") {
    std::istringstream in(input);
    std::ostringstream outStream;
    std::ostringstream errStream;
    const int code = runTool(arguments, machine, in, outStream, errStream);
    out = outStream.str();
    err = errStream.str();
    return code;
  }
  void startAgent() { agent = std::make_unique<ScriptedAgent>(directory / "agent"); }
  /// The tree's own path replaced by "ROOT", so that whole outputs can be compared.
  [[nodiscard]] std::string plain(std::string text) const {
    for (std::size_t at = 0; (at = text.find(directory.path(), at)) != std::string::npos;) {
      text.replace(at, directory.path().size(), "ROOT");
    }
    return text;
  }

  TemporaryDirectory directory;
  ScriptedMachine machine;
  std::unique_ptr<ScriptedAgent> agent;
  std::string out;
  std::string err;
};

}  // namespace zal::testing
