#pragma once

#include <memory>
#include <string>
#include <string_view>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/linux/files/rooted_paths.h"

namespace zal {

/// Has the modem's state written into the telephony user's reports by `lirra-modemdump`, a process of
/// its own that goes on when this one ends. Any thread; never waits for it.
///
/// One at a time: a start while one is being written joins it, since the set that it writes shows the
/// same modem within seconds, and who collects takes the newest set there is. Its marker is there for
/// both.
class BasebandDumpStarter {
 public:
  struct Places {
    std::string helper;     ///< the program's path
    std::string directory;  ///< for the files; made when it is missing
    std::string marker;     ///< is there as long as files are being written
    RootedPaths paths{};    ///< how the directory is reached: the program would follow a link
  };
  /// The reason is cut there, in bytes: it becomes an argument.
  static constexpr std::size_t kLongestReason = 4096;

  /// The end of the program is noticed on the loop. Both outlive this.
  BasebandDumpStarter(asio::io_context& loop, AgentLog& log, Places places);
  ~BasebandDumpStarter();
  BasebandDumpStarter(const BasebandDumpStarter&) = delete;
  BasebandDumpStarter& operator=(const BasebandDumpStarter&) = delete;

  /// The marker is there when it returns. When the directory cannot be made, or the program not started, the
  /// marker is gone again and one line in the log says why; one of a program that was killed goes with its
  /// end.
  void start(std::string_view reason);

 private:
  class State;
  std::shared_ptr<State> _state;  // shared with what waits on the loop for the program's end
};

}  // namespace zal
