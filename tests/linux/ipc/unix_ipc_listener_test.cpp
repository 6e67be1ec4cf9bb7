#include "platform/linux/ipc/unix_ipc_listener.h"

#include <grp.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <ctime>

#include "tests/linux/ipc/ipc_fixture.h"

namespace zal {
namespace {

using Lines = std::vector<std::string>;
using namespace std::chrono_literals;

constexpr uid_t kNobody = 65534;
constexpr gid_t kNoGroup = 65534;  // the primary group of nobody
constexpr gid_t kStrayGroup = 54321;

bool exists(const std::string& path) { return ::access(path.c_str(), F_OK) == 0; }

mode_t modeOf(const std::string& path) {
  struct stat status {};
  return ::lstat(path.c_str(), &status) == 0 ? status.st_mode & 07777U : 0;
}

int boundSocket(const std::string& path) {
  const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.copy(address.sun_path, sizeof address.sun_path - 1);
  EXPECT_EQ(::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  return socket;
}

class UnixIpcListenerTest : public IpcFixture {
 protected:
  /// What a child of that identity gets when it sends one request: 0 a barrier's answer, 1 the end of
  /// the stream, 2 no connection, 3 anything else.
  int outcomeFor(uid_t user, gid_t group) {
    const pid_t child = ::fork();
    if (child == 0) {
      if (::setgroups(0, nullptr) != 0 || ::setgid(group) != 0 || ::setuid(user) != 0) ::_exit(3);
      TestClient client(path);
      if (!client.isConnected()) ::_exit(2);
      static_cast<void>(client.send(bareFrame(FrameKind::barrier, 1)));
      char byte = 0;
      ::_exit(::recv(client.socket(), &byte, 1, 0) == 1 ? 0 : 1);
    }
    int status = 0;
    EXPECT_TRUE(runUntil([&] { return ::waitpid(child, &status, WNOHANG) == child; }));
    lastChild = child;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 3;
  }

  /// The socket is within reach of everybody: what is left is the agent's own decision.
  void startWithinReachOfAll() {
    startService();
    ASSERT_EQ(::chmod(directory.path().c_str(), 0711), 0);
    ASSERT_EQ(::chmod(path.c_str(), 0666), 0);
  }

  pid_t lastChild = 0;
};

TEST_F(UnixIpcListenerTest, TheSocketHasMode0660WhateverTheMask) {
  for (const mode_t mask : {0000U, 0022U, 0777U}) {
    const mode_t before = ::umask(mask);
    startService();
    ::umask(before);
    EXPECT_EQ(modeOf(path), 0660U);
    listener.reset();
  }
}

TEST_F(UnixIpcListenerTest, TheSocketFileIsRemovedAtTheEnd) {
  startService();
  EXPECT_TRUE(exists(path));
  listener.reset();
  EXPECT_FALSE(exists(path));
}

TEST_F(UnixIpcListenerTest, ASocketFileThatIsNoLongerItsOwnStays) {
  startService();
  ASSERT_EQ(::rename(path.c_str(), (path + ".moved").c_str()), 0);
  const int other = boundSocket(path);
  listener.reset();
  EXPECT_TRUE(exists(path));
  ::close(other);
}

TEST_F(UnixIpcListenerTest, AStaleSocketFileIsReplaced) {
  ::close(boundSocket(path));
  ASSERT_TRUE(exists(path));
  startService();
  const TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1)));
  EXPECT_TRUE(runUntilEvents(1));
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(UnixIpcListenerTest, ASecondListenerNamesTheProcessAndBecomesInvalidFromTheLoop) {
  startService();
  UnixIpcService second(loop.context(), loop, log, {path, settings, {}});
  const auto loser = second.makeListener("com.vendel.lirra");
  int lost = 0;
  loser->resume([&] { ++lost; }, [](const auto&, const auto&) {});
  EXPECT_EQ(lost, 0);
  EXPECT_TRUE(runUntil([&] { return lost == 1; }));
  EXPECT_EQ(log.lines, Lines{"warning: Cannot serve com.vendel.lirra: " + path + " is held by process " +
                             std::to_string(::getpid())});
  EXPECT_EQ(invalidations, 0);
  const TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1)));
  EXPECT_TRUE(runUntil([&] { return !events.empty() && events.back() == "1:"; }));
}

TEST_F(UnixIpcListenerTest, ALiveSocketWithoutALockIsRespectedToo) {
  const int other = boundSocket(path);
  ASSERT_EQ(::listen(other, 5), 0);
  startService();
  EXPECT_TRUE(runUntil([this] { return invalidations == 1; }));
  EXPECT_EQ(log.lines, Lines{"warning: Cannot serve com.vendel.lirra: " + path + " is held by process " +
                             std::to_string(::getpid())});
  EXPECT_TRUE(exists(path));
  ::close(other);
}

TEST_F(UnixIpcListenerTest, AFileThatIsNoSocketIsNotTouched) {
  testing::writeFile(path, "precious");
  startService();
  EXPECT_TRUE(runUntil([this] { return invalidations == 1; }));
  EXPECT_EQ(log.lines,
            Lines{"warning: Cannot serve com.vendel.lirra: " + path + " is there and is no socket"});
  EXPECT_EQ(testing::readFile(path), "precious");
}

TEST_F(UnixIpcListenerTest, AMissingDirectoryMakesItInvalidWithAReason) {
  UnixIpcService lost(loop.context(), loop, log, {directory / "none/socket", settings, {}});
  const auto door = lost.makeListener("com.vendel.lirra");
  door->resume([this] { ++invalidations; }, [](const auto&, const auto&) {});
  EXPECT_TRUE(runUntil([this] { return invalidations == 1; }));
  EXPECT_EQ(log.lines, Lines{"warning: Cannot serve com.vendel.lirra: cannot open " +
                             (directory / "none/socket.lock") + ": No such file or directory"});
}

TEST_F(UnixIpcListenerTest, APathTooLongForASocketMakesItInvalidWithAReason) {
  const std::string longPath = directory / std::string(108 - directory.path().size() - 1, 'p');
  ASSERT_EQ(longPath.size(), 108U);
  UnixIpcService lost(loop.context(), loop, log, {longPath, settings, {}});
  const auto door = lost.makeListener("com.vendel.lirra");
  door->resume([this] { ++invalidations; }, [](const auto&, const auto&) {});
  EXPECT_TRUE(runUntil([this] { return invalidations == 1; }));
  EXPECT_EQ(
      log.lines,
      Lines{"warning: Cannot serve com.vendel.lirra: socket path of 108 bytes; 1 to 107 are possible: " +
            longPath});
}

TEST_F(UnixIpcListenerTest, AnInvalidListenerThatIsGoneBeforeTheLoopRunsCallsNobody) {
  testing::writeFile(path, "in the way");
  startService();
  listener.reset();
  runFor(10ms);
  EXPECT_EQ(invalidations, 0);
}

TEST_F(UnixIpcListenerTest, OfManyThatStartAtOnceExactlyOneWins) {
  ::close(boundSocket(path));  // stale, so that each wants to replace it
  int go[2];
  int hold[2];
  ASSERT_EQ(::pipe(go), 0);
  ASSERT_EQ(::pipe(hold), 0);
  std::vector<pid_t> children;
  for (int i = 0; i < 8; ++i) {
    const pid_t child = ::fork();
    if (child == 0) {
      ::close(go[1]);
      ::close(hold[1]);
      char byte = 0;
      static_cast<void>(::read(go[0], &byte, 1) == 0);
      std::string trouble;
      const auto mine = ListeningSocket::bindPath(path, std::nullopt, trouble);
      if (!mine) ::_exit(trouble.find("is held by") != std::string::npos ? 1 : 2);
      static_cast<void>(::read(hold[0], &byte, 1) == 0);  // the winner stays until all have tried
      ::_exit(0);
    }
    children.push_back(child);
  }
  ::close(go[1]);
  int losers = 0;
  while (losers < 7) {
    int status = 0;
    const pid_t child = ::waitpid(-1, &status, 0);
    ASSERT_GT(child, 0);
    ASSERT_EQ(WEXITSTATUS(status), 1);
    ++losers;
    children.erase(std::find(children.begin(), children.end(), child));
  }
  ASSERT_EQ(children.size(), 1U);
  int status = 0;
  EXPECT_EQ(::waitpid(children[0], &status, WNOHANG), 0);
  ::close(hold[1]);
  EXPECT_EQ(::waitpid(children[0], &status, 0), children[0]);
  EXPECT_EQ(WEXITSTATUS(status), 0);
  ::close(go[0]);
  ::close(hold[0]);
}

TEST_F(UnixIpcListenerTest, ADescriptorPassedByTheServiceManagerIsUsed) {
  // In a child: the protocol names descriptor 3, which the test's own process may be using.
  const int passed = boundSocket(path);
  ASSERT_EQ(::listen(passed, 5), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    if (passed != 3) ::dup2(passed, 3);
    ::setenv("LISTEN_PID", std::to_string(::getpid()).c_str(), 1);
    ::setenv("LISTEN_FDS", "1", 1);
    ::setenv("LISTEN_FDNAMES", "lirra", 1);
    {
      LinuxRunLoop own;
      UnixIpcService activated(own.context(), own, log, {"/nonexistent/never-used", settings, {}});
      const bool taken = ::getenv("LISTEN_PID") == nullptr && ::getenv("LISTEN_FDS") == nullptr &&
                         ::getenv("LISTEN_FDNAMES") == nullptr && (::fcntl(3, F_GETFD) & FD_CLOEXEC) != 0;
      bool heard = false;
      const auto door = activated.makeListener("com.vendel.lirra");
      door->resume([] { ::_exit(4); },
                   [&](const auto&, const IpcEvent& event) {
                     heard = described(event) == "1:activated";
                     own.stop();
                   });
      own.callAfter(10s, [] { ::_exit(5); });
      own.run();
      if (!taken || !heard) ::_exit(6);
    }
    ::_exit(::access(path.c_str(), F_OK) == 0 ? 0 : 7);  // the file is the service manager's
  }
  const TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1, "activated")));
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_EQ(WEXITSTATUS(status), 0);
  ::close(passed);
}

TEST_F(UnixIpcListenerTest, DescriptorsPassedToAnotherProcessAreNotTaken) {
  ::setenv("LISTEN_PID", std::to_string(::getpid() + 1).c_str(), 1);
  ::setenv("LISTEN_FDS", "1", 1);
  EXPECT_FALSE(takePassedListener().isOpen());
  EXPECT_EQ(::getenv("LISTEN_FDS"), nullptr);
}

TEST_F(UnixIpcListenerTest, APassedDescriptorThatDoesNotListenIsRefused) {
  std::string trouble;
  EXPECT_FALSE(ListeningSocket::adopt(Descriptor(::socket(AF_UNIX, SOCK_STREAM, 0)), trouble).has_value());
  EXPECT_EQ(trouble, "the descriptor passed by the service manager is no listening Unix stream socket");
}

TEST_F(UnixIpcListenerTest, OutOfDescriptorsItSaysSoOnceWithoutSpinningAndGoesOnLater) {
  startService();
  // The sanitizer looks at each kind of object once with a descriptor of its own: now, by a failure
  // that uses the same ones, not later.
  UnixIpcService lost(loop.context(), loop, log, {directory / "none/socket", settings, {}});
  const auto door = lost.makeListener("com.vendel.lirra");
  door->resume([] {}, [](const auto&, const auto&) {});
  runFor(1ms);
  log.lines.clear();
  const TestClient client(path);
  ASSERT_TRUE(client.send(requestFrame(1, "patient")));
  rlimit before{};
  ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &before), 0);
  const int lowestFree = ::dup(client.socket());
  ::close(lowestFree);
  rlimit none = before;
  none.rlim_cur = static_cast<rlim_t>(lowestFree);
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &none), 0);
  const std::clock_t start = std::clock();
  runFor(1500ms);
  const double processorSeconds = static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC;
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &before), 0);
  EXPECT_LT(processorSeconds, 0.75);
  EXPECT_EQ(log.lines, Lines{"warning: New connections have to wait: Too many open files"});
  EXPECT_EQ(events, Lines{});
  EXPECT_TRUE(runUntilEvents(1));
  EXPECT_EQ(events, Lines{"1:patient"});
}

TEST_F(UnixIpcListenerTest, AStrangerIsDisconnectedAtOnceWithOneWarning) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become another user";
  startWithinReachOfAll();
  EXPECT_EQ(outcomeFor(kNobody, kNoGroup), 1);
  EXPECT_EQ(log.lines, Lines{"warning: Process " + std::to_string(lastChild) +
                             " of user 65534 may not talk to the agent; it is disconnected"});
  EXPECT_EQ(events, Lines{});
}

TEST_F(UnixIpcListenerTest, AMemberOfTheConfiguredGroupIsLetIn) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become another user";
  settings.group = "nogroup";
  startWithinReachOfAll();
  EXPECT_EQ(outcomeFor(kNobody, kStrayGroup), 0);  // by the group table, not by the process's own group
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(UnixIpcListenerTest, TheModeOfTheSocketItselfAdmitsTheGroupAndNoOthers) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become another user";
  settings.group = "nogroup";
  startService();
  ASSERT_EQ(::chmod(directory.path().c_str(), 0711), 0);
  EXPECT_EQ(modeOf(path), 0660U);
  EXPECT_EQ(outcomeFor(kNobody, kNoGroup), 0);
  EXPECT_EQ(outcomeFor(kNobody, kStrayGroup), 2);
}

TEST_F(UnixIpcListenerTest, AnUnknownGroupIsSaidAndLetsNobodyElseIn) {
  settings.group = "no-such-group-here";
  startService();
  EXPECT_EQ(log.lines,
            Lines{"warning: There is no group no-such-group-here; only the superuser and the agent's own "
                  "user may talk to it"});
}

TEST_F(UnixIpcListenerTest, StoppingToListenTakesTheFileAwayAndKeepsThePeers) {
  startService();
  TestClient client(path);
  ASSERT_TRUE(client.send(bareFrame(FrameKind::barrier, 1)));
  ASSERT_TRUE(runUntil([&] { return service->peerCount() == 1; }));
  service->stopListening();
  EXPECT_FALSE(exists(path));
  EXPECT_FALSE(TestClient(path).isConnected());
  EXPECT_EQ(service->peerCount(), 1U);
  service->stopListening();  // once more is fine
  EXPECT_EQ(invalidations, 0);
}

}  // namespace
}  // namespace zal
