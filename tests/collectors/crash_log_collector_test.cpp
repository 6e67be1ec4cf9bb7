#include "tests/collectors/log_collectors_fixture.h"

namespace zal::testing {
namespace {

class CrashLogCollectorTest : public LogCollectorsFixture {};

TEST_F(CrashLogCollectorTest, LinksTheReportsOfTheThreeProcesses) {
  for (const char* name : {"Orrisd_1.crash", "Vistel-2013-01-01.crash", "Dialette", "Textelle_1.crash",
                           "aVistel.crash", ".Vistel"}) {
    putReport(name);
  }
  logs.CollectCrashLogs(out);
  EXPECT_EQ(gathered(), "Dialette\nOrrisd_1.crash\nVistel-2013-01-01.crash\n");
  EXPECT_TRUE(isLinked("Dialette", "Logs/Reports/Dialette"));
  EXPECT_TRUE(lines.empty());
}

TEST_F(CrashLogCollectorTest, ThePrefixTestIsCaseSensitiveWhereTheFragmentTestOfSystemLogsMatchesBoth) {
  putReport("Vistel-2013-01-01.crash");
  putReport("vistel-2013-01-01.crash");
  logs.CollectCrashLogs(out);
  EXPECT_EQ(gathered(), "Vistel-2013-01-01.crash\n");
  const std::string other = host.home / "other";
  std::filesystem::create_directories(other);
  logs.CollectSystemLogs(other, start);
  EXPECT_EQ(listTree(other), "Vistel-2013-01-01.crash\nvistel-2013-01-01.crash\n");
}

TEST_F(CrashLogCollectorTest, DirectoriesAndLinksToNowhereStayOut) {
  putReport("Vistel/2013-01-01/Log.log");
  std::filesystem::create_symlink("/nonexistent", host.home / "Logs/Reports/Vistel.link");
  std::filesystem::create_directory_symlink("Vistel", host.home / "Logs/Reports/Vistel.dir");
  logs.CollectCrashLogs(out);
  EXPECT_EQ(gathered(), "");
}

TEST_F(CrashLogCollectorTest, AMissingDirectorySelectsNothingWithoutAMessage) {
  logs.CollectCrashLogs(out);
  logs.CollectNetworkStackLogs(out);
  EXPECT_EQ(gathered(), "");
  EXPECT_TRUE(lines.empty());
}

TEST_F(CrashLogCollectorTest, ATakenNameStaysAndIsNotLogged) {
  putReport("Vistel.crash");
  put("out/Vistel.crash");
  logs.CollectCrashLogs(out);
  EXPECT_EQ(readFile(out + "/Vistel.crash"), "out/Vistel.crash");
  EXPECT_TRUE(lines.empty());
}

TEST_F(CrashLogCollectorTest, ARootOfTheHomeDirectoryIsExpanded) {
  host.configuration.roots.DiagnosticReportRoot = "~/Elsewhere";
  put("Elsewhere/Vistel.crash");
  put("Elsewhere/Webstrand.crash");
  logs.CollectCrashLogs(out);
  logs.CollectNetworkStackLogs(out);
  EXPECT_EQ(gathered(), "Vistel.crash\nWebstrand.crash\n");
}

TEST_F(CrashLogCollectorTest, AnExceptionEndsTheWalkWithOneLine) {
  putReport("Orrisd.crash");
  putReport("Vistel.crash");
  throwAt("Orrisd");
  logs.CollectCrashLogs(out);
  EXPECT_EQ(gathered(), "");
  EXPECT_EQ(lines, std::vector<std::string>{"warning: Exception processing crash logs: the roof is on fire"});
}

class NetworkStackLogCollectorTest : public LogCollectorsFixture {};

TEST_F(NetworkStackLogCollectorTest, TakesEveryMatchingEntryOfTheFourDirectories) {
  for (const char* directory : {"System/Reports/", "Wireless/Reports/", "Root/Reports/", "Logs/Reports/"}) {
    const std::string owner = std::string(directory).substr(0, 4);
    put(directory + ("Webstrand-" + owner));
    put(directory + ("webstrand-" + owner));
    put(directory + ("aWebstrand-" + owner));
  }
  logs.CollectNetworkStackLogs(out);
  EXPECT_EQ(gathered(), "Webstrand-Logs\nWebstrand-Root\nWebstrand-Syst\nWebstrand-Wire\n");
}

TEST_F(NetworkStackLogCollectorTest, TheFirstDirectoryWinsATakenName) {
  for (const char* directory : {"System/Reports/", "Wireless/Reports/", "Root/Reports/", "Logs/Reports/"}) {
    put(std::string(directory) + "Webstrand.log");
  }
  logs.CollectNetworkStackLogs(out);
  EXPECT_TRUE(isLinked("Webstrand.log", "System/Reports/Webstrand.log"));
}

TEST_F(NetworkStackLogCollectorTest, AnExceptionForOneDirectoryIsALineAndTheNextFollows) {
  put("System/Reports/Webstrand-1");
  put("Root/Reports/Webstrand-2");
  throwAt("System/Reports");
  logs.CollectNetworkStackLogs(out);
  EXPECT_EQ(gathered(), "Webstrand-2\n");
  EXPECT_EQ(lines,
            std::vector<std::string>{"warning: Exception processing webstrand logs: the roof is on fire"});
}

}  // namespace
}  // namespace zal::testing
