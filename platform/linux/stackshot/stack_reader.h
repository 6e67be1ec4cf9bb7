#pragma once

#include <sys/types.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "platform/linux/stackshot/records.h"

struct Dwfl;

namespace zal::stackshot {

/// The stacks of one process's threads. Files are opened when it is made and symbols looked up in
/// `name`: a thread need be held only for `frames`. One thread.
class StackReader {
 public:
  /// Reads what is mapped in the process that the thread is one of.
  StackReader(pid_t process, pid_t thread);
  ~StackReader();
  StackReader(const StackReader&) = delete;
  StackReader& operator=(const StackReader&) = delete;

  /// Why no stack can be read; empty when they can.
  [[nodiscard]] const std::string& trouble() const { return _trouble; }

  struct Frames {
    std::vector<Frame> frames;  ///< the innermost first, without names
    std::string trouble;        ///< why it may not be all; empty when it is
  };
  /// Of a thread that is held still.
  [[nodiscard]] Frames frames(pid_t thread, std::size_t most, std::chrono::steady_clock::time_point end);
  /// Fills in functions and modules.
  void name(Frame& frame);

 private:
  const std::unique_ptr<Dwfl, void (*)(Dwfl*)> _dwfl;
  std::string _root;
  std::string _trouble;
};

}  // namespace zal::stackshot
