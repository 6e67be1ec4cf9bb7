#include "platform/linux/stackshot/process_files.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <memory>
#include <sstream>

#include "platform/linux/files/descriptor.h"

namespace zal::stackshot {
namespace {

constexpr std::size_t kMostBytes = 64 * 1024;
constexpr std::size_t kMostCommandBytes =
    256;  // which program it is; arguments may hold what concerns nobody
constexpr std::size_t kMostKernelFrames = 64;
constexpr unsigned kKernelFlag = 0x00200000;  // PF_KTHREAD, the same in every kernel so far

std::string processPath(pid_t process) { return "/proc/" + std::to_string(process); }
std::string threadPath(pid_t process, pid_t thread) {
  return processPath(process) + "/task/" + std::to_string(thread);
}

/// The beginning of the file; empty when it cannot be read.
std::string textOf(const std::string& path, std::size_t most = kMostBytes) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  std::string text;
  std::array<char, 4096> buffer{};
  while (file.isOpen() && text.size() < most) {
    const ssize_t count = ::read(file.get(), buffer.data(), buffer.size());
    if (count <= 0) break;
    text.append(buffer.data(), static_cast<std::size_t>(count));
  }
  text.resize(std::min(text.size(), most));
  return text;
}

std::vector<pid_t> numbersIn(const std::string& directory) {
  std::vector<pid_t> result;
  const std::unique_ptr<DIR, int (*)(DIR*)> opened(::opendir(directory.c_str()), ::closedir);
  while (const dirent* const entry = opened ? ::readdir(opened.get()) : nullptr) {
    const std::string_view name = entry->d_name;
    pid_t number = 0;
    const auto parsed = std::from_chars(name.data(), name.data() + name.size(), number);
    if (parsed.ec == std::errc{} && parsed.ptr == name.data() + name.size()) result.push_back(number);
  }
  std::sort(result.begin(), result.end());
  return result;
}

/// The first number behind "KEY:" in a "status" file.
long statusNumber(const std::string& status, std::string_view key) {
  std::istringstream lines(status);
  for (std::string line; std::getline(lines, line);) {
    if (!line.starts_with(key) || line.size() <= key.size() || line[key.size()] != ':') continue;
    std::istringstream rest(line.substr(key.size() + 1));
    long number = 0;
    rest >> number;
    return number;
  }
  return 0;
}

std::string commandOf(pid_t process) {
  std::string command = textOf(processPath(process) + "/cmdline", kMostCommandBytes);
  while (!command.empty() && command.back() == '\0') command.pop_back();
  std::replace(command.begin(), command.end(), '\0', ' ');
  return command;
}

}  // namespace

std::optional<StatLine> parseStatLine(std::string_view text) {
  // The name may hold blanks and brackets of its own: it ends at the last one.
  const std::size_t open = text.find('(');
  const std::size_t close = text.rfind(')');
  if (open == std::string_view::npos || close == std::string_view::npos || close < open) return std::nullopt;
  StatLine result;
  result.name = text.substr(open + 1, close - open - 1);
  std::istringstream rest{std::string(text.substr(close + 1))};
  long group = 0;
  long session = 0;
  long terminal = 0;
  long foreground = 0;
  unsigned flags = 0;
  rest >> result.state >> result.parent >> group >> session >> terminal >> foreground >> flags;
  if (!rest) return std::nullopt;
  result.isKernel = (flags & kKernelFlag) != 0;
  return result;
}

std::vector<pid_t> allProcesses() { return numbersIn("/proc"); }

std::vector<pid_t> threadsOf(pid_t process) { return numbersIn(processPath(process) + "/task"); }

std::optional<ProcessRecord> readProcess(pid_t process) {
  const auto stat = parseStatLine(textOf(processPath(process) + "/stat"));
  if (!stat) return std::nullopt;
  ProcessRecord result;
  result.id = process;
  result.parent = stat->parent;
  result.user = static_cast<uid_t>(statusNumber(textOf(processPath(process) + "/status"), "Uid"));
  result.name = stat->name;
  result.command = commandOf(process);
  result.state = stat->state;
  if (stat->isKernel) result.kind = ProcessKind::kernel;
  return result;
}

std::optional<ThreadRecord> readThread(pid_t process, pid_t thread) {
  const auto stat = parseStatLine(textOf(threadPath(process, thread) + "/stat"));
  if (!stat) return std::nullopt;
  ThreadRecord result;
  result.id = thread;
  result.name = stat->name;
  result.state = stat->state;
  result.waitsIn = textOf(threadPath(process, thread) + "/wchan");
  if (result.waitsIn == "0") result.waitsIn.clear();
  return result;
}

char stateOf(pid_t process, pid_t thread) {
  const auto stat = parseStatLine(textOf(threadPath(process, thread) + "/stat"));
  return stat ? stat->state : '?';
}

std::vector<std::string> kernelFramesOf(pid_t process, pid_t thread) {
  std::vector<std::string> result;
  std::istringstream lines(textOf(threadPath(process, thread) + "/stack"));
  // Each line begins with an address, which is hidden: "[<0>] function+0x10/0x20".
  for (std::string line; result.size() < kMostKernelFrames && std::getline(lines, line);) {
    const std::size_t blank = line.find("] ");
    result.push_back(blank == std::string::npos ? line : line.substr(blank + 2));
  }
  return result;
}

pid_t tracerOf(pid_t process, pid_t thread) {
  return static_cast<pid_t>(statusNumber(textOf(threadPath(process, thread) + "/status"), "TracerPid"));
}

}  // namespace zal::stackshot
