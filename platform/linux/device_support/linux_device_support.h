#pragma once

#include <atomic>
#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include "platform/clock.h"
#include "platform/device_support.h"
#include "platform/linux/bus_module/cellular_data_status.h"
#include "platform/run_loop.h"

namespace zal {

/// The device's name from its files, and whether video calls work over cellular: as configured, else
/// as the modem daemons last said, else by the cellular interface being up. Questions come from any
/// thread and are answered at once. The daemons are asked on the main loop, shortly after the start
/// and after each question that found their word old, so that an idle agent asks nothing.
class LinuxDeviceSupport : public DeviceSupport {
 public:
  struct Options {
    std::optional<bool> videoCallsOverCellular;  ///< the configured word
    std::string cellularInterface;
    bool looksAtStart = true;  ///< false where nothing depends on the answer
    std::string root = "/";    ///< etc and sys are below; another is for tests
  };
  /// After which time a word is old. Sessions that follow one another closely share one.
  static constexpr std::chrono::seconds kFresh{10};
  /// The first requests come before the daemons are asked: they are why the agent was started.
  static constexpr std::chrono::milliseconds kFirstLook{500};

  /// Made and ended on the main thread.
  LinuxDeviceSupport(RunLoop& mainLoop, const Clock& clock, CellularDataStatus& status, Options options);
  LinuxDeviceSupport(const LinuxDeviceSupport&) = delete;
  LinuxDeviceSupport& operator=(const LinuxDeviceSupport&) = delete;

  [[nodiscard]] std::string deviceName() override;
  [[nodiscard]] bool videoCallsOverCellularAvailable() override;

 private:
  enum class Word { none, no, yes };
  void _refresh();
  void _take(CellularData data);
  [[nodiscard]] bool _isInterfaceUp() const;

  RunLoop& _mainLoop;
  const Clock& _clock;
  CellularDataStatus& _status;
  const Options _options;
  std::atomic<Word> _word = Word::none;
  bool _isAsking = false;
  std::optional<SteadyTime> _askedAt;
  ScopedTimer _firstLook;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
