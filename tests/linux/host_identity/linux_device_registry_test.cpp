#include "platform/linux/host_identity/linux_device_registry.h"

#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using namespace std::string_literals;

class LinuxDeviceRegistryTest : public ::testing::Test {
 protected:
  TemporaryDirectory root;
  LinuxDeviceRegistry registry{root.path()};
};

TEST_F(LinuxDeviceRegistryTest, TheDeviceTreesModelComesFirstAsItsRawBytes) {
  writeFile(root / "proc/device-tree/model", "Board One\0"s);
  writeFile(root / "sys/firmware/devicetree/base/model", "Board Two\0"s);
  writeFile(root / "sys/class/dmi/id/product_name", "Desk Three\n");
  EXPECT_EQ(registry.modelBytes(), "Board One\0"s);
}

TEST_F(LinuxDeviceRegistryTest, TheFirmwareFolderStandsInForTheDeviceTree) {
  writeFile(root / "sys/firmware/devicetree/base/model", "Board Two\0"s);
  writeFile(root / "sys/class/dmi/id/product_name", "Desk Three\n");
  EXPECT_EQ(registry.modelBytes(), "Board Two\0"s);
}

TEST_F(LinuxDeviceRegistryTest, WithoutADeviceTreeTheProductNameAnswersWithoutItsNewline) {
  writeFile(root / "sys/class/dmi/id/product_name", "Desk Three (rev 2)\n");
  EXPECT_EQ(registry.modelBytes(), "Desk Three (rev 2)");
}

TEST_F(LinuxDeviceRegistryTest, WithoutEitherThereIsNoModelUntilThereIsOne) {
  EXPECT_EQ(registry.modelBytes(), std::nullopt);
  writeFile(root / "sys/class/dmi/id/product_name", "\n");
  EXPECT_EQ(registry.modelBytes(), std::nullopt);
  std::filesystem::create_directories(root / "proc/device-tree/model");  // no file
  EXPECT_EQ(registry.modelBytes(), std::nullopt);
  writeFile(root / "sys/class/dmi/id/product_name", "Late\n");
  EXPECT_EQ(registry.modelBytes(), "Late");
}

}  // namespace
}  // namespace zal::testing
