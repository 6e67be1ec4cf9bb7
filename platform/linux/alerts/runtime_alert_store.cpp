#include "platform/linux/alerts/runtime_alert_store.h"

#include <algorithm>
#include <exception>
#include <filesystem>
#include <utility>
#include <vector>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/config/text_file.h"
#include "platform/linux/files/directory_names.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/files/whole_file.h"
#include "platform/linux/notifications/notification_file.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

constexpr std::size_t kMostDisposable = 50;
constexpr std::size_t kMostQuestions = 1000;
constexpr unsigned kMostTakenNumbers = 1000;  // by others, while this agent looks for a free one
constexpr double kLongestTimeout = 31'536'000;
constexpr std::size_t kLongestScreenText = kLargestAlertAnswer;

/// The id in a file's name that ends so; nothing when it does not.
std::optional<std::string_view> idBefore(std::string_view name, std::string_view ending) {
  if (!name.ends_with(ending)) return std::nullopt;
  return name.substr(0, name.size() - ending.size());
}

AlertResponse responseFor(const UserAlert& alert, const std::optional<AlertAnswer>& answer) {
  AlertResponse response;
  if (answer) response.code = answer->code;
  if (alert.textField) {
    response.textFieldValue = answer && answer->text ? *answer->text : alert.textField->initialValue;
  }
  return response;
}

void removeFile(const std::string& path) {
  std::error_code ignored;  // it is gone, or the next one says what is wrong here
  std::filesystem::remove(path, ignored);
}

}  // namespace

RuntimeAlertStore::RuntimeAlertStore(asio::io_context& context, RunLoop& loop, const Clock& clock,
                                     AgentLog& log, std::string directory)
    : _context(context), _loop(loop), _clock(clock), _log(log), _directory(std::move(directory)) {}

RuntimeAlertStore::~RuntimeAlertStore() = default;

void RuntimeAlertStore::post(UserAlert alert, Listener listener) {
  _loop.post([this, alive = std::weak_ptr<bool>(_alive), posted = std::move(alert),
              answered = std::move(listener)]() mutable {
    if (alive.expired()) return;
    try {
      _accept(std::move(posted), std::move(answered));
    } catch (const std::exception& problem) {
      _log.warning(std::string("An alert was lost: ") + problem.what());
    }
  });
}

void RuntimeAlertStore::_accept(UserAlert alert, Listener listener) {
  _mainThread.check("RuntimeAlertStore");
  if (!_isReady()) return;
  const bool isQuestion = !isNotice(alert);
  if (isQuestion && _questions >= kMostQuestions) {
    _log.warning("Alert \"" + escapedLine(cutAtCharacter(alert.title, 200)) +
                 "\" was dropped: " + std::to_string(kMostQuestions) + " others wait for an answer already");
    return;
  }
  AlertRecord record;
  record.alert = boundedAlert(std::move(alert));
  record.posted = _clock.wallNow();
  record.agent = _agent;
  const auto number = _place(record);
  if (!number) return;
  _complained = false;
  _announce(record);
  Waiting& waiting = _waiting[*number];
  waiting.record = std::move(record);
  waiting.listener = std::move(listener);
  _armTimeout(*number, waiting);
  if (isQuestion) {
    ++_questions;
  } else {
    _disposable.insert(*number);
  }
  _show(waiting.record, *number);
  _prune();
}

/// The directory is there and watched.
bool RuntimeAlertStore::_isReady() {
  if (const std::error_code error = makeNotificationDirectory(_directory)) {
    _complain(_directory + ": cannot be made: " + error.message());
    return false;
  }
  if (_watch) return true;
  _agent = ProcessIdentity::ofThisProcess();
  _lookAtOldRecords();
  _watch = std::make_unique<DirectoryWatch>(
      _context, _directory, makeNotificationDirectory,
      DirectoryWatch::Handlers{[this](std::string_view name) { _takeArrival(name); },
                               [this] { _takeAllAnswers(); },
                               [this](std::string_view problem) { _log.warning(problem); }});
  return true;
}

void RuntimeAlertStore::_lookAtOldRecords() {
  for (const std::string& name : namesIn(_directory)) {
    const auto id = idBefore(name, kAlertRecordEnding);
    const auto number = id ? alertNumber(*id) : std::nullopt;
    if (number) _lookAtOldRecord(*number);
  }
}

/// What another agent that still runs has in the directory is its own affair.
void RuntimeAlertStore::_lookAtOldRecord(unsigned number) {
  _lastNumber = std::max(_lastNumber, number);
  const auto record = readAlert(_directory, std::to_string(number));
  if (record && record->agent.isRunning()) return;
  if (record && record->state == AlertState::cutOff) _rewrite(*record);
  removeFile(_answerPath(number));  // it came too late
  _disposable.insert(number);
}

/// Writes the record under the next free number.
std::optional<unsigned> RuntimeAlertStore::_place(AlertRecord& record) {
  std::error_code error = std::make_error_code(std::errc::file_exists);
  for (unsigned tries = 0; tries < kMostTakenNumbers && error == std::errc::file_exists; ++tries) {
    record.id = std::to_string(++_lastNumber);
    error = placeWholeFile(_recordPath(_lastNumber), alertRecordText(record), ExistingFile::stays);
    if (!error) return _lastNumber;
  }
  _complain(_recordPath(_lastNumber) + ": cannot be written: " + error.message() +
            "; nobody sees the alert \"" + escapedLine(cutAtCharacter(record.alert.title, 200)) + "\"");
  return std::nullopt;
}

void RuntimeAlertStore::_announce(const AlertRecord& record) {
  _log.notice("Alert " + record.id + ": " + escapedLine(record.alert.title) + ": " +
              escapedLine(record.alert.message) + " (to answer: lirractl alerts answer " + record.id + ")");
}

void RuntimeAlertStore::_show(const AlertRecord& record, unsigned number) {
  if (_screen == nullptr) return;
  _screen->present(record.id, record.alert,
                   {.onAnswer =
                        [this, number, alive = std::weak_ptr<bool>(_alive)](const AlertAnswer& answer) {
                          if (!alive.expired()) _takeScreenAnswer(number, answer);
                        },
                    .onDeclined = [] {}});
}

void RuntimeAlertStore::_takeScreenAnswer(unsigned number, AlertAnswer answer) {
  const auto waiting = _waiting.find(number);
  if (waiting == _waiting.end() || !alertHasButton(waiting->second.record.alert, answer.code)) return;
  answer.isFromScreen = true;
  if (answer.text) answer.text = replacedUtf8(cutAtCharacter(*answer.text, kLongestScreenText));
  _finish(number, AlertState::answered, answer);
}

void RuntimeAlertStore::_armTimeout(unsigned number, Waiting& waiting) {
  const double seconds = waiting.record.alert.timeout;
  if (!(seconds > 0)) return;
  const std::chrono::duration<double> delay(std::min(seconds, kLongestTimeout));
  waiting.timeout = ScopedTimer(
      _loop, _loop.callAfter(std::chrono::duration_cast<std::chrono::nanoseconds>(delay),
                             [this, number] { _finish(number, AlertState::timedOut, std::nullopt); }));
}

void RuntimeAlertStore::_takeArrival(std::string_view name) {
  const auto id = idBefore(name, kAlertAnswerEnding);
  if (!id) return;
  const std::string path = _directory + "/" + std::string(name);
  if (const auto number = alertNumber(*id)) {
    _takeAnswer(*number, path);
  } else {
    _refuseAnswer(*id, path, "there is no such alert");
  }
}

/// After arrivals were missed.
void RuntimeAlertStore::_takeAllAnswers() {
  for (const std::string& name : namesIn(_directory)) _takeArrival(name);
}

void RuntimeAlertStore::_takeAnswer(unsigned number, const std::string& path) {
  const std::string id = std::to_string(number);
  const auto waiting = _waiting.find(number);
  if (waiting == _waiting.end()) {
    const auto record = readAlert(_directory, id);
    const bool ofAnotherAgent = record && record->state == AlertState::waiting && record->agent != _agent;
    if (!ofAnotherAgent) _refuseAnswer(id, path, "nothing waits for it");
    return;
  }
  std::string text;
  const std::error_code error = readTextFile(path, text, kLargestAlertAnswer);
  if (error == std::errc::no_such_file_or_directory) return;
  std::string reason = error.message();
  auto answer = error ? std::nullopt : parseAlertAnswer(text, reason);
  if (answer && !alertHasButton(waiting->second.record.alert, answer->code)) {
    reason = "the alert has no button \"" + std::string(alertButtonName(answer->code)) + "\"";
    answer.reset();
  }
  if (!answer) {
    _refuseAnswer(id, path, reason);
    return;
  }
  _finish(number, AlertState::answered, answer);
}

void RuntimeAlertStore::_refuseAnswer(std::string_view id, const std::string& path, std::string_view reason) {
  removeFile(path);
  _log.warning("An answer to alert " + escapedLine(id) + " was dropped: " + std::string(reason));
}

/// The listener runs from the loop: what it throws or takes is no concern of the watch.
void RuntimeAlertStore::_finish(unsigned number, AlertState state, const std::optional<AlertAnswer>& answer) {
  auto entry = _waiting.extract(number);
  if (entry.empty()) return;
  Waiting& waiting = entry.mapped();
  waiting.record.state = state;
  waiting.record.answer = answer;
  _rewrite(waiting.record);
  removeFile(_answerPath(number));
  AlertResponse response = responseFor(waiting.record.alert, answer);
  if (waiting.listener) {
    _loop.post(
        [listener = std::move(waiting.listener), response = std::move(response)] { listener(response); });
  }
  if (!isNotice(waiting.record.alert)) --_questions;
  _disposable.insert(number);
  if (_screen != nullptr) _screen->withdraw(waiting.record.id);
  _prune();
}

void RuntimeAlertStore::_prune() {
  while (_disposable.size() > kMostDisposable) {
    const unsigned oldest = *_disposable.begin();
    _disposable.erase(_disposable.begin());
    _forget(oldest);
    removeFile(_recordPath(oldest));
    removeFile(_answerPath(oldest));
  }
}

/// An old notice goes from the screen with its record.
void RuntimeAlertStore::_forget(unsigned number) {
  const auto notice = _waiting.extract(number);
  if (_screen != nullptr && !notice.empty()) _screen->withdraw(notice.mapped().record.id);
}

void RuntimeAlertStore::cutOffWaiting() {
  _mainThread.check("RuntimeAlertStore");
  if (_screen != nullptr) _screen->agentEnds();
  _watch.reset();
  for (auto& [number, waiting] : std::exchange(_waiting, {})) {
    AlertRecord record = waiting.record;
    record.state = AlertState::cutOff;
    _rewrite(record);
  }
}

void RuntimeAlertStore::_rewrite(const AlertRecord& record) {
  const std::string path = _directory + "/" + record.id + std::string(kAlertRecordEnding);
  const std::error_code error = placeWholeFile(path, alertRecordText(record), ExistingFile::isReplaced);
  if (error) _complain(path + ": cannot be written: " + error.message());
}

void RuntimeAlertStore::_complain(const std::string& problem) {
  if (std::exchange(_complained, true)) return;
  _log.warning(problem);
}

std::string RuntimeAlertStore::_recordPath(unsigned number) const {
  return _directory + "/" + std::to_string(number) + std::string(kAlertRecordEnding);
}

std::string RuntimeAlertStore::_answerPath(unsigned number) const {
  return _directory + "/" + std::to_string(number) + std::string(kAlertAnswerEnding);
}

}  // namespace zal
