#include "platform/linux/bus/bus_inquiry.h"

#include <utility>

namespace zal {

void BusInquiry::ask(std::shared_ptr<BusQuestion> question, std::function<void(InquiryEnd)> onEnd) {
  _question = std::move(question);
  _onEnd = std::move(onEnd);
  _isEnding = false;
  _timeOver = ScopedTimer(
      _host.mainLoop, _host.mainLoop.callAfter(_limits.question, [this] { _endSoon(InquiryEnd::timeOver); }));
  if (_user == nullptr) {
    _user = _connection.addUser({.onConnected = [this](sdbus::IConnection& bus) { _begin(bus); },
                                 .onLost =
                                     [this] {
                                       _conversation.reset();
                                       _endSoon(InquiryEnd::busLost);
                                     }});
  } else if (sdbus::IConnection* const bus = _connection.connection()) {
    _begin(*bus);
  }
}

void BusInquiry::_begin(sdbus::IConnection& bus) {
  if (_question == nullptr || _conversation != nullptr || _isEnding) return;
  _conversation = std::make_unique<BusConversation>(bus, _limits.call);
  _question->begin(*_conversation, [this] { _endSoon(InquiryEnd::complete); });
}

/// The proxies must not go inside the handlers that say that all is said.
void BusInquiry::_endSoon(InquiryEnd end) {
  if (_question == nullptr || std::exchange(_isEnding, true)) return;
  _endsAs = end;
  _host.mainLoop.post([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _end();
  });
}

void BusInquiry::_end() {
  _timeOver.cancel();
  // A bus that goes answers all calls first and is missed later.
  if (_conversation != nullptr && !_conversation->isConnected()) _endsAs = InquiryEnd::busLost;
  _conversation.reset();
  _question.reset();
  std::exchange(_onEnd, nullptr)(_endsAs);
}

}  // namespace zal
