#pragma once

#include <sys/types.h>

#include <chrono>
#include <deque>
#include <memory>
#include <string>
#include <vector>

#include "platform/linux/stackshot/records.h"
#include "platform/linux/stackshot/symbol_cache.h"

struct Dwfl;

namespace zal::stackshot {

/// The stacks of one process's threads. Files are opened when it is made and symbols looked up in
/// `name`: a thread need be held only for `frames`. One thread.
class StackReader {
 public:
  /// Reads what is mapped in the process that the thread is one of. The cache is borrowed.
  StackReader(pid_t process, pid_t thread, SymbolCache& symbols);
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

  /// What is mapped from one file, as the library's callbacks see it.
  struct Module {
    const std::string* root = nullptr;  ///< the process's root directory
    SymbolPlace place;                  ///< its device and file; none when it was not opened by its name
  };
  /// One more; valid as long as this.
  [[nodiscard]] Module* addModule();

 private:
  SymbolCache& _symbols;
  const std::string _root;
  std::deque<Module> _modules;  // a deque: the library refers to its elements
  const std::unique_ptr<Dwfl, void (*)(Dwfl*)> _dwfl;
  std::string _trouble;
};

}  // namespace zal::stackshot
