#include "platform/linux/bus/daemon_note.h"

#include <utility>

namespace zal {

void DaemonNote::note(BusTrouble trouble) {
  if (trouble == BusTrouble::refused) trouble = BusTrouble::none;
  if (std::exchange(_last, trouble) == trouble) return;
  switch (trouble) {
    case BusTrouble::none:
    case BusTrouble::refused:
      _log.notice(_name + " answers again");
      break;
    case BusTrouble::noOwner:
      _log.notice(_name + " is not running");
      break;
    case BusTrouble::silent:
      _log.warning(_name + " does not answer");
      break;
    case BusTrouble::unreadable:
      _log.warning(_name + " answers what cannot be read");
      break;
  }
}

}  // namespace zal
