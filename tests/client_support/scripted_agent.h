#pragma once

#include <atomic>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <list>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "platform/linux/wire/frame_decoder.h"
#include "platform/value.h"

namespace zal::testing {

/// An agent that does what a test says, on a real socket. It keeps each request as the one line that
/// the agent's own log would show.
class ScriptedAgent {
 public:
  /// How it treats one connection.
  struct Behaviour {
    bool reads = true;
    bool answersBarriers = true;
    std::optional<std::size_t> diesAfterBytes = {};  ///< closes once it has read that many
    std::optional<ValueMap> reply = {};              ///< to every request that expects one
    std::string sendsAtOnce = {};                    ///< bytes that it greets the client with
  };

  explicit ScriptedAgent(std::string path);
  ~ScriptedAgent();
  ScriptedAgent(const ScriptedAgent&) = delete;
  ScriptedAgent& operator=(const ScriptedAgent&) = delete;

  /// For the connections to come, one each; the last serves all further ones too.
  void behave(std::deque<Behaviour> behaviours);
  void startReading();  ///< on the connections there are, too
  void closeConnections();
  /// To all requests that expect a reply and have none.
  void reply(const ValueMap& reply);

  /// All requests so far, once there are at least that many; false after ten seconds without.
  [[nodiscard]] bool waitForRequests(std::size_t count);
  [[nodiscard]] bool waitForConnections(std::size_t count);
  [[nodiscard]] std::vector<std::string> requests() const;
  [[nodiscard]] std::size_t connections() const;

 private:
  struct Unanswered {
    int descriptor;
    std::uint64_t cookie;
  };
  struct Peer {
    int descriptor;
    Behaviour behaviour;
    std::size_t bytesRead = 0;
    FrameDecoder decoder;
    bool gone = false;
  };

  void _run();
  void _accept();
  void _serve(Peer& peer);
  void _answer(const Peer& peer, const Frame& frame);

  std::string _path;
  int _listener = -1;
  mutable std::mutex _mutex;
  std::condition_variable _changed;
  std::deque<Behaviour> _behaviours{Behaviour{}};
  std::list<Peer> _peers;
  std::vector<std::string> _requests;
  std::vector<Unanswered> _unanswered;
  std::size_t _connections = 0;
  std::atomic<bool> _stop{false};
  std::thread _thread;
};

}  // namespace zal::testing
