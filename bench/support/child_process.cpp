#include "bench/support/child_process.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <sstream>
#include <utility>

#include "bench/support/timing.h"

namespace zal::bench {
namespace {

// The service manager's value at boot; the kernel's own is 10, and would make every daemon that
// reads datagrams look worse than it is in use.
constexpr const char* kDatagramQueueLength = "512";

bool writeText(const char* path, const char* text) {
  const int file = open(path, O_WRONLY | O_CLOEXEC | O_CREAT | O_TRUNC, 0644);
  if (file < 0) return false;
  const bool written = write(file, text, strlen(text)) == static_cast<ssize_t>(strlen(text));
  close(file);
  return written;
}

// A machine without an identity gets one for the child alone, in an /etc of its own.
bool ensureMachineId() {
  struct stat status {};
  if (stat("/etc/machine-id", &status) == 0 && status.st_size >= 32) return true;
  if (mount("tmpfs", "/etc", "tmpfs", 0, "mode=0755") != 0) return false;
  return writeText("/etc/machine-id", "5f0d3c1b2a49e8776655443322110099\n") &&
         writeText("/etc/passwd", "root:x:0:0:root:/root:/bin/sh\n") &&
         writeText("/etc/group", "root:x:0:\n");
}

}  // namespace

ChildProcess::ChildProcess(const Options& options) {
  std::vector<char*> arguments;
  for (const auto& word : options.command) arguments.push_back(const_cast<char*>(word.c_str()));
  arguments.push_back(nullptr);
  fflush(stdout);
  _id = fork();
  if (_id != 0) return;
  const int null = open("/dev/null", O_RDONLY);
  const int output = open(options.output.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
  dup2(null, STDIN_FILENO);
  dup2(output, STDOUT_FILENO);
  dup2(output, STDERR_FILENO);
  for (int descriptor = 3; descriptor < 256; ++descriptor) close(descriptor);
  for (const auto& setting : options.environment) putenv(const_cast<char*>(setting.c_str()));
  if (options.beforeExec != nullptr) {
    if (const char* failed = options.beforeExec()) {
      perror(failed);
      _exit(127);
    }
  }
  execv(arguments[0], arguments.data());
  perror(arguments[0]);
  _exit(127);
}

ChildProcess::~ChildProcess() { stop(); }

ChildProcess::ChildProcess(ChildProcess&& other) noexcept : _id(std::exchange(other._id, -1)) {}

ChildProcess& ChildProcess::operator=(ChildProcess&& other) noexcept {
  if (this != &other) {
    stop();
    _id = std::exchange(other._id, -1);
  }
  return *this;
}

bool ChildProcess::running() {
  if (_id <= 0) return false;
  if (waitpid(_id, nullptr, WNOHANG) == 0) return true;
  _id = -1;
  return false;
}

void ChildProcess::stop() {
  if (!running()) return;
  ::kill(_id, SIGTERM);
  const Stopwatch since;
  while (running()) {
    if (since.seconds() > 3.0) return kill();
    pauseMilliseconds(1);
  }
}

void ChildProcess::kill() {
  if (!running()) return;
  ::kill(_id, SIGKILL);
  waitpid(_id, nullptr, 0);
  _id = -1;
}

std::string findProgram(const std::string& name) {
  const char* path = getenv("PATH");
  std::istringstream folders(std::string(path == nullptr ? "" : path) +
                             ":/usr/local/sbin:/usr/sbin:/sbin:/usr/bin:/usr/lib/systemd:/lib/systemd");
  for (std::string folder; std::getline(folders, folder, ':');) {
    const std::string candidate = folder + "/" + name;
    if (!folder.empty() && access(candidate.c_str(), X_OK) == 0) return candidate;
  }
  return {};
}

const char* enterPrivateHost() {
  const uid_t user = getuid();
  const gid_t group = getgid();
  if (user == 0) {
    if (unshare(CLONE_NEWNS | CLONE_NEWNET) != 0) return "private namespaces";
  } else {
    if (unshare(CLONE_NEWUSER | CLONE_NEWNS | CLONE_NEWNET) != 0) return "private user namespace";
    char line[64];
    snprintf(line, sizeof line, "0 %u 1\n", user);
    if (!writeText("/proc/self/uid_map", line)) return "mapping the user";
    if (!writeText("/proc/self/setgroups", "deny")) return "mapping the group";
    snprintf(line, sizeof line, "0 %u 1\n", group);
    if (!writeText("/proc/self/gid_map", line)) return "mapping the group";
  }
  if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) return "private mounts";
  if (mount("tmpfs", "/run", "tmpfs", 0, "mode=0755") != 0) return "private /run";
  if (!writeText("/proc/sys/net/unix/max_dgram_qlen", kDatagramQueueLength)) return "datagram queue length";
  if (!ensureMachineId()) return "machine id";
  return nullptr;
}

}  // namespace zal::bench
