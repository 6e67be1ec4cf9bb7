#include "agent/logging_switches.h"

namespace zal {
namespace {

struct Row {
  std::string_view key;
  bool LoggingSwitches::*target;  ///< null: read, and of no effect
};

constexpr Row kRows[] = {
    {"VerboseCallLogging", &LoggingSwitches::VerboseCallLogging},
    {"CallLogging", &LoggingSwitches::CallLogging},
    {"ConsoleOutput", &LoggingSwitches::ConsoleOutput},
    {"ConsoleOutputVerbose", &LoggingSwitches::ConsoleOutputVerbose},
    {"ConsoleOutputRegistration", nullptr},
    {"ConsoleOutputTorvik", &LoggingSwitches::ConsoleOutputTorvik},
    {"ConsoleOutputLocalPreview", nullptr},
};

}  // namespace

bool LoggingSwitches::read(PreferenceStore& preferences) {
  preferences.synchronize(kLoggingDomain);
  bool last = false;
  for (const Row& row : kRows) {
    last = preferences.boolean(kLoggingDomain, row.key).value_or(false);
    if (row.target != nullptr) this->*row.target = last;
  }
  return last;
}

}  // namespace zal
