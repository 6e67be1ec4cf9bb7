#include "bench/archive/measured_run.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include "bench/support/timing.h"

namespace zal::bench {
namespace {

double secondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
}

}  // namespace

RunFigures measureRun(const std::vector<std::string>& command, const std::filesystem::path& folder) {
  std::vector<char*> arguments;
  for (const auto& word : command) arguments.push_back(const_cast<char*>(word.c_str()));
  arguments.push_back(nullptr);
  sync();
  const Stopwatch clock;
  const pid_t child = fork();
  if (child == 0) {
    const int null = open("/dev/null", O_RDWR);
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO}) dup2(null, stream);
    if (chdir(folder.c_str()) == 0) execv(arguments[0], arguments.data());
    _exit(127);
  }
  int status = 0;
  rusage used{};
  if (wait4(child, &status, 0, &used) != child) return {};
  return {clock.seconds(), secondsOf(used.ru_utime) + secondsOf(used.ru_stime),
          static_cast<double>(used.ru_maxrss) / 1024, status == 0};
}

}  // namespace zal::bench
