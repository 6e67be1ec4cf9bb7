#include "platform/linux/wifidump/wireless_text.h"

#include <gtest/gtest.h>

namespace zal::wifidump {
namespace {

using Names = std::vector<std::string>;

TEST(WirelessTextTest, InterfacesAreReadFromTheList) {
  EXPECT_EQ(
      interfacesOf("phy#0\n\tUnnamed/non-netdev interface\n\t\twdev 0x2\n\tInterface wlan0\n\t\tifindex 3\n"
                   "phy#1\n\tInterface uplink 5\n"),
      (Names{"wlan0", "uplink 5"}));
  EXPECT_EQ(interfacesOf("\tInterface ../x\n\tInterface \n"), Names());
  EXPECT_EQ(interfacesOf("nl80211 not found.\n"), Names());
  EXPECT_EQ(interfacesOf(""), Names());
}

TEST(WirelessTextTest, LinesOfTheKernelThatHaveToDoWithWirelessAreTaken) {
  EXPECT_EQ(wirelessLines("[1] usb 1-1: new device\n[2] ath10k_pci: firmware crashed\n[3] WLAN0: link up\n"
                          "[4] uplink5: authenticated\n[5] ext4 mounted",
                          {"uplink5"}),
            "[2] ath10k_pci: firmware crashed\n[3] WLAN0: link up\n[4] uplink5: authenticated\n");
}

TEST(WirelessTextTest, OnlyTheLastLinesStay) {
  EXPECT_EQ(wirelessLines("wlan 1\nother\nwlan 2\nwlan 3\n", {}, 2), "wlan 2\nwlan 3\n");
}

}  // namespace
}  // namespace zal::wifidump
