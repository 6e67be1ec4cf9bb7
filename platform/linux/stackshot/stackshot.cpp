#include "platform/linux/stackshot/stackshot.h"

#include <sched.h>
#include <sys/resource.h>
#include <sys/utsname.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <utility>

#include "platform/linux/files/escaped_text.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/stackshot/arguments.h"
#include "platform/linux/stackshot/process_files.h"
#include "platform/linux/stackshot/report_names.h"
#include "platform/linux/stackshot/report_place.h"
#include "platform/linux/stackshot/report_text.h"
#include "platform/linux/stackshot/survey.h"

namespace zal::stackshot {
namespace {

constexpr int kDone = 0;
constexpr int kNoReport = 1;
constexpr int kWrongUsage = 2;
/// Of the processes' part; what does not fit is left out and the report says so.
constexpr std::size_t kMostText = 16U << 20U;
constexpr std::size_t kMostSubject = 8192;
/// Behind what people wait for, but not so far that those we hold wait with us.
constexpr int kNiceness = 5;

int fail(int code, const std::string& trouble) {
  std::cerr << "lirra-stackshot: " << escapedLine(trouble) << std::endl;
  return code;
}

void setUp() {
  // The parent's background threads run only when nothing else does.
  const sched_param none{};
  ::sched_setscheduler(0, SCHED_OTHER, &none);
  ::setpriority(PRIO_PROCESS, 0, kNiceness);
  // Symbols come from this machine's files: no question to a server over the network.
  ::unsetenv("DEBUGINFOD_URLS");
}

/// The processes' part of the report while it grows.
struct Body {
  std::string text;
  ReportTotals totals;
  std::string endedEarly;

  void add(const ProcessRecord& process) {
    totals.add(process);
    text += processText(process);
  }
};

Body machine(Survey& survey, const TimeLeft& timeLeft) {
  Body body;
  for (const pid_t id : allProcesses()) {
    if (body.text.size() > kMostText) {
      body.endedEarly = "size limit";
      return body;
    }
    // What is over is not asked any more but still listed: that costs next to nothing.
    if (const auto process = survey.process(id)) body.add(*process);
  }
  body.endedEarly = timeLeft.whyOver();
  return body;
}

std::string timeText(const LinuxClock& clock, const LocalTime& time) {
  char text[96];
  std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d.%03d ", time.year, time.month, time.day,
                time.hour, time.minute, time.second, time.millisecond);
  return text + clock.zoneAbbreviation();
}

void describeHost(ReportHeader& header) {
  utsname host{};
  ::uname(&host);
  header.host = host.nodename;
  header.kernel = std::string(host.sysname) + " " + host.release + " " + host.version + " " + host.machine;
  header.writer =
      "lirra-stackshot, process " + std::to_string(::getpid()) + ", user " + std::to_string(::geteuid());
}

ReportHeader headerOf(const Arguments& arguments) {
  ReportHeader header;
  header.title = "Stackshot of the machine";
  if (arguments.process) header.title = "Report of process " + std::to_string(*arguments.process);
  if (arguments.exception)
    header.title = "Report of an exception in process " + std::to_string(*arguments.process);
  const std::pair<const char*, const std::optional<std::string>&> subjects[] = {
      {"Reason", arguments.reason}, {"Message", arguments.message}, {"Exception", arguments.exception}};
  for (const auto& [label, text] : subjects) {
    if (text) header.subject.emplace_back(label, cutAtCharacter(*text, kMostSubject));
  }
  header.code = arguments.code;
  describeHost(header);
  return header;
}

std::int64_t microseconds(std::chrono::nanoseconds time) {
  return std::chrono::duration_cast<std::chrono::microseconds>(time).count();
}

int report(const Arguments& arguments) {
  const TimeLeft timeLeft(arguments.limit);
  const LinuxClock clock;
  const SteadyTime begin = clock.steadyNow();
  const LocalTime beginTime = clock.localTime(clock.wallNow());
  Survey survey(timeLeft);
  ReportHeader header = headerOf(arguments);
  std::string name = stackshotName(beginTime);
  Body body;
  if (arguments.process) {
    const auto process = survey.process(*arguments.process);
    if (!process) return fail(kNoReport, "there is no process " + std::to_string(*arguments.process));
    body.add(*process);
    body.endedEarly = timeLeft.whyOver();
    name = crashReportName(process->name, beginTime);
  } else {
    body = machine(survey, timeLeft);
  }
  header.endedEarly = body.endedEarly;
  header.time = timeText(clock, beginTime);
  header.microseconds = microseconds(clock.steadyNow() - begin);
  header.longestHoldMicroseconds = microseconds(survey.longestHold());
  const PlacedReport placed =
      placeReport(arguments.output, name, headerText(header, body.totals) + body.text);
  if (placed.error) return fail(kNoReport, placed.path + ": " + placed.error.message());
  if (!placed.path.empty()) std::cout << placed.path << std::endl;
  return kDone;
}

}  // namespace

int run(const std::vector<std::string>& words) {
  const auto parsed = parseArguments(words);
  if (const auto* trouble = std::get_if<std::string>(&parsed))
    return fail(kWrongUsage, *trouble + "; see lirra-stackshot --help");
  const auto& arguments = std::get<Arguments>(parsed);
  if (arguments.help) {
    std::cout << helpText();
    return kDone;
  }
  setUp();
  return report(arguments);
}

}  // namespace zal::stackshot
