#include "platform/linux/process/child_environment.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "platform/linux/process/posix_shell.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Lines = std::vector<std::string>;

TEST(ChildEnvironmentTest, KeepsWhatProgramsNeedAndNothingElse) {
  std::vector<std::string> given = {
      "PATH=/bin",       "LD_PRELOAD=/tmp/x.so", "HOME=/root",
      "BASH_ENV=/tmp/x", "ENV=/tmp/x",           "LC_ALL=C",
      "LC_TIME=de_DE",   "LISTEN_FDS=1",         "TZ=CEST-2",
      "AWS_SECRET=1",    "DISPLAY=:0",           "DBUS_SESSION_BUS_ADDRESS=unix:path=/x",
      "IFS= ",           "NOTIFY_SOCKET=/x",     "XDG_RUNTIME_DIR=/run",
      "PATHS=/tmp",      "no equals sign",       "BASH_FUNC_ls%%=() {}",
      "PYTHONPATH=/tmp", "LIRRA_CONFIG=/x"};
  std::vector<char*> pointers;
  for (std::string& one : given) pointers.push_back(one.data());
  pointers.push_back(nullptr);
  const ChildEnvironment environment(pointers.data());
  EXPECT_EQ(environment.variables(),
            (Lines{"PATH=/bin", "HOME=/root", "LC_ALL=C", "LC_TIME=de_DE", "TZ=CEST-2", "DISPLAY=:0",
                   "DBUS_SESSION_BUS_ADDRESS=unix:path=/x", "XDG_RUNTIME_DIR=/run"}));
  EXPECT_STREQ(environment.pointers()[0], "PATH=/bin");
  EXPECT_EQ(environment.pointers()[8], nullptr);
}

TEST(ChildEnvironmentTest, AShellGetsNoOtherVariable) {
  const TemporaryDirectory directory;
  ::setenv("ZAL_TEST_TOKEN", "secret", 1);
  ::setenv("LC_ZAL_TEST", "kept", 1);
  RecordingAgentLog log;
  PosixShell(log).PerformSystem("/usr/bin/env > '" + directory / "env'");
  ::unsetenv("ZAL_TEST_TOKEN");
  ::unsetenv("LC_ZAL_TEST");
  const std::string seen = readFile(directory / "env");
  EXPECT_EQ(seen.find("ZAL_TEST_TOKEN"), std::string::npos) << seen;
  EXPECT_NE(seen.find("LC_ZAL_TEST=kept\n"), std::string::npos) << seen;
}

}  // namespace
}  // namespace zal::testing
