#pragma once

#include <chrono>
#include <functional>
#include <memory>

#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/bus_conversation.h"

namespace zal {

/// What somebody wants to know from daemons, with what is known so far.
class BusQuestion {
 public:
  virtual ~BusQuestion() = default;
  /// Asks. `done` is to be called once, when there is nothing more to ask; perhaps inside begin().
  virtual void begin(BusConversation& bus, std::function<void()> done) = 0;
};

enum class InquiryEnd { complete, timeOver, busLost };

/// Asks one question at a time, and ends it in any case: when all is said, when the time is over, or
/// when the bus is lost. Waits for a connection that is being made. Between questions nothing is left:
/// no proxy, no match, no timer. Main thread only.
class BusInquiry {
 public:
  /// How long is waited. A healthy daemon answers in a millisecond or two; the rest is for a device
  /// under load. What samples every few seconds has no use for what comes later.
  struct Limits {
    std::chrono::milliseconds call{250};
    std::chrono::milliseconds question{900};
  };

  BusInquiry(const BusHost& host, BusConnection& connection, Limits limits)
      : _host(host), _connection(connection), _limits(limits) {}
  BusInquiry(const BusInquiry&) = delete;
  BusInquiry& operator=(const BusInquiry&) = delete;

  [[nodiscard]] bool isOpen() const { return _question != nullptr; }
  /// Not while a question is open; `onEnd` runs once, never inside ask(), and may ask again.
  void ask(std::shared_ptr<BusQuestion> question, std::function<void(InquiryEnd)> onEnd);

 private:
  void _begin(sdbus::IConnection& bus);
  void _endSoon(InquiryEnd end);
  void _end();

  const BusHost& _host;
  BusConnection& _connection;
  const Limits _limits;
  std::unique_ptr<BusConnection::User> _user;
  std::shared_ptr<BusQuestion> _question;
  std::function<void(InquiryEnd)> _onEnd;
  bool _isEnding = false;
  InquiryEnd _endsAs = InquiryEnd::complete;
  ScopedTimer _timeOver;
  std::unique_ptr<BusConversation> _conversation;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
