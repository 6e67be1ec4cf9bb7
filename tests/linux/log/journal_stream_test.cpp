#include "platform/linux/log/journal_stream.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <gtest/gtest.h>

#include "platform/linux/files/descriptor.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

TEST(JournalStreamTest, OnlyTheStreamThatTheVariableNamesIsTheJournals) {
  const testing::TemporaryDirectory directory;
  const Descriptor one(::open((directory / "one").c_str(), O_CREAT | O_WRONLY, 0600));
  const Descriptor other(::open((directory / "other").c_str(), O_CREAT | O_WRONLY, 0600));
  struct stat status {};
  ASSERT_EQ(::fstat(one.get(), &status), 0);
  const std::string name = std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
  EXPECT_TRUE(isJournalStream(name, one.get()));
  EXPECT_FALSE(isJournalStream(name, other.get()));
  EXPECT_FALSE(isJournalStream(name, -1));
  EXPECT_FALSE(isJournalStream("", one.get()));
  EXPECT_FALSE(isJournalStream(name + "1", one.get()));
}

}  // namespace
}  // namespace zal
