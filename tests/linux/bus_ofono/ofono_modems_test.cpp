#include "platform/linux/bus/telephony/ofono_modems.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

OfonoModems::value_type modem(const std::string& path, OfonoProperties properties) {
  return {sdbus::ObjectPath(path), std::move(properties)};
}
OfonoModems::value_type modem(const std::string& path, bool powered, bool online) {
  return modem(path, {{"Powered", sdbus::Variant(powered)}, {"Online", sdbus::Variant(online)}});
}
std::string chosenOf(const OfonoModems& modems) {
  const auto* const used = modemInUse(modems);
  return used != nullptr ? std::string(used->get<0>()) : "none";
}

TEST(OfonoModemsTest, OfNoneNoneIsInUse) { EXPECT_EQ(chosenOf({}), "none"); }

TEST(OfonoModemsTest, TheFirstThatIsPoweredAndOnlineIsInUse) {
  EXPECT_EQ(chosenOf({modem("/a", false, false), modem("/b", true, false), modem("/c", true, true),
                      modem("/d", true, true)}),
            "/c");
}

TEST(OfonoModemsTest, WithoutAnyOnlineItIsTheFirst) {
  EXPECT_EQ(chosenOf({modem("/a", false, false), modem("/b", true, false)}), "/a");
}

TEST(OfonoModemsTest, WhatIsNotSaidOrOfAnotherTypeIsNotOn) {
  EXPECT_EQ(chosenOf({modem("/a", {}),
                      modem("/b", {{"Powered", sdbus::Variant(std::string("yes"))},
                                   {"Online", sdbus::Variant(true)}}),
                      modem("/c", true, true)}),
            "/c");
}

}  // namespace
}  // namespace zal::testing
