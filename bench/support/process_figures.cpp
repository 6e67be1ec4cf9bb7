#include "bench/support/process_figures.h"

#include <time.h>

#include <filesystem>
#include <fstream>
#include <string>

namespace zal::bench {
namespace {

std::filesystem::path processFolder(pid_t process) { return "/proc/" + std::to_string(process); }

std::uint64_t labelledNumber(const std::filesystem::path& file, const std::string& label) {
  std::ifstream lines(file);
  std::uint64_t sum = 0;
  for (std::string line; std::getline(lines, line);) {
    if (line.rfind(label, 0) == 0) sum += std::stoull(line.substr(label.size()));
  }
  return sum;
}

}  // namespace

double cpuSeconds(pid_t process) {
  clockid_t clock{};
  timespec spent{};
  if (clock_getcpuclockid(process, &clock) != 0 || clock_gettime(clock, &spent) != 0) return 0;
  return static_cast<double>(spent.tv_sec) + static_cast<double>(spent.tv_nsec) * 1e-9;
}

double residentMebibytes(pid_t process) {
  return static_cast<double>(labelledNumber(processFolder(process) / "status", "VmRSS:")) / 1024;
}

double peakMebibytes(pid_t process) {
  return static_cast<double>(labelledNumber(processFolder(process) / "status", "VmHWM:")) / 1024;
}

double proportionalMebibytes(pid_t process) {
  return static_cast<double>(labelledNumber(processFolder(process) / "smaps_rollup", "Pss:")) / 1024;
}

std::uint64_t contextSwitches(pid_t process) {
  std::uint64_t sum = 0;
  std::error_code error;
  for (const auto& thread : std::filesystem::directory_iterator(processFolder(process) / "task", error)) {
    sum += labelledNumber(thread.path() / "status", "voluntary_ctxt_switches:");
    sum += labelledNumber(thread.path() / "status", "nonvoluntary_ctxt_switches:");
  }
  return sum;
}

}  // namespace zal::bench
