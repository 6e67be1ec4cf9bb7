#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <csignal>
#include <cstring>
#include <memory>

#include <gtest/gtest.h>

#include "tests/linux/secretlist/fake_secret_service.h"
#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

constexpr const char* kDaemon = "/usr/bin/dbus-daemon";

/// The real program, in UTC.
class SecretlistTest : public ::testing::Test {
 protected:
  int run(const std::vector<std::string>& arguments) {
    std::filesystem::remove(directory / "out");
    std::filesystem::remove(directory / "err");
    std::vector<std::string> command = {ZAL_SECRETLIST_PATH};
    command.insert(command.end(), arguments.begin(), arguments.end());
    ChildProgram program({.command = command,
                          .output = directory / "out",
                          .errors = directory / "err",
                          .environment = {{"TZ", "UTC0"}, {"DBUS_SESSION_BUS_ADDRESS", address}}});
    const auto status = program.waitForExit();
    out = readFile(directory / "out");
    err = readFile(directory / "err");
    return status.value_or(-1000);
  }

  TemporaryDirectory directory;
  std::string address = "unix:path=" + directory / "bus";
  std::string out;
  std::string err;
};

TEST_F(SecretlistTest, WrongUsageEndsWithTwoAndAMessage) {
  for (const std::vector<std::string>& words : {std::vector<std::string>{}, {"certs"}, {"inet", "keys"}}) {
    EXPECT_EQ(run(words), 2);
    EXPECT_EQ(err, "secretlist: one word is needed, inet or keys; see secretlist --help\n");
  }
}

TEST_F(SecretlistTest, HelpIsPrinted) {
  EXPECT_EQ(run({"--help"}), 0);
  EXPECT_NE(out.find("secretlist inet|keys"), std::string::npos);
}

TEST_F(SecretlistTest, WithoutABusItSaysSoInOneLine) {
  EXPECT_EQ(run({"inet"}), 1);
  EXPECT_EQ(out, "");
  EXPECT_EQ(err, "secretlist: there is no session bus: No such file or directory\n");
}

TEST_F(SecretlistTest, WithoutAnAddressItNamesTheVariablesThatGiveOne) {
  const ChildProgram::Options options{.command = {"/usr/bin/env", "-u", "DBUS_SESSION_BUS_ADDRESS", "-u",
                                                  "XDG_RUNTIME_DIR", ZAL_SECRETLIST_PATH, "keys"},
                                      .errors = directory / "err"};
  EXPECT_EQ(ChildProgram(options).waitForExit(), 1);
  EXPECT_EQ(
      readFile(directory / "err"),
      "secretlist: there is no session bus: neither DBUS_SESSION_BUS_ADDRESS nor XDG_RUNTIME_DIR is set\n");
}

TEST_F(SecretlistTest, BusThatNeverAnswersIsGivenUp) {
  sockaddr_un name{};
  name.sun_family = AF_UNIX;
  const std::string path = directory / "bus";
  ASSERT_LT(path.size(), sizeof name.sun_path);
  std::memcpy(name.sun_path, path.c_str(), path.size() + 1);
  const int listener = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  ASSERT_EQ(::bind(listener, reinterpret_cast<sockaddr*>(&name), sizeof name), 0);
  ASSERT_EQ(::listen(listener, 4), 0);
  EXPECT_EQ(run({"inet"}), 1);
  EXPECT_EQ(err, "secretlist: gave up: the session does not answer in time\n");
  ::close(listener);
}

/// The same with a bus of the test's own, on which a secret service could be started.
class SecretlistOnABusTest : public SecretlistTest {
 protected:
  void SetUp() override {
    if (::access(kDaemon, X_OK) != 0) GTEST_SKIP() << kDaemon << " is not installed";
    writeFile(
        directory / "services/org.freedesktop.secrets.service",
        "[D-BUS Service]\nName=org.freedesktop.secrets\nExec=/usr/bin/touch " + directory / "started" + "\n");
    writeFile(
        directory / "bus.conf",
        "<busconfig><type>session</type><listen>" + address + "</listen><servicedir>" +
            directory / "services" +
            "</servicedir><policy context=\"default\"><allow send_destination=\"*\" eavesdrop=\"true\"/>"
            "<allow eavesdrop=\"true\"/><allow own=\"*\"/></policy></busconfig>");
    daemon = std::make_unique<ChildProgram>(
        ChildProgram::Options{.command = {kDaemon, "--nofork", "--nopidfile", "--print-address",
                                          "--config-file=" + directory / "bus.conf"},
                              .output = directory / "address",
                              .errors = directory / "daemon"});
    // It prints the address once it can be reached there.
    ASSERT_TRUE(eventually([&] { return readFile(directory / "address").ends_with('\n'); }))
        << readFile(directory / "daemon");
  }
  static FakeSecretService::Item item(const std::string& name, std::map<std::string, std::string> attributes,
                                      bool isLocked = false) {
    return {"/org/freedesktop/secrets/collection/login/" + name,
            {name, std::move(attributes), WallTime(std::chrono::seconds(1714651387)), isLocked}};
  }
  std::unique_ptr<ChildProgram> daemon;
};

TEST_F(SecretlistOnABusTest, ItemsOfServersAndOthersAreListedApartAndNobodyAsksForASecret) {
  const FakeSecretService service(address, {item("mail", {{"server", "mail.example"}, {"user", "alice"}}),
                                            item("wallet", {{"application", "x"}}, true)});
  EXPECT_EQ(run({"inet"}), 0) << err;
  EXPECT_EQ(out,
            "label: mail\n"
            "    created: 2024-05-02 12:03:07\n"
            "    locked: no\n"
            "    server: mail.example\n"
            "    user: alice\n");
  EXPECT_EQ(run({"keys"}), 0) << err;
  EXPECT_EQ(out,
            "label: wallet\n"
            "    created: 2024-05-02 12:03:07\n"
            "    locked: yes\n"
            "    other attributes: application\n");
  EXPECT_EQ(err, "");
  EXPECT_EQ(service.calls(),
            (std::vector<std::string>{"SearchItems", "GetAll", "GetAll", "SearchItems", "GetAll", "GetAll"}));
}

TEST_F(SecretlistOnABusTest, NothingIsPrintedForAnEmptyService) {
  const FakeSecretService service(address, {});
  EXPECT_EQ(run({"keys"}), 0) << err;
  EXPECT_EQ(out + err, "");
}

TEST_F(SecretlistOnABusTest, NoServiceIsStarted) {
  EXPECT_EQ(run({"inet"}), 1);
  EXPECT_EQ(err, "secretlist: no secret service runs in this session\n");
  EXPECT_FALSE(std::filesystem::exists(directory / "started"));
}

TEST_F(SecretlistOnABusTest, ServiceThatFallsSilentIsGivenUp) {
  FakeSecretService service(address, {});
  service.fallSilent();
  EXPECT_EQ(run({"inet"}), 1);
  EXPECT_EQ(out, "");
  EXPECT_TRUE(err.starts_with("secretlist: the secret service does not answer: ")) << err;
}

}  // namespace
}  // namespace zal::testing
