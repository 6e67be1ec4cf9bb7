#include <gtest/gtest.h>

#include "dump/log_compressor.h"
#include "tests/support/fake_platform.h"

namespace zal {
namespace {

/// A disk that does not do at once what it should.
class LogCompressorTroubleTest : public ::testing::Test {
 protected:
  testing::FakePlatform host;
  _LirraLogCompressor compressor{
      {.log = host.agentLog, .copier = host.fileCopier, .files = host.files, .queues = host.queues}};
};

TEST_F(LogCompressorTroubleTest, ArchiveThatIsRefusedItsPlaceForAMomentGetsIt) {
  testing::writeFile(host.home / "a/Log (x)/line.log", "a line\n");
  int refusals = 2;
  host.files.failWith = [&](const std::string&) {
    return refusals-- > 0 ? std::make_error_code(std::errc::io_error) : std::error_code{};
  };
  compressor.compressDirectory(host.home / "a/Log (x)", host.home / "a/Log (x).zip", {});
  host.queues.runAll();
  EXPECT_EQ(testing::listTree(host.home / "a"), "Log (x).zip\n");
  EXPECT_EQ(host.agentLog.lines, std::vector<std::string>{});
}

}  // namespace
}  // namespace zal
