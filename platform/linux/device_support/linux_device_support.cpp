#include "platform/linux/device_support/linux_device_support.h"

#include <net/if.h>
#include <unistd.h>

#include <array>
#include <charconv>
#include <utility>

#include "platform/linux/config/text_file.h"
#include "platform/linux/device_support/user_visible_name.h"

namespace zal {
namespace {

std::string hostName() {
  std::array<char, 256> name{};
  return ::gethostname(name.data(), name.size() - 1) == 0 ? name.data() : "";
}

}  // namespace

LinuxDeviceSupport::LinuxDeviceSupport(RunLoop& mainLoop, const Clock& clock, CellularDataStatus& status,
                                       Options options)
    : _mainLoop(mainLoop), _clock(clock), _status(status), _options(std::move(options)) {
  if (_options.videoCallsOverCellular || !_options.looksAtStart) return;
  _firstLook = ScopedTimer(_mainLoop, _mainLoop.callAfter(kFirstLook, [this] {
    _firstLook = {};
    _refresh();
  }));
}

std::string LinuxDeviceSupport::deviceName() {
  // The host-name service keeps the name in this file, so that no daemon needs to be asked.
  std::string machineInfo;
  if (readTextFile(_options.root + "/etc/machine-info", machineInfo)) machineInfo.clear();
  return userVisibleName(machineInfo, hostName());
}

bool LinuxDeviceSupport::videoCallsOverCellularAvailable() {
  if (_options.videoCallsOverCellular) return *_options.videoCallsOverCellular;
  _mainLoop.post([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _refresh();
  });
  const Word word = _word;
  return word == Word::none ? _isInterfaceUp() : word == Word::yes;
}

void LinuxDeviceSupport::_refresh() {
  const SteadyTime now = _clock.steadyNow();
  if (_isAsking || (_askedAt && now < *_askedAt + kFresh)) return;
  _askedAt = now;
  _isAsking = true;
  _status.ask([this, alive = std::weak_ptr<bool>(_alive)](CellularData data) {
    if (!alive.expired()) _take(data);
  });
}

void LinuxDeviceSupport::_take(CellularData data) {
  _isAsking = false;
  switch (data) {
    case CellularData::available:
      _word = Word::yes;
      break;
    case CellularData::unavailable:
      _word = Word::no;
      break;
    case CellularData::noService:
      _word = Word::none;
      break;
    case CellularData::noAnswer:
      break;
  }
}

bool LinuxDeviceSupport::_isInterfaceUp() const {
  std::string text;
  if (readTextFile(_options.root + "/sys/class/net/" + _options.cellularInterface + "/flags", text)) {
    return false;
  }
  // "0x1043"
  unsigned flags = 0;
  if (!text.starts_with("0x")) return false;
  std::from_chars(text.data() + 2, text.data() + text.size(), flags, 16);
  return (flags & IFF_UP) != 0;
}

}  // namespace zal
