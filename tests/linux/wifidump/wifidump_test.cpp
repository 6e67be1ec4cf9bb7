#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <memory>

#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

/// The real program with tools of the test's own.
class WifidumpTest : public ::testing::Test {
 protected:
  std::unique_ptr<ChildProgram> start(const std::vector<std::string>& more = {}) {
    std::vector<std::string> command = {
        ZAL_WIFIDUMP_PATH, "--directory",       target,     "--root",  directory / "root",
        "--tools",         directory / "tools", "--reason", "a reason"};
    command.insert(command.end(), more.begin(), more.end());
    return std::make_unique<ChildProgram>(
        ChildProgram::Options{.command = command, .errors = directory / "errors"});
  }
  int run(const std::vector<std::string>& more = {}) { return start(more)->waitForExit().value_or(-1000); }
  void tool(const std::string& name, const std::string& lines) const {
    writeFile(directory / "tools/" + name, "#!/bin/sh\n" + lines + "\n");
    std::filesystem::permissions(directory / "tools/" + name, std::filesystem::perms::all);
  }
  void toolsOfAnInterface() const {
    tool("iw",
         "case \"$*\" in dev) printf 'phy#0\\n\\tInterface wlan0\\n' ;; *survey*) echo 'no' >&2; exit 237 ;; "
         "*) echo \"iw $*\" ;; esac");
    tool("nmcli", "echo \"nmcli $*\"");
    tool("dmesg", "echo '[1] ext4'; echo '[2] wlan0: authenticated'");
  }
  [[nodiscard]] std::string content(const std::string& name) const {
    return readFile(target + "/wifidump-" + name);
  }

  TemporaryDirectory directory;
  const std::string target = directory / "reports/WiFi";
};

TEST_F(WifidumpTest, WritesWhatEachToolSaysOrWhyNot) {
  toolsOfAnInterface();
  writeFile(directory / "root/sys/class/devcoredump/devcd1/data", "core");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(listTree(target),
            "wifidump-devcore.bin\nwifidump-iw-dev.txt\nwifidump-iw-phy.txt\nwifidump-iw-wlan0-link.txt\n"
            "wifidump-iw-wlan0-scan.txt\nwifidump-iw-wlan0-station.txt\nwifidump-iw-wlan0-survey.txt\n"
            "wifidump-kernel.txt\nwifidump-nmcli-list.txt\nwifidump-note.txt\n");
  EXPECT_EQ(content("iw-dev.txt"), "phy#0\n\tInterface wlan0\n");
  EXPECT_EQ(content("iw-wlan0-link.txt"), "iw dev wlan0 link\n");
  EXPECT_EQ(content("iw-wlan0-station.txt"), "iw dev wlan0 station dump\n");
  EXPECT_EQ(content("iw-wlan0-scan.txt"), "iw dev wlan0 scan dump\n");
  EXPECT_EQ(content("iw-wlan0-survey.txt"), "(iw dev wlan0 survey dump: ended with status 237: no)\n");
  EXPECT_EQ(content("iw-phy.txt"), "iw phy\n");
  EXPECT_EQ(content("nmcli-list.txt"), "nmcli -f all device wifi list --rescan no\n");
  EXPECT_EQ(content("kernel.txt"), "[2] wlan0: authenticated\n");
  EXPECT_EQ(content("devcore.bin"), "core");
  EXPECT_EQ(content("note.txt"),
            "reason: a reason\n"
            "iw-dev.txt: 23 bytes\n"
            "iw-wlan0-link.txt: 18 bytes\n"
            "iw-wlan0-station.txt: 26 bytes\n"
            "not had: iw dev wlan0 survey dump: ended with status 237: no\n"
            "iw-wlan0-scan.txt: 23 bytes\n"
            "iw-phy.txt: 7 bytes\n"
            "nmcli-list.txt: 42 bytes\n"
            "kernel.txt: 25 bytes\n"
            "devcore.bin: 4 bytes of " +
                directory / "root/sys/class/devcoredump/devcd1/data\n");
}

TEST_F(WifidumpTest, WithoutAnyToolTheFilesSayThatAndNothingWasHad) {
  EXPECT_EQ(run(), 1);
  EXPECT_EQ(content("iw-dev.txt"), "(iw dev: not installed)\n");
  EXPECT_EQ(content("kernel.txt"), "(dmesg: not installed)\n");
  EXPECT_EQ(content("note.txt"),
            "reason: a reason\n"
            "not had: iw dev: not installed\n"
            "not had: iw phy: not installed\n"
            "not had: nmcli -f all device wifi list --rescan no: not installed\n"
            "not had: dmesg: not installed\n"
            "not had: device core dumps: there are none\n");
}

TEST_F(WifidumpTest, ToolThatHangsIsCutOffAndTheOthersAreAsked) {
  toolsOfAnInterface();
  tool("nmcli", "echo begun; exec /bin/sleep 1000");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(content("nmcli-list.txt"),
            "begun\n(nmcli -f all device wifi list --rescan no: cut off after 3000 ms)\n");
  EXPECT_EQ(content("kernel.txt"), "[2] wlan0: authenticated\n");
}

TEST_F(WifidumpTest, LimitOfTheWholeKeepsWhatWasHad) {
  toolsOfAnInterface();
  tool("nmcli", "exec /bin/sleep 1000");
  EXPECT_EQ(run({"--limit", "1"}), 0);
  EXPECT_EQ(content("iw-phy.txt"), "iw phy\n");
  EXPECT_THAT(content("note.txt"), HasSubstr("cut short: its time of 1000 ms was up\n"));
  EXPECT_THAT(content("note.txt"), HasSubstr("not had: dmesg: not run: its time of 1000 ms was up\n"));
}

TEST_F(WifidumpTest, ToldToEndItEndsItsToolAndWritesItsNote) {
  toolsOfAnInterface();
  tool("nmcli", "echo $$ > " + directory / "pid" + "; exec /bin/sleep 1000");
  const auto program = start();
  ASSERT_TRUE(eventually([&] { return readFile(directory / "pid").ends_with('\n'); }));
  program->signal(SIGTERM);
  EXPECT_EQ(program->waitForExit(), 0);
  EXPECT_THAT(content("note.txt"), HasSubstr("cut short: told to end by signal 15\n"));
  EXPECT_FALSE(std::filesystem::exists("/proc/" + std::to_string(std::stoi(readFile(directory / "pid")))));
}

TEST_F(WifidumpTest, EarlierFilesOfItsOwnGoAndThoseOfOthersStay) {
  writeFile(target + "/wifidump-iw-wlan7-link.txt", "of an interface that is gone");
  writeFile(target + "/wifi-driver.log", "the driver's");
  EXPECT_EQ(run(), 1);
  EXPECT_EQ(listTree(target),
            "wifi-driver.log\nwifidump-iw-dev.txt\nwifidump-iw-phy.txt\nwifidump-kernel.txt\n"
            "wifidump-nmcli-list.txt\nwifidump-note.txt\n");
}

TEST_F(WifidumpTest, DirectoryThatCannotBeFilledIsTold) {
  writeFile(directory / "reports", "a file");
  EXPECT_EQ(run(), 3);
  EXPECT_THAT(readFile(directory / "errors"), HasSubstr("lirra-wifidump: "));
}

TEST_F(WifidumpTest, WrongUsageEndsWithTwo) {
  EXPECT_EQ(run({"--limit", "-1"}), 2);
  EXPECT_EQ(run({"--what"}), 2);
}

}  // namespace
}  // namespace zal::testing
