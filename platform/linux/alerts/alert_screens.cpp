#include "platform/linux/alerts/alert_screens.h"

#include <utility>

namespace zal {

void AlertScreens::present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) {
  _shown.insert_or_assign(id, Shown{alert, std::move(handlers)});
  _offer(id);
}

void AlertScreens::_offer(const std::string& id) {
  const auto place = _shown.find(id);
  if (place == _shown.end()) return;
  const std::size_t screen = place->second.screen;
  if (screen == _screens.size()) {
    const auto gone = _shown.extract(place);
    gone.mapped().handlers.onDeclined();
    return;
  }
  const std::weak_ptr<bool> alive = _alive;
  AlertHandlers handlers;
  handlers.onAnswer = [this, alive, id](const AlertAnswer& answer) {
    if (alive.expired()) return;
    const auto over = _shown.extract(id);
    if (!over.empty()) over.mapped().handlers.onAnswer(answer);
  };
  handlers.onDeclined = [this, alive, id, screen] {
    if (!alive.expired()) _goOn(id, screen);
  };
  _screens[screen]->present(id, place->second.alert, std::move(handlers));
}

void AlertScreens::_goOn(const std::string& id, std::size_t declined) {
  const auto place = _shown.find(id);
  if (place == _shown.end() || place->second.screen != declined) return;
  ++place->second.screen;
  _offer(id);
}

void AlertScreens::withdraw(const std::string& id) {
  const auto gone = _shown.extract(id);
  if (!gone.empty()) _screens[gone.mapped().screen]->withdraw(id);
}

void AlertScreens::agentEnds() {
  _shown.clear();
  for (AlertScreen* const screen : _screens) screen->agentEnds();
}

}  // namespace zal
