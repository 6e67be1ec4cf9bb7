#include <string>
#include <thread>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using VistelSessionThreadsTest = SessionFixture;

TEST_F(VistelSessionThreadsTest, TextPropertiesAreWrittenAndReadWholeFromAnyThread) {
  const std::string a(100, 'a');
  const std::string b(100, 'b');
  session->setInitiator(a);
  std::thread writer([&] {
    for (int i = 0; i < 2000; ++i) session->setInitiator(i % 2 == 0 ? b : a);
  });
  for (int i = 0; i < 2000; ++i) {
    const auto seen = session->initiator();
    ASSERT_TRUE(seen == a || seen == b);
  }
  writer.join();
}

}  // namespace
}  // namespace zal::testing
