// What one record costs on its way through the protocol's code alone, without a socket.

#include <benchmark/benchmark.h>

#include <cstdint>
#include <cstdlib>
#include <string>

#include "bench/servers/frame_sender.h"
#include "bench/servers/record_text.h"
#include "platform/linux/wire/frame_decoder.h"
#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/wire_message.h"

namespace zal::bench {
namespace {

constexpr int kFramesAChunk = 1000;

std::string chunkOfFrames() {
  std::string chunk;
  for (int number = 0; number < kFramesAChunk; ++number) chunk += recordFrame(1);
  return chunk;
}

void cutFrames(benchmark::State& state) {
  const std::string chunk = chunkOfFrames();
  FrameDecoder decoder;
  for (auto _ : state) {
    decoder.feed(chunk);
    while (auto frame = decoder.next()) benchmark::DoNotOptimize(frame);
  }
  state.SetItemsProcessed(state.iterations() * kFramesAChunk);
}
BENCHMARK(cutFrames);

void cutAndVerifyFrames(benchmark::State& state) {
  const std::string chunk = chunkOfFrames();
  FrameDecoder decoder;
  for (auto _ : state) {
    decoder.feed(chunk);
    while (auto frame = decoder.next()) {
      auto message = WireMessage::fromFrame(*frame);
      if (!message) abort();
      benchmark::DoNotOptimize(message);
    }
  }
  state.SetItemsProcessed(state.iterations() * kFramesAChunk);
}
BENCHMARK(cutAndVerifyFrames);

void decodeRecords(benchmark::State& state) {
  const std::string chunk = chunkOfFrames();
  FrameDecoder decoder;
  for (auto _ : state) {
    decoder.feed(chunk);
    while (auto frame = decoder.next()) {
      const auto message = WireMessage::fromFrame(*frame);
      if (!message || message->int64("__ipc__event_code__") != 15) abort();
      benchmark::DoNotOptimize(message->string("logString"));
      benchmark::DoNotOptimize(message->int64("level"));
      benchmark::DoNotOptimize(message->uint64("time"));
      benchmark::DoNotOptimize(message->string("category"));
      benchmark::DoNotOptimize(message->string("sender"));
      benchmark::DoNotOptimize(message->string("type"));
    }
  }
  state.SetItemsProcessed(state.iterations() * kFramesAChunk);
}
BENCHMARK(decodeRecords);

void buildRecords(benchmark::State& state) {
  const std::string text = RecordText(1).text();
  MessageBuilder builder;
  std::string out;
  for (auto _ : state) {
    out.clear();
    builder.setInt64("__ipc__event_code__", 15);
    builder.setString("logString", text);
    builder.setInt64("level", 6);
    builder.setUInt64("time", 1'700'000'000'123ULL);
    builder.setString("category", "Default");
    builder.setString("sender", "callservice");
    builder.setString("type", kRecordType);
    benchmark::DoNotOptimize(builder.finish(out, FrameKind::message, 0));
  }
  state.SetItemsProcessed(state.iterations());
}
BENCHMARK(buildRecords);

}  // namespace
}  // namespace zal::bench

BENCHMARK_MAIN();
