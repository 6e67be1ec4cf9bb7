#include <sstream>

#include <gtest/gtest.h>

#include "platform/linux/wire/message_builder.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

/// The bytes of each ```hex block of the page; what follows a bar is remark.
std::vector<std::string> hexBlocks() {
  std::istringstream page(testing::readFile(ZAL_WIRE_PROTOCOL_PAGE));
  std::vector<std::string> blocks;
  bool inside = false;
  for (std::string line; std::getline(page, line);) {
    if (line == "```hex") {
      inside = true;
      blocks.emplace_back();
    } else if (line == "```") {
      inside = false;
    } else if (inside) {
      std::istringstream bytes(line.substr(0, line.find('|')));
      for (int byte = 0; bytes >> std::hex >> byte;) blocks.back().push_back(static_cast<char>(byte));
    }
  }
  return blocks;
}

TEST(WireProtocolPageTest, TheBarrierOfThePageIsTheRealOne) {
  std::string barrier;
  FrameHeader header;
  header.kind = FrameKind::barrier;
  header.cookie = 0x1122334455667788U;
  appendFrame(barrier, header, {});
  ASSERT_EQ(hexBlocks().size(), 2U);
  EXPECT_EQ(hexBlocks()[0], barrier);
}

TEST(WireProtocolPageTest, TheRequestOfThePageIsWhatTheEncoderMakes) {
  MessageBuilder builder;
  builder.setInt64("__ipc__event_code__", 6);
  builder.setString("description", "rtt");
  builder.setCodedNumber("number", 4.5);
  builder.setString("session", "Vistel");
  builder.setString("sender", "cli");
  std::string request;
  builder.finish(request, FrameKind::message, 0);
  ASSERT_EQ(hexBlocks().size(), 2U);
  EXPECT_EQ(hexBlocks()[1], request);
}

}  // namespace
}  // namespace zal
