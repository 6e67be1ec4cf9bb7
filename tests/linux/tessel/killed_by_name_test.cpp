#include "tests/linux/tessel/tessel_fixture.h"

namespace zal::testing {
namespace {

class KilledByNameTest : public TesselFixture {};

/// Alone with their own process ids, so that nobody else's programs are in reach.
TEST_F(KilledByNameTest, KillingTesselByNameSparesThePersonsOwnReader) {
  std::vector<std::string> command = {"/usr/bin/unshare", "--user",      "--map-root-user", "--pid",
                                      "--fork",           "--mount-proc"};
  std::vector<std::string> trial = command;
  trial.emplace_back("/bin/true");
  if (ChildProgram({.command = trial, .errors = directory / "trial"}).waitForExit() != 0)
    GTEST_SKIP() << "no process ids of one's own: " << readFile(directory / "trial");
  if (::access("/usr/bin/killall", X_OK) != 0) GTEST_SKIP() << "killall is not installed";

  // The person's reader is whatever bears its name.
  std::filesystem::copy_file("/bin/sleep", directory / "journalctl");
  writeFile(directory / "syslog", "");
  const std::string script = R"(
    cd "$1" || exit 9
    ./journalctl 1000 & reader=$!
    "$2" -w --syslog syslog >live & tessel=$!
    tries=0
    until grep -q probe live; do
      echo "Nov 21 17:34:18 phone call: probe" >>syslog
      tries=$((tries + 1)); [ $tries -lt 1000 ] || exit 8
      sleep 0.01
    done
    cat /proc/$tessel/comm
    /usr/bin/killall -9 tessel || exit 7
    wait $tessel; echo "tessel $?"
    kill -0 $reader && echo "the reader lives"
  )";
  command.insert(command.end(), {"/bin/sh", "-c", script, "sh", directory.path(), ZAL_TESSEL_PATH});
  ChildProgram child({.command = command, .output = directory / "out", .errors = directory / "err"});
  EXPECT_EQ(child.waitForExit(), 0) << readFile(directory / "err");
  EXPECT_EQ(printed(), "tessel\ntessel 137\nthe reader lives\n");
}

}  // namespace
}  // namespace zal::testing
