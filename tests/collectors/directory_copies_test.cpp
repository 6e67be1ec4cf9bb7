#include "tests/collectors/collector_fixture.h"

namespace zal {
namespace {

namespace fs = std::filesystem;

class DirectoryCopiesTest : public testing::CollectorFixture {
 protected:
  /// Fails the first `count` copies, whichever entries the host lists first, each with its own error.
  void failCopies(int count) {
    files.failWith = [this, count](const std::string& source) {
      tried.push_back(source);
      const int number = static_cast<int>(tried.size());
      if (number > count) return std::error_code{};
      return std::make_error_code(number == 1 ? std::errc::no_space_on_device : std::errc::io_error);
    };
  }
  [[nodiscard]] std::string failure(std::size_t index, std::errc error) const {
    const std::string name = fs::path(tried.at(index)).filename().string();
    return "warning: Failed to copy from file://" + tried.at(index) + " to file://" + out + "/" + name +
           " with error: " + std::make_error_code(error).message();
  }
  std::vector<std::string> tried;
};

TEST_F(DirectoryCopiesTest, CompressedOlderLogsStayOutExceptThoseOfTheBeacon) {
  put("d/a.log");
  put("d/a.log.gz");
  put("d/beacond.0.log.gz");
  collector.CopyDirectoryContents(in + "/d", out);
  EXPECT_EQ(testing::listTree(out), "a.log\nbeacond.0.log.gz\n");
  EXPECT_EQ(testing::readFile(out + "/a.log"), "content of d/a.log\n");
}

TEST_F(DirectoryCopiesTest, SubdirectoriesAreCopiedWholeAndHiddenEntriesLeftOut) {
  put("d/sub/deep/x.log.gz");
  put("d/.hidden");
  collector.CopyDirectoryContents(in + "/d", out);
  EXPECT_EQ(testing::listTree(out), "sub/\nsub/deep/\nsub/deep/x.log.gz\n");
}

TEST_F(DirectoryCopiesTest, AfterTheFirstFailureEveryLaterEntryIsLoggedWithThatError) {
  put("d/one");
  put("d/two");
  failCopies(1);
  collector.CopyDirectoryContents(in + "/d", out);
  ASSERT_EQ(tried.size(), 2U);
  EXPECT_EQ(log.lines, (std::vector<std::string>{failure(0, std::errc::no_space_on_device),
                                                 failure(1, std::errc::no_space_on_device)}));
  EXPECT_TRUE(fs::exists(out + "/" + fs::path(tried[1]).filename().string()));
}

TEST_F(DirectoryCopiesTest, ALaterFailureOfItsOwnReplacesTheErrorThatIsLogged) {
  put("d/one");
  put("d/two");
  put("d/three");
  failCopies(2);
  collector.CopyDirectoryContents(in + "/d", out);
  ASSERT_EQ(tried.size(), 3U);
  EXPECT_EQ(log.lines,
            (std::vector<std::string>{failure(0, std::errc::no_space_on_device),
                                      failure(1, std::errc::io_error), failure(2, std::errc::io_error)}));
}

TEST_F(DirectoryCopiesTest, NothingIsLoggedBeforeTheFirstFailure) {
  put("d/one");
  put("d/two");
  testing::writeFile(out + "/unrelated", "");
  collector.CopyDirectoryContents(in + "/d", out);
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(DirectoryCopiesTest, UnreadableSourceReturnsSilently) {
  collector.CopyDirectoryContents(in + "/missing", out);
  put("file");
  collector.CopyDirectoryContents(in + "/file", out);
  EXPECT_TRUE(log.lines.empty());
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(DirectoryCopiesTest, MissingDestinationIsNotMade) {
  put("d/one");
  collector.CopyDirectoryContents(in + "/d", out + "/missing");
  EXPECT_EQ(log.lines.size(), 1U);
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(DirectoryCopiesTest, CrashReportsMatchInAnyCaseAndSubdirectoriesAreIgnored) {
  put("Reports/Vistel_2013-01-01.crash");
  put("Reports/Messages_2013-01-01.crash");
  put("Reports/vistel-sessions/x.crash");
  collector.CopyCrashReportsMatching({"vistel"}, out);
  EXPECT_EQ(testing::listTree(out), "Vistel_2013-01-01.crash\n");
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"notice: Copying diagnostic logs from: file://" + in + "/Reports/"});
}

TEST_F(DirectoryCopiesTest, CrashReportsWithSeveralFragmentsNeedOneOfThem) {
  put("Reports/a-one");
  put("Reports/a-two");
  put("Reports/a-three");
  put("Reports/.one");
  collector.CopyCrashReportsMatching({"ONE", "tWo"}, out);
  EXPECT_EQ(testing::listTree(out), "a-one\na-two\n");
}

TEST_F(DirectoryCopiesTest, EmptyFragmentListSelectsNoCrashReport) {
  put("Reports/a");
  collector.CopyCrashReportsMatching({}, out);
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(DirectoryCopiesTest, CrashReportLinkToNowhereCountsAsAFile) {
  fs::create_directories(in + "/Reports");
  fs::create_symlink("/nonexistent/target", in + "/Reports/vistel.link");
  failCopies(0);
  collector.CopyCrashReportsMatching({"vistel"}, out);
  EXPECT_EQ(tried, std::vector<std::string>{in + "/Reports/vistel.link"});
}

TEST_F(DirectoryCopiesTest, FailedCrashReportCopiesKeepTheErrorToo) {
  put("Reports/vistel-1");
  put("Reports/vistel-2");
  failCopies(1);
  collector.CopyCrashReportsMatching({"vistel"}, out);
  ASSERT_EQ(tried.size(), 2U);
  EXPECT_EQ(log.lines,
            (std::vector<std::string>{"notice: Copying diagnostic logs from: file://" + in + "/Reports/",
                                      failure(0, std::errc::no_space_on_device),
                                      failure(1, std::errc::no_space_on_device)}));
}

TEST_F(DirectoryCopiesTest, MissingReportDirectoryIsNamedAndThenPassedOver) {
  collector.CopyCrashReportsMatching({"vistel"}, out);
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"notice: Copying diagnostic logs from: file://" + in + "/Reports/"});
}

}  // namespace
}  // namespace zal
