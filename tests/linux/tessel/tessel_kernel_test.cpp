#include <chrono>
#include <sstream>

#include "tests/linux/tessel/tessel_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class TesselKernelTest : public TesselFixture {
 protected:
  static std::string record(std::chrono::seconds age, const std::string& text) {
    const auto time = std::chrono::duration_cast<std::chrono::microseconds>(
        std::chrono::steady_clock::now().time_since_epoch() - age);
    return "6,339," + std::to_string(time.count()) + ",-;" + text + "\n SUBSYSTEM=usb\n";
  }
  /// Behind the host's name, which is not ours to know.
  [[nodiscard]] static std::string bare(const std::string& lines) {
    std::string all;
    std::istringstream in(lines);
    for (std::string one; std::getline(in, one);) {
      const std::size_t name = one.find(" kernel: ");
      all += name == std::string::npos ? "?" + one : one.substr(name + 1);
      all += '\n';
    }
    return all;
  }
};

TEST_F(TesselKernelTest, RecordsArePrintedWithoutTheirKeys) {
  writeFile(directory / "kmsg", record(3s, "usb 1-1: new device") + record(2s, "forged\\x0aline \x1b[2J"));
  EXPECT_EQ(run({"--kmsg", directory / "kmsg"}), 0);
  EXPECT_EQ(bare(out), "kernel: usb 1-1: new device\nkernel: forged\\x0aline \\x1b[2J\n");
}

TEST_F(TesselKernelTest, LookingBackGoesByTheMonotonicTimes) {
  writeFile(directory / "kmsg", record(400s, "old") + record(290s, "young") + record(0s, "now"));
  EXPECT_EQ(run({"-k", "Time", "ge", "-5m", "--kmsg", directory / "kmsg"}), 0);
  EXPECT_EQ(bare(out), "kernel: young\nkernel: now\n");
}

TEST_F(TesselKernelTest, FollowingSeesWhatComesUntilTheLogEnds) {
  ASSERT_EQ(::mkfifo((directory / "kmsg").c_str(), 0600), 0);
  const int pipe = ::open((directory / "kmsg").c_str(), O_RDWR | O_CLOEXEC);
  const auto write = [&](const std::string& text) {
    EXPECT_EQ(::write(pipe, text.data(), text.size()), static_cast<ssize_t>(text.size()));
  };
  follow({"--kmsg", directory / "kmsg"}, [&](const std::string& probe) { write(record(0s, probe)); });
  write(record(0s, "one"));
  EXPECT_TRUE(eventually([&] { return bare(news()) == "kernel: one\n"; })) << news();
  EXPECT_TRUE(eventually([&] { return program->sleeps(); }));
  ::close(pipe);
  EXPECT_EQ(program->waitForExit(), 1);
  EXPECT_EQ(readFile(directory / "err"), "tessel: " + directory / "kmsg" + ": it has ended\n");
}

TEST_F(TesselKernelTest, HostsOwnLogCanBeRead) {
  if (::access("/dev/kmsg", R_OK) != 0 || ::close(::open("/dev/kmsg", O_RDONLY)) != 0)
    GTEST_SKIP() << "/dev/kmsg cannot be opened";
  EXPECT_EQ(run({"--kmsg", "/dev/kmsg"}), 0) << err;
  EXPECT_EQ(bare(out).find('?'), std::string::npos) << "a line in another form";
}

}  // namespace
}  // namespace zal::testing
