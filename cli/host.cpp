#include "cli/host.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <optional>
#include <ostream>
#include <string>
#include <thread>

#include "platform/agent_log.h"
#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/archive/inspect_archive.h"
#include "platform/linux/archive/zip_contents.h"
#include "platform/linux/config/configuration_loader.h"
#include "platform/linux/config/host_environment.h"
#include "platform/linux/config/host_paths.h"
#include "platform/linux/config/toml_preference_store.h"
#include "platform/linux/disk/kept_places.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/posix_file_placement.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/ipc/client_shares.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/notifications/notification_file.h"
#include "platform/linux/progress/progress_file.h"

namespace zal {
namespace {

constexpr std::string_view kDomain = "com.vendel.logging";
constexpr std::size_t kUsualColumns = 80;

/// What the preference store has to say is for the person at the terminal.
class ToolLog final : public AgentLog {
 public:
  explicit ToolLog(std::ostream& err) : _err(err) {}
  [[nodiscard]] bool isEnabled(std::string_view) const override { return false; }
  void log(std::string_view, std::string_view) override {}
  void notice(std::string_view) override {}
  void warning(std::string_view text) override { _err << "lirractl: " << text << "\n"; }
  void console(std::string_view, std::string_view) override {}
  void backtrace() override {}

 private:
  std::ostream& _err;
};

class ZipReader final : public ArchiveReader {
 public:
  [[nodiscard]] std::optional<std::vector<SessionFile>> files(const std::string& archive) override {
    const auto entries = listZip(archive);
    if (!entries) return std::nullopt;
    std::vector<SessionFile> result;
    for (const ZipEntry& entry : *entries) {
      result.push_back({entry.name.substr(topOf(entry.name).size()), entry.bytes});
    }
    return result;
  }
  [[nodiscard]] std::optional<std::string> text(const std::string& archive,
                                                const std::string& path) override {
    const auto entries = listZip(archive);
    if (!entries || entries->empty()) return std::nullopt;
    return readZipEntry(archive, topOf(entries->front().name) + path);
  }
  [[nodiscard]] std::error_code inspect(const std::string& archive, ArchiveInspection& into) override {
    const Descriptor file(::open(archive.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat status {};
    if (!file.isOpen() || ::fstat(file.get(), &status) != 0) return lastSystemError();
    if (S_ISDIR(status.st_mode)) return std::make_error_code(std::errc::is_a_directory);
    if (!S_ISREG(status.st_mode)) return std::make_error_code(std::errc::invalid_argument);
    into = inspectArchive(file.get());
    return {};
  }

 private:
  /// The one directory that everything in an archive lies in, with its slash.
  static std::string topOf(const std::string& name) { return name.substr(0, name.find('/') + 1); }
};

std::string timeText(const Clock& clock, WallTime moment) {
  const LocalTime local = clock.localTime(moment);
  char text[64];
  std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d", local.year, local.month, local.day,
                local.hour, local.minute, local.second);
  return text;
}

PostedAlert postedAlert(const AlertRecord& record, const Clock& clock) {
  PostedAlert alert;
  alert.id = record.id;
  alert.title = record.alert.title;
  alert.message = record.alert.message;
  alert.buttons.push_back({"default", record.alert.defaultButton});
  if (record.alert.alternateButton) alert.buttons.push_back({"alternate", *record.alert.alternateButton});
  if (record.alert.otherButton) alert.buttons.push_back({"other", *record.alert.otherButton});
  alert.takesText = record.alert.textField.has_value();
  alert.posted = timeText(clock, record.posted);
  alert.state = alertStateText(record.state);
  if (record.answer) alert.answer = alertButtonName(record.answer->code);
  return alert;
}

DumpView::State dumpState(DumpProgressRecord::State state) {
  switch (state) {
    case DumpProgressRecord::State::running:
      return DumpView::State::running;
    case DumpProgressRecord::State::done:
      return DumpView::State::done;
    case DumpProgressRecord::State::failed:
      return DumpView::State::failed;
    case DumpProgressRecord::State::cutOff:
      return DumpView::State::cutOff;
  }
  return DumpView::State::cutOff;
}

DumpView dumpView(ListedDumpProgress listed) {
  DumpProgressRecord& record = listed.record;
  DumpView view;
  view.name = std::move(listed.name);
  view.service = std::move(record.service);
  view.directory = std::move(record.directory);
  for (DumpProgressRecord::Step& step : record.steps) {
    DumpView::Step& shown = view.steps.emplace_back();
    shown.name = std::move(step.name);
    if (step.began) shown.began = std::chrono::floor<std::chrono::milliseconds>(*step.began - record.began);
  }
  view.currentStep = record.currentStep;
  for (DumpProgressRecord::Missing& one : record.missing)
    view.missing.push_back({std::move(one.what), std::move(one.why)});
  view.state = dumpState(record.state);
  view.reason = std::move(record.reason);
  return view;
}

class ThisMachine final : public ToolHost {
 public:
  explicit ThisMachine(std::ostream& err)
      : _environment(HostEnvironment::ofThisProcess()),
        _preferenceDirectory(preferenceDirectory(_environment)),
        _log(err),
        _preferences(_preferenceDirectory, _log) {}

  [[nodiscard]] const ToolSettings& settings() override {
    if (!_settings) _settings = _load();
    return *_settings;
  }
  [[nodiscard]] std::optional<bool> preference(std::string_view key) override {
    return _preferences.boolean(kDomain, key);
  }
  [[nodiscard]] std::optional<std::string> setPreference(std::string_view key, bool value) override {
    return TomlPreferenceStore::setBoolean(_preferenceDirectory, kDomain, key, value);
  }
  [[nodiscard]] std::optional<std::string> postNotification(std::string_view name) override {
    const std::string directory = notificationDirectory(settings().roots.RuntimeRoot);
    const std::error_code error = zal::postNotification(directory, name);
    if (!error) return std::nullopt;
    return directory + ": " + error.message();
  }
  [[nodiscard]] ArchiveReader& archives() override { return _archives; }
  [[nodiscard]] std::vector<PostedAlert> alerts() override {
    std::vector<PostedAlert> result;
    for (const AlertRecord& record : listAlerts(alertDirectory(settings().roots.RuntimeRoot)))
      result.push_back(postedAlert(record, _clock));
    return result;
  }
  [[nodiscard]] std::optional<std::string> answerAlert(const std::string& id, const std::string& button,
                                                       const std::optional<std::string>& text) override {
    return zal::answerAlert(alertDirectory(settings().roots.RuntimeRoot), id, button, text);
  }
  [[nodiscard]] std::vector<DumpView> dumps() override {
    std::vector<DumpView> result;
    for (ListedDumpProgress& listed : listDumpProgress(progressDirectory(settings().roots.RuntimeRoot)))
      result.push_back(dumpView(std::move(listed)));
    return result;
  }
  [[nodiscard]] std::optional<MemoryView> memory() override {
    const auto shares = readClientShares(clientSharesPath(settings().roots.RuntimeRoot));
    if (!shares) return std::nullopt;
    MemoryView view{.agent = shares->agent, .bytes = shares->bytes, .clients = {}};
    for (const ClientShare& client : shares->clients) {
      view.clients.push_back(
          {client.process, client.user, client.bytes, client.delayedMessages, client.isWaiting});
    }
    return view;
  }
  [[nodiscard]] KeptStore& kept() override {
    if (!_kept) _kept.emplace(keptPlaces(settings().roots, _environment.userId), _files);
    return *_kept;
  }
  [[nodiscard]] bool isInteractive() const override {
    return outputIsTerminal() && ::isatty(STDIN_FILENO) != 0;
  }
  [[nodiscard]] std::size_t redrawWidth() const override {
    winsize size{};
    if (!outputIsTerminal() || _environment.variable("TERM") == "dumb") return 0;
    const bool known = ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col != 0;
    return known ? size.ws_col : kUsualColumns;
  }
  [[nodiscard]] bool outputIsTerminal() const override { return ::isatty(STDOUT_FILENO) != 0; }
  [[nodiscard]] bool wantsColour() const override {
    return outputIsTerminal() && _environment.variable("NO_COLOR").empty() &&
           _environment.variable("TERM") != "dumb";
  }
  [[nodiscard]] bool isSuperuser() const override { return _environment.isSystem(); }
  [[nodiscard]] std::int64_t processId() const override { return ::getpid(); }
  [[nodiscard]] std::string absolutePath(const std::string& path) const override {
    std::error_code error;
    const auto absolute = std::filesystem::absolute(path, error);
    return error ? path : absolute.lexically_normal().string();
  }
  [[nodiscard]] std::chrono::steady_clock::time_point now() const override {
    return std::chrono::steady_clock::now();
  }
  [[nodiscard]] WallTime wallNow() const override { return _clock.wallNow(); }
  [[nodiscard]] std::string timeText(WallTime moment) const override { return zal::timeText(_clock, moment); }
  void pause(std::chrono::milliseconds duration) override { std::this_thread::sleep_for(duration); }

 private:
  ToolSettings _load() {
    LoadedConfiguration loaded = ConfigurationLoader(_environment).load();
    ToolSettings settings;
    settings.socketPath = socketPath(_environment).value_or("");
    settings.configurationFile = std::move(loaded.file);
    settings.warnings = std::move(loaded.warnings);
    settings.preferenceFile = TomlPreferenceStore::filePath(_preferenceDirectory, kDomain);
    settings.roots = std::move(loaded.configuration.roots);
    settings.disk = loaded.configuration.disk;
    return settings;
  }

  HostEnvironment _environment;
  LinuxClock _clock;
  std::string _preferenceDirectory;
  ToolLog _log;
  TomlPreferenceStore _preferences;
  std::optional<ToolSettings> _settings;
  ZipReader _archives;
  PosixFilePlacement _files{"", ""};  // the store asks it for nothing as long as nothing is removed
  std::optional<FileKeptStore> _kept;
};

}  // namespace

std::unique_ptr<ToolHost> thisMachine(std::ostream& err) { return std::make_unique<ThisMachine>(err); }

}  // namespace zal
