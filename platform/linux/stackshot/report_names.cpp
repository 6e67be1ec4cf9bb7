#include "platform/linux/stackshot/report_names.h"

#include <cstdio>

#include "platform/linux/files/escaped_text.h"

namespace zal::stackshot {
namespace {

std::string stamp(const LocalTime& time) {
  char text[64];
  const int size = std::snprintf(text, sizeof text, "%04d-%02d-%02d-%02d%02d%02d", time.year, time.month,
                                 time.day, time.hour, time.minute, time.second);
  return {text, static_cast<std::size_t>(size)};
}

}  // namespace

std::string crashReportName(std::string_view process, const LocalTime& begin) {
  std::string name = process.empty() ? "_" : escapedWord(process);
  for (char& c : name) {
    if (c == '/' || c == '\\') c = '_';
  }
  if (name.front() == '.') name.front() = '_';
  return name + "-" + stamp(begin) + ".crash";
}

std::string stackshotName(const LocalTime& begin) { return "Homeframe+" + stamp(begin) + ".stackshot"; }

std::string variantOf(const std::string& name, int number) {
  const std::size_t dot = name.rfind('.');
  return name.substr(0, dot) + "-" + std::to_string(number) + name.substr(dot);
}

}  // namespace zal::stackshot
