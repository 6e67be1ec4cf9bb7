#pragma once

#include <sys/types.h>

#include <array>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>

#include "platform/linux/dialog/dialog_command.h"

namespace zal {

/// One dialog's program as a child of ours: ended when the object goes, told of when it ends by itself.
/// Loop thread only; a shared_ptr owns it.
class DialogProcess : public std::enable_shared_from_this<DialogProcess> {
 public:
  /// Bytes of its output that are kept, and as many of its errors; it may print any number.
  static constexpr std::size_t kMostBytes = std::size_t{64} << 10U;

  explicit DialogProcess(asio::io_context& context) : _exit(context), _output(context), _errors(context) {}
  ~DialogProcess();
  DialogProcess(const DialogProcess&) = delete;
  DialogProcess& operator=(const DialogProcess&) = delete;

  /// The program, looked for in PATH, its arguments after it. The handler runs on the loop when it has
  /// ended. Returned: zero, or the errno that says why there is none.
  [[nodiscard]] int start(std::vector<std::string> command, std::vector<std::string> environment,
                          std::function<void(const DialogOutcome&)> onEnd);
  /// The window disappears; no handler runs any more.
  void end();

 private:
  struct Stream {
    explicit Stream(asio::io_context& context) : pipe(context) {}
    asio::posix::stream_descriptor pipe;
    std::array<char, 4096> buffer{};
    std::string text;
    void keep(std::size_t size);
    void readRest();
  };
  void _read(Stream& stream);
  void _takeBack();

  asio::posix::stream_descriptor _exit;  // the process itself: readable when it has ended
  Stream _output, _errors;
  std::function<void(const DialogOutcome&)> _onEnd;
  pid_t _child = -1;  // -1: not started, or taken back
};

}  // namespace zal
