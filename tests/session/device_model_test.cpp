#include "session/device_model.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

using namespace std::string_literals;

TEST(DeviceModelTest, EndsAtTheNul) {
  testing::FakeDeviceRegistry registry;
  registry.bytes = "Model7,1\0rest"s;
  EXPECT_EQ(deviceModel(registry), "Model7,1");
}

TEST(DeviceModelTest, IsNothingWithoutADeviceOrText) {
  testing::FakeDeviceRegistry registry;
  EXPECT_EQ(deviceModel(registry), std::nullopt);
  registry.bytes = "\xFF\xFE";
  EXPECT_EQ(deviceModel(registry), std::nullopt);
}

}  // namespace
}  // namespace zal
