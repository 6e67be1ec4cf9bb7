#include "session/build_information_cache.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

class BuildInformationCacheTest : public ::testing::Test {
 protected:
  testing::FakeSystemVersion version;
  std::optional<std::string> model = "Phone1,1";
  int modelReads = 0;
  BuildInformationCache cache;

  void provide(const std::string& build, const std::string& osVersion, const std::string& name) {
    version.values = {{{"ProductBuildVersion", build}, {"ProductVersion", osVersion}, {"ProductName", name}}};
  }
  void refill() {
    cache.refill(version, [this] {
      ++modelReads;
      return model;
    });
  }
};

TEST_F(BuildInformationCacheTest, FillsAllFourOnce) {
  provide("1A1", "1.0", "First");
  refill();
  provide("2B2", "2.0", "Second");
  refill();
  EXPECT_EQ(cache.buildVersion(), "1A1");
  EXPECT_EQ(cache.osVersion(), "1.0");
  EXPECT_EQ(cache.osName(), "First");
  EXPECT_EQ(cache.deviceModel(), "Phone1,1");
  EXPECT_EQ(version.reads, 1);
  EXPECT_EQ(modelReads, 1);
}

TEST_F(BuildInformationCacheTest, NeverFillsAModelThatWasMissingAtTheFirstFill) {
  provide("1A1", "1.0", "First");
  model.reset();
  refill();
  model = "Phone1,1";
  refill();
  EXPECT_EQ(cache.deviceModel(), std::nullopt);
  EXPECT_EQ(modelReads, 1);
}

TEST_F(BuildInformationCacheTest, ReadsAgainWhileNameOrVersionIsMissing) {
  refill();
  EXPECT_EQ(cache.osName(), std::nullopt);
  EXPECT_EQ(cache.deviceModel(), "Phone1,1");
  version.values = {{{"ProductName", "Name"}, {"ProductBuildVersion", "1A1"}}};
  refill();
  provide("other", "1.0", "Other");
  model = "Other";
  refill();
  refill();
  EXPECT_EQ(cache.buildVersion(), "1A1");
  EXPECT_EQ(cache.osName(), "Name");
  EXPECT_EQ(cache.osVersion(), "1.0");
  EXPECT_EQ(cache.deviceModel(), "Phone1,1");
  EXPECT_EQ(version.reads, 3);
}

}  // namespace
}  // namespace zal
