#include "platform/linux/bus/door/bus_caller.h"

#include <utility>

#include "platform/linux/bus/door/bus_dictionary.h"

namespace zal {

/// Goes with the last one who could answer.
class BusCaller::OwedAnswer {
 public:
  OwedAnswer(std::shared_ptr<BusCaller> caller, std::uint64_t token)
      : _caller(std::move(caller)), _token(token) {}
  ~OwedAnswer() {
    if (std::this_thread::get_id() == _mainThread) {
      _caller->sendReply(_token, {});
      return;
    }
    // The caller's messages go on the main thread, too.
    RunLoop& loop = _caller->_loop;
    loop.post([caller = std::move(_caller), token = _token] { caller->sendReply(token, {}); });
  }
  OwedAnswer(const OwedAnswer&) = delete;
  OwedAnswer& operator=(const OwedAnswer&) = delete;

 private:
  std::shared_ptr<BusCaller> _caller;
  const std::uint64_t _token;
  const std::thread::id _mainThread = std::this_thread::get_id();
};

BusCaller::BusCaller(RunLoop& loop, const PeerCredentials& credentials, std::function<void()> onCancel)
    : _loop(loop), _credentials(credentials), _onCancel(std::move(onCancel)) {}

bool BusCaller::sendReply(std::uint64_t replyToken, const ValueMap& reply) {
  _mainThread.check("BusCaller");
  auto call = _calls.extract(replyToken);
  if (call.empty() || !_isConnected) return false;
  try {
    auto answer = call.mapped().createReply();
    writeDictionary(answer, reply);
    answer.send();
    return true;
  } catch (const sdbus::Error&) {
    return false;  // the bus is about to be found lost
  }
}

void BusCaller::cancel() {
  _mainThread.check("BusCaller");
  if (!std::exchange(_isConnected, false)) return;
  for (const auto& [token, call] : _calls) {
    refuse(call, "org.freedesktop.DBus.Error.Disconnected", "the agent ended this connection");
  }
  _calls.clear();
  if (const auto onCancel = std::exchange(_onCancel, nullptr)) onCancel();
}

std::uint64_t BusCaller::keep(sdbus::MethodCall call) {
  _calls.emplace(++_lastToken, std::move(call));
  return _lastToken;
}

std::shared_ptr<PeerConnection> BusCaller::owing(std::uint64_t replyToken) {
  return {std::make_shared<OwedAnswer>(shared_from_this(), replyToken), this};
}

void refuse(const sdbus::MethodCall& call, const char* errorName, const std::string& reason) {
  if (call.doesntExpectReply()) return;
  try {
    call.createErrorReply(sdbus::Error(errorName, reason)).send();
  } catch (const sdbus::Error&) {
    // The bus is about to be found lost.
  }
}

}  // namespace zal
