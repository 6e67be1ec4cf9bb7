#pragma once

#include <cstddef>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "platform/linux/alerts/alert_screen.h"

namespace zal {

/// Several screens as one: each alert goes to the first that takes it, and on to the next when that
/// one cannot show it any more. Main thread only.
class AlertScreens : public AlertScreen {
 public:
  /// In the order of preference; they outlive this.
  explicit AlertScreens(std::vector<AlertScreen*> screens) : _screens(std::move(screens)) {}

  void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) override;
  void withdraw(const std::string& id) override;
  void agentEnds() override;

 private:
  struct Shown {
    UserAlert alert;
    AlertHandlers handlers;
    std::size_t screen = 0;
  };
  void _offer(const std::string& id);
  void _goOn(const std::string& id, std::size_t declined);

  const std::vector<AlertScreen*> _screens;
  std::map<std::string, Shown> _shown;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards handlers
};

}  // namespace zal
