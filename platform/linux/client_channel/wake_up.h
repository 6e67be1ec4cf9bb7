#pragma once

namespace zal {

/// What one thread waits on with poll() and another one wakes it by.
class WakeUp {
 public:
  /// Throws std::system_error when the host has no descriptor left.
  WakeUp();
  ~WakeUp();
  WakeUp(const WakeUp&) = delete;
  WakeUp& operator=(const WakeUp&) = delete;

  [[nodiscard]] int descriptor() const { return _descriptor; }
  /// Any thread. Several before the sleeper looks are one.
  void wake();
  /// The sleeper's: takes back what woke it.
  void drain();

 private:
  int _descriptor;
};

}  // namespace zal
