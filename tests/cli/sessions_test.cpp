#include <unistd.h>

#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class SessionsTest : public ToolFixture {
 protected:
  void writeSession(const std::string& name, const std::string& time, const std::string& log,
                    const std::string& quality = "q\n") {
    const std::string path = directory / ("Reports/" + name + "/");
    writeFile(path + "Log (" + time + ").log", log);
    writeFile(path + "Verbose Log (" + time + ").log", "verbose\n" + log);
    writeFile(path + "Quality Log (" + time + ").log", quality);
  }
  void writeTree() {
    writeSession("Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "14-03-07", "first\n");
    writeSession(
        "Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver)", "09-00-00", "second\n",
        "line\n========================================\n  [rtt]\n Average: 5\n     Min: 2\n     Max: 9\n"
        "  Median: 4.5\n  StdDev: 2\n");
    writeSession("Messages/2024-05-02 at 20-00-00 (+03) (Receiver)", "20-00-00", "third\n");
    writeFile(directory / "Reports/Messages/2024-05-02 at 20-00-00 (+03) (Receiver)/Media/a.pcap",
              std::string(3000, 'x'));
    writeFile(directory / "Reports/Vistel/2024-05-04 at 00-00-00 (CEST)/a dump, no session", "x");
    writeFile(directory / "Reports/a file", "x");
  }
};

TEST_F(SessionsTest, ListIsLatestFirst) {
  writeTree();
  EXPECT_EQ(run({"sessions", "list"}), 0);
  EXPECT_EQ(plain(out),
            "STARTED                     TYPE      ROLE       FILES        SIZE  DIRECTORY\n"
            "2024-05-03 09:00:00 CEST    Vistel    Receiver       3       138 B  "
            "ROOT/Reports/Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver)\n"
            "2024-05-02 20:00:00 +03     Messages  Receiver       4     3.0 KiB  "
            "ROOT/Reports/Messages/2024-05-02 at 20-00-00 (+03) (Receiver)\n"
            "2024-05-02 14:03:07 CEST    Vistel    Initiator      3        22 B  "
            "ROOT/Reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)\n");
}

TEST_F(SessionsTest, ASessionThatBecameAnArchiveIsListedAndShownLikeAnyOther) {
  const std::string archive = directory / "Reports/Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver).zip";
  writeFile(archive, "the machine knows what is in it");
  writeFile(directory / "Reports/Vistel/2024-05-03 at 09-00-00 (CEST).zip", "a dump's, no session's");
  machine.scriptedArchives.archives[archive] = {{"Verbose Log (09-00-00).log", "verbose\n"},
                                                {"Log (09-00-00).log", "simple\n"}};
  EXPECT_EQ(run({"sessions", "list"}), 0);
  EXPECT_EQ(plain(out),
            "STARTED                     TYPE    ROLE       FILES        SIZE  DIRECTORY\n"
            "2024-05-03 09:00:00 CEST    Vistel  Receiver       2        15 B  "
            "ROOT/Reports/Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver).zip\n");
  EXPECT_EQ(run({"sessions", "show", "Vistel", "--verbose"}), 0);
  EXPECT_EQ(out, "verbose\n");
  EXPECT_EQ(run({"sessions", "show", archive, "--log"}), 0);
  EXPECT_EQ(out, "simple\n");
  EXPECT_EQ(run({"sessions", "show", archive, "--quality"}), 3);
}

TEST_F(SessionsTest, AnArchiveThatCannotBeReadIsLeftOut) {
  writeFile(directory / "Reports/Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver).zip", "torn");
  EXPECT_EQ(run({"sessions", "list"}), 0);
  EXPECT_EQ(plain(out), "No sessions in ROOT/Reports\n");
}

TEST_F(SessionsTest, ListForProgramsHasEveryFile) {
  writeSession("Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "14-03-07", "first\n");
  EXPECT_EQ(run({"sessions", "list", "--json"}), 0);
  EXPECT_EQ(
      plain(out),
      R"~([{"type": "Vistel", "started": "2024-05-02 14:03:07", "zone": "CEST", "role": "Initiator", )~"
      R"~("directory": "ROOT/Reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "archived": false, "bytes": 22, "files": [)~"
      R"~({"path": "Log (14-03-07).log", "bytes": 6}, {"path": "Quality Log (14-03-07).log", "bytes": 2}, )~"
      R"~({"path": "Verbose Log (14-03-07).log", "bytes": 14}]}])~"
      "\n");
}

TEST_F(SessionsTest, WithoutSessionsTheListSaysWhereItLooked) {
  EXPECT_EQ(run({"sessions", "list"}), 0);
  EXPECT_EQ(plain(out), "No sessions in ROOT/Reports\n");
  EXPECT_EQ(run({"sessions", "list", "--json"}), 0);
  EXPECT_EQ(out, "[]\n");
}

TEST_F(SessionsTest, ShowTakesTheLatestSessionWithItsStatistics) {
  writeTree();
  EXPECT_EQ(run({"sessions", "show"}), 0);
  EXPECT_EQ(plain(out),
            "ROOT/Reports/Vistel/2024-05-03 at 09-00-00 (CEST) (Receiver)\n"
            "         7 B  Log (09-00-00).log\n"
            "       116 B  Quality Log (09-00-00).log\n"
            "        15 B  Verbose Log (09-00-00).log\n"
            "\n"
            "Log\n"
            "second\n"
            "\n"
            "Statistics\n"
            "========================================\n"
            "  [rtt]\n"
            " Average: 5\n"
            "     Min: 2\n"
            "     Max: 9\n"
            "  Median: 4.5\n"
            "  StdDev: 2\n");
}

TEST_F(SessionsTest, ShowTakesATypeOrADirectory) {
  writeTree();
  EXPECT_EQ(run({"sessions", "show", "Messages", "--log"}), 0);
  EXPECT_EQ(out, "third\n");
  EXPECT_EQ(
      run({"sessions", "show", "Reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)/", "--verbose"}), 0);
  EXPECT_EQ(out, "verbose\nfirst\n");
  EXPECT_EQ(run({"sessions", "show", "Messages", "--quality"}), 0);
  EXPECT_EQ(out, "q\n");
}

TEST_F(SessionsTest, ShowForProgramsHasLogAndStatistics) {
  writeSession("Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "14-03-07", "a \"b\"\n");
  EXPECT_EQ(run({"sessions", "show", "--json", "--log"}), 0);
  EXPECT_EQ(
      plain(out),
      R"({"path": "ROOT/Reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)/Log (14-03-07).log", "text": )"
      R"("a \"b\"\n"})"
      "\n");
  EXPECT_EQ(run({"sessions", "show", "--json"}), 0);
  const std::string ending = R"("log": "a \"b\"\n", "statistics": []})"
                             "\n";
  EXPECT_TRUE(out.ends_with(ending)) << out;
}

TEST_F(SessionsTest, SessionThatIsNotThereIsNotFound) {
  writeTree();
  EXPECT_EQ(run({"sessions", "show", "Nexa"}), 3);
  EXPECT_EQ(err, "lirractl: there is no session Nexa\n  \"lirractl sessions list\" shows what there is.\n");
  EXPECT_EQ(run({"sessions", "show", "./Nexa"}), 3);
}

TEST_F(SessionsTest, LogThatWasNotWrittenIsNotFound) {
  writeFile(directory / "Reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)/other", "x");
  EXPECT_EQ(run({"sessions", "show", "Vistel", "--log"}), 3);
}

TEST_F(SessionsTest, HostileLogCannotSteerTheTerminal) {
  const std::string hostile = "a\x1b[2J\x07\xc2\x9b\xff\xe2\x80\xae b\tc\n";
  writeSession("Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "14-03-07", hostile);
  EXPECT_EQ(run({"sessions", "show", "--log"}), 0);
  EXPECT_EQ(out, hostile) << "a pipe gets the bytes as they are";
  machine.terminal = true;
  EXPECT_EQ(run({"sessions", "show", "--log"}), 0);
  EXPECT_EQ(out, "a\\x1b[2J\\x07\\x9b\\xff\\u202e b\tc\n");
}

TEST_F(SessionsTest, HostileNamesAreEscapedEverywhere) {
  writeSession("Vis\x1b[31mtel/2024-05-02 at 14-03-07 (C\nT) (Initiator)", "14-03-07", "x\n");
  EXPECT_EQ(run({"sessions", "list"}), 0);
  EXPECT_EQ(plain(out),
            "STARTED                     TYPE            ROLE       FILES        SIZE  DIRECTORY\n"
            "2024-05-02 14:03:07 C\\nT    Vis\\x1b[31mtel  Initiator      3        14 B  "
            "ROOT/Reports/Vis\\x1b[31mtel/2024-05-02 at 14-03-07 (C\\nT) (Initiator)\n");
}

TEST_F(SessionsTest, ColoursAreForTerminalsOnly) {
  writeSession("Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)", "14-03-07", "first\n");
  EXPECT_EQ(run({"sessions", "show"}), 0);
  EXPECT_EQ(out.find('\x1b'), std::string::npos);
  machine.terminal = true;
  EXPECT_EQ(run({"sessions", "show"}), 0);
  EXPECT_NE(out.find("\x1b[1mLog\x1b[0m\n"), std::string::npos);
}

}  // namespace
}  // namespace zal::testing
