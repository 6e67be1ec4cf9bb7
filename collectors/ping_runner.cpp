#include "collectors/ping_runner.h"

#include <atomic>
#include <utility>
#include <vector>

#include "platform/agent_log.h"
#include "platform/ping_test.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

constexpr std::string_view kLogCategory = "Ping";

std::atomic<_ZalLoggingAgentPingRunner*> sharedRunner{nullptr};

struct PingRequest {
  std::string address;
  double duration = 0;
  bool useWifi = false;
  std::optional<std::string> outputPath;
};

void finish(PingTest& test, const PingRequest& request, std::string_view result, bool success,
            AgentLog& log) {
  log.log(kLogCategory,
          ("Finishing ping test " + request.address + ", useWifi = " + (request.useWifi ? "1" : "0") + ", ")
              .append(result));
  std::string error;
  if (request.outputPath && !test.writeResultsToFile(*request.outputPath, error)) {
    log.log(kLogCategory, "Couldn't write ping results to file " + error);
  }
  if (!success) log.log(kLogCategory, "Encountered errors pinging address " + request.address);
}

}  // namespace

struct _ZalLoggingAgentPingRunner::State {
  State(WorkQueues& queues, PingFacility& facility, AgentLog& agentLog)
      : pings(facility),
        log(agentLog),
        _testQueue(queues.makeSerial("com.vendel.lirra.pingqueue")),
        _pingQueue(queues.makeSerial("com.vendel.zallogging.pingqueue")) {}

  PingFacility& pings;
  AgentLog& log;
  std::vector<std::shared_ptr<PingTest>> _pingTests;  // touched on _testQueue only
  std::unique_ptr<WorkQueue> _testQueue;
  std::unique_ptr<WorkQueue> _pingQueue;
};

_ZalLoggingAgentPingRunner::_ZalLoggingAgentPingRunner(WorkQueues& queues, PingFacility& pings, AgentLog& log)
    : _state(std::make_shared<State>(queues, pings, log)) {}

_ZalLoggingAgentPingRunner::~_ZalLoggingAgentPingRunner() = default;

_ZalLoggingAgentPingRunner* _ZalLoggingAgentPingRunner::sharedInstance() { return sharedRunner.load(); }

void _ZalLoggingAgentPingRunner::setSharedInstance(_ZalLoggingAgentPingRunner* runner) {
  sharedRunner.store(runner);
}

void _ZalLoggingAgentPingRunner::addPingTest(std::optional<std::string> address, double duration,
                                             bool useWifi, std::optional<std::string> outputPath) {
  PingRequest request{std::move(address).value_or(std::string(kDefaultGatewayAddress)), duration, useWifi,
                      std::move(outputPath)};
  _state->_testQueue->async([state = _state, request = std::move(request)] {
    const std::shared_ptr<PingTest> test = state->pings.makeTest(request.address, request.useWifi);
    state->_pingTests.push_back(test);
    const double timeout = request.duration > 0.0 ? request.duration : test->longTimeInterval();
    WorkQueue& queue = request.useWifi ? *state->_pingQueue : *state->_testQueue;
    // The handler holds the state, for the queue that it is called on lives there.
    test->startWithTimeout(timeout, queue, [state, test, request](std::string_view result, bool success) {
      finish(*test, request, result, success, state->log);
    });
  });
}

void _ZalLoggingAgentPingRunner::addPingTest(std::optional<std::string> address, double duration,
                                             bool useWifi, const std::optional<std::string>& pathDirectory,
                                             const std::optional<std::string>& fileName) {
  std::optional<std::string> outputPath;
  if (pathDirectory && fileName) outputPath = *pathDirectory + "/" + *fileName;
  addPingTest(std::move(address), duration, useWifi, std::move(outputPath));
}

void _ZalLoggingAgentPingRunner::stopAllTests() {
  _state->_testQueue->async([state = _state] {
    for (const auto& test : state->_pingTests) {
      if (test->secondsToRun() > kLongestUnstoppedSeconds) test->stop();
    }
    state->_pingTests.clear();
  });
}

}  // namespace zal
