#pragma once

#include <string_view>
#include <thread>

namespace zal {

/// Catches calls of a main-thread-only object from another thread. A member of the object; belongs
/// to the thread that made it. In release builds it costs nothing and checks nothing.
///
///     void record() { _mainThread.check("FileLogFacility"); ... }
class MainThreadCheck {
 public:
#ifndef NDEBUG
  /// Ends the process with a line that names the object, the operation and both threads.
  void check(std::string_view object, const char* operation = __builtin_FUNCTION()) const;

 private:
  std::thread::id _owner = std::this_thread::get_id();
#else
  void check(std::string_view /*object*/) const {}
#endif
};

}  // namespace zal
