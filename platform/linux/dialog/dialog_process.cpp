#include "platform/linux/dialog/dialog_process.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <utility>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/process/child_setup.h"

namespace zal {
namespace {

struct Pipe {
  Descriptor ours, theirs;
};

int makePipe(Pipe& pipe) {
  int ends[2] = {-1, -1};
  if (::pipe2(ends, O_CLOEXEC) != 0) return errno;
  pipe.ours = Descriptor(ends[0]);
  pipe.theirs = Descriptor(ends[1]);
  // Our end alone: a program that finds its output full has to wait.
  return ::fcntl(ends[0], F_SETFL, O_NONBLOCK) == 0 ? 0 : errno;
}

int waitForEnd(pid_t child) {
  int status = 0;
  while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

}  // namespace

DialogProcess::~DialogProcess() {
  if (_child <= 0) return;
  ::kill(_child, SIGKILL);
  waitForEnd(_child);
}

int DialogProcess::start(std::vector<std::string> command, std::vector<std::string> environment,
                         std::function<void(const DialogOutcome&)> onEnd) {
  Pipe output;
  Pipe errors;
  if (const int error = makePipe(output)) return error;
  if (const int error = makePipe(errors)) return error;
  std::vector<char*> variables;
  variables.reserve(environment.size() + 1);
  for (std::string& variable : environment) variables.push_back(variable.data());
  variables.push_back(nullptr);
  ChildSetup setup;
  setup.sendOutputTo(output.theirs.get());
  setup.sendErrorsTo(errors.theirs.get());
  const std::string program = command.front();
  if (const int error = setup.start(_child, program, std::move(command), variables.data())) {
    _child = -1;
    return error;
  }
  const int process = static_cast<int>(::syscall(SYS_pidfd_open, _child, 0));
  if (process < 0) return errno;  // the destructor ends it
  _exit.assign(process);
  _output.pipe.assign(output.ours.release());
  _errors.pipe.assign(errors.ours.release());
  _onEnd = std::move(onEnd);
  _read(_output);
  _read(_errors);
  _exit.async_wait(asio::posix::descriptor_base::wait_read,
                   [self = shared_from_this()](const std::error_code& error) {
                     if (!error) self->_takeBack();
                   });
  return 0;
}

void DialogProcess::end() {
  _onEnd = nullptr;
  if (_child > 0) ::kill(_child, SIGKILL);
}

void DialogProcess::Stream::keep(std::size_t size) {
  text.append(buffer.data(), std::min(size, kMostBytes - text.size()));
}

/// A program that is gone left this in its pipe; others that hold it are not waited for.
void DialogProcess::Stream::readRest() {
  asio::error_code error;
  while (text.size() < kMostBytes) {
    const ssize_t size = ::read(pipe.native_handle(), buffer.data(), buffer.size());
    if (size <= 0) break;
    keep(static_cast<std::size_t>(size));
  }
  pipe.close(error);
}

void DialogProcess::_read(Stream& stream) {
  stream.pipe.async_read_some(
      asio::buffer(stream.buffer),
      [self = shared_from_this(), &stream](const std::error_code& error, std::size_t size) {
        if (error || !stream.pipe.is_open()) return;
        stream.keep(size);
        self->_read(stream);
      });
}

void DialogProcess::_takeBack() {
  DialogOutcome outcome;
  outcome.status = waitForEnd(std::exchange(_child, -1));
  _output.readRest();
  _errors.readRest();
  outcome.output = std::move(_output.text);
  outcome.errors = std::move(_errors.text);
  if (const auto onEnd = std::exchange(_onEnd, nullptr)) onEnd(outcome);
}

}  // namespace zal
