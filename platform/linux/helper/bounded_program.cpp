#include "platform/linux/helper/bounded_program.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <system_error>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/process/child_environment.h"
#include "platform/linux/process/child_setup.h"
#include "platform/linux/process/process_descriptor.h"

namespace zal::helper {
namespace {

constexpr std::size_t kMostErrorBytes = 4096;

/// A pipe's end that we read, and what came out of it so far.
struct Stream {
  Descriptor ours;
  Descriptor theirs;
  std::size_t most = 0;
  std::string text;
};

bool open(Stream& stream) {
  int ends[2] = {-1, -1};
  if (::pipe2(ends, O_CLOEXEC) != 0) return false;
  stream.ours = Descriptor(ends[0]);
  stream.theirs = Descriptor(ends[1]);
  return ::fcntl(stream.ours.get(), F_SETFL, O_NONBLOCK) == 0;
}

/// Takes what is there. At its end the stream is closed.
void drain(Stream& stream) {
  std::array<char, 16384> buffer;
  while (stream.ours.isOpen()) {
    const ssize_t got = ::read(stream.ours.get(), buffer.data(), buffer.size());
    if (got < 0 && errno == EINTR) continue;
    if (got < 0 && errno == EAGAIN) return;
    if (got <= 0) {
      stream.ours = Descriptor();
      return;
    }
    const std::size_t room = stream.most - stream.text.size();
    stream.text.append(buffer.data(), std::min(room, static_cast<std::size_t>(got)));
  }
}

std::string endOf(pid_t child) {
  int status = 0;
  pid_t ended = -1;
  do {
    ended = ::waitpid(child, &status, 0);
  } while (ended < 0 && errno == EINTR);
  if (ended != child) return "nobody knows how it ended";
  if (WIFSIGNALED(status)) return "ended by signal " + std::to_string(WTERMSIG(status));
  if (WEXITSTATUS(status) == 0) return "";
  return "ended with status " + std::to_string(WEXITSTATUS(status));
}

}  // namespace

ProgramOutcome runBounded(const std::vector<std::string>& command, Patience& patience,
                          const ProgramLimits& limits) {
  if (patience.isOver()) return {.output = {}, .errors = {}, .trouble = "not run: " + patience.reason()};
  Stream output{.ours = {}, .theirs = {}, .most = limits.bytes, .text = {}};
  Stream errors{.ours = {}, .theirs = {}, .most = kMostErrorBytes, .text = {}};
  if (!open(output) || !open(errors))
    return {.output = {}, .errors = {}, .trouble = "no pipe: " + lastSystemError().message()};
  ChildSetup setup;
  setup.sendOutputTo(output.theirs.get());
  setup.sendErrorsTo(errors.theirs.get());
  setup.putIntoOwnGroup();
  pid_t child = -1;
  if (const int error = setup.start(child, command.front(), command, ChildEnvironment().pointers())) {
    const std::string why = error == ENOENT ? "not installed" : std::generic_category().message(error);
    return {.output = {}, .errors = {}, .trouble = why};
  }
  output.theirs = Descriptor();
  errors.theirs = Descriptor();
  const SteadyMoment until = std::chrono::steady_clock::now() + limits.time;
  // Without one (an old kernel) the program's end is that of its streams.
  const Descriptor process = processDescriptor(child);
  bool isCutOff = false;
  while (process.isOpen() || output.ours.isOpen() || errors.ours.isOpen()) {
    pollfd watched[] = {{.fd = process.get(), .events = POLLIN, .revents = 0},
                        {.fd = output.ours.get(), .events = POLLIN, .revents = 0},
                        {.fd = errors.ours.get(), .events = POLLIN, .revents = 0}};
    isCutOff = !patience.await(watched, until);
    drain(output);
    drain(errors);
    if (isCutOff || watched[0].revents != 0) break;
  }
  if (isCutOff) ::kill(-child, SIGKILL);
  std::string trouble = endOf(child);
  if (isCutOff)
    trouble = patience.isOver() ? "cut off: " + patience.reason()
                                : "cut off after " + std::to_string(limits.time.count()) + " ms";
  return {.output = std::move(output.text), .errors = std::move(errors.text), .trouble = std::move(trouble)};
}

void searchForToolsIn(const std::string& path) {
  const char* const own = std::getenv("PATH");
  const std::string usual = own != nullptr ? own : "/usr/local/bin:/usr/bin:/bin";
  ::setenv("PATH", path.empty() ? (usual + ":/usr/local/sbin:/usr/sbin:/sbin").c_str() : path.c_str(), 1);
}

}  // namespace zal::helper
