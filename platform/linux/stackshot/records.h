#pragma once

#include <sys/types.h>

#include <cstdint>
#include <string>
#include <vector>

namespace zal::stackshot {

/// One call on a stack. The function is empty when no symbol covers the address, the module when
/// nothing is mapped there.
struct Frame {
  std::uint64_t address = 0;
  bool isCall = true;  ///< the address is where a call returns to, so it may lie behind the caller's end
  std::string function = {};
  std::uint64_t offset = 0;  ///< from the function's begin, or the module's when there is no function
  std::string module = {};
};

struct ThreadRecord {
  pid_t id = 0;
  std::string name = {};
  char state = '?';                ///< the kernel's letter, as it was before anybody stopped the thread
  std::string waitsIn = {};        ///< the kernel's function it sleeps in; empty when unknown
  std::string trouble = {};        ///< why there is no whole stack; empty when there is
  std::vector<Frame> frames = {};  ///< the innermost first
  std::vector<std::string> kernelFrames = {};  ///< where they are all there is, and readable
};

enum class ProcessKind { user, kernel, ended };

struct ProcessRecord {
  pid_t id = 0;
  pid_t parent = 0;
  uid_t user = 0;
  std::string name = {};
  std::string command = {};  ///< arguments with blanks between them
  char state = '?';
  ProcessKind kind = ProcessKind::user;
  std::size_t threadCount = 0;  ///< all, the listed ones included
  std::vector<ThreadRecord> threads = {};
};

}  // namespace zal::stackshot
