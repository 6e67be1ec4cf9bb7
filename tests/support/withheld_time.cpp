#include "tests/support/withheld_time.h"

#include <unistd.h>

#include <cstdint>
#include <fstream>

namespace zal::testing {
namespace {

std::chrono::milliseconds withheldSinceBoot() {
  constexpr int kStealColumn = 8;  // after the row's name
  std::ifstream file("/proc/stat");
  std::string name;
  file >> name;
  std::int64_t ticks = 0;
  for (int column = 1; column <= kStealColumn; ++column) file >> ticks;
  return std::chrono::milliseconds(file ? ticks * 1000 / ::sysconf(_SC_CLK_TCK) : 0);
}

}  // namespace

WithheldTime::WithheldTime() : _began(std::chrono::steady_clock::now()), _before(withheldSinceBoot()) {}

std::string WithheldTime::text() const {
  const auto passed = std::chrono::steady_clock::now() - _began;
  return "in " + std::to_string(std::chrono::floor<std::chrono::seconds>(passed).count()) +
         " s the host withheld " + std::to_string((withheldSinceBoot() - _before).count()) +
         " ms of processor time";
}

}  // namespace zal::testing
