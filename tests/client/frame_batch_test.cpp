#include "platform/linux/client_channel/frame_batch.h"

#include <gtest/gtest.h>

#include "platform/linux/wire/frame.h"

namespace zal::testing {
namespace {

class FrameBatchTest : public ::testing::Test {
 protected:
  FrameBatchTest() {
    append("0123456789", true);  // 16 + 16 bytes
    append("", false);           // 16 bytes: a barrier
    append("01234567", true);    // 16 + 8 bytes
  }
  void append(std::string_view payload, bool isRequest) {
    std::string frame;
    appendFrame(frame, {0, kProtocolVersion, isRequest ? FrameKind::message : FrameKind::barrier, 0},
                payload);
    batch.append(frame, isRequest);
    all += frame;
  }
  FrameBatch batch;
  std::string all;
};

TEST_F(FrameBatchTest, CountsRequestsApartFromBarriers) {
  EXPECT_EQ(batch.count().frames, 3U);
  EXPECT_EQ(batch.count().requests, 2U);
}

TEST_F(FrameBatchTest, TornFrameIsTakenBackToItsBeginning) {
  const struct {
    std::size_t written, frames, requests, rest;
  } cases[] = {{0, 0, 0, 0},   {1, 0, 0, 0},   {31, 0, 0, 0},  {32, 1, 1, 32},
               {33, 1, 1, 32}, {47, 1, 1, 32}, {48, 2, 1, 48}, {71, 2, 1, 48}};
  for (const auto& c : cases) {
    FrameBatch torn = batch;
    torn.advance(c.written);
    const FrameBatch::Count gone = torn.forgetWritten();
    EXPECT_EQ(gone.frames, c.frames) << c.written;
    EXPECT_EQ(gone.requests, c.requests) << c.written;
    EXPECT_EQ(torn.unwritten(), std::string_view(all).substr(c.rest)) << c.written;
    EXPECT_EQ(torn.count().frames, 3 - c.frames) << c.written;
  }
}

}  // namespace
}  // namespace zal::testing
