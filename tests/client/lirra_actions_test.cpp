#include "tests/client/client_fixture.h"

namespace zal::testing {
namespace {

class LirraActionsTest : public ClientFixture {
 protected:
  static ValueMap dumpReply() {
    return {{"action", std::int64_t{14}},
            {"replyResult",
             ValueMap{{"logPath", std::string("/tmp/dump.zip")}, {"replyAction", std::int64_t{14}}}}};
  }
  void replyWith(const ValueMap& reply) { agent->behave({Behaviour{.reply = reply}}); }
  std::uint64_t ask(lirra::Client& client) {
    std::uint64_t ticket = 0;
    EXPECT_EQ(client.ask("Vistel", 14, lirra::Dictionary(), ticket), LIRRA_OK);
    return ticket;
  }
};

TEST_F(LirraActionsTest, ReplyIsReadThroughTheDictionary) {
  startAgent();
  replyWith(dumpReply());
  for (const bool synchronous : {false, true}) {
    lirra::Client client = open(0, synchronous);
    lirra::Dictionary reply;
    ASSERT_EQ(client.awaitReply(ask(client), kPatienceMs, reply), LIRRA_OK);

    std::int64_t action = 0;
    EXPECT_EQ(lirra_dictionary_int64(reply.raw(), "action", &action), LIRRA_OK);
    EXPECT_EQ(action, 14);
    const lirra_dictionary* result = nullptr;
    ASSERT_EQ(lirra_dictionary_dictionary(reply.raw(), "replyResult", &result), LIRRA_OK);
    const char* path = nullptr;
    ASSERT_EQ(lirra_dictionary_string(result, "logPath", &path), LIRRA_OK);
    EXPECT_STREQ(path, "/tmp/dump.zip");
    EXPECT_EQ(lirra_dictionary_count(reply.raw()), 2U);
    EXPECT_STREQ(lirra_dictionary_key(reply.raw(), 0), "action");
    EXPECT_STREQ(lirra_dictionary_key(reply.raw(), 1), "replyResult");
    EXPECT_EQ(lirra_dictionary_key(reply.raw(), 2), nullptr);
  }
}

TEST_F(LirraActionsTest, EachReplyGoesToItsOwnQuestion) {
  startAgent();
  replyWith(dumpReply());
  lirra::Client client = open();
  const std::uint64_t first = ask(client);
  const std::uint64_t second = ask(client);
  EXPECT_NE(first, second);
  lirra::Dictionary reply;
  EXPECT_EQ(client.awaitReply(second, kPatienceMs, reply), LIRRA_OK);
  EXPECT_EQ(client.awaitReply(first, kPatienceMs, reply), LIRRA_OK);
  EXPECT_EQ(client.awaitReply(first, kPatienceMs, reply), LIRRA_LOST) << "a reply is taken once";
}

TEST_F(LirraActionsTest, ReplyThatIsLateCanBeAwaitedAgain) {
  startAgent();
  agent->behave({Behaviour{.reads = false, .reply = dumpReply()}});
  lirra::Client client = open();
  const std::uint64_t ticket = ask(client);
  lirra::Dictionary reply;
  EXPECT_EQ(client.awaitReply(ticket, 20, reply), LIRRA_TIMEOUT);
  agent->startReading();
  EXPECT_EQ(client.awaitReply(ticket, kPatienceMs, reply), LIRRA_OK);
}

TEST_F(LirraActionsTest, ReplyIsLostWithItsConnection) {
  startAgent();
  lirra::Client client = open();
  const std::uint64_t ticket = ask(client);
  ASSERT_TRUE(agent->waitForRequests(1));
  agent->closeConnections();
  lirra::Dictionary reply;
  EXPECT_EQ(client.awaitReply(ticket, kPatienceMs, reply), LIRRA_LOST);
}

TEST_F(LirraActionsTest, SixtyFiveOpenQuestionsAreOneTooMany) {
  lirra::Client client = open();
  for (int i = 0; i < 64; ++i) EXPECT_NE(ask(client), 0U);
  std::uint64_t ticket = 1;
  EXPECT_EQ(client.ask("Vistel", 14, lirra::Dictionary(), ticket), LIRRA_DROPPED);
  EXPECT_EQ(ticket, 0U);
}

TEST_F(LirraActionsTest, DictionaryIsReadByExactTypeOnly) {
  lirra::Dictionary dictionary;
  dictionary.setInt64("int", -5)
      .setUInt64("uint", 5)
      .setDouble("double", 0.5)
      .setBool("bool", true)
      .set("text", "a");
  std::int64_t int64 = 0;
  std::uint64_t uint64 = 0;
  double real = 0;
  int boolean = 0;
  EXPECT_EQ(lirra_dictionary_int64(dictionary.raw(), "int", &int64), LIRRA_OK);
  EXPECT_EQ(int64, -5);
  EXPECT_EQ(lirra_dictionary_uint64(dictionary.raw(), "uint", &uint64), LIRRA_OK);
  EXPECT_EQ(uint64, 5U);
  EXPECT_EQ(lirra_dictionary_double(dictionary.raw(), "double", &real), LIRRA_OK);
  EXPECT_EQ(real, 0.5);
  EXPECT_EQ(lirra_dictionary_bool(dictionary.raw(), "bool", &boolean), LIRRA_OK);
  EXPECT_EQ(boolean, 1);
  EXPECT_EQ(lirra_dictionary_int64(dictionary.raw(), "uint", &int64), LIRRA_ABSENT);
  EXPECT_EQ(lirra_dictionary_int64(dictionary.raw(), "missing", &int64), LIRRA_ABSENT);
  EXPECT_EQ(int64, -5) << "left alone";
}

}  // namespace
}  // namespace zal::testing
