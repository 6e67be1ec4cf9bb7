#include "platform/kept_item.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

/// "session archive", "dump", "stub"; "" for another's name.
std::string kindOf(std::string_view name) {
  const auto kept = keptNameOf(name);
  return kept ? std::string(keptKindText(kept->kind)) + (kept->isArchive ? " archive" : "") : "";
}

TEST(KeptNameTest, SessionsAreToldByDateZoneAndRole) {
  EXPECT_EQ(kindOf("2024-05-02 at 14-03-07 (CEST) (Initiator)"), "session");
  EXPECT_EQ(kindOf("2024-05-02 at 14-03-07 (CEST) (Receiver).zip"), "session archive");
  EXPECT_EQ(kindOf("2024-05-02 at 14-03-07 (CEST) (Receiver) (not archived)"), "session");
}

TEST(KeptNameTest, DumpsAreToldByTheMarkAndTheDateWhateverStandsAroundThem) {
  EXPECT_EQ(kindOf("Vistel-Log (2024-05-02 at 14-03-07 (CEST))"), "dump");
  EXPECT_EQ(kindOf("Vistel-Log (2024-05-02 at 14-03-07 (CEST)) (no sound).zip"), "dump archive");
  EXPECT_EQ(kindOf("a-Log (b-Log (2024-05-02 at 14-03-07 (CEST))"), "dump");
  EXPECT_EQ(kindOf("Vistel-Log (2024-05-02 at 14-03-07 (CEST)) (a) (not archived)-12"), "dump");
}

TEST(KeptNameTest, StubsAreNamedAfterTheirArchive) {
  const std::string archive = "/reports/Vistel/Vistel-Log (2024-05-02 at 14-03-07 (CEST)).zip";
  EXPECT_EQ(stubPathOf(archive), "/reports/Vistel/Vistel-Log (2024-05-02 at 14-03-07 (CEST)).Manifest.json");
  EXPECT_EQ(kindOf("Vistel-Log (2024-05-02 at 14-03-07 (CEST)).Manifest.json"), "stub");
  EXPECT_EQ(kindOf("2024-05-02 at 14-03-07 (CEST) (Initiator).Manifest.json"), "stub");
}

TEST(KeptNameTest, WhatOthersPutBesideThemIsNoneOfThem) {
  for (const char* name :
       {"", "notes.zip", "Manifest.json", ".zip", "2024-05-02", "2024-05-02 at 14-03-07 (CEST)",
        "2024-05-02 at 14-03-07 (CEST) (Observer)", "2024-05-02 at 14:03:07 (CEST) (Initiator)",
        "2024-05-02 at 14-03-07 (CEST) (Initiator).zip.part",
        "2024-05-02 at 14-03-07 (CEST) (Initiator) (not archived)x", "Vistel-Log (yesterday)", "Vistel-Log",
        "kernel-2024-05-02-140307.ips"}) {
    EXPECT_EQ(kindOf(name), "") << name;
  }
}

}  // namespace
}  // namespace zal
