#include <chrono>
#include <cstring>
#include <sstream>

#include "tests/linux/tessel/tessel_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

constexpr const char* kJournalWriter = "/lib/systemd/systemd-journal-remote";

/// A journal of the test's own, written by the host's writer of journals.
class TesselJournalTest : public TesselFixture {
 protected:
  void SetUp() override {
    if (::access(kJournalWriter, X_OK) != 0) GTEST_SKIP() << kJournalWriter << " is not installed";
    std::filesystem::create_directory(directory / "journal");
    ASSERT_EQ(::mkfifo((directory / "entries").c_str(), 0600), 0);
    _entries = ::open((directory / "entries").c_str(), O_RDWR | O_CLOEXEC);
    writer = std::make_unique<ChildProgram>(
        ChildProgram::Options{.command = {kJournalWriter, "--split-mode=none",
                                          "--output=" + directory / "journal/test.journal", "-"},
                              .input = directory / "entries",
                              .errors = directory / "writer"});
  }
  ~TesselJournalTest() override {
    if (_entries >= 0) ::close(_entries);
  }
  void write(const std::string& bytes) const {
    ASSERT_EQ(::write(_entries, bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
  }
  /// The form in which journals are exchanged; a text with line breaks goes with its size.
  static std::string field(const std::string& name, const std::string& value) {
    const std::uint64_t size = value.size();
    char raw[8];
    std::memcpy(raw, &size, sizeof raw);
    return name + "\n" + std::string(raw, sizeof raw) + value + "\n";
  }
  void log(std::chrono::microseconds wall, const std::string& message, const std::string& more = {}) {
    write("__REALTIME_TIMESTAMP=" + std::to_string(wall.count()) + "\n__MONOTONIC_TIMESTAMP=" +
          std::to_string(++_monotonic) + "\n_BOOT_ID=0123456789abcdef0123456789abcdef\n_HOSTNAME=phone\n" +
          more + field("MESSAGE", message) + "\n");
  }
  void logNow(const std::string& message) { log(now(), message, "SYSLOG_IDENTIFIER=call\n_PID=7\n"); }
  static std::chrono::microseconds now() {
    return std::chrono::duration_cast<std::chrono::microseconds>(
        std::chrono::system_clock::now().time_since_epoch());
  }
  [[nodiscard]] static std::string bare(const std::string& lines) {
    std::string all;
    std::istringstream in(lines);
    for (std::string one; std::getline(in, one);) {
      const std::size_t host = one.find(" phone ");
      all += (host == std::string::npos ? one : one.substr(host + 1)) + "\n";
    }
    return all;
  }
  /// Printing with these arguments gives this, sooner or later: the writer works on its own.
  bool prints(const std::string& text, std::vector<std::string> arguments = {}) {
    arguments.insert(arguments.end(), {"--journal-directory", directory / "journal"});
    return eventually([&] { return run(arguments) == 0 && (out == text || bare(out) == text); });
  }

  std::unique_ptr<ChildProgram> writer;

 private:
  int _entries = -1;
  int _monotonic = 0;
};

TEST_F(TesselJournalTest, EntriesArePrintedWhateverTheyHoldAndForgeNothing) {
  log(1732206858123456us, "up", "SYSLOG_IDENTIFIER=call\n_PID=7\n_COMM=other\n");
  log(1732206859000000us, "one\nNov 21 16:34:18.123 phone sshd[1]: forged \x1b[2J",
      "_COMM=call\nSYSLOG_PID=8\n");
  log(1732206860999999us, "", field("SYSLOG_IDENTIFIER", "a\nb"));
  log(1732206861000000us, "nobody's");
  EXPECT_TRUE(
      prints("Nov 21 16:34:18.123 phone call[7]: up\n"
             "Nov 21 16:34:19.000 phone call[8]: one\n"
             "    | Nov 21 16:34:18.123 phone sshd[1]: forged \\x1b[2J\n"
             "Nov 21 16:34:20.999 phone a\\x0ab: \n"
             "Nov 21 16:34:21.000 phone unknown: nobody's\n"))
      << out << err << readFile(directory / "writer");
}

TEST_F(TesselJournalTest, LongMessageIsPrintedWhole) {
  const std::string text(200'000, 'x');
  log(1732206858123456us, text);
  EXPECT_TRUE(prints("Nov 21 16:34:18.123 phone unknown: " + text + "\n"));
}

TEST_F(TesselJournalTest, LookingBackKeepsWhatIsYoungEnough) {
  log(now() - 400s, "old");
  log(now() - 290s, "young");
  log(now(), "now");
  EXPECT_TRUE(prints("phone unknown: young\nphone unknown: now\n", {"-k", "Time", "ge", "-5m"}))
      << out << err;
  EXPECT_TRUE(
      prints("phone unknown: old\nphone unknown: young\nphone unknown: now\n", {"-k", "Time", "ge", "-1h"}));
}

TEST_F(TesselJournalTest, FollowingSeesWhatComesAndNothingFromBefore) {
  logNow("before");
  ASSERT_TRUE(prints("phone call[7]: before\n"));
  std::filesystem::remove(directory / "out");
  follow({"--journal-directory", directory / "journal"}, [&](const std::string& probe) { logNow(probe); });
  EXPECT_EQ(printed().find("before"), std::string::npos);
  logNow("one");
  EXPECT_TRUE(eventually([&] { return bare(news()) == "phone call[7]: one\n"; })) << news();
  EXPECT_TRUE(eventually([&] { return program->sleeps(); }));
  program->signal(SIGKILL);
  EXPECT_EQ(program->waitForExit(), -SIGKILL);
  EXPECT_EQ(bare(news()), "phone call[7]: one\n");
}

}  // namespace
}  // namespace zal::testing
