#pragma once

#include <map>
#include <string>
#include <vector>

#include "platform/linux/alerts/alert_screen.h"

namespace zal::testing {

/// A screen whose person the test plays. What happens on it is noted in order.
class RecordingAlertScreen : public AlertScreen {
 public:
  std::vector<std::string> events;  ///< "show 1 TITLE", "withdraw 1", "end"
  std::map<std::string, AlertHandlers> shown;
  bool declines = false;  ///< everything, at once

  void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) override {
    events.push_back("show " + id + " " + alert.title);
    if (declines) {
      handlers.onDeclined();
    } else {
      shown.insert_or_assign(id, std::move(handlers));
    }
  }
  void withdraw(const std::string& id) override {
    if (shown.erase(id) != 0) events.push_back("withdraw " + id);
  }
  void agentEnds() override { events.emplace_back("end"); }

  void answer(const std::string& id, const AlertAnswer& answer) {
    shown.extract(id).mapped().onAnswer(answer);
  }
  void decline(const std::string& id) { shown.extract(id).mapped().onDeclined(); }
};

}  // namespace zal::testing
