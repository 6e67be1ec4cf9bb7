#include "platform/linux/secretlist/secret_service.h"

#include <cerrno>
#include <cstdint>
#include <optional>
#include <string_view>
#include <system_error>
#include <utility>

namespace zal::secretlist {
namespace {

constexpr const char* kName = "org.freedesktop.secrets";
constexpr std::uint64_t kCallLimitMicroseconds = 2'000'000;

struct Unref {
  void operator()(sd_bus_message* message) const { sd_bus_message_unref(message); }
};
using Message = std::unique_ptr<sd_bus_message, Unref>;

std::string textOf(int error) { return std::generic_category().message(-error); }

/// Null, and the reason in `trouble`, when it cannot be made.
Message newCall(sd_bus* bus, const char* service, const char* path, const char* interface, const char* member,
                std::string& trouble) {
  sd_bus_message* raw = nullptr;
  const int result = sd_bus_message_new_method_call(bus, &raw, service, path, interface, member);
  Message message(raw);
  if (result < 0) {
    trouble = textOf(result);
    return nullptr;
  }
  (void)sd_bus_message_set_auto_start(raw, 0);
  return message;
}

/// The answer; null, and the reason in `trouble`, when there is none.
Message call(sd_bus* bus, const Message& request, std::string& trouble) {
  sd_bus_error error{};
  sd_bus_message* raw = nullptr;
  const int result = sd_bus_call(bus, request.get(), kCallLimitMicroseconds, &error, &raw);
  if (result < 0) trouble = error.message != nullptr ? std::string(error.message) : textOf(result);
  sd_bus_error_free(&error);
  return Message(raw);
}

bool readAttributes(sd_bus_message* reply, std::map<std::string, std::string>& attributes) {
  if (sd_bus_message_enter_container(reply, 'v', "a{ss}") < 0 ||
      sd_bus_message_enter_container(reply, 'a', "{ss}") < 0)
    return false;
  const char* name = nullptr;
  const char* value = nullptr;
  int result = 0;
  while ((result = sd_bus_message_read(reply, "{ss}", &name, &value)) > 0) attributes[name] = value;
  return result == 0 && sd_bus_message_exit_container(reply) >= 0 &&
         sd_bus_message_exit_container(reply) >= 0;
}

/// One property behind its name. False when the message is not as it should be.
bool readProperty(sd_bus_message* reply, std::string_view name, SecretItem& item) {
  const char* contents = nullptr;
  if (sd_bus_message_peek_type(reply, nullptr, &contents) < 0) return false;
  const std::string_view type = contents != nullptr ? contents : "";
  if (name == "Attributes" && type == "a{ss}") return readAttributes(reply, item.attributes);
  if (name == "Label" && type == "s") {
    const char* text = nullptr;
    if (sd_bus_message_read(reply, "v", "s", &text) < 0) return false;
    item.label = text;
    return true;
  }
  if (name == "Created" && type == "t") {
    std::uint64_t seconds = 0;
    if (sd_bus_message_read(reply, "v", "t", &seconds) < 0) return false;
    item.created = wallTimeFromSeconds(static_cast<double>(seconds));
    return true;
  }
  if (name == "Locked" && type == "b") {
    int truth = 0;
    if (sd_bus_message_read(reply, "v", "b", &truth) < 0) return false;
    item.isLocked = truth != 0;
    return true;
  }
  return sd_bus_message_skip(reply, "v") >= 0;
}

bool readItem(sd_bus_message* reply, SecretItem& item) {
  if (sd_bus_message_enter_container(reply, 'a', "{sv}") < 0) return false;
  int result = 0;
  while ((result = sd_bus_message_enter_container(reply, 'e', "sv")) > 0) {
    const char* name = nullptr;
    if (sd_bus_message_read(reply, "s", &name) < 0 || !readProperty(reply, name, item) ||
        sd_bus_message_exit_container(reply) < 0)
      return false;
  }
  return result == 0;
}

bool readPaths(sd_bus_message* reply, std::vector<std::string>& paths) {
  // Those that are not locked, then those that are.
  for (int list = 0; list < 2; ++list) {
    if (sd_bus_message_enter_container(reply, 'a', "o") < 0) return false;
    const char* path = nullptr;
    int result = 0;
    while ((result = sd_bus_message_read(reply, "o", &path)) > 0) paths.emplace_back(path);
    if (result < 0 || sd_bus_message_exit_container(reply) < 0) return false;
  }
  return true;
}

}  // namespace

std::variant<SecretService, Trouble> SecretService::connect() {
  sd_bus* raw = nullptr;
  const int result = sd_bus_open_user(&raw);
  Bus bus(raw);
  if (result == -ENOMEDIUM)
    return Trouble{"there is no session bus: neither DBUS_SESSION_BUS_ADDRESS nor XDG_RUNTIME_DIR is set"};
  if (result < 0) return Trouble{"there is no session bus: " + textOf(result)};
  std::string trouble;
  const Message question = newCall(raw, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                   "org.freedesktop.DBus", "NameHasOwner", trouble);
  if (!question || sd_bus_message_append(question.get(), "s", kName) < 0)
    return Trouble{"the session bus cannot be asked: " + trouble};
  const Message answer = call(raw, question, trouble);
  int isOwned = 0;
  if (!answer || sd_bus_message_read(answer.get(), "b", &isOwned) < 0)
    return Trouble{"the session bus does not answer: " + trouble};
  if (isOwned == 0) return Trouble{"no secret service runs in this session"};
  return SecretService(std::move(bus));
}

std::variant<std::vector<std::string>, Trouble> SecretService::items() {
  std::string trouble;
  const Message question = newCall(_bus.get(), kName, "/org/freedesktop/secrets",
                                   "org.freedesktop.Secret.Service", "SearchItems", trouble);
  // No attribute is asked for: every item fits.
  if (!question || sd_bus_message_append(question.get(), "a{ss}", 0) < 0)
    return Trouble{"the secret service cannot be asked: " + trouble};
  const Message answer = call(_bus.get(), question, trouble);
  if (!answer) return Trouble{"the secret service does not answer: " + trouble};
  std::vector<std::string> paths;
  if (!readPaths(answer.get(), paths)) return Trouble{"the secret service's answer is not understood"};
  return paths;
}

std::variant<SecretItem, Trouble> SecretService::item(const std::string& path) {
  std::string trouble;
  const Message question =
      newCall(_bus.get(), kName, path.c_str(), "org.freedesktop.DBus.Properties", "GetAll", trouble);
  if (!question || sd_bus_message_append(question.get(), "s", "org.freedesktop.Secret.Item") < 0)
    return Trouble{trouble};
  const Message answer = call(_bus.get(), question, trouble);
  if (!answer) return Trouble{trouble};
  SecretItem item;
  if (!readItem(answer.get(), item)) return Trouble{"its answer is not understood"};
  return item;
}

}  // namespace zal::secretlist
