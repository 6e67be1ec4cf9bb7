#include "tests/linux/bus_ofono/ofono_fixture.h"

namespace zal::testing {
namespace {

std::string textOf(const Value& value) {
  if (const auto* const text = value.as<std::string>()) return *text;
  if (const auto* const number = value.as<std::int64_t>()) return std::to_string(*number);
  std::string words;
  if (const auto* const map = value.as<ValueMap>()) {
    for (const auto& [key, each] : *map) words += key + "=" + textOf(each) + " ";
  }
  return "{ " + words + "}";
}

}  // namespace

std::string cellularState(Telephony& telephony, AgentLog& log) {
  FakePropertyListWriter unused;
  std::string lines;
  for (const auto& [key, value] : CellularSnapshot(telephony, unused, log).CopyCellularState()) {
    lines += key + ": " + textOf(value) + "\n";
  }
  return lines;
}

void OfonoFixture::SetUp() {
  BusFixture::SetUp();
  if (IsSkipped()) return;
  if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
}

void OfonoFixture::startOfono(bool withModem) {
  ofono.reset();
  ofono = std::make_unique<MockedService>(
      bus, "org.ofono",
      std::vector<std::string>{"-m", "dbusmock", "--system", "-t", "ofono", "-p",
                               withModem ? "{}" : R"({"no_modem": true})"});
  // The name comes before the objects do.
  const std::string count = withModem ? "a(oa{sv}) 1 " : "a(oa{sv}) 0";
  ASSERT_TRUE(eventually([&] {
    return bus.busctl({"call", "org.ofono", "/", "org.ofono.Manager", "GetModems"}).starts_with(count);
  }));
  if (!withModem) return;
  // The template's number has not the type of a real daemon's.
  tell("/ril_0", {"org.freedesktop.DBus.Mock", "UpdateProperties", "sa{sv}", "org.ofono.NetworkRegistration",
                  "1", "CellId", "u", "10203"});
}

void OfonoFixture::answerWith(const std::string& interface, const std::string& expression,
                              const std::string& signature) {
  tell("/ril_0", {"org.freedesktop.DBus.Mock", "AddMethod", "sssss", "org.ofono." + interface,
                  "GetProperties", "", signature, "ret = " + expression});
}

void OfonoFixture::change(const std::string& interface, const std::string& changes) {
  answerWith(interface, "dict(self.GetAll('org.ofono." + interface + "'), " + changes + ")");
}

void OfonoFixture::tell(const std::string& path, const std::vector<std::string>& words) {
  std::vector<std::string> command{"call", "org.ofono", path};
  command.insert(command.end(), words.begin(), words.end());
  const std::string trouble = bus.busctl(command);
  ASSERT_EQ(trouble.find("failed"), std::string::npos) << trouble;
}

}  // namespace zal::testing
