#include "platform/linux/client_channel/request_encoder.h"

#include <memory>
#include <string>

#include "platform/linux/wire/message_builder.h"

namespace zal {
namespace {

constexpr std::size_t kKeptFrameCapacity = 256U << 10U;

struct Encoder {
  MessageBuilder builder;
  std::string frame;
};

Encoder& encoderOfThread() {
  thread_local std::unique_ptr<Encoder> encoder;
  // One huge text must not keep its memory for the life of the thread.
  if (!encoder || encoder->frame.capacity() > kKeptFrameCapacity) encoder = std::make_unique<Encoder>();
  encoder->frame.clear();
  encoder->builder.reset();
  return *encoder;
}

struct FieldSetter {
  MessageBuilder& builder;
  std::string_view key;
  void operator()(std::string_view text) const { builder.setString(key, text); }
  void operator()(std::int64_t number) const { builder.setInt64(key, number); }
  void operator()(std::uint64_t number) const { builder.setUInt64(key, number); }
  void operator()(double number) const { builder.setReal(key, number); }
  void operator()(const Number& number) const { builder.setCodedNumber(key, number); }
  void operator()(const ValueMap* dictionary) const { builder.setDictionary(key, *dictionary); }
};

}  // namespace

std::optional<std::string_view> encodeRequest(std::span<const RequestField> fields, FrameKind kind,
                                              std::uint64_t cookie, std::uint32_t largestPayload) {
  std::size_t textBytes = 0;
  for (const RequestField& field : fields) {
    if (const auto* text = std::get_if<std::string_view>(&field.content)) textBytes += text->size();
  }
  if (textBytes > largestPayload) return std::nullopt;

  Encoder& encoder = encoderOfThread();
  for (const RequestField& field : fields) std::visit(FieldSetter{encoder.builder, field.key}, field.content);
  encoder.builder.finish(encoder.frame, kind, cookie);
  if (encoder.frame.size() > frameSize(largestPayload)) return std::nullopt;
  return encoder.frame;
}

std::string_view encodeBarrier(std::uint64_t cookie) {
  Encoder& encoder = encoderOfThread();
  appendFrame(encoder.frame, FrameHeader{0, kProtocolVersion, FrameKind::barrier, cookie}, {});
  return encoder.frame;
}

}  // namespace zal
