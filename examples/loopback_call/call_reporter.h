#pragma once

#include <string>

#include "client/lirra.h"
#include "examples/loopback_call/media_endpoint.h"

namespace loopback {

/// Tells the agent of one call. Every function only queues its request: the media loop never waits.
class CallReporter {
 public:
  CallReporter(std::string sender, std::string session);
  ~CallReporter();
  CallReporter(const CallReporter&) = delete;
  CallReporter& operator=(const CallReporter&) = delete;

  void begin(const std::string& initiator, const std::string& recipient);
  void checkpoint(const std::string& text);
  void describe(const std::string& description, const std::string& log);
  void info(const std::string& category, const std::string& text);
  void quality(const std::string& category, const std::string& text);
  /// The side's measurements of this moment, each as a metric "SIDE-…".
  void metrics(const std::string& side, const MediaEndpoint& endpoint);
  void collect(const std::string& category, const std::string& path);
  void end();

  /// Waits until the agent has handled everything. Returned: nothing when it did, else why not.
  [[nodiscard]] std::string confirm(int timeoutMilliseconds);
  [[nodiscard]] unsigned long long dropped() const;

 private:
  lirra_handle* _agent;
  std::string _session;
};

}  // namespace loopback
