#include "platform/linux/stackshot/time_left.h"

#include <unistd.h>

#include <algorithm>
#include <csignal>

namespace zal::stackshot {
namespace {

volatile std::sig_atomic_t askedToEnd = 0;

void endSoon(int /*signal*/) {
  askedToEnd = 1;
  ::alarm(1);
}

void endNow(int /*signal*/) { ::_exit(1); }

}  // namespace

TimeLeft::TimeLeft(std::chrono::milliseconds limit) : _end(Clock::now() + limit) {
  askedToEnd = 0;
  struct sigaction soon {};
  soon.sa_handler = endSoon;  // without SA_RESTART: a wait is to end
  for (const int signal : {SIGTERM, SIGINT, SIGHUP}) ::sigaction(signal, &soon, nullptr);
  struct sigaction now {};
  now.sa_handler = endNow;
  ::sigaction(SIGALRM, &now, nullptr);
  const auto seconds = std::chrono::ceil<std::chrono::seconds>(limit).count() + 2;
  ::alarm(static_cast<unsigned>(seconds));
}

bool TimeLeft::isOver() const { return askedToEnd != 0 || Clock::now() >= _end; }

const char* TimeLeft::whyOver() const {
  if (askedToEnd != 0) return "told to end";
  return Clock::now() >= _end ? "time limit" : "";
}

TimeLeft::Clock::time_point TimeLeft::atMost(std::chrono::milliseconds time) const {
  return std::min(_end, Clock::now() + time);
}

}  // namespace zal::stackshot
