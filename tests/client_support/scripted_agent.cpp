#include "tests/client_support/scripted_agent.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <stdexcept>

#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/wire_message.h"

namespace zal::testing {
namespace {

constexpr std::chrono::seconds kPatience{10};

}  // namespace

ScriptedAgent::ScriptedAgent(std::string path) : _path(std::move(path)) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (_path.size() >= sizeof address.sun_path) throw std::runtime_error("socket path too long: " + _path);
  std::memcpy(address.sun_path, _path.data(), _path.size());
  _listener = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
  if (::bind(_listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
      ::listen(_listener, 64) != 0) {
    throw std::runtime_error("cannot listen at " + _path);
  }
  _thread = std::thread([this] { _run(); });
}

ScriptedAgent::~ScriptedAgent() {
  _stop = true;
  _thread.join();
  closeConnections();
  ::close(_listener);
  ::unlink(_path.c_str());
}

void ScriptedAgent::behave(std::deque<Behaviour> behaviours) {
  const std::lock_guard lock(_mutex);
  _behaviours = std::move(behaviours);
}

void ScriptedAgent::startReading() {
  const std::lock_guard lock(_mutex);
  for (Behaviour& behaviour : _behaviours) behaviour.reads = true;
  for (Peer& peer : _peers) peer.behaviour.reads = true;
}

void ScriptedAgent::closeConnections() {
  const std::lock_guard lock(_mutex);
  for (const Peer& peer : _peers) {
    ::shutdown(peer.descriptor, SHUT_RDWR);  // a poll that is under way would keep it open
    ::close(peer.descriptor);
  }
  _peers.clear();
  _unanswered.clear();
}

void ScriptedAgent::reply(const ValueMap& reply) {
  const std::lock_guard lock(_mutex);
  for (const Unanswered& request : _unanswered) {
    std::string answer;
    appendFrame(answer, {0, kProtocolVersion, FrameKind::reply, request.cookie}, encodeDictionary(reply));
    (void)::send(request.descriptor, answer.data(), answer.size(), MSG_NOSIGNAL);
  }
  _unanswered.clear();
}

bool ScriptedAgent::waitForRequests(std::size_t count) {
  std::unique_lock lock(_mutex);
  return _changed.wait_for(lock, kPatience, [&] { return _requests.size() >= count; });
}

bool ScriptedAgent::waitForConnections(std::size_t count) {
  std::unique_lock lock(_mutex);
  return _changed.wait_for(lock, kPatience, [&] { return _connections >= count; });
}

std::vector<std::string> ScriptedAgent::requests() const {
  const std::lock_guard lock(_mutex);
  return _requests;
}

std::size_t ScriptedAgent::connections() const {
  const std::lock_guard lock(_mutex);
  return _connections;
}

void ScriptedAgent::_run() {
  while (!_stop) {
    std::vector<pollfd> descriptors{{_listener, POLLIN, 0}};
    {
      const std::lock_guard lock(_mutex);
      for (const Peer& peer : _peers) {
        if (peer.behaviour.reads) descriptors.push_back({peer.descriptor, POLLIN, 0});
      }
    }
    ::poll(descriptors.data(), descriptors.size(), 2);
    const std::lock_guard lock(_mutex);
    _accept();
    for (Peer& peer : _peers) {
      if (peer.behaviour.reads) _serve(peer);
      if (!peer.gone) continue;
      std::erase_if(_unanswered, [&](const Unanswered& one) { return one.descriptor == peer.descriptor; });
      ::close(peer.descriptor);
    }
    _peers.remove_if([](const Peer& peer) { return peer.gone; });
    _changed.notify_all();
  }
}

void ScriptedAgent::_accept() {
  const int descriptor = ::accept4(_listener, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
  if (descriptor < 0) return;
  Peer& peer = _peers.emplace_back(Peer{descriptor, _behaviours.front(), 0, FrameDecoder(64U << 20U), false});
  if (_behaviours.size() > 1) _behaviours.pop_front();
  ++_connections;
  const std::string& greeting = peer.behaviour.sendsAtOnce;
  if (!greeting.empty()) (void)::send(descriptor, greeting.data(), greeting.size(), MSG_NOSIGNAL);
}

void ScriptedAgent::_serve(Peer& peer) {
  std::vector<char> buffer(256U << 10U);
  std::size_t room = buffer.size();
  if (peer.behaviour.diesAfterBytes) room = std::min(room, *peer.behaviour.diesAfterBytes - peer.bytesRead);
  const ssize_t count = ::recv(peer.descriptor, buffer.data(), room, MSG_DONTWAIT);
  if (count > 0) {
    peer.bytesRead += static_cast<std::size_t>(count);
    peer.decoder.feed({buffer.data(), static_cast<std::size_t>(count)});
    while (const auto frame = peer.decoder.next()) _answer(peer, *frame);
    peer.gone = peer.behaviour.diesAfterBytes == peer.bytesRead;
  } else {
    peer.gone = count == 0 || errno != EAGAIN;
  }
}

void ScriptedAgent::_answer(const Peer& peer, const Frame& frame) {
  std::string answer;
  if (frame.header.kind == FrameKind::barrier) {
    if (!peer.behaviour.answersBarriers) return;
    appendFrame(answer, {0, kProtocolVersion, FrameKind::barrierPassed, frame.header.cookie}, {});
  } else {
    const auto message = WireMessage::fromFrame(frame);
    _requests.push_back(message ? message->description() : "not a message");
    if (frame.header.kind != FrameKind::messageExpectingReply) return;
    if (!peer.behaviour.reply) {
      _unanswered.push_back({peer.descriptor, frame.header.cookie});
      return;
    }
    appendFrame(answer, {0, kProtocolVersion, FrameKind::reply, frame.header.cookie},
                encodeDictionary(*peer.behaviour.reply));
  }
  (void)::send(peer.descriptor, answer.data(), answer.size(), MSG_NOSIGNAL);
}

}  // namespace zal::testing
