#include "platform/linux/ping/program_run.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/ping/ping_report.h"
#include "platform/linux/ping/program_output.h"
#include "platform/linux/process/child_setup.h"

namespace zal {
namespace {

void takeBack(pid_t child) {
  while (::waitpid(child, nullptr, 0) < 0 && errno == EINTR) {
  }
}

}  // namespace

ProgramRun::ProgramRun(asio::io_context& context, std::vector<std::string> command,
                       std::shared_ptr<PingReport> report, std::function<void()> onEnd)
    : _output(context),
      _patience(context),
      _command(std::move(command)),
      _report(std::move(report)),
      _onEnd(std::move(onEnd)) {}

ProgramRun::~ProgramRun() {
  if (_child <= 0) return;
  ::kill(_child, SIGKILL);
  takeBack(_child);
}

int ProgramRun::_spawn() {
  int ends[2] = {-1, -1};
  if (::pipe2(ends, O_CLOEXEC) != 0) return errno;
  Descriptor ours(ends[0]);
  const Descriptor theirs(ends[1]);
  std::string language = "LC_ALL=C";  // its summary is read
  char* environment[] = {language.data(), nullptr};
  ChildSetup setup;
  setup.sendOutputTo(theirs.get());
  const int error = setup.start(_child, _command.front(), _command, environment);
  if (error != 0) {
    _child = -1;
    return error;
  }
  _output.assign(ours.release());
  return 0;
}

void ProgramRun::start() {
  if (const int error = _spawn()) {
    _end(_command.front() + ": " + std::generic_category().message(error));
    return;
  }
  _readMore();
}

void ProgramRun::stop() {
  if (_child <= 0 || !_onEnd) return;
  ::kill(_child, SIGINT);  // it then prints its statistics
  _patience.expires_after(kPatience);
  _patience.async_wait([self = shared_from_this()](const std::error_code& cancelled) {
    if (!cancelled && self->_child > 0) ::kill(self->_child, SIGKILL);
  });
}

void ProgramRun::_readMore() {
  _output.async_read_some(asio::buffer(_buffer),
                          [self = shared_from_this()](const std::error_code& error, std::size_t size) {
                            if (self->_text.size() < PingReport::kMostBytes)
                              self->_text.append(self->_buffer.data(), size);
                            if (error) {
                              self->_collect();
                            } else {
                              self->_readMore();
                            }
                          });
}

// Nobody else holds the pipe, so its end means that the program is gone or as good as gone.
void ProgramRun::_collect() {
  ::kill(_child, SIGKILL);
  takeBack(std::exchange(_child, -1));
  _patience.cancel();
  while (!_text.empty() && _text.back() == '\n') _text.pop_back();
  _report->addLine(_text);
  const auto summary = parseProgramOutput(_text);
  if (summary) {
    _report->setProgramOutcome(summary->line, summary->received > 0);
    _end("");
    return;
  }
  const std::string said = lastLine(_text);
  _report->setProgramOutcome(said.empty() ? _command.front() + " said nothing" : said, false);
  _end("");
}

void ProgramRun::_end(const std::string& failure) {
  if (!failure.empty()) _report->fail(failure);
  if (const auto onEnd = std::exchange(_onEnd, nullptr)) onEnd();
}

std::vector<std::string> pingCommand(const std::string& program, const std::string& address,
                                     const std::string& interface, std::chrono::nanoseconds duration) {
  const auto seconds = std::max<std::int64_t>(1, std::chrono::ceil<std::chrono::seconds>(duration).count());
  return {program, "-n", "-I", interface, "-w", std::to_string(seconds), address};
}

}  // namespace zal
