#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/linux/wire/frame.h"
#include "platform/value.h"

namespace zal {

/// Makes the payload of one message after another: a FlexBuffers root map of exactly typed values.
/// Reuse one object; it keeps its buffers. One thread at a time. Keys are literals that outlive
/// finish(); a key set twice is the caller's mistake.
///
///     builder.setString("sender", "callservice");
///     builder.setInt64("__ipc__event_code__", 2);
///     builder.finish(out, FrameKind::message, 0);   // appends one whole frame; the builder is empty again
class MessageBuilder {
 public:
  MessageBuilder();
  ~MessageBuilder();
  MessageBuilder(const MessageBuilder&) = delete;
  MessageBuilder& operator=(const MessageBuilder&) = delete;

  void setString(std::string_view key, std::string_view value);
  void setInt64(std::string_view key, std::int64_t value);
  void setUInt64(std::string_view key, std::uint64_t value);
  void setReal(std::string_view key, double value);
  void setDictionary(std::string_view key, const ValueMap& value);
  /// A coded value: a Blob that holds a FlexBuffers scalar of its own.
  void setCodedNumber(std::string_view key, const Number& value);

  /// Appends the frame to `out`. Returned: its size in bytes.
  std::size_t finish(std::string& out, FrameKind kind, std::uint64_t cookie);
  /// Forgets what was set.
  void reset();

 private:
  struct State;
  std::unique_ptr<State> _state;
};

/// A whole root map from a dictionary; what replies and nested dictionaries are made of.
[[nodiscard]] std::string encodeDictionary(const ValueMap& value);

}  // namespace zal
