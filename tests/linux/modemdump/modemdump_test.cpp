#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <memory>
#include <regex>

#include "collectors/collectors.h"
#include "platform/linux/baseband/hand_off_marker.h"
#include "platform/linux/loop/linux_clock.h"
#include "tests/support/child_program.h"
#include "tests/support/fake_platform.h"
#include "tests/support/private_bus.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

/// The real program, in UTC, with devices, logs and tools of the test's own.
class ModemdumpTest : public ::testing::Test {
 protected:
  std::unique_ptr<ChildProgram> start(const std::vector<std::string>& more = {}) {
    std::vector<std::string> command = {
        ZAL_MODEMDUMP_PATH, "--directory",       reports,    "--marker", marker, "--root", directory / "root",
        "--tools",          directory / "tools", "--reason", "a reason"};
    command.insert(command.end(), more.begin(), more.end());
    return std::make_unique<ChildProgram>(
        ChildProgram::Options{.command = command,
                              .errors = directory / "errors",
                              .environment = {{"TZ", "UTC0"}, {"DBUS_SYSTEM_BUS_ADDRESS", address}}});
  }
  int run(const std::vector<std::string>& more = {}) { return start(more)->waitForExit().value_or(-1000); }
  void tool(const std::string& name, const std::string& lines) const {
    writeFile(directory / "tools/" + name, "#!/bin/sh\n" + lines + "\n");
    std::filesystem::permissions(directory / "tools/" + name, std::filesystem::perms::all);
  }
  [[nodiscard]] bool markerIsThere() const { return std::filesystem::exists(marker); }
  /// The set's names without what they have in common.
  [[nodiscard]] std::string names() const {
    return std::regex_replace(listTree(reports), std::regex("modemd-\\d{4}(-\\d\\d){5}-"), "");
  }
  [[nodiscard]] std::string content(const std::string& name) const {
    for (const auto& entry : std::filesystem::directory_iterator(reports)) {
      if (entry.path().filename().string().ends_with(name)) return readFile(entry.path());
    }
    return "(none)";
  }
  [[nodiscard]] std::string errors() const { return readFile(directory / "errors"); }

  TemporaryDirectory directory;
  const std::string reports = directory / "reports/Baseband";
  const std::string marker = directory / "marker";
  std::string address = "unix:path=" + directory / "no-bus";
};

TEST_F(ModemdumpTest, WrongUsageEndsWithTwo) {
  EXPECT_EQ(run({"--limit", "soon"}), 2);
  EXPECT_EQ(run({"--wrong", "word"}), 2);
  EXPECT_EQ(run({"--limit"}), 2);
  EXPECT_THAT(errors(), HasSubstr("lirra-modemdump: a directory and a marker are needed"));
}

TEST_F(ModemdumpTest, WithoutABusTheNoteSaysWhatCouldNotBeHadAndTheMarkerIsGone) {
  EXPECT_EQ(run(), 1);
  EXPECT_FALSE(markerIsThere());
  EXPECT_EQ(names(), "note.txt\n");
  EXPECT_EQ(content("-note.txt"),
            "reason: a reason\n"
            "not had: modem daemons: there is no system bus: No such file or directory\n"
            "not had: control devices of the modem: there are none\n"
            "not had: device core dumps: there are none\n");
}

TEST_F(ModemdumpTest, DeviceCoreDumpsAreCopied) {
  const std::string folder = directory / "root/sys/class/devcoredump/";
  const std::string core("core\0of a modem", 15);
  writeFile(folder + "devcd1/data", core);
  writeFile(folder + "devcd2/data", "second");
  writeFile(folder + "disabled", "0");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "devcore-2.bin\ndevcore.bin\nnote.txt\n");
  EXPECT_EQ(content("-devcore.bin"), core);
  EXPECT_EQ(content("-devcore-2.bin"), "second");
  EXPECT_THAT(content("-note.txt"), HasSubstr("devcore.bin: 15 bytes of " + folder + "devcd1/data\n"));
}

TEST_F(ModemdumpTest, ControlDevicesAreAskedWithTheToolOfTheirDriver) {
  for (const auto& [device, driver] :
       {std::pair("cdc-wdm0", "qmi_wwan"), std::pair("cdc-wdm1", "cdc_mbim")}) {
    writeFile(directory / "root/dev/" + device, "");
    const std::string place = directory / "root/sys/class/usbmisc/" + device + "/device";
    std::filesystem::create_directories(place);
    std::filesystem::create_symlink(std::string("/sys/bus/usb/drivers/") + driver, place + "/driver");
  }
  tool("qmicli", "[ $4 = --nas-get-signal-info ] && echo \"$*\"; exit 0");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "note.txt\nqmi.txt\n");
  const std::string device = "# " + directory / "root/dev/cdc-wdm0 ";
  EXPECT_EQ(content("-qmi.txt"), device + "--dms-get-revision\n" + device + "--dms-get-operating-mode\n" +
                                     device + "--nas-get-signal-info\n-p -d " +
                                     directory / "root/dev/cdc-wdm0 --nas-get-signal-info\n" + device +
                                     "--nas-get-system-info\n" + device + "--nas-get-cell-location-info\n");
  EXPECT_THAT(content("-note.txt"), HasSubstr("not had: mbimcli: not installed\n"));
}

TEST_F(ModemdumpTest, TellsWhenFilesCannotBeWritten) {
  writeFile(directory / "reports", "a file");
  EXPECT_EQ(run(), 3);
  EXPECT_FALSE(markerIsThere());
  EXPECT_THAT(errors(), HasSubstr("reports/Baseband: "));
}

TEST_F(ModemdumpTest, LeavesTheMarkerToAnotherOneThatHoldsIt) {
  const auto held = HandOffMarker::take(marker);
  EXPECT_EQ(run(), 4);
  EXPECT_TRUE(markerIsThere());
  EXPECT_FALSE(std::filesystem::exists(reports));
}

TEST_F(ModemdumpTest, TakesOverAMarkerThatAKilledOneLeft) {
  writeFile(marker, "");
  EXPECT_EQ(run(), 1);
  EXPECT_FALSE(markerIsThere());
}

TEST_F(ModemdumpTest, OnlyTheNewestTenSetsStay) {
  for (int day = 10; day < 22; ++day)
    writeFile(reports + "/modemd-2001-01-" + std::to_string(day) + "-10-00-00-note.txt", "");
  writeFile(reports + "/somebody's file", "");
  EXPECT_EQ(run(), 1);
  const std::string left = listTree(reports);
  EXPECT_EQ(std::count(left.begin(), left.end(), '\n'), 11);
  EXPECT_THAT(left, HasSubstr("2001-01-13-"));
  EXPECT_THAT(left, ::testing::Not(HasSubstr("2001-01-12-")));
  EXPECT_THAT(left, HasSubstr("somebody's file\n"));
}

/// With ModemManager or oFono played on a bus of the test's own.
class ModemdumpOnABusTest : public ModemdumpTest {
 protected:
  void SetUp() override {
    if (const std::string obstacle = PrivateBus::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
    if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
    bus = std::make_unique<PrivateBus>();
    address = bus->address();
  }
  void playModemManager(const std::string& more = "") {
    service = std::make_unique<MockedService>(
        *bus, "org.freedesktop.ModemManager1",
        std::vector<std::string>{"-m", "dbusmock", "-t", ZAL_MODEMDUMP_MOCKS "/modem_manager_mock.py", "-p",
                                 "{\"levels\": \"" + directory / "levels\"" + more + "}"});
    tool("mmcli", "[ \"$*\" = '-m any -J' ] && echo '{\"modem\":{}}'");
    tool("journalctl", "echo \"at the levels $(/bin/cat " + directory / "levels)\"");
  }
  [[nodiscard]] std::string levels() const { return readFile(directory / "levels"); }

  std::unique_ptr<PrivateBus> bus;
  std::unique_ptr<MockedService> service;
};

TEST_F(ModemdumpOnABusTest, WritesOneSetAboutModemManagersModems) {
  playModemManager();
  EXPECT_EQ(run({"--listening", "0"}), 0);
  EXPECT_FALSE(markerIsThere());
  EXPECT_EQ(names(), "at.log\ncells.json\nmmcli.json\nnote.txt\nstate.json\n");
  EXPECT_EQ(content("-state.json"), R"({
  "/org/freedesktop/ModemManager1/Modem/0": {
    "org.freedesktop.ModemManager1.Modem": {
      "Model": "a \"model\"\u0009with\u0007",
      "SignalQuality": [80, true],
      "CurrentBands": [5, 31],
      "State": -1,
      "Rate": 0.5,
      "Largest": 18446744073709551615,
      "Ports": []
    }
  }
}
)");
  EXPECT_EQ(content("-mmcli.json"), "{\"modem\":{}}\n");
  EXPECT_EQ(content("-cells.json"), R"({
"/org/freedesktop/ModemManager1/Modem/0": [{
  "serving": true,
  "tac": "2A"
}]
}
)");
  // While the log is read nothing more is said.
  EXPECT_EQ(content("-at.log"), "at the levels DEBUG\nINFO\n");
  EXPECT_THAT(content("-note.txt"), HasSubstr("state.json: "));
  EXPECT_THAT(content("-note.txt"), HasSubstr("(ModemManager's objects, 1 modems)\n"));
}

TEST_F(ModemdumpOnABusTest, WholeSetCarriesOneStampAndIsWhatACollectionThatBeganBeforeTakes) {
  playModemManager();
  writeFile(reports + "/modemd-2001-01-01-10-00-00-note.txt", "");
  const WallTime start = LinuxClock().wallNow();
  ASSERT_EQ(run({"--listening", "0"}), 0);
  FakePlatform host;
  host.configuration.roots.WirelessReportRoot = directory / "reports";
  Collectors(host.platform).logs.CollectBasebandLogs(directory / "dump", start);
  std::filesystem::remove(reports + "/modemd-2001-01-01-10-00-00-note.txt");
  EXPECT_EQ(listTree(directory / "dump/Baseband"), listTree(reports));
  EXPECT_EQ(names(), "at.log\ncells.json\nmmcli.json\nnote.txt\nstate.json\n");
}

TEST_F(ModemdumpOnABusTest, LogIsTheFileOfModemManagersCommandLineAndItsLevelComesBack) {
  playModemManager();
  const std::string process =
      outputOf({"sh", "-c",
                "busctl --address=" + address + " status org.freedesktop.ModemManager1 | sed -n s/^PID=//p"});
  const std::string words("ModemManager\0--log-level=WARN\0--log-file\0/var/log/mm.log\0", 58);
  writeFile(directory / "root/proc/" + process + "/cmdline", words);
  writeFile(directory / "root/var/log/mm.log", "AT+CSQ\n");
  EXPECT_EQ(run({"--listening", "0"}), 0);
  EXPECT_EQ(content("-at.log"), "AT+CSQ\n");
  EXPECT_EQ(levels(), "DEBUG\nWARN\n");
}

TEST_F(ModemdumpOnABusTest, WhereTheLevelIsRefusedTheLogIsTakenAsItIsAndTheNoteSaysSo) {
  playModemManager(", \"refuses\": true");
  EXPECT_EQ(run(), 0);
  EXPECT_THAT(content("-at.log"), HasSubstr("at the levels"));
  EXPECT_THAT(content("-note.txt"), HasSubstr("(the journal; at its usual level: not allowed)\n"));
}

TEST_F(ModemdumpOnABusTest, ModemManagerThatHangsIsNotWaitedForLongerThanTwoSeconds) {
  playModemManager();
  service->hang();
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "at.log\nnote.txt\n");
  EXPECT_THAT(content("-note.txt"),
              HasSubstr("not had: org.freedesktop.ModemManager1: no answer within 2000 ms\n"));
  EXPECT_THAT(content("-note.txt"),
              HasSubstr("not had: mmcli: not run: ModemManager does not run or does not answer\n"));
  EXPECT_EQ(levels(), "");
  service->goOn();
}

TEST_F(ModemdumpOnABusTest, ToldToEndInTheMiddleItSetsTheLevelBackAndTakesTheMarkerWithIt) {
  playModemManager();
  for (const int signal : {SIGTERM, SIGINT, SIGHUP}) {
    std::filesystem::remove(directory / "levels");
    std::filesystem::remove_all(reports);
    const auto program = start({"--listening", "50"});
    ASSERT_TRUE(eventually([&] { return levels() == "DEBUG\n"; }));
    EXPECT_TRUE(markerIsThere());
    program->signal(signal);
    EXPECT_EQ(program->waitForExit(), 0);
    EXPECT_FALSE(markerIsThere());
    EXPECT_EQ(levels(), "DEBUG\nINFO\n");
    EXPECT_THAT(content("-note.txt"),
                HasSubstr("cut short: told to end by signal " + std::to_string(signal) + "\n"));
    EXPECT_THAT(listTree(reports), ::testing::Not(HasSubstr(".new")));
  }
}

TEST_F(ModemdumpOnABusTest, TimeLimitOfTheWholeCutsItShort) {
  playModemManager();
  EXPECT_EQ(run({"--listening", "50", "--limit", "1"}), 0);
  EXPECT_FALSE(markerIsThere());
  EXPECT_EQ(levels(), "DEBUG\nINFO\n");
  EXPECT_THAT(content("-note.txt"), HasSubstr("cut short: its time of 1000 ms was up\n"));
  EXPECT_THAT(content("-state.json"), HasSubstr("/org/freedesktop/ModemManager1/Modem/0"));
}

TEST_F(ModemdumpOnABusTest, ToolThatHangsIsKilledWithItsChildren) {
  playModemManager();
  tool("mmcli", "/bin/sleep 1000 & echo $! > " + directory / "child" + "; wait");
  const auto program = start();
  ASSERT_TRUE(eventually([&] { return readFile(directory / "child").ends_with('\n'); }));
  const pid_t child = std::stoi(readFile(directory / "child"));
  program->signal(SIGTERM);
  EXPECT_EQ(program->waitForExit(), 0);
  EXPECT_THAT(content("-note.txt"), HasSubstr("not had: mmcli: cut off: told to end by signal 15\n"));
  EXPECT_TRUE(eventually([&] {
    const std::string state = readFile("/proc/" + std::to_string(child) + "/stat");
    return state.empty() || state.find(") Z ") != std::string::npos;
  }));
}

TEST_F(ModemdumpOnABusTest, NothingIsStartedOnTheBus) {
  for (const std::string name : {"org.freedesktop.ModemManager1", "org.ofono"})
    writeFile(bus->servicesDirectory() + "/" + name + ".service",
              "[D-BUS Service]\nName=" + name + "\nExec=/usr/bin/touch " + directory / "started" + "\n");
  EXPECT_EQ(run(), 1);
  EXPECT_FALSE(std::filesystem::exists(directory / "started"));
  EXPECT_THAT(
      content("-note.txt"),
      HasSubstr("not had: org.freedesktop.ModemManager1: does not run\nnot had: org.ofono: does not run\n"));
}

TEST_F(ModemdumpOnABusTest, OfonosModemsAreWrittenWhereItHasThem) {
  MockedService ofono(*bus, "org.ofono", {"-m", "dbusmock", "-t", ZAL_MODEMDUMP_MOCKS "/ofono_mock.py"});
  writeFile(directory / "root/var/log/syslog",
            "Nov 21 10:00:00 phone cron[1]: a job\nNov 21 10:00:01 phone ofonod[7]: a line\n");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "at.log\nnote.txt\nstate.json\n");
  EXPECT_THAT(content("-state.json"), HasSubstr(R"("modems": [["/ril_0", {
  "Powered": true
}]],
"/ril_0": {
"org.ofono.SimManager": {
  "Present": true,
  "MobileCountryCode": "001"
},
)"));
  EXPECT_EQ(content("-at.log"), "Nov 21 10:00:01 phone ofonod[7]: a line\n");
}

}  // namespace
}  // namespace zal::testing
