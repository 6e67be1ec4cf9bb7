#include "platform/linux/host/linux_platform.h"

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <cstdlib>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/progress/progress_file.h"
#include "tests/linux/log/listening_journal.h"
#include "tests/support/child_program.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using testing::readFile;
using testing::TemporaryDirectory;
using testing::writeFile;

class LinuxPlatformTest : public ::testing::Test {
 protected:
  HostEnvironment environment() const {
    HostEnvironment result;
    result.userId = 1234;
    result.homeDirectory = home.path();
    result.variables = {{"LIRRA_CONFIG", home / "config/lirra.toml"},
                        {"LIRRA_SOCKET", home / "agent.socket"},
                        {"XDG_RUNTIME_DIR", home / "run"},
                        {"DBUS_SYSTEM_BUS_ADDRESS", "unix:path=" + (home / "no-bus")},
                        {"DBUS_SESSION_BUS_ADDRESS", "unix:path=" + (home / "no-bus")}};
    return result;
  }
  LinuxPlatformTest() { configure(""); }
  /// The machine's own journal is left alone.
  void configure(const std::string& text) const {
    writeFile(home / "config/lirra.toml", text + "[log]\njournalSocket = '" + (home / "journal") + "'\n");
  }

  TemporaryDirectory home;
};

TEST_F(LinuxPlatformTest, HandsOutServicesOfTheConfigurationThatTheEnvironmentLeadsTo) {
  configure("[roots]\nUserLogRoot = '" + (home / "logs") + "'\n");
  writeFile(home / "config/com.vendel.logging.toml", "CallLogging = true\n");
  LinuxPlatform platform(environment());
  Platform& services = platform.services();
  EXPECT_EQ(services.configuration.roots.UserLogRoot, home / "logs");
  EXPECT_EQ(services.files.homeDirectory(), home.path());
  EXPECT_EQ(services.preferences.boolean("com.vendel.logging", "CallLogging"), true);
  services.logFacility.record({.type = "Set", .category = "Set", .line = "a line"});
  services.logFacility.flush();
  EXPECT_THAT(readFile(home / "logs/Set/Set.log"), ::testing::EndsWith("a line\n"));
}

TEST_F(LinuxPlatformTest, ListensAtTheSocketOfTheEnvironment) {
  LinuxPlatform platform(environment());
  auto listener = platform.services().ipc.makeListener("com.vendel.lirra");
  listener->resume([] {}, [](const std::shared_ptr<PeerConnection>&, const IpcEvent&) {});
  EXPECT_TRUE(std::filesystem::is_socket(home / "agent.socket"));
}

TEST_F(LinuxPlatformTest, WarningsOfTheConfigurationReachTheAgentsOwnLogSet) {
  configure("[roots]\nUserLogRoot = '" + (home / "logs") + "'\nNoSuchRoot = 'x'\n");
  LinuxPlatform platform(environment());
  platform.services().logFacility.flush();
  EXPECT_THAT(readFile(home / "logs/ZalLogging/ZalLogging.log"),
              ::testing::HasSubstr("lirra.toml:3: unknown key roots.NoSuchRoot"));
}

TEST_F(LinuxPlatformTest, RecordsAreCopiedToTheJournalUnlessThatIsSwitchedOff) {
  for (const bool isOn : {true, false}) {
    testing::ListeningJournal journal(home / "journal");
    writeFile(home / "config/lirra.toml", "[roots]\nUserLogRoot = '" + (home / "logs") +
                                              "'\n[log]\njournal = " + (isOn ? "true" : "false") +
                                              "\njournalSocket = '" + (home / "journal") + "'\n");
    LinuxPlatform platform(environment());
    platform.services().logFacility.record({.type = "Set", .category = "Set", .line = "a line"});
    platform.services().agentLog.notice("own line");
    platform.services().logFacility.flush();
    EXPECT_EQ(journal.messages(),
              isOn ? (std::vector<std::string>{"a line", "own line"}) : std::vector<std::string>());
  }
}

TEST_F(LinuxPlatformTest, OwnLinesAreInTheJournalOnceWhenStandardErrorGoesThere) {
  configure("[roots]\nUserLogRoot = '" + (home / "logs") + "'\n");
  testing::ListeningJournal journal(home / "journal");
  ::testing::internal::CaptureStderr();
  struct stat status {};
  ASSERT_EQ(::fstat(STDERR_FILENO, &status), 0);
  HostEnvironment service = environment();
  service.variables["JOURNAL_STREAM"] = std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
  LinuxPlatform platform(service);
  platform.services().agentLog.warning("own line");
  platform.services().logFacility.record({.type = "Set", .category = "Set", .line = "a line"});
  platform.services().logFacility.flush();
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "<4>own line\n");
  EXPECT_THAT(journal.messages(), ::testing::ElementsAre("a line"));
  EXPECT_THAT(readFile(home / "logs/ZalLogging/ZalLogging.log"), ::testing::EndsWith("warning: own line\n"));
}

TEST_F(LinuxPlatformTest, AlertsAndProgressAreRecordsInTheRuntimeDirectory) {
  configure("[roots]\nRuntimeRoot = '" + (home / "runtime") + "'\n");
  LinuxPlatform platform(environment());
  EXPECT_FALSE(std::filesystem::exists(home / "runtime/alerts"));
  EXPECT_FALSE(std::filesystem::exists(home / "runtime/dumps"));
  Platform& services = platform.services();
  UserAlert alert;
  alert.title = "Title";
  services.userAlerts.post(alert, nullptr);
  services.mainLoop.post([&] { services.mainLoop.stop(); });
  services.mainLoop.run();
  const auto progress = services.dumpProgress.begin({"Vistel", "/d", {"one"}});
  EXPECT_EQ(listAlerts(home / "runtime/alerts").at(0).alert.title, "Title");
  EXPECT_EQ(listDumpProgress(home / "runtime/dumps").at(0).record.service, "Vistel");
}

TEST_F(LinuxPlatformTest, AStartRemovesWhatWasNeverFinishedInTheRuntimeDirectory) {
  configure("[roots]\nRuntimeRoot = '" + (home / "runtime") + "'\n");
  for (const std::string name : {"notifications/.post-1", "alerts/.new-1", "clients/.new-1"}) {
    const std::string path = home / ("runtime/" + name);
    writeFile(path, "half");
    testing::setTime(path, 1'500'000'000, 0);
  }
  writeFile(home / "runtime/notifications/posted", "");
  const LinuxPlatform platform(environment());
  EXPECT_EQ(testing::listTree(home / "runtime"), "alerts/\nclients/\nnotifications/\nnotifications/posted\n");
}

TEST_F(LinuxPlatformTest, TheEndOfTheProcessIsInTheRecordsOfWaitingAlerts) {
  const pid_t agent = ::fork();
  if (agent == 0) {
    LinuxPlatform platform(environment());
    Platform& services = platform.services();
    services.userAlerts.post(UserAlert(), nullptr);
    services.mainLoop.post([&] { services.processExit.exit(0); });
    services.mainLoop.run();
    ::_exit(1);
  }
  int status = 1;
  ::waitpid(agent, &status, 0);
  EXPECT_EQ(status, 0);
  EXPECT_THAT(readFile(home / "run/lirra/alerts/1.toml"), ::testing::HasSubstr("state = \"cut off\"\n"));
}

/// With a display, and a program for dialogs that waits until it is ended.
class LinuxPlatformDialogTest : public LinuxPlatformTest {
 protected:
  LinuxPlatformDialogTest() {
    const std::string program = home / "bin/zenity";
    writeFile(program, "#!/bin/sh\necho $$ > '" + dialog + "'\nexec sleep 1000\n");
    ::chmod(program.c_str(), 0755);
    ::setenv("PATH", ((home / "bin:") + path).c_str(), 1);
  }
  ~LinuxPlatformDialogTest() override { ::setenv("PATH", path.c_str(), 1); }
  /// Posts a question, and has the agent end when the condition holds.
  void runAgent(const std::function<bool()>& isDone) const {
    const pid_t agent = ::fork();
    if (agent == 0) {
      HostEnvironment withDisplay = environment();
      withDisplay.variables["DISPLAY"] = ":7";
      LinuxPlatform platform(withDisplay);
      Platform& services = platform.services();
      UserAlert question;
      question.textField = UserAlert::TextField{};
      services.userAlerts.post(question, nullptr);
      services.mainLoop.callEvery(std::chrono::milliseconds(1), [&] {
        if (isDone()) services.processExit.exit(0);
      });
      services.mainLoop.run();
      ::_exit(1);
    }
    ::waitpid(agent, nullptr, 0);
  }

  const std::string path = ::getenv("PATH");
  const std::string dialog = home / "dialog";
};

TEST_F(LinuxPlatformDialogTest, ADialogGoesWithTheAgent) {
  runAgent([this] { return readFile(dialog).ends_with('\n'); });
  const pid_t process = std::stoi(readFile(dialog));
  // The one who inherits it buries it, sooner or later.
  EXPECT_TRUE(testing::eventually([&] {
    const std::string status = readFile("/proc/" + std::to_string(process) + "/status");
    return status.empty() || status.find("State:\tZ") != std::string::npos;
  }));
}

TEST_F(LinuxPlatformDialogTest, WithoutAScreenByConfigurationNoDialogIsOpened) {
  configure("[alerts]\nscreen = false\n");
  int turns = 0;
  runAgent([&] { return ++turns > 20; });
  EXPECT_EQ(readFile(dialog), "");
  EXPECT_TRUE(std::filesystem::exists(home / "run/lirra/alerts/1.toml"));
}

TEST_F(LinuxPlatformTest, ABrokenPipeEndsNothing) {
  std::signal(SIGPIPE, SIG_DFL);
  const LinuxPlatform platform(environment());
  EXPECT_EQ(std::signal(SIGPIPE, SIG_IGN), SIG_IGN);
}

}  // namespace
}  // namespace zal
