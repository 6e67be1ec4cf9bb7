#include <fcntl.h>
#include <grp.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <functional>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/progress/progress_file.h"
#include "tests/e2e/dump_fixture.h"

namespace zal {
namespace {

namespace fs = std::filesystem;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::RawClient;
using testing::readFile;
using testing::writeFile;

constexpr uid_t kNobody = 65534;
constexpr const char* kSecret = "what only the superuser may read\n";

std::string reason(int result) { return result >= 0 ? "done" : std::strerror(errno); }

sockaddr_un addressOf(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.copy(address.sun_path, sizeof address.sun_path - 1);
  return address;
}

/// Somebody who may log in to the machine and nothing else, against an agent of the superuser. The way to the
/// agent's directories is closed as its unit closes it; the temporary directory is everybody's.
class HostileLocalUserE2eTest : public testing::DumpFixture {
 protected:
  void SetUp() override {
    if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become another user";
    for (const std::string& open : {sandbox / "", sandbox / "run", sandbox / "config"})
      ASSERT_EQ(::chmod(open.c_str(), 0755), 0);
    ASSERT_EQ(::chmod((sandbox / "tmp").c_str(), 01777), 0);
    ASSERT_EQ(::chmod(sandbox.stateRoot.c_str(), 0750), 0);
    writeFile(secret, kSecret);
    ASSERT_EQ(::chmod(secret.c_str(), 0600), 0);
  }

  /// What the attempt comes to when another user makes it, in a process of its own.
  static std::string asNobody(const std::function<std::string()>& attempt) {
    std::array<int, 2> pipe{};
    if (::pipe2(pipe.data(), O_CLOEXEC) != 0) return "no pipe";
    const pid_t child = ::fork();
    if (child == 0) {
      std::string outcome = "could not become nobody";
      if (::setgroups(0, nullptr) == 0 && ::setgid(kNobody) == 0 && ::setuid(kNobody) == 0)
        outcome = attempt();
      const auto written = ::write(pipe[1], outcome.data(), outcome.size());
      ::_exit(written < 0 ? 1 : 0);
    }
    ::close(pipe[1]);
    std::string outcome;
    std::array<char, 256> buffer{};
    for (ssize_t count = 0; (count = ::read(pipe[0], buffer.data(), buffer.size())) > 0;)
      outcome.append(buffer.data(), static_cast<std::size_t>(count));
    ::close(pipe[0]);
    int status = 0;
    ::waitpid(child, &status, 0);
    return WIFEXITED(status) ? outcome : "died";
  }
  void attempt(const std::string& name, const std::function<std::string()>& what) {
    note(name, asNobody(what));
  }
  void note(const std::string& name, const std::string& outcome) {
    std::string line = name;
    line.resize(std::max<std::size_t>(line.size() + 1, 56), ' ');
    table += line + outcome + "\n";
  }
  /// A link of another user's at a name in the temporary directory that everybody knows.
  void plantLink(const std::string& name, const std::string& target) {
    ASSERT_EQ(asNobody([&] { return reason(::symlink(target.c_str(), (sandbox / "tmp/" + name).c_str())); }),
              "done");
  }
  static std::string reading(const std::string& path) {
    const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    return reason(file);
  }
  static std::string writing(const std::string& path) {
    return reason(::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666));
  }
  std::string connecting() const {
    const sockaddr_un address = addressOf(sandbox.socketPath());
    const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    return reason(::connect(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address));
  }
  [[nodiscard]] std::string untouched() const {
    return readFile(secret) == kSecret ? "what it leads to is untouched" : "HARM";
  }

  const std::string secret = sandbox / "secret";
  std::string table;
};

TEST_F(HostileLocalUserE2eTest, GetsNowhereByTheDoorsAndTheDirectories) {
  start();
  RawClient neighbour(sandbox.socketPath());
  ASSERT_TRUE(neighbour.sendLog("Neighbour", "before"));
  ASSERT_TRUE(neighbour.barrier());
  neighbour.beginSession("Vistel");
  ASSERT_TRUE(neighbour.barrier());

  // A question to the person at the screen, and a collection: both leave their traces.
  lirra::Client asking = makeClient();
  ask(asking, "Messages", 0, 0);
  ask(asking, "Messages", 0);
  ASSERT_TRUE(testing::eventually([&] { return !alerts().empty() && !records().empty(); }));

  attempt("connects to the socket", [&] { return connecting(); });
  attempt("removes the socket", [&] { return reason(::unlink(sandbox.socketPath().c_str())); });
  attempt("puts another socket beside it", [&] { return writing(sandbox / "run/other"); });
  attempt("reads the logs", [&] { return reading(sandbox.logRoot() + "/Neighbour/Neighbour.log"); });
  attempt("lists the reports", [&] { return reading(sandbox.reportRoot()); });
  attempt("makes a session's directory before the agent does",
          [&] { return reason(::mkdir((sandbox.reportRoot() + "/Vistel").c_str(), 0777)); });
  attempt("changes the configuration", [&] { return writing(sandbox.configurationFile()); });
  attempt("changes a switch", [&] { return writing(sandbox / "config/com.vendel.logging.toml"); });
  attempt("posts a notification",
          [&] { return writing(sandbox / "runtime/notifications/kLirraSyncLoggingPrefs"); });
  attempt("answers an alert", [&] { return writing(alertDirectory(sandbox / "runtime") + "/1.answer"); });
  attempt("writes a progress record",
          [&] { return writing(progressDirectory(sandbox / "runtime") + "/x.progress"); });
  attempt("ends the agent", [&] { return reason(::kill(agent->processId(), SIGKILL)); });
  const std::string process = "/proc/" + std::to_string(agent->processId());
  attempt("reads the agent's environment", [&] { return reading(process + "/environ"); });
  attempt("reads the agent's memory", [&] { return reading(process + "/mem"); });

  // An administrator who was too generous: what is left is the agent's own decision.
  ASSERT_EQ(::chmod(sandbox.socketPath().c_str(), 0666), 0);
  attempt("sends a record through a socket open to all", [&]() -> std::string {
    RawClient client(sandbox.socketPath());
    client.sendLog("Intruder", "forged");
    return client.barrier() ? "ANSWERED" : "closed without an answer";
  });
  attempt("floods it with 2000 connections of garbage", [&]() -> std::string {
    for (int i = 0; i < 2000; ++i) {
      RawClient client(sandbox.socketPath());
      client.sendBytes(std::string(4096, '\xA5'));
    }
    return "all closed";
  });
  attempt("holds 200 connections and says nothing", [&]() -> std::string {
    std::vector<std::unique_ptr<RawClient>> held;
    for (int i = 0; i < 200; ++i) held.push_back(std::make_unique<RawClient>(sandbox.socketPath()));
    for (const auto& client : held) {
      if (!client->waitUntilClosed()) return "KEPT";
    }
    return "all closed";
  });
  ASSERT_TRUE(neighbour.sendLog("Neighbour", "after"));
  note("meanwhile a neighbour's records", neighbour.barrier() ? "are stored" : "ARE LOST");
  EXPECT_THAT(sandbox.wholeLogSet("Neighbour"), HasSubstr("after\n"));
  EXPECT_FALSE(fs::exists(sandbox.logRoot() + "/Intruder"));
  EXPECT_EQ(agent->terminate(), 0);

  std::printf("%s", table.c_str());
  EXPECT_EQ(table, R"(connects to the socket                                  Permission denied
removes the socket                                      Permission denied
puts another socket beside it                           Permission denied
reads the logs                                          Permission denied
lists the reports                                       Permission denied
makes a session's directory before the agent does       Permission denied
changes the configuration                               Permission denied
changes a switch                                        Permission denied
posts a notification                                    Permission denied
answers an alert                                        Permission denied
writes a progress record                                Permission denied
ends the agent                                          Operation not permitted
reads the agent's environment                           Permission denied
reads the agent's memory                                Permission denied
sends a record through a socket open to all             closed without an answer
floods it with 2000 connections of garbage              all closed
holds 200 connections and says nothing                  all closed
meanwhile a neighbour's records                         are stored
)");
}

TEST_F(HostileLocalUserE2eTest, GetsNowhereByLinksInTheDirectoryThatIsEverybodys) {
  start();
  for (const char* name : {"time-file.txt", "vistel_thermal_log.txt", "uart-1", "vistel-ping.log"})
    plantLink(name, secret);

  RawClient client(sandbox.socketPath());
  client.beginSession("Vistel");
  for (const char* text : {"one", "two", "three"}) client.sendCheckpoint("Vistel", text, 1714651388.0);
  client.endSession("Vistel");
  ASSERT_TRUE(testing::eventually([&] { return !sandbox.sessionFile("Vistel", "Quality Log").empty(); }));
  note("a link where the reference time is written", untouched());
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), Not(HasSubstr(kSecret)));
  EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(sandbox / "tmp/time-file.txt")));

  lirra::Client asking = makeClient();
  // The registration bit brings the serial port's logs along.
  const std::string archive = archiveOf(asking, ask(asking, "Nexa", 0x80));
  ASSERT_TRUE(fs::exists(archive)) << output();
  std::string contents;
  for (const std::string& entry : entriesOf(archive)) contents += entry + "\n" + textIn(archive, entry);
  note("links where the thermal and the serial log are taken from",
       contents.find(kSecret) == std::string::npos ? "not taken" : "TAKEN");
  note("and the agent's log",
       output().find("vistel_thermal_log.txt is not taken: a symbolic link that anybody "
                     "may have laid leads to " +
                     secret) != std::string::npos
           ? "says so"
           : "SAYS NOTHING");
  EXPECT_EQ(untouched(), "what it leads to is untouched");
  attempt("a second name for a file of the superuser's",
          [&] { return reason(::link(secret.c_str(), (sandbox / "tmp/uart-2").c_str())); });
  EXPECT_EQ(agent->terminate(), 0);

  std::printf("%s", table.c_str());
  const bool kernelHelps = readFile("/proc/sys/fs/protected_hardlinks") == "1\n";
  EXPECT_EQ(
      table,
      std::string(R"(a link where the reference time is written              what it leads to is untouched
links where the thermal and the serial log are taken from not taken
and the agent's log                                     says so
a second name for a file of the superuser's             )") +
          (kernelHelps ? "Operation not permitted\n" : "done\n"));
}

TEST_F(HostileLocalUserE2eTest, AStaleSocketLaidInTheAgentsWayIsReplacedAndALiveOneIsNamed) {
  // Worse than any installation: its directory is everybody's.
  ASSERT_EQ(::chmod((sandbox / "run").c_str(), 01777), 0);
  const auto bound = [&](int* listening) {
    const sockaddr_un address = addressOf(sandbox.socketPath());
    const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) return reason(-1);
    ::chmod(sandbox.socketPath().c_str(), 0777);
    if (listening != nullptr) *listening = socket;
    return reason(listening == nullptr ? ::close(socket) : ::listen(socket, 5));
  };
  ASSERT_EQ(asNobody([&] { return bound(nullptr); }), "done");
  start();
  EXPECT_EQ(asNobody([&] { return connecting(); }), "Permission denied");
  EXPECT_EQ(asNobody([&] { return reason(::unlink(sandbox.socketPath().c_str())); }),
            "Operation not permitted");
  EXPECT_EQ(agent->terminate(), 0);

  std::array<int, 2> toStay{};
  ASSERT_EQ(::pipe(toStay.data()), 0);
  const pid_t listener = ::fork();
  if (listener == 0) {
    ::close(toStay[1]);
    int socket = -1;
    if (::setgid(kNobody) != 0 || ::setuid(kNobody) != 0 || bound(&socket) != "done") ::_exit(1);
    char byte = 0;
    static_cast<void>(::read(toStay[0], &byte, 1));
    ::_exit(0);
  }
  ASSERT_TRUE(testing::eventually([&] { return RawClient::canConnect(sandbox.socketPath()); }));
  testing::AgentProcess second(sandbox, {.arguments = {}, .launcher = {}, .waitUntilListening = false});
  EXPECT_TRUE(second.waitForExit()) << "it serves nobody and ends";
  EXPECT_THAT(output(), HasSubstr("agent.socket is held by process " + std::to_string(listener)));
  ::close(toStay[0]);
  ::close(toStay[1]);
  int status = 0;
  ::waitpid(listener, &status, 0);
}

}  // namespace
}  // namespace zal
