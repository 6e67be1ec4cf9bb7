#include "tests/crash_points/system_calls.h"

#include <fcntl.h>
#include <linux/audit.h>
#include <linux/seccomp.h>
#include <sys/syscall.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstdint>

namespace zal::testing {
namespace {

#if defined(__x86_64__)
constexpr std::uint32_t kArchitecture = AUDIT_ARCH_X86_64;
#elif defined(__aarch64__)
constexpr std::uint32_t kArchitecture = AUDIT_ARCH_AARCH64;
#else
constexpr std::uint32_t kArchitecture = 0;
#endif

}  // namespace

const std::vector<WatchedCall>& callsThatChange() {
  static const std::vector<WatchedCall> calls = {
#ifdef SYS_open
      {.number = SYS_rename, .name = "rename", .errors = {}},
      {.number = SYS_link, .name = "link", .errors = {}},
      {.number = SYS_symlink, .name = "symlink", .errors = {}},
      {.number = SYS_unlink, .name = "unlink", .errors = {}},
      {.number = SYS_rmdir, .name = "rmdir", .errors = {}},
      {.number = SYS_mkdir, .name = "mkdir", .errors = {}},
      {.number = SYS_creat, .name = "creat", .errors = {}},
      {.number = SYS_chmod, .name = "chmod", .errors = {}},
      {.number = SYS_mknod, .name = "mknod", .errors = {}},
#endif
      {.number = SYS_write, .name = "write", .errors = {}, .writes = true},
      {.number = SYS_pwrite64, .name = "pwrite", .errors = {}, .writes = true},
      {.number = SYS_writev, .name = "writev", .errors = {}},
      {.number = SYS_pwritev, .name = "pwritev", .errors = {}},
      {.number = SYS_pwritev2, .name = "pwritev2", .errors = {}},
      {.number = SYS_sendto, .name = "sendto", .errors = {}},
      {.number = SYS_sendmsg, .name = "sendmsg", .errors = {}},
      {.number = SYS_sendfile, .name = "sendfile", .errors = {}},
      {.number = SYS_splice, .name = "splice", .errors = {}},
      {.number = SYS_copy_file_range, .name = "copy_file_range", .errors = {}},
      {.number = SYS_openat, .name = "openat", .errors = {}, .onlyIfItMakes = true},
      {.number = SYS_renameat, .name = "renameat", .errors = {}},
      {.number = SYS_renameat2, .name = "renameat2", .errors = {}},
      {.number = SYS_linkat, .name = "linkat", .errors = {}},
      {.number = SYS_symlinkat, .name = "symlinkat", .errors = {}},
      {.number = SYS_unlinkat, .name = "unlinkat", .errors = {}},
      {.number = SYS_mkdirat, .name = "mkdirat", .errors = {}},
      {.number = SYS_mknodat, .name = "mknodat", .errors = {}},
      {.number = SYS_truncate, .name = "truncate", .errors = {}},
      {.number = SYS_ftruncate, .name = "ftruncate", .errors = {}},
      {.number = SYS_fallocate, .name = "fallocate", .errors = {}},
      {.number = SYS_fchmod, .name = "fchmod", .errors = {}},
      {.number = SYS_fchmodat, .name = "fchmodat", .errors = {}},
      {.number = SYS_utimensat, .name = "utimensat", .errors = {}},
      {.number = SYS_fsync, .name = "fsync", .errors = {}},
      {.number = SYS_fdatasync, .name = "fdatasync", .errors = {}},
      {.number = SYS_sync_file_range, .name = "sync_file_range", .errors = {}},
      {.number = SYS_sync, .name = "sync", .errors = {}},
      {.number = SYS_bind, .name = "bind", .errors = {}},
      {.number = SYS_listen, .name = "listen", .errors = {}},
  };
  return calls;
}

const std::vector<WatchedCall>& callsThatMayFail() {
  static const std::vector<WatchedCall> calls = {
#ifdef SYS_open
      {.number = SYS_rename, .name = "rename", .errors = {EIO, ENOSPC}},
      {.number = SYS_link, .name = "link", .errors = {EIO, ENOSPC}},
      {.number = SYS_symlink, .name = "symlink", .errors = {EIO, ENOSPC}},
      {.number = SYS_unlink, .name = "unlink", .errors = {EIO}},
      {.number = SYS_rmdir, .name = "rmdir", .errors = {EIO}},
      {.number = SYS_mkdir, .name = "mkdir", .errors = {EIO, ENOSPC}},
      {.number = SYS_chmod, .name = "chmod", .errors = {EIO}},
      {.number = SYS_readlink, .name = "readlink", .errors = {EIO}},
      {.number = SYS_access, .name = "access", .errors = {EIO}},
#endif
      {.number = SYS_openat, .name = "openat", .errors = {EIO, ENOSPC, EMFILE, EINTR}},
      {.number = SYS_openat2, .name = "openat2", .errors = {EIO, EMFILE, EINTR}},
      {.number = SYS_read, .name = "read", .errors = {EIO, EINTR}, .ofFilesOnly = true},
      {.number = SYS_pread64, .name = "pread", .errors = {EIO, EINTR}, .ofFilesOnly = true},
      {.number = SYS_write,
       .name = "write",
       .errors = {EIO, ENOSPC, EINTR},
       .ofFilesOnly = true,
       .writes = true},
      {.number = SYS_pwrite64,
       .name = "pwrite",
       .errors = {EIO, ENOSPC, EINTR},
       .ofFilesOnly = true,
       .writes = true},
      {.number = SYS_writev, .name = "writev", .errors = {EIO, ENOSPC, EINTR}, .ofFilesOnly = true},
      {.number = SYS_recvmsg, .name = "recvmsg", .errors = {EINTR, EAGAIN}},
      {.number = SYS_recvfrom, .name = "recvfrom", .errors = {EINTR, EAGAIN}},
      {.number = SYS_sendmsg, .name = "sendmsg", .errors = {EINTR, EAGAIN}},
      {.number = SYS_sendto, .name = "sendto", .errors = {EINTR, EAGAIN}},
      {.number = SYS_sendfile, .name = "sendfile", .errors = {EIO, ENOSPC, EINTR}, .ofFilesOnly = true},
      {.number = SYS_copy_file_range,
       .name = "copy_file_range",
       .errors = {EIO, ENOSPC, EINTR},
       .ofFilesOnly = true},
      {.number = SYS_renameat, .name = "renameat", .errors = {EIO, ENOSPC}},
      {.number = SYS_renameat2, .name = "renameat2", .errors = {EIO, ENOSPC}},
      {.number = SYS_linkat, .name = "linkat", .errors = {EIO, ENOSPC}},
      {.number = SYS_symlinkat, .name = "symlinkat", .errors = {EIO, ENOSPC}},
      {.number = SYS_unlinkat, .name = "unlinkat", .errors = {EIO}},
      {.number = SYS_mkdirat, .name = "mkdirat", .errors = {EIO, ENOSPC}},
      {.number = SYS_readlinkat, .name = "readlinkat", .errors = {EIO}},
      {.number = SYS_newfstatat, .name = "newfstatat", .errors = {EIO}},
      {.number = SYS_getdents64, .name = "getdents64", .errors = {EIO}, .ofFilesOnly = true},
      {.number = SYS_ftruncate, .name = "ftruncate", .errors = {EIO, EINTR}, .ofFilesOnly = true},
      {.number = SYS_fallocate, .name = "fallocate", .errors = {EIO, ENOSPC, EINTR}, .ofFilesOnly = true},
      {.number = SYS_fchmod, .name = "fchmod", .errors = {EIO}, .ofFilesOnly = true},
      {.number = SYS_utimensat, .name = "utimensat", .errors = {EIO}},
      {.number = SYS_fsync, .name = "fsync", .errors = {EIO, ENOSPC, EINTR}, .ofFilesOnly = true},
      {.number = SYS_fdatasync, .name = "fdatasync", .errors = {EIO, ENOSPC, EINTR}, .ofFilesOnly = true},
      {.number = SYS_flock, .name = "flock", .errors = {EINTR, EAGAIN}},
      {.number = SYS_socket, .name = "socket", .errors = {EMFILE}},
      {.number = SYS_bind, .name = "bind", .errors = {EIO, ENOSPC}},
      {.number = SYS_listen, .name = "listen", .errors = {EIO}},
      {.number = SYS_accept4, .name = "accept4", .errors = {EMFILE, EINTR, EAGAIN}},
      {.number = SYS_epoll_create1, .name = "epoll_create1", .errors = {EMFILE}},
      {.number = SYS_epoll_ctl, .name = "epoll_ctl", .errors = {ENOSPC}},
      {.number = SYS_eventfd2, .name = "eventfd2", .errors = {EMFILE}},
      {.number = SYS_timerfd_create, .name = "timerfd_create", .errors = {EMFILE}},
      {.number = SYS_signalfd4, .name = "signalfd4", .errors = {EMFILE}},
      {.number = SYS_inotify_init1, .name = "inotify_init1", .errors = {EMFILE}},
      {.number = SYS_inotify_add_watch, .name = "inotify_add_watch", .errors = {ENOSPC}},
      {.number = SYS_pipe2, .name = "pipe2", .errors = {EMFILE}},
      {.number = SYS_mmap, .name = "mmap", .errors = {ENOMEM}},
      {.number = SYS_clone3, .name = "clone3", .errors = {EAGAIN}},
      {.number = SYS_pidfd_open, .name = "pidfd_open", .errors = {EMFILE}},
      {.number = SYS_wait4, .name = "wait4", .errors = {EINTR}},
  };
  return calls;
}

const WatchedCall* findCall(const std::vector<WatchedCall>& calls, int number) {
  const auto found = std::find_if(calls.begin(), calls.end(),
                                  [number](const WatchedCall& call) { return call.number == number; });
  return found == calls.end() ? nullptr : &*found;
}

std::vector<sock_filter> filterFor(const std::vector<WatchedCall>& calls) {
  constexpr auto kAsk = SECCOMP_RET_USER_NOTIF;
  constexpr std::uint32_t kFlagsOfOpenat = offsetof(seccomp_data, args) + 2 * sizeof(std::uint64_t);
  std::vector<sock_filter> filter = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, arch)),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, kArchitecture, 1, 0),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
  };
  for (const WatchedCall& call : calls) {
    const auto number = static_cast<std::uint32_t>(call.number);
    if (call.onlyIfItMakes) {
      filter.push_back(BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, number, 0, 4));
      filter.push_back(BPF_STMT(BPF_LD | BPF_W | BPF_ABS, kFlagsOfOpenat));
      filter.push_back(BPF_JUMP(BPF_JMP | BPF_JSET | BPF_K, O_CREAT | O_TRUNC, 0, 1));
      filter.push_back(BPF_STMT(BPF_RET | BPF_K, kAsk));
      filter.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
    } else {
      filter.push_back(BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, number, 0, 1));
      filter.push_back(BPF_STMT(BPF_RET | BPF_K, kAsk));
    }
  }
  filter.push_back(BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW));
  return filter;
}

}  // namespace zal::testing
