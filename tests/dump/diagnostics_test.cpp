#include "dump/diagnostics.h"

#include <gtest/gtest.h>

#include "tests/dump/action_fixture.h"

namespace zal {
namespace {

class DiagnosticsTest : public testing::ActionFixture {};

TEST_F(DiagnosticsTest, LendsTheSharedCompressorAsLongAsItLives) {
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), nullptr);
  {
    Diagnostics diagnostics(platform, collectors, sessionServices);
    EXPECT_EQ(_LirraLogCompressor::sharedInstance(), &diagnostics.compressor);
  }
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), nullptr);
}

TEST_F(DiagnosticsTest, CarriesADumpFromTheRequestToTheReply) {
  Diagnostics diagnostics(platform, collectors, sessionServices);
  message.token = kToken;
  const ValueMap info{{"displayFlags", std::int64_t{4}}};
  diagnostics.dispatcher.performAction({.action = 14,
                                        .session = "Vistel",
                                        .sender = "caller",
                                        .peer = peer,
                                        .request = &message,
                                        .userInfo = &info},
                                       server);
  finish();
  ASSERT_EQ(fakePeer->replies.size(), 1U);
  EXPECT_EQ(fakePeer->replies[0].second,
            replyWithPath(root + "/Vistel/Vistel-Log (" + kTime + ") (Vistel).zip"));
}

}  // namespace
}  // namespace zal
