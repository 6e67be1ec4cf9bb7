#include "cli/archive_verdict.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

using Lines = std::vector<std::string>;

Lines linesOf(const std::vector<ArchiveVerdict::Finding>& findings) {
  Lines lines;
  for (const auto& [what, why] : findings) lines.push_back(what + ": " + why);
  return lines;
}

/// An archive of one file with a manifest, whole until a test changes it.
class ArchiveVerdictTest : public ::testing::Test {
 protected:
  [[nodiscard]] ArchiveVerdict judge() {
    archive.entries.back().bytes = 1000;
    archive.lastText = R"({"manifest": 1, "service": "Vistel", "steps": [)" + steps + R"(], "commands": [)" +
                       commands + R"(], "sources": [)" + sources + R"(], "files": [)" + files +
                       R"(], "remarks": [)" + remarks + "]}";
    return judgeArchive(archive);
  }
  [[nodiscard]] Lines damaged() { return linesOf(judge().damaged); }
  [[nodiscard]] Lines missing() { return linesOf(judge().missing); }

  std::string steps, commands, sources, remarks;
  std::string files = R"({"file": "a.log", "bytes": 5, "sha256": "11"})";
  ArchiveInspection archive{
      true, "", {{"Top/", 0, "", ""}, {"Top/a.log", 5, "11", ""}, {"Top/Manifest.json", 9, "22", ""}}, ""};
};

TEST_F(ArchiveVerdictTest, AStepThatWasLeftOutToSaveRoomIsMissing) {
  steps = R"({"step": "Location", "state": "skipped", "why": ["over budget"]})";
  EXPECT_EQ(missing(), Lines{"Location: over budget"});
  EXPECT_EQ(judge().skipped, Lines{});
}

TEST_F(ArchiveVerdictTest, ArchiveAsItsManifestTellsItIsWhole) {
  steps = R"({"step": "Thermal log", "state": "done"}, {"step": "Location", "state": "skipped"})";
  const ArchiveVerdict verdict = judge();
  EXPECT_EQ(linesOf(verdict.damaged), Lines{});
  EXPECT_EQ(linesOf(verdict.missing), Lines{});
  EXPECT_EQ(verdict.skipped, Lines{"Location"});
  EXPECT_EQ(verdict.files, 1U);
  EXPECT_EQ(verdict.bytes, 5U);
  EXPECT_EQ(verdict.service, "Vistel");
}

TEST_F(ArchiveVerdictTest, WhatIsMissingIsToldWithItsReason) {
  steps = R"({"step": "Thermal log", "state": "missing", "why": ["none of its sources is there"]},
             {"step": "Stackshot", "state": "failed", "why": ["no room"]},
             {"step": "Network dump", "state": "partial"}, {"step": "Snapshots", "state": "not run"})";
  sources = R"({"source": "/tmp/t.txt", "state": "missing", "step": "Thermal log"},
               {"source": "/tmp/u.txt", "state": "failed", "why": "Permission denied"})";
  commands =
      R"({"command": "voltra", "state": "missing", "file": "Network/v.txt", "why": "voltra: not found"},
                {"command": "ip route", "state": "done", "file": "Network/ip.txt"})";
  remarks = R"("a pipe is left out")";
  EXPECT_EQ(missing(), (Lines{"Thermal log: none of its sources is there: /tmp/t.txt", "Stackshot: no room",
                              "Snapshots: not run", "Network/v.txt: voltra: not found",
                              "/tmp/u.txt: Permission denied", ": a pipe is left out"}));
  EXPECT_EQ(damaged(), Lines{});
}

TEST_F(ArchiveVerdictTest, FileThatIsNotAsTheManifestSaysIsDamaged) {
  files = R"({"file": "a.log", "bytes": 5, "sha256": "12"})";
  EXPECT_EQ(damaged(), Lines{"a.log: has another SHA-256 than the manifest says"});
  files = R"({"file": "a.log", "bytes": 6, "sha256": "11"})";
  EXPECT_EQ(damaged(), Lines{"a.log: has another length than the manifest says"});
  files = R"({"file": "b.log", "bytes": 5, "sha256": "11"})";
  EXPECT_EQ(damaged(), (Lines{"b.log: is in the manifest, but not in the archive",
                              "a.log: is in the archive, but not in the manifest"}));
}

TEST_F(ArchiveVerdictTest, FileThatBecameShorterWhileItWasArchivedIsMissingAPart) {
  files = R"({"file": "a.log", "bytes": 5, "sha256": "11", "cut": true})";
  remarks = R"("\"/d/a.log\" is cut in the archive after 5 of 9 bytes")";
  EXPECT_EQ(damaged(), Lines{});
  EXPECT_EQ(missing(), Lines{": \"/d/a.log\" is cut in the archive after 5 of 9 bytes"});
}

TEST_F(ArchiveVerdictTest, TroublesOfEntriesAndOfTheWholeAreDamage) {
  archive.trouble = "its directory breaks off";
  archive.entries[1].trouble = "has a wrong checksum";
  EXPECT_EQ(damaged(), (Lines{"the archive: its directory breaks off", "Top/a.log: has a wrong checksum"}));
  EXPECT_EQ(judge().files, 0U);
}

TEST_F(ArchiveVerdictTest, NamesThatLeadOutOrStandThereTwiceAreDamage) {
  archive.entries.insert(archive.entries.begin(),
                         {{"/etc/passwd", 1, "", ""}, {"Top/../../x/", 0, "", ""}, {"Top/", 0, "", ""}});
  EXPECT_EQ(
      damaged(),
      (Lines{"/etc/passwd: has a name that leads out of a directory", "/etc/passwd: does not lie below Top/",
             "Top/../../x/: has a name that leads out of a directory", "Top/: stands in the archive twice"}));
}

TEST_F(ArchiveVerdictTest, ManifestThatIsNoneIsDamage) {
  (void)judge();
  archive.lastText = "{";
  EXPECT_EQ(linesOf(judgeArchive(archive).damaged), Lines{"Top/Manifest.json: is no JSON object"});
  for (const char* text : {"{}", R"({"steps": 1, "sources": []})", R"({"steps": [1], "sources": []})"}) {
    archive.lastText = text;
    const auto found = linesOf(judgeArchive(archive).damaged);
    ASSERT_EQ(found.size(), 1U) << text;
    EXPECT_TRUE(found[0].starts_with("Manifest.json: cannot be understood: ")) << found[0];
  }
}

TEST_F(ArchiveVerdictTest, WithoutAManifestOnlyItsChecksumsCount) {
  archive.entries.pop_back();
  archive.lastText = "hello";
  const ArchiveVerdict verdict = judgeArchive(archive);
  EXPECT_FALSE(verdict.hasManifest);
  EXPECT_EQ(linesOf(verdict.damaged), Lines{});
  EXPECT_EQ(verdict.files, 1U);
}

TEST_F(ArchiveVerdictTest, ClientsOwnManifestIsAFileLikeAnyOther) {
  archive.entries.insert(archive.entries.begin() + 2, {"Top/Manifest.json", 2, "33", ""});
  archive.entries.back().name = "Top/Manifest.json-2";
  files += R"(, {"file": "Manifest.json", "bytes": 2, "sha256": "33"})";
  EXPECT_EQ(damaged(), Lines{});
  EXPECT_EQ(judge().files, 2U);
}

}  // namespace
}  // namespace zal
