// A call in one process: two sides on the loopback interface, real packets, measured and reported.

#include <poll.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <filesystem>
#include <sstream>
#include <string>

#include "examples/loopback_call/call_reporter.h"
#include "examples/loopback_call/media_endpoint.h"
#include "examples/loopback_call/packet_trace.h"

namespace loopback {
namespace {

constexpr std::uint64_t kPacketInterval = 20'000'000;     // nanoseconds: 20 ms of audio a packet
constexpr std::uint64_t kReportInterval = 1'000'000'000;  // one report a second

struct Options {
  int seconds = 12;  // two of the session's 5-second signal samples and some
  std::string trace = "packet-trace.csv";
};

void say(const std::string& text) {
  std::printf("%s\n", text.c_str());
  std::fflush(stdout);
}

std::string negotiation(const MediaEndpoint& caller, const MediaEndpoint& callee) {
  std::ostringstream text;
  text << "offer from " << caller.address() << "\n"
       << "answer from " << callee.address() << "\n"
       << "audio PCMU/8000, " << kAudioBytes << " bytes every 20 ms, " << kPacketBytes
       << " bytes with headers";
  return text.str();
}

std::string reading(const char* side, const MediaEndpoint& endpoint) {
  const ReceptionStatistics& seen = endpoint.statistics();
  char text[160];
  std::snprintf(text, sizeof text, "%s: %5llu packets in, rtt %.3f ms, jitter %.3f ms, loss %.2f %%", side,
                static_cast<unsigned long long>(seen.packets()), seen.roundTripMilliseconds().value_or(0.0),
                seen.jitterMilliseconds(), seen.lossPercent());
  return text;
}

/// Sends and receives until the time is over; `everySecond` runs after each whole second.
template <class EverySecond>
void talk(MediaEndpoint& caller, MediaEndpoint& callee, int seconds, EverySecond everySecond) {
  const std::uint64_t start = steadyNanoseconds();
  const std::uint64_t end = start + static_cast<std::uint64_t>(seconds) * kReportInterval;
  std::uint64_t nextPacket = start;
  std::uint64_t nextReport = start + kReportInterval;
  for (int second = 1;;) {
    const std::uint64_t now = steadyNanoseconds();
    if (now >= nextPacket) {
      caller.sendPacket();
      callee.sendPacket();
      nextPacket += kPacketInterval;
    }
    if (now >= nextReport) {
      everySecond(second++);
      nextReport += kReportInterval;
    }
    if (now >= end) return;
    pollfd sides[] = {{caller.descriptor(), POLLIN, 0}, {callee.descriptor(), POLLIN, 0}};
    const std::uint64_t until = std::min(nextPacket, nextReport);
    const std::uint64_t after = steadyNanoseconds();
    const timespec wait{0, until > after ? static_cast<long>(until - after) : 0};
    if (::ppoll(sides, 2, &wait, nullptr) > 0) {
      if (sides[0].revents != 0) caller.receivePackets();
      if (sides[1].revents != 0) callee.receivePackets();
    }
  }
}

int run(const Options& options) {
  CallReporter agent("loopback_call", "Vistel");
  MediaEndpoint caller(0x43414C4C);
  MediaEndpoint callee(0x414E5357);
  PacketTrace trace(options.trace);

  agent.begin("caller@" + caller.address(), "callee@" + callee.address());
  agent.checkpoint("Invite");
  say("Invite: " + caller.address() + " calls " + callee.address());
  agent.info("Transport", "UDP over loopback");
  agent.info("Codec", "PCMU/8000, 20 ms");
  agent.describe("Negotiation", negotiation(caller, callee));
  agent.checkpoint("Ringing");
  if (const std::string trouble = agent.confirm(3000); !trouble.empty()) {
    std::fprintf(stderr, "The agent did not confirm: %s. Is it running at $LIRRA_SOCKET?\n", trouble.c_str());
    return 1;
  }
  caller.callTo(callee);
  callee.callTo(caller);
  agent.checkpoint("Connected");

  bool flowing = false;
  talk(caller, callee, options.seconds, [&](int second) {
    if (!flowing && caller.statistics().packets() > 0 && callee.statistics().packets() > 0) {
      agent.checkpoint("Media flowing");
      flowing = true;
    }
    agent.metrics("caller", caller);
    agent.metrics("callee", callee);
    agent.quality("reception", reading("caller", caller));
    trace.add(second, caller, callee);
    say(std::to_string(second) + " s  " + reading("caller", caller) + " | " + reading("callee", callee));
  });
  caller.receivePackets();
  callee.receivePackets();

  std::ostringstream summary;
  summary << reading("caller", caller) << "\n"
          << reading("callee", callee) << "\n"
          << "sent: " << caller.sent() << " by the caller, " << callee.sent() << " by the callee";
  agent.describe("Summary", summary.str());
  agent.checkpoint("Hang up");
  agent.collect("Packet Trace", std::filesystem::absolute(options.trace).string());
  agent.end();
  if (const std::string trouble = agent.confirm(3000); !trouble.empty()) {
    std::fprintf(stderr, "The agent did not confirm the end of the call: %s.\n", trouble.c_str());
    return 1;
  }
  say("Hang up: every report was taken by the agent, " + std::to_string(agent.dropped()) + " dropped");
  return 0;
}

int usage(const char* program) {
  std::fprintf(stderr, "usage: %s [--seconds N] [--trace FILE]\n", program);
  return 2;
}

}  // namespace
}  // namespace loopback

int main(int argumentCount, char** arguments) {
  loopback::Options options;
  for (int i = 1; i < argumentCount; i += 2) {
    if (i + 1 == argumentCount) return loopback::usage(arguments[0]);
    if (std::strcmp(arguments[i], "--seconds") == 0) {
      options.seconds = std::atoi(arguments[i + 1]);
    } else if (std::strcmp(arguments[i], "--trace") == 0) {
      options.trace = arguments[i + 1];
    } else {
      return loopback::usage(arguments[0]);
    }
  }
  if (options.seconds < 1) return loopback::usage(arguments[0]);
  try {
    return loopback::run(options);
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "The call failed: %s\n", failure.what());
    return 1;
  }
}
