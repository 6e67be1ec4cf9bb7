#include <sys/stat.h>

#include "tests/collectors/log_collectors_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class PushLogCollectorTest : public LogCollectorsFixture {
 protected:
  PushLogCollectorTest() { host.configuration.commands.profile = CommandProfile::literal; }
};

TEST_F(PushLogCollectorTest, WithOneCaptureFilePresentExactlyOneLinkIsMade) {
  put("Logs/tcpdump_beacond_en0-1");
  logs.CollectPushCaptureFiles(out);
  EXPECT_EQ(gathered(), "tcpdump_beacond_en0-1.pcap\n");
  EXPECT_TRUE(isLinked("tcpdump_beacond_en0-1.pcap", "Logs/tcpdump_beacond_en0-1"));
}

TEST_F(PushLogCollectorTest, AllFourCaptureFilesAreLinkedAndNoOther) {
  for (const char* name : {"en0-0", "en0-1", "en0-2", "pdp_ip0-0", "pdp_ip0-1", "pdp_ip1-0"}) {
    put(std::string("Logs/tcpdump_beacond_") + name);
  }
  put("Logs/tcpdump_en0-full.pcap");
  logs.CollectPushCaptureFiles(out);
  EXPECT_EQ(gathered(),
            "tcpdump_beacond_en0-0.pcap\ntcpdump_beacond_en0-1.pcap\n"
            "tcpdump_beacond_pdp_ip0-0.pcap\ntcpdump_beacond_pdp_ip0-1.pcap\n");
}

TEST_F(PushLogCollectorTest, TheFullCaptureKeepsItsName) {
  logs.LinkFullPacketCapture(out);
  EXPECT_EQ(gathered(), "");
  put("Logs/tcpdump_en0-full.pcap");
  logs.LinkFullPacketCapture(out);
  EXPECT_EQ(gathered(), "tcpdump_en0-full.pcap\n");
  EXPECT_TRUE(isLinked("tcpdump_en0-full.pcap", "Logs/tcpdump_en0-full.pcap"));
}

TEST_F(PushLogCollectorTest, TheStateIsTheLogsAndWhatTheDaemonSays) {
  host.configuration.collection.pushLogDirectory = "~/Push";
  put("Push/beacond.0.log.gz");
  put("Push/a.log.gz");
  const std::string push = out + "/deep/Push";
  logs.DumpPushServiceState(push);
  EXPECT_EQ(gathered(), "deep/\ndeep/Push/\ndeep/Push/beacond.0.log.gz\n");
  struct stat status {};
  ASSERT_EQ(::stat(push.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0777U);
  EXPECT_EQ(host.shell.commands, std::vector<std::string>{"/usr/local/bin/pushprobe -dumpState > \"" + push +
                                                          "/pushprobe_state.txt\"  2>&1 &"});
}

TEST_F(PushLogCollectorTest, WithoutAKnownDirectoryOrDestinationNothingHappens) {
  logs.DumpPushServiceState(out + "/Push");
  host.configuration.collection.pushLogDirectory = host.home / "Push";
  put("Push/a.log");
  logs.DumpPushServiceState("");
  EXPECT_EQ(gathered(), "");
  EXPECT_TRUE(host.shell.commands.empty());
}

class BluetoothLogCollectorTest : public LogCollectorsFixture {
 protected:
  BluetoothLogCollectorTest() {
    host.configuration.commands.profile = CommandProfile::literal;
    put("uart.log");
    put("Logs/Bluetooth/hci.log");
  }
  void pass(std::chrono::nanoseconds time) {
    host.host.advance(time);
    host.queues.runAll();
  }
};

TEST_F(BluetoothLogCollectorTest, TheDaemonIsAskedAtOnceAndItsLogsAreTakenASecondLater) {
  logs.CollectBluetoothLogs(out);
  EXPECT_EQ(host.shell.commands, std::vector<std::string>{"/usr/bin/killall -USR2 Corvell > \"" + out +
                                                          "/kill_corvell_usr2_command.txt\"  2>&1 &"});
  pass(999ms);
  EXPECT_EQ(gathered(), "");
  put("Logs/Bluetooth/written-on-request.log");
  pass(1ms);
  EXPECT_EQ(gathered(), "hci.log\nuart.log\nwritten-on-request.log\n");
  EXPECT_TRUE(isLinked("uart.log", "uart.log"));
  EXPECT_FALSE(isLinked("hci.log", "Logs/Bluetooth/hci.log"));
}

TEST_F(BluetoothLogCollectorTest, TheLogsAreTakenOnAGlobalQueueNotOnTheMainThread) {
  logs.CollectBluetoothLogs(out);
  host.host.advance(1s);
  EXPECT_EQ(host.queues.readyJobs("global.default"), 1U);
  EXPECT_EQ(gathered(), "");
}

TEST_F(BluetoothLogCollectorTest, ADestinationThatIsGoneByThenDoesNotComeBack) {
  logs.CollectBluetoothLogs(out);
  std::filesystem::remove_all(out);
  pass(1s);
  EXPECT_FALSE(std::filesystem::exists(out));
  EXPECT_TRUE(lines.empty());
}

class SingleLogCollectorTest : public LogCollectorsFixture {};

TEST_F(SingleLogCollectorTest, TheThermalLogIsLinked) {
  logs.LinkThermalLog(out);
  EXPECT_EQ(gathered(), "");
  put("tmp/vistel_thermal_log.txt");
  logs.LinkThermalLog(out);
  EXPECT_EQ(gathered(), "vistel_thermal_log.txt\n");
  EXPECT_TRUE(isLinked("vistel_thermal_log.txt", "tmp/vistel_thermal_log.txt"));
}

TEST_F(SingleLogCollectorTest, SyncAndDiagnosticLogsAreCopiedIntoAFreshDirectory) {
  put("Logs/Cirrel/sync.log");
  put("Logs/Cirrel/sync.log.gz");
  putReport("DiagnosticLogs/Accounts/a.log");
  putReport("DiagnosticLogs/d.log");
  logs.CopyDiagnosticAndSyncLogs(out + "/new");
  EXPECT_EQ(gathered(), "new/\nnew/Accounts/\nnew/Accounts/a.log\nnew/d.log\nnew/sync.log\n");
  EXPECT_FALSE(isLinked("new/d.log", "Logs/Reports/DiagnosticLogs/d.log"));
}

TEST_F(SingleLogCollectorTest, WithoutSuchLogsTheDirectoryIsStillMade) {
  logs.CopyDiagnosticAndSyncLogs(out + "/new");
  EXPECT_EQ(gathered(), "new/\n");
}

}  // namespace
}  // namespace zal::testing
