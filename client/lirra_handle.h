#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "client/lirra.h"
#include "platform/client_channel.h"

/// Behind the C interface's opaque names.
struct lirra_handle {
  std::optional<std::string> sender;
  std::unique_ptr<zal::ClientChannel> channel;
};

struct lirra_dictionary {
  zal::ValueMap values;
  /// What lirra_dictionary_dictionary gave out, by key.
  mutable std::map<std::string, std::unique_ptr<lirra_dictionary>, std::less<>> inner;
};

namespace lirra {

/// Requests as the agent tells them apart.
enum class EventCode : std::int64_t {
  beginSession = 0,
  endSession = 1,
  checkpoint = 2,
  description = 3,
  callInfo = 4,
  callQuality = 5,
  callMetric = 6,
  pulse = 7,
  action = 8,
  actionWithInfo = 9,
  sessionEvent = 10,
  initiator = 11,
  receiver = 12,
  failureReason = 13,
  addLogFile = 14,
  logRecord = 15,
  eventRecord = 16,
};

/// The fields of one request, in a fixed place. A NULL text leaves its key out.
class Request {
 public:
  Request(EventCode code, const std::optional<std::string>& sender) {
    add("__ipc__event_code__", static_cast<std::int64_t>(code));
    if (sender) add("sender", std::string_view(*sender));
  }
  Request& text(std::string_view key, const char* value) {
    if (value != nullptr) add(key, std::string_view(value));
    return *this;
  }
  Request& add(std::string_view key, zal::RequestField::Content content) {
    _fields[_count++] = {key, content};
    return *this;
  }
  [[nodiscard]] std::span<const zal::RequestField> fields() const { return {_fields.data(), _count}; }

 private:
  static constexpr std::size_t kMostFields = 8;
  std::array<zal::RequestField, kMostFields> _fields;
  std::size_t _count = 0;
};

[[nodiscard]] lirra_result resultOf(zal::ClientOutcome outcome);

/// Exceptions end here: what can be thrown is want of memory.
template <class Work>
lirra_result guarded(Work&& work) noexcept {
  try {
    return work();
  } catch (...) {
    return LIRRA_DROPPED;
  }
}

}  // namespace lirra
