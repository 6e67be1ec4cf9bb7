#include "collectors/rotated_log_sets.h"

#include "tests/collectors/collector_fixture.h"

namespace zal {
namespace {

class RotatedLogSetsTest : public testing::CollectorFixture {
 protected:
  void putWholeSet(const std::string& name) {
    const std::string base = "Logs/" + name + "/" + name;
    put(base + ".log");
    put(base + "-Event.log");
    for (char generation = '1'; generation <= '9'; ++generation) {
      put(base + ".log." + generation + ".zip");
      put(base + "-Event.log." + generation + ".zip");
    }
  }
  void linkAll(const std::vector<std::string>& names) {
    LinkRotatedLogSets(collector, roots, log, names, out, true);
  }
  void linkRecent(const std::vector<std::string>& names) {
    LinkRecentLogSets(collector, roots, log, names, out);
  }
};

TEST_F(RotatedLogSetsTest, SetWithOnlyItsCurrentLogYieldsThatFileAndNothingElse) {
  put("Logs/N/N.log");
  linkRecent({"N"});
  EXPECT_EQ(testing::listTree(out), "N/\nN/N.log\n");
  EXPECT_TRUE(sameFile(in + "/Logs/N/N.log", out + "/N/N.log"));
}

TEST_F(RotatedLogSetsTest, MissingSetMakesNoDirectory) {
  linkRecent({"N"});
  linkAll({"N"});
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(RotatedLogSetsTest, AllGenerationsOfAFullSetAreTwentyLinks) {
  putWholeSet("Registration");
  int links = 0;
  files.failWith = [&](const std::string&) {
    ++links;
    return std::error_code{};
  };
  linkAll({"Registration"});
  EXPECT_EQ(links, 21);  // the first event generation is tried twice and linked once
  std::string expected = "Registration/\n";
  for (const std::string kind : {"-Event.log", ".log"}) {
    expected += "Registration/Registration" + kind + "\n";
    for (char generation = '1'; generation <= '9'; ++generation) {
      expected += "Registration/Registration" + kind + "." + generation + ".zip\n";
    }
  }
  EXPECT_EQ(testing::listTree(out), expected);
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(RotatedLogSetsTest, ShortFormNeverTakesTheSecondEventGenerationNorTheFourthLogGeneration) {
  putWholeSet("N");
  linkRecent({"N"});
  EXPECT_EQ(testing::listTree(out), R"(N/
N/N-Event.log
N/N-Event.log.1.zip
N/N.log
N/N.log.1.zip
N/N.log.2.zip
N/N.log.3.zip
)");
}

TEST_F(RotatedLogSetsTest, FilesAreLinkedInTheirFixedOrder) {
  putWholeSet("N");
  std::string order;
  files.failWith = [&](const std::string& source) {
    order += std::filesystem::path(source).filename().string() + "\n";
    return std::error_code{};
  };
  linkAll({"N"});
  EXPECT_EQ(order, R"(N-Event.log
N-Event.log.1.zip
N.log
N.log.1.zip
N.log.2.zip
N.log.3.zip
N-Event.log.1.zip
N-Event.log.2.zip
N-Event.log.3.zip
N-Event.log.4.zip
N-Event.log.5.zip
N-Event.log.6.zip
N-Event.log.7.zip
N-Event.log.8.zip
N-Event.log.9.zip
N.log.4.zip
N.log.5.zip
N.log.6.zip
N.log.7.zip
N.log.8.zip
N.log.9.zip
)");
}

TEST_F(RotatedLogSetsTest, MissingDestinationIsMadeEvenForNoNames) {
  LinkRotatedLogSets(collector, roots, log, {}, out + "/x/y", false);
  EXPECT_EQ(testing::listTree(out), "x/\nx/y/\n");
}

TEST_F(RotatedLogSetsTest, NameThatLeadsOutOfItsRootIsRefusedWithOneWarningAndTheOthersGoOn) {
  put("Logs/N/N.log");
  put("...log");
  put("secret/secret.log");
  linkRecent({"..", ".", "../secret", "N/../../secret", "N"});
  EXPECT_EQ(testing::listTree(directory.path() + "/out"), "N/\nN/N.log\n");
  const std::string reason = "its name leads out of the log directory";
  EXPECT_EQ(log.lines, (std::vector<std::string>{
                           "warning: Refused the log set \"..\": " + reason,
                           "warning: Refused the log set \".\": " + reason,
                           "warning: Refused the log set \"../secret\": " + reason,
                           "warning: Refused the log set \"N/../../secret\": " + reason,
                       }));
}

}  // namespace
}  // namespace zal
