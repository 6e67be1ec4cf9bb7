#pragma once

#include <functional>
#include <string>
#include <vector>

#include <flatbuffers/flexbuffers.h>

#include "platform/linux/wire/wire_message.h"

namespace zal {

/// A root map made with the format's own library.
inline std::string flexMap(const std::function<void(flexbuffers::Builder&)>& fill,
                           flexbuffers::BuilderFlag flags = flexbuffers::BUILDER_FLAG_SHARE_KEYS) {
  flexbuffers::Builder builder(256, flags);
  builder.Map([&] { fill(builder); });
  builder.Finish();
  return {builder.GetBuffer().begin(), builder.GetBuffer().end()};
}

/// The message of a payload, which outlives it. Kind 0 unless said otherwise.
inline std::optional<WireMessage> messageOf(const std::string& payload, FrameKind kind = FrameKind::message,
                                            std::uint64_t cookie = 0) {
  FrameHeader header;
  header.length = static_cast<std::uint32_t>(payload.size());
  header.kind = kind;
  header.cookie = cookie;
  return WireMessage::fromFrame({header, payload});
}

/// Asks for every key as every type, and for the description: all that can be done with a message.
/// Gives a size that depends on it all, never 0.
inline std::size_t readEverything(const Message& message, const std::vector<std::string>& keys) {
  std::size_t seen = message.description().size();
  for (const std::string& key : keys) {
    seen += message.string(key).value_or("").size();
    seen += message.int64(key) != 0 ? 1U : 0U;
    seen += message.uint64(key) != 0 ? 1U : 0U;
    seen += message.real(key) != 0.0 ? 1U : 0U;
    if (const auto dictionary = message.dictionary(key)) seen += dictionary->size();
    if (const auto number = message.codedNumber(key)) seen += numberText(*number).size();
  }
  return seen;
}

}  // namespace zal
