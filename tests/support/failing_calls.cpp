#include "tests/support/failing_calls.h"

#include <linux/filter.h>
#include <linux/seccomp.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <future>
#include <thread>
#include <utility>

namespace zal::testing {
namespace {

std::vector<sock_filter> filterOf(const std::vector<FailingCall>& calls) {
  std::vector<sock_filter> filter = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
  };
  for (const FailingCall& call : calls) {
    filter.push_back(BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, static_cast<std::uint32_t>(call.number), 0, 1));
    filter.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_USER_NOTIF));
  }
  filter.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
  return filter;
}

/// From here on the kernel asks before the calling thread's calls. Returned: whom it asks, or -1.
int beAskedAbout(const std::vector<FailingCall>& calls) {
  std::vector<sock_filter> filter = filterOf(calls);
  const sock_fprog program{static_cast<unsigned short>(filter.size()), filter.data()};
  ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
  return static_cast<int>(
      ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, SECCOMP_FILTER_FLAG_NEW_LISTENER, &program));
}

/// By the kernel, which knows that the thread that wrote it waits; a thread sanitizer sees a race in looking.
std::string textAt(std::uint64_t address) {
  constexpr std::uint64_t kPage = 4096;
  char text[2 * kPage] = {};
  const std::uint64_t toPageEnd = kPage - address % kPage;
  iovec here{text, sizeof text - 1};
  // The page after it may not be there.
  iovec there[] = {{reinterpret_cast<void*>(address), toPageEnd},
                   {reinterpret_cast<void*>(address + toPageEnd), kPage - 1}};
  static_cast<void>(::process_vm_readv(::getpid(), &here, 1, there, 2, 0));
  return text;
}

/// Minus the error that the call is to fail with, or 0.
int verdictOn(std::vector<FailingCall>& calls, const seccomp_data& data) {
  std::uint64_t words[6];
  std::copy_n(data.args, 6, words);
  for (FailingCall& call : calls) {
    if (call.number != data.nr || call.times == 0 || (call.ofThose && !call.ofThose(words))) continue;
    --call.times;
    return -call.error;
  }
  return 0;
}

/// Until all that the kernel asks about is over.
void answer(int listener, std::vector<FailingCall>& calls) {
  // The kernel's own size may be larger than the one that this was compiled with.
  alignas(seccomp_notif) char space[512];
  for (;;) {
    pollfd event{listener, POLLIN, 0};
    if (::poll(&event, 1, -1) < 0) continue;
    if ((event.revents & POLLIN) == 0) return;
    std::memset(space, 0, sizeof space);
    auto& question = *reinterpret_cast<seccomp_notif*>(space);
    if (::ioctl(listener, SECCOMP_IOCTL_NOTIF_RECV, &question) != 0) continue;
    seccomp_notif_resp reply{};
    reply.id = question.id;
    reply.error = verdictOn(calls, question.data);
    if (reply.error == 0) reply.flags = SECCOMP_USER_NOTIF_FLAG_CONTINUE;
    ::ioctl(listener, SECCOMP_IOCTL_NOTIF_SEND, &reply);
  }
}

}  // namespace

std::function<bool(const std::uint64_t*)> namesPath(std::string end) {
  return [end = std::move(end)](const std::uint64_t* words) { return textAt(words[1]).ends_with(end); };
}

bool withFailingCalls(std::vector<FailingCall> calls, const std::function<void()>& work) {
  std::promise<int> asked;
  std::future<int> whom = asked.get_future();
  std::promise<void> ready;
  std::thread worker([&, mayBegin = ready.get_future()]() mutable {
    const int listener = beAskedAbout(calls);
    asked.set_value(listener);
    mayBegin.wait();
    if (listener >= 0) work();
  });
  const int listener = whom.get();
  ready.set_value();
  if (listener >= 0) answer(listener, calls);
  worker.join();
  if (listener >= 0) ::close(listener);
  return listener >= 0;
}

}  // namespace zal::testing
