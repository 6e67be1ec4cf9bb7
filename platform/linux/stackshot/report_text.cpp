#include "platform/linux/stackshot/report_text.h"

#include <cstdio>

#include "platform/linux/files/escaped_text.h"

namespace zal::stackshot {
namespace {

std::string hexadecimal(const char* format, std::uint64_t value) {
  char text[32];
  const int size = std::snprintf(text, sizeof text, format, static_cast<unsigned long long>(value));
  return {text, static_cast<std::size_t>(size)};
}

std::string milliseconds(std::int64_t microseconds) {
  char text[48];
  const int size = std::snprintf(text, sizeof text, "%.3f ms", static_cast<double>(microseconds) / 1000);
  return {text, static_cast<std::size_t>(size)};
}

const char* stateWord(char state) {
  switch (state) {
    case 'R':
      return "running";
    case 'S':
      return "sleeping";
    case 'D':
      return "sleeping uninterruptibly";
    case 'T':
      return "stopped";
    case 't':
      return "stopped by a tracer";
    case 'Z':
      return "ended";
    case 'I':
      return "idle";
    default:
      return "unknown";
  }
}

std::string stateText(char state) { return std::string(1, state) + " (" + stateWord(state) + ")"; }

std::string line(const std::string& label, const std::string& text) {
  std::string result = label + ":";
  result.resize(result.size() < 16 ? 16 : result.size() + 1, ' ');
  return result + text + "\n";
}

std::string count(std::size_t number, const char* noun) {
  return std::to_string(number) + " " + noun + (number == 1 ? "" : "s");
}

std::string troublesText(const ReportTotals& totals) {
  std::string text;
  for (const auto& [reason, threads] : totals.troubles) {
    text += (text.empty() ? "" : ", ") + count(threads, "thread") + " (" + reason + ")";
  }
  return text;
}

std::string frameText(std::size_t number, const Frame& frame) {
  std::string text = "    #" + std::to_string(number);
  text.resize(text.size() < 9 ? 9 : text.size() + 1, ' ');
  text += hexadecimal("0x%016llx", frame.address);
  if (!frame.function.empty()) text += " " + escapedLine(frame.function);
  if (!frame.module.empty()) {
    text += frame.function.empty() ? " " : " + ";
    text += hexadecimal("0x%llx", frame.offset) + " in " + escapedLine(frame.module);
  }
  return text + "\n";
}

std::string threadText(const ThreadRecord& thread) {
  std::string text = "  Thread " + std::to_string(thread.id) + " [" + escapedLine(thread.name) + "], " +
                     stateText(thread.state);
  if (!thread.waitsIn.empty()) text += ", waits in " + escapedLine(thread.waitsIn);
  text += "\n";
  std::size_t number = 0;
  for (const Frame& frame : thread.frames) text += frameText(number++, frame);
  for (const std::string& frame : thread.kernelFrames) text += "    kernel: " + escapedLine(frame) + "\n";
  if (!thread.trouble.empty()) {
    text += std::string("    ") + (thread.frames.empty() ? "no stack: " : "incomplete: ") +
            escapedLine(thread.trouble) + "\n";
  }
  return text;
}

}  // namespace

void ReportTotals::add(const ProcessRecord& process) {
  ++processes;
  if (process.kind == ProcessKind::kernel) ++kernelProcesses;
  if (process.kind == ProcessKind::ended) ++endedProcesses;
  threads += process.threadCount;
  leftOutThreads += process.threadCount - process.threads.size();
  for (const ThreadRecord& thread : process.threads) {
    if (!thread.frames.empty()) ++stacks;
    if (!thread.trouble.empty()) ++troubles[thread.trouble];
  }
}

std::string headerText(const ReportHeader& header, const ReportTotals& totals) {
  std::string text = header.title + "\n\n" + line("Time", header.time);
  for (const auto& [label, value] : header.subject) text += line(label, escapedLine(value));
  if (header.code) text += line("Code", hexadecimal("0x%08llX", *header.code));
  text += line("Host", escapedLine(header.host)) + line("Kernel", escapedLine(header.kernel)) +
          line("Written by", header.writer);
  text += line("Processes", std::to_string(totals.processes) + ", " + std::to_string(totals.kernelProcesses) +
                                " of the kernel, " + std::to_string(totals.endedProcesses) + " ended");
  text += line("Threads", std::to_string(totals.threads) + ", " + count(totals.stacks, "stack"));
  if (totals.leftOutThreads > 0)
    text += line("Left out", count(totals.leftOutThreads, "thread") + " of processes that have too many");
  if (!totals.troubles.empty()) text += line("Incomplete", troublesText(totals));
  text += line("Duration", milliseconds(header.microseconds) + ", no thread held for more than " +
                               milliseconds(header.longestHoldMicroseconds));
  if (!header.endedEarly.empty()) text += line("Ended early", header.endedEarly);
  return text + "\n";
}

std::string processText(const ProcessRecord& process) {
  std::string text = "Process " + std::to_string(process.id) + " [" + escapedLine(process.name) + "], ";
  if (process.kind == ProcessKind::kernel) text += "of the kernel, ";
  text += stateText(process.state) + ", parent " + std::to_string(process.parent) + ", user " +
          std::to_string(process.user) + ", " + count(process.threadCount, "thread") + "\n";
  if (!process.command.empty()) text += "  Command: " + escapedLine(process.command) + "\n";
  if (process.kind == ProcessKind::ended) return text + "  ended, waits for its parent\n\n";
  for (const ThreadRecord& thread : process.threads) text += threadText(thread);
  return text + "\n";
}

}  // namespace zal::stackshot
