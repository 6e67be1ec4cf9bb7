#include "platform/linux/modemdump/system_bus.h"

#include <poll.h>

#include <algorithm>
#include <cstdint>
#include <system_error>

namespace zal::modemdump {
namespace {

using helper::SteadyMoment;

constexpr std::chrono::milliseconds kLimitAtTheEnd{500};

struct UnrefSlot {
  void operator()(sd_bus_slot* slot) const { sd_bus_slot_unref(slot); }
};

std::string textOf(int error) { return std::generic_category().message(-error); }

int keepAnswer(sd_bus_message* answer, void* place, sd_bus_error* /*error*/) {
  static_cast<BusMessage*>(place)->reset(sd_bus_message_ref(answer));
  return 0;
}

/// When the connection itself wants to be looked at next.
SteadyMoment nextMoment(sd_bus* bus, SteadyMoment until) {
  std::uint64_t due = 0;
  if (sd_bus_get_timeout(bus, &due) <= 0 || due == UINT64_MAX) return until;
  // The connection counts the same steady clock, in microseconds.
  return std::min(until, SteadyMoment(std::chrono::microseconds(due)));
}

void awaitConnection(sd_bus* bus, SteadyMoment until, helper::Patience* patience) {
  const int events = sd_bus_get_events(bus);
  pollfd connection{
      .fd = sd_bus_get_fd(bus), .events = static_cast<short>(std::max(events, 0)), .revents = 0};
  const SteadyMoment next = nextMoment(bus, until);
  if (patience != nullptr) {
    (void)patience->await({&connection, 1}, next);
  } else {
    ::poll(&connection, 1, helper::pollLimit(next));
  }
}

}  // namespace

std::variant<SystemBus, Trouble> SystemBus::connect(helper::Patience& patience) {
  sd_bus* raw = nullptr;
  const int result = sd_bus_open_system(&raw);
  Bus bus(raw);
  if (result < 0) return Trouble{"there is no system bus: " + textOf(result)};
  return SystemBus(std::move(bus), patience);
}

SystemBus::Answer SystemBus::call(const BusMethod& method, const std::vector<std::string>& texts) {
  return _call(method, texts, kCallLimit, _patience);
}

SystemBus::Answer SystemBus::callAtTheEnd(const BusMethod& method, const std::vector<std::string>& texts) {
  return _call(method, texts, kLimitAtTheEnd, nullptr);
}

std::variant<bool, Trouble> SystemBus::hasOwner(const std::string& name) {
  const Answer answer =
      call({"org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "NameHasOwner"}, {name});
  if (const auto* trouble = std::get_if<Trouble>(&answer)) return *trouble;
  int isOwned = 0;
  if (sd_bus_message_read(std::get<BusMessage>(answer).get(), "b", &isOwned) < 0)
    return Trouble{"the bus's answer is not understood"};
  return isOwned != 0;
}

SystemBus::Answer SystemBus::_call(const BusMethod& method, const std::vector<std::string>& texts,
                                   std::chrono::milliseconds limit, helper::Patience* patience) {
  sd_bus_message* raw = nullptr;
  int result = sd_bus_message_new_method_call(_bus.get(), &raw, method.service.c_str(), method.path.c_str(),
                                              method.interface.c_str(), method.member.c_str());
  const BusMessage request(raw);
  if (result >= 0) result = sd_bus_message_set_auto_start(raw, 0);
  for (const std::string& text : texts) {
    if (result >= 0) result = sd_bus_message_append(raw, "s", text.c_str());
  }
  BusMessage answer;
  sd_bus_slot* rawSlot = nullptr;
  const auto microseconds = std::chrono::microseconds(limit).count();
  const SteadyMoment until = std::chrono::steady_clock::now() + limit;
  if (result >= 0)
    result = sd_bus_call_async(_bus.get(), &rawSlot, raw, keepAnswer, &answer,
                               static_cast<std::uint64_t>(microseconds));
  if (result < 0) return Trouble{"cannot be asked: " + textOf(result)};
  const std::unique_ptr<sd_bus_slot, UnrefSlot> slot(rawSlot);
  const Trouble silence{"no answer within " + std::to_string(limit.count()) + " ms"};
  while (!answer) {
    result = sd_bus_process(_bus.get(), nullptr);
    if (result < 0) return Trouble{"the bus is gone: " + textOf(result)};
    if (result > 0) continue;
    if (patience != nullptr && patience->isOver()) return Trouble{"not awaited: " + patience->reason()};
    if (std::chrono::steady_clock::now() >= until) return silence;
    awaitConnection(_bus.get(), until, patience);
  }
  const sd_bus_error* error = sd_bus_message_get_error(answer.get());
  if (error == nullptr) return Answer(std::move(answer));
  // The connection's own limit has the same name as the end of a daemon in the middle of a call.
  if (sd_bus_error_has_name(error, SD_BUS_ERROR_NO_REPLY) != 0 && std::chrono::steady_clock::now() >= until)
    return silence;
  return Trouble{error->message != nullptr ? std::string(error->message) : std::string(error->name)};
}

}  // namespace zal::modemdump
