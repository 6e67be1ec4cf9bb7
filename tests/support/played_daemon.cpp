#include "tests/support/played_daemon.h"

#include <sstream>
#include <utility>

namespace zal::testing {

PlayedDaemon::PlayedDaemon(const PrivateBus& bus, const std::string& name, Answers answers)
    : _answers(std::move(answers)),
      _service(bus, name, {ZAL_TEST_SUPPORT "/played_daemon.py", name, _written()}) {}

std::string PlayedDaemon::obstacle() {
  static const bool isThere = outputOf({"/usr/bin/python3", "-c", "import gi"}).empty();
  return isThere ? "" : "python3-gi is not installed";
}

void PlayedDaemon::answer(const std::string& call, const std::string& answer) {
  _answers[call] = answer;
  _written();
}

std::vector<std::string> PlayedDaemon::calls() const {
  std::istringstream notes(readFile(_file() + ".calls"));
  std::vector<std::string> calls;
  for (std::string line; std::getline(notes, line);) calls.push_back(line);
  return calls;
}

std::string PlayedDaemon::_written() {
  std::string text;
  for (const auto& [call, answer] : _answers) text += call + "\t" + answer + "\n";
  writeFile(_file() + ".new", text);
  std::filesystem::rename(_file() + ".new", _file());
  return _file();
}

PlayedDaemon::Answers playedProperties(const std::string& path, const std::string& interface,
                                       const std::map<std::string, std::string>& values) {
  const std::string call = path + " org.freedesktop.DBus.Properties.";
  PlayedDaemon::Answers answers;
  std::string all;
  for (const auto& [name, value] : values) {
    all += (all.empty() ? "'" : ", '") + name + "': <" + value + ">";
    answers[call + "Get(\"" + interface + "\", \"" + name + "\")"] = "(<" + value + ">,)";
  }
  answers[call + "GetAll(\"" + interface + "\")"] = values.empty() ? "(@a{sv} {},)" : "({" + all + "},)";
  return answers;
}

}  // namespace zal::testing
