#include "bench/servers/frame_sender.h"

#include "bench/servers/record_text.h"
#include "platform/linux/wire/message_builder.h"

namespace zal::bench {

std::string recordFrame(unsigned client) {
  MessageBuilder builder;
  builder.setInt64("__ipc__event_code__", 15);
  builder.setString("logString", RecordText(client).text());
  builder.setInt64("level", 6);
  builder.setUInt64("time", 1'700'000'000'123ULL);
  builder.setString("category", "Default");
  builder.setString("sender", "callservice");
  builder.setString("type", kRecordType);
  std::string frame;
  builder.finish(frame, FrameKind::message, 0);
  return frame;
}

FrameSender::FrameSender(const std::filesystem::path& socket, unsigned client)
    : _socket(UnixSocket::Kind::stream, socket),
      _frame(recordFrame(client)),
      _position(numberPosition(_frame)) {}

void FrameSender::send(std::uint64_t number) {
  putNumber(_frame, _position, number);
  _socket.sendAll(_frame);
}

}  // namespace zal::bench
