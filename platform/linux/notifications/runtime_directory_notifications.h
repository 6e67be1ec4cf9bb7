#pragma once

#include <deque>
#include <functional>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/linux/notifications/directory_watch.h"
#include "platform/main_thread_check.h"
#include "platform/system_notifications.h"

namespace zal {

/// Notifications as files renamed into a directory that everybody concerned watches: see
/// postNotification. A post is delivered from the run loop, never inside post(); posts of the same
/// name that come faster than the loop may be delivered as one. After an overflow of the kernel's
/// queue every observer is called once. What was posted before the service was made is not delivered.
class RuntimeDirectoryNotifications : public SystemNotifications {
 public:
  /// The io_context is the main run loop's and outlives this.
  RuntimeDirectoryNotifications(asio::io_context& context, std::string directory, AgentLog& log);

  void observe(std::string name, std::function<void()> handler) override;
  void post(std::string_view name) override;

  // For who posts and observes by another road too.

  /// As observe; the handler learns the post's id, which is empty when it has none.
  void observePosts(std::string name, std::function<void(std::string_view id)> handler);
  /// As post, with an id that no other post has; empty: without one.
  void postWithId(std::string_view name, std::string_view id);

 private:
  struct Observer {
    std::string name;
    std::function<void(std::string_view id)> handler;
  };
  void _deliver(std::string_view name, std::string_view id);
  void _deliverToAll();

  std::string _directory;
  AgentLog& _log;
  std::deque<Observer> _observers;  // a deque: a handler may add another while it runs
  MainThreadCheck _mainThread;
  DirectoryWatch _watch;
};

}  // namespace zal
