#include "tests/crash_points/supervised_agent.h"

#include <fcntl.h>
#include <poll.h>
#include <sched.h>
#include <signal.h>
#include <sys/eventfd.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <string>
#include <utility>

namespace zal::testing {
namespace {

/// What the child tells before it becomes the agent: the number of its listener, or minus an error.
struct Handover {
  std::atomic<int> listener{0};
  std::atomic<bool> taken{false};
};

std::vector<char*> asPointers(const std::vector<std::string>& words) {
  std::vector<char*> result;
  for (const std::string& word : words) result.push_back(const_cast<char*>(word.c_str()));
  result.push_back(nullptr);
  return result;
}

long listenTo(const sock_fprog& program) {
  ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
  return ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, SECCOMP_FILTER_FLAG_NEW_LISTENER, &program);
}

/// In the child: nothing that takes a lock.
[[noreturn]] void becomeAgent(Handover& handover, const sock_fprog& program, const char* output,
                              char** arguments, char** environment) {
  ::prctl(PR_SET_PDEATHSIG, SIGKILL);
  const int out = ::open(output, O_WRONLY | O_CREAT | O_APPEND, 0644);
  const int in = ::open("/dev/null", O_RDONLY);
  ::dup2(in, 0);
  ::dup2(out, 1);
  ::dup2(out, 2);
  ::close(in);
  ::close(out);
  const long listener = listenTo(program);
  handover.listener = listener < 0 ? -errno : static_cast<int>(listener);
  while (!handover.taken) ::sched_yield();
  ::execve(arguments[0], arguments, environment);
  ::_exit(127);
}

Descriptor takeDescriptor(int process, int number) {
  return Descriptor(static_cast<int>(::syscall(SYS_pidfd_getfd, process, number, 0)));
}

}  // namespace

SupervisedAgent::SupervisedAgent(const AgentSandbox& sandbox, const std::vector<WatchedCall>& calls,
                                 Judge judge)
    : _watched(calls), _judge(std::move(judge)), _stop(::eventfd(0, EFD_CLOEXEC)) {
  _start(sandbox);
  _supervisor = std::thread([this] { _supervise(); });
}

void SupervisedAgent::_start(const AgentSandbox& sandbox) {
  std::vector<sock_filter> filter = filterFor(_watched);
  const sock_fprog program{static_cast<unsigned short>(filter.size()), filter.data()};
  const std::string output = sandbox.outputFile();
  const std::vector<std::string> words = {ZAL_AGENT_PATH};
  const std::vector<std::string> environment = sandbox.environment();
  const auto arguments = asPointers(words);
  const auto variables = asPointers(environment);
  void* const shared =
      ::mmap(nullptr, sizeof(Handover), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  auto* const handover = new (shared) Handover;
  _process = ::fork();
  if (_process == 0) {
    becomeAgent(*handover, program, output.c_str(), const_cast<char**>(arguments.data()),
                const_cast<char**>(variables.data()));
  }
  _processDescriptor = Descriptor(static_cast<int>(::syscall(SYS_pidfd_open, _process, 0)));
  while (handover->listener == 0) ::sched_yield();
  const int listener = handover->listener;
  if (listener > 0) _listener = takeDescriptor(_processDescriptor.get(), listener);
  const int error = listener > 0 ? errno : -listener;
  handover->taken = true;
  ::munmap(shared, sizeof(Handover));
  if (_listener.isOpen()) return;
  ::kill(_process, SIGKILL);
  ::waitpid(_process, nullptr, 0);
  throw std::runtime_error(std::string("system calls cannot be supervised here: ") + std::strerror(error));
}

SupervisedAgent::~SupervisedAgent() {
  constexpr std::chrono::seconds kPatience{10};
  if (!_status) signal(SIGKILL);
  waitForExit(kPatience);
  // Its children end as well, or they would hold what it had open.
  pollfd childrenGone{_listener.get(), 0, 0};
  ::poll(&childrenGone, 1, static_cast<int>(std::chrono::milliseconds(kPatience).count()));
  const std::uint64_t one = 1;
  static_cast<void>(::write(_stop.get(), &one, sizeof one));
  _supervisor.join();
}

bool SupervisedAgent::isPossible() {
  std::vector<sock_filter> filter = filterFor({});
  const sock_fprog program{static_cast<unsigned short>(filter.size()), filter.data()};
  const pid_t child = ::fork();
  if (child == 0) ::_exit(listenTo(program) < 0 ? 1 : 0);
  int status = 0;
  ::waitpid(child, &status, 0);
  return status == 0;
}

bool SupervisedAgent::hasEnded() const {
  pollfd ended{_processDescriptor.get(), POLLIN, 0};
  return ::poll(&ended, 1, 0) == 1;
}

void SupervisedAgent::signal(int number) const { ::kill(_process, number); }

std::optional<int> SupervisedAgent::waitForExit(std::chrono::milliseconds deadline) {
  if (_status) return _status;
  pollfd ended{_processDescriptor.get(), POLLIN, 0};
  if (::poll(&ended, 1, static_cast<int>(deadline.count())) != 1) return std::nullopt;
  int status = 0;
  ::waitpid(_process, &status, 0);
  _status = WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
  return _status;
}

Descriptor SupervisedAgent::borrow(int descriptor) const {
  return takeDescriptor(_processDescriptor.get(), descriptor);
}

void SupervisedAgent::_supervise() {
  // The kernel's own sizes may be larger than those that this was compiled with.
  alignas(seccomp_notif) char space[512];
  for (;;) {
    pollfd events[] = {{_listener.get(), POLLIN, 0}, {_stop.get(), POLLIN, 0}};
    ::poll(events, 2, -1);
    if ((events[0].revents & POLLIN) != 0) {
      std::memset(space, 0, sizeof space);
      auto& question = *reinterpret_cast<seccomp_notif*>(space);
      if (::ioctl(_listener.get(), SECCOMP_IOCTL_NOTIF_RECV, &question) == 0) _answer(question);
    } else if (events[0].revents != 0 || events[1].revents != 0) {
      return;
    }
  }
}

bool SupervisedAgent::_isOurs(pid_t thread) const {
  if (thread == _process) return true;
  const std::string task = "/proc/" + std::to_string(_process) + "/task/" + std::to_string(thread);
  return ::access(task.c_str(), F_OK) == 0;
}

void SupervisedAgent::_answer(const seccomp_notif& question) {
  seccomp_notif_resp answer{};
  answer.id = question.id;
  answer.flags = SECCOMP_USER_NOTIF_FLAG_CONTINUE;
  const WatchedCall* const call = findCall(_watched, question.data.nr);
  if (call != nullptr && _isOurs(static_cast<pid_t>(question.pid))) {
    using Kind = Judgement::Kind;
    const Judgement judgement = _judge(_process, *call, question.data);
    if (judgement.kind == Kind::fails) {
      answer.flags = 0;
      answer.error = -judgement.error;
    } else if (judgement.kind == Kind::shortens) {
      answer.flags = 0;
      answer.val = static_cast<std::int64_t>(_writeFirst(question.data, judgement.bytes));
    } else if (judgement.kind != Kind::passes) {
      if (judgement.kind == Kind::tearsAndKills) _writeFirst(question.data, judgement.bytes);
      ::kill(_process, SIGKILL);
      return;  // without an answer the call does not happen
    }
  }
  ::ioctl(_listener.get(), SECCOMP_IOCTL_NOTIF_SEND, &answer);
}

std::size_t SupervisedAgent::_writeFirst(const seccomp_data& data, std::size_t bytes) const {
  std::string content(std::min<std::size_t>(bytes, data.args[2]), '\0');
  iovec here{content.data(), content.size()};
  iovec there{reinterpret_cast<void*>(data.args[1]), content.size()};
  if (::process_vm_readv(_process, &here, 1, &there, 1, 0) != static_cast<ssize_t>(content.size())) return 0;
  const Descriptor file = borrow(static_cast<int>(data.args[0]));
  const ssize_t written = data.nr == SYS_pwrite64 ? ::pwrite(file.get(), content.data(), content.size(),
                                                             static_cast<off_t>(data.args[3]))
                                                  : ::write(file.get(), content.data(), content.size());
  return written < 0 ? 0 : static_cast<std::size_t>(written);
}

}  // namespace zal::testing
