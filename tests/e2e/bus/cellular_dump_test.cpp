#include <regex>

#include "tests/e2e/bus/bus_e2e_fixture.h"

namespace zal::testing {
namespace {

constexpr int kNetworkLogs = 2;

class CellularDumpE2eTest : public BusE2eFixture {
 protected:
  using Rows = std::map<std::string, std::string>;

  CellularDumpE2eTest() { sandbox.settings = "[testing]\nclosingStageDelay = 3600\n"; }

  /// The property list CTState.plist of a dump of the agent, before it is archived.
  std::string dumpedState() {
    lirra::Client client = makeClient();
    (void)ask(client, "Vistel", kNetworkLogs);
    std::string text;
    EXPECT_TRUE(eventually(
        [&] {
          const auto found = reportsEndingWith("/Network/CT/CTState.plist");
          text = found.size() == 1 ? readFile(found[0]) : "";
          return text.ends_with("</plist>\n");
        },
        kDeadline))
        << output();
    return text;
  }
  /// What stands under the keys of the outermost dictionary.
  static Rows rowsOf(const std::string& propertyList) {
    static const std::regex row(R"(\n    <key>([^<]*)</key>\n    <(string|integer|dict)>([^<]*))");
    Rows rows;
    for (std::sregex_iterator found(propertyList.begin(), propertyList.end(), row), end; found != end;
         ++found) {
      rows[(*found)[1]] = (*found)[2] == "dict" ? "dictionary" : (*found)[3].str();
    }
    return rows;
  }
  /// What mmcli says of modem or SIM: "modem.3gpp.imei" and the like.
  Rows mmcli(const std::vector<std::string>& words) const {
    static const std::regex line(R"((\S+) +: (.*))");
    Rows rows;
    std::smatch parts;
    for (const std::string& text : linesOf(modemManager->mmcli(words))) {
      if (std::regex_match(text, parts, line)) rows[parts[1]] = parts[2];
    }
    return rows;
  }
};

TEST_F(CellularDumpE2eTest, AllRowsOfARealModemManagerAreInTheStateOfADump) {
  startModem({"csq=20"});
  start();
  const Rows rows = rowsOf(dumpedState());
  // 33 of the 34: a firmware baseline is something that this modem does not have.
  const Rows expected = {{"active-supported-bands", "dictionary"},
                         {"allowed-mode", "2g|3g|4g"},
                         {"bootloader-version", "FAILED"},
                         {"cell-id", "10203"},
                         {"data-attached", "YES"},
                         {"data-disallowed", "NO"},
                         {"data-enabled", "NO"},
                         {"firmware-version", "1.2.3"},
                         {"graded", "3"},
                         {"home-country", "YES"},
                         {"international-data-enabled", "FAILED"},
                         {"mobile-identity", "490154203237518"},
                         {"network-mcc", "001"},
                         {"network-mnc", "01"},
                         {"numeric-network-code-mode", "00101"},
                         {"operator-name", "Test Net"},
                         {"packet-context-count", "0"},
                         {"percentage", "80"},
                         {"provider-name", "Home Net"},
                         {"radio-rat", "lte"},
                         {"rat-preferred", "none"},
                         {"rat-selection", "2g|3g|4g"},
                         {"registration-status", "home"},
                         {"reset-state", "NO"},
                         {"rssi", "-63"},
                         {"service-center-address", "+15550001"},
                         {"sim-identity", "8949000000000000017"},
                         {"sim-mcc", "001"},
                         {"sim-mnc", "01"},
                         {"sim-status", "none"},
                         {"subscriber-country-code", "001"},
                         {"subscriber-identity", "001010123456789"},
                         {"tty-mode", "FAILED"}};
  EXPECT_EQ(rows, expected);

  Rows said = mmcli({"-m", "any", "-K"});
  said.merge(mmcli({"-i", "0", "-K"}));
  const std::pair<const char*, const char*> sames[] = {
      {"firmware-version", "modem.generic.revision"},
      {"mobile-identity", "modem.generic.equipment-identifier"},
      {"percentage", "modem.generic.signal-quality.value"},
      {"radio-rat", "modem.generic.access-technologies.value[1]"},
      {"operator-name", "modem.3gpp.operator-name"},
      {"numeric-network-code-mode", "modem.3gpp.operator-code"},
      {"registration-status", "modem.3gpp.registration-state"},
      {"sim-identity", "sim.properties.iccid"},
      {"subscriber-identity", "sim.properties.imsi"},
      {"provider-name", "sim.properties.operator-name"},
  };
  for (const auto& [key, name] : sames) EXPECT_EQ(rows.at(key), said[name]) << key;
  EXPECT_EQ(rows.at("sim-mcc") + rows.at("sim-mnc"), said["sim.properties.operator-code"]);
}

TEST_F(CellularDumpE2eTest, WithoutAModemDaemonTheStateOfADumpIsThereAndEmpty) {
  start();
  EXPECT_EQ(rowsOf(dumpedState()), Rows{});
  EXPECT_NE(output().find("CT Network information query failed, could not connect to Telvane"),
            std::string::npos);
}

}  // namespace
}  // namespace zal::testing
