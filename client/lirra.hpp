#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <type_traits>
#include <utility>

#include "lirra.h"

/// The same library for C++: owners instead of raw handles, texts as one likes. What each call means
/// stands in lirra.h.
namespace lirra {

using Result = lirra_result;

/// A text that may be absent: a literal, a std::string, or nullptr. Borrowed for the call.
class Text {
 public:
  Text(std::nullptr_t) {}                                 // NOLINT(google-explicit-constructor)
  Text(const char* text) : _text(text) {}                 // NOLINT(google-explicit-constructor)
  Text(const std::string& text) : _text(text.c_str()) {}  // NOLINT(google-explicit-constructor)
  operator const char*() const { return _text; }          // NOLINT(google-explicit-constructor)

 private:
  const char* _text = nullptr;
};

/// Keys with values. Movable; one thread at a time.
class Dictionary {
 public:
  Dictionary() : _raw(lirra_dictionary_create()) {}
  /// Takes it over.
  explicit Dictionary(lirra_dictionary* raw) : _raw(raw) {}
  ~Dictionary() { lirra_dictionary_free(_raw); }
  Dictionary(Dictionary&& other) noexcept : _raw(std::exchange(other._raw, nullptr)) {}
  Dictionary& operator=(Dictionary&& other) noexcept {
    std::swap(_raw, other._raw);
    return *this;
  }

  Dictionary& set(Text key, Text value) { return lirra_dictionary_set_string(_raw, key, value), *this; }
  Dictionary& setInt64(Text key, std::int64_t value) {
    return lirra_dictionary_set_int64(_raw, key, value), *this;
  }
  Dictionary& setUInt64(Text key, std::uint64_t value) {
    return lirra_dictionary_set_uint64(_raw, key, value), *this;
  }
  Dictionary& setDouble(Text key, double value) {
    return lirra_dictionary_set_double(_raw, key, value), *this;
  }
  Dictionary& setBool(Text key, bool value) {
    return lirra_dictionary_set_bool(_raw, key, value ? 1 : 0), *this;
  }

  [[nodiscard]] const lirra_dictionary* raw() const { return _raw; }

 private:
  lirra_dictionary* _raw;
};

/// One sender's connection to the agent. Any thread, except for the end. Movable.
class Client {
 public:
  struct Options {
    std::string socketPath = {};  ///< empty: where the agent of this user listens
    std::string sender = {};      ///< empty: none
    std::size_t queueLimit = 0;
    bool synchronous = false;
    int closeTimeoutMs = 1000;  ///< how long the destructor waits for the agent
  };

  explicit Client(const Options& options) : _closeTimeoutMs(options.closeTimeoutMs) {
    lirra_options raw;
    lirra_options_init(&raw);
    if (!options.socketPath.empty()) raw.socket_path = options.socketPath.c_str();
    if (!options.sender.empty()) raw.sender = options.sender.c_str();
    raw.queue_limit = options.queueLimit;
    raw.synchronous = options.synchronous ? 1 : 0;
    _raw = lirra_open(&raw);
  }
  ~Client() { (void)close(_closeTimeoutMs); }
  Client(Client&& other) noexcept
      : _raw(std::exchange(other._raw, nullptr)), _closeTimeoutMs(other._closeTimeoutMs) {}
  Client& operator=(Client&& other) noexcept {
    std::swap(_raw, other._raw);
    std::swap(_closeTimeoutMs, other._closeTimeoutMs);
    return *this;
  }

  /// False when lirra_open gave nothing; every call is then LIRRA_INVALID.
  explicit operator bool() const { return _raw != nullptr; }
  [[nodiscard]] lirra_handle* raw() const { return _raw; }
  Result close(int timeoutMs) {
    return _raw == nullptr ? LIRRA_INVALID : lirra_close(std::exchange(_raw, nullptr), timeoutMs);
  }
  Result flush(int timeoutMs) { return lirra_flush(_raw, timeoutMs); }
  [[nodiscard]] lirra_statistics statistics() const {
    lirra_statistics result{};
    result.size = sizeof result;
    (void)lirra_status(_raw, &result);
    return result;
  }
  [[nodiscard]] std::string trouble() const {
    std::string text(lirra_trouble(_raw, nullptr, 0) + 1, '\0');
    // It may have become longer or shorter meanwhile; what fits is kept.
    const std::size_t length = lirra_trouble(_raw, text.data(), text.size());
    text.resize(length < text.size() ? length : text.size() - 1);
    return text;
  }

  Result beginSession(Text session, std::int64_t beginFlags = 0, std::int64_t endFlags = 0) {
    return lirra_begin_session(_raw, session, beginFlags, endFlags);
  }
  Result endSession(Text session) { return lirra_end_session(_raw, session); }
  Result checkpoint(Text session, Text checkpoint, double time = LIRRA_NOW) {
    return lirra_checkpoint(_raw, session, checkpoint, time);
  }
  Result describe(Text session, Text description, Text log, double time = LIRRA_NOW) {
    return lirra_describe(_raw, session, description, log, time);
  }
  Result callInfo(Text session, Text category, Text info) {
    return lirra_call_info(_raw, session, category, info);
  }
  Result callQuality(Text session, Text description, Text log) {
    return lirra_call_quality(_raw, session, description, log);
  }
  /// Keeps the kind of the number: real, signed or unsigned.
  template <class Number, class = std::enable_if_t<std::is_arithmetic_v<Number>>>
  Result callMetric(Text session, Text metric, Number value) {
    if constexpr (std::is_floating_point_v<Number>) {
      return lirra_call_metric(_raw, session, metric, static_cast<double>(value));
    } else if constexpr (std::is_signed_v<Number>) {
      return lirra_call_metric_int64(_raw, session, metric, value);
    } else {
      return lirra_call_metric_uint64(_raw, session, metric, value);
    }
  }
  Result pulse(Text session) { return lirra_pulse(_raw, session); }
  Result sessionEvent(Text session, std::int64_t event) { return lirra_session_event(_raw, session, event); }
  Result initiator(Text session, Text initiator) { return lirra_initiator(_raw, session, initiator); }
  Result receiver(Text session, Text receiver) { return lirra_receiver(_raw, session, receiver); }
  Result failureReason(Text session, Text reason) { return lirra_failure_reason(_raw, session, reason); }
  Result addLogFile(Text session, Text category, Text path) {
    return lirra_add_log_file(_raw, session, category, path);
  }
  Result log(Text type, Text category, Text text, std::int64_t level = 0, std::uint64_t time = 0) {
    return lirra_log(_raw, type, category, level, time, text);
  }
  Result event(Text type, Text category, Text text, std::int64_t level = 0, std::uint64_t time = 0) {
    return lirra_event(_raw, type, category, level, time, text);
  }

  Result action(Text session, std::int64_t action) { return lirra_action(_raw, session, action); }
  Result action(Text session, std::int64_t action, const Dictionary& info) {
    return lirra_action_with_info(_raw, session, action, info.raw());
  }
  Result ask(Text session, std::int64_t action, const Dictionary& info, std::uint64_t& ticket) {
    return lirra_action_ask(_raw, session, action, info.raw(), &ticket);
  }
  Result awaitReply(std::uint64_t ticket, int timeoutMs, Dictionary& reply) {
    lirra_dictionary* raw = nullptr;
    const Result result = lirra_action_wait(_raw, ticket, timeoutMs, &raw);
    if (result == LIRRA_OK) reply = Dictionary(raw);
    return result;
  }

 private:
  lirra_handle* _raw = nullptr;
  int _closeTimeoutMs;
};

}  // namespace lirra
