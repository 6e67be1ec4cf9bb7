#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/linux/ipc/unix_ipc_service.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "tests/linux/ipc/test_client.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal {

/// A real service on a real loop, with a socket in a directory of its own.
class IpcFixture : public ::testing::Test {
 protected:
  void startService() {
    options.path = path;
    options.settings = settings;
    options.flush = [this] { ++flushes; };
    service = std::make_unique<UnixIpcService>(loop.context(), loop, log, options);
    listener = service->makeListener("com.vendel.lirra");
    listener->resume([this] { ++invalidations; },
                     [this](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
                       lastPeer = peer;
                       events.push_back(described(event));
                       if (onEvent) onEvent(peer, event);
                     });
  }

  static std::string described(const IpcEvent& event) {
    if (const auto* message = std::get_if<const Message*>(&event)) {
      return std::to_string((*message)->int64("code")) + ":" +
             std::string((*message)->string("text").value_or("-"));
    }
    if (const auto* error = std::get_if<IpcError>(&event)) {
      switch (*error) {
        case IpcError::connectionInvalid:
          return "invalid";
        case IpcError::connectionInterrupted:
          return "interrupted";
        case IpcError::terminationImminent:
          return "termination";
        case IpcError::other:
          return "other";
      }
    }
    return "nothing";
  }

  /// Runs the loop until the condition holds; false after three minutes.
  bool runUntil(const std::function<bool()>& condition,
                std::chrono::milliseconds limit = std::chrono::minutes(3)) {
    bool held = false;
    const ScopedTimer check(loop, loop.callEvery(std::chrono::milliseconds(1), [&] {
      held = condition();
      if (held) loop.stop();
    }));
    const ScopedTimer deadline(loop, loop.callAfter(limit, [&] { loop.stop(); }));
    loop.run();
    return held || condition();
  }
  bool runUntilEvents(std::size_t count) {
    return runUntil([this, count] { return events.size() >= count; });
  }
  void runFor(std::chrono::milliseconds time) {
    runUntil([] { return false; }, time);
  }

  testing::TemporaryDirectory directory;
  const std::string path = directory / "com.vendel.lirra";
  IpcSettings settings;
  UnixIpcService::Options options;  ///< the other ones
  testing::RecordingAgentLog log;
  LinuxRunLoop loop;
  std::unique_ptr<UnixIpcService> service;
  std::unique_ptr<IpcListener> listener;
  std::vector<std::string> events;
  std::function<void(const std::shared_ptr<PeerConnection>&, const IpcEvent&)> onEvent;
  std::shared_ptr<PeerConnection> lastPeer;
  int flushes = 0;
  int invalidations = 0;
};

}  // namespace zal
