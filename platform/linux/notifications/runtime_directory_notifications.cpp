#include "platform/linux/notifications/runtime_directory_notifications.h"

#include <utility>

#include "platform/linux/notifications/notification_file.h"

namespace zal {

RuntimeDirectoryNotifications::RuntimeDirectoryNotifications(asio::io_context& context, std::string directory,
                                                             AgentLog& log)
    : _directory(std::move(directory)),
      _log(log),
      _watch(context, _directory, makeNotificationDirectory,
             {.onArrival = nullptr,
              .onOverflow = [this] { _deliverToAll(); },
              .onProblem = [this](std::string_view problem) { _log.warning(problem); },
              .onRename = [this](std::string_view name,
                                 std::string_view formerName) { _deliver(name, idOfPost(formerName)); }}) {}

void RuntimeDirectoryNotifications::observe(std::string name, std::function<void()> handler) {
  observePosts(std::move(name), [handler = std::move(handler)](std::string_view) { handler(); });
}

void RuntimeDirectoryNotifications::observePosts(std::string name,
                                                 std::function<void(std::string_view id)> handler) {
  _mainThread.check("RuntimeDirectoryNotifications");
  _observers.push_back({std::move(name), std::move(handler)});
}

void RuntimeDirectoryNotifications::post(std::string_view name) { postWithId(name, {}); }

void RuntimeDirectoryNotifications::postWithId(std::string_view name, std::string_view id) {
  _mainThread.check("RuntimeDirectoryNotifications");
  const std::error_code error = postNotification(_directory, name, id);
  if (error) {
    _log.warning("notification \"" + std::string(name) + "\" was not posted in " + _directory + ": " +
                 error.message());
  }
}

void RuntimeDirectoryNotifications::_deliver(std::string_view name, std::string_view id) {
  const std::size_t count = _observers.size();
  for (std::size_t i = 0; i < count; ++i) {
    if (_observers[i].name == name) _observers[i].handler(id);
  }
}

void RuntimeDirectoryNotifications::_deliverToAll() {
  const std::size_t count = _observers.size();
  for (std::size_t i = 0; i < count; ++i) _observers[i].handler({});
}

}  // namespace zal
