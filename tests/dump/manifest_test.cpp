#include "dump/manifest.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

using namespace std::chrono_literals;
using Step = CollectionAccount::Step;

/// An account of one of each, a millisecond before the third of May.
class ManifestTest : public ::testing::Test {
 protected:
  [[nodiscard]] std::string text() const { return manifestText(account, content, kNight + 12s); }
  /// The only row of a list.
  [[nodiscard]] std::string rowOf(const std::string& list) const {
    const std::string all = text();
    const std::size_t begin = all.find("\"" + list + "\": [\n    ") + list.size() + 10;
    return all.substr(begin, all.find('\n', begin) - begin);
  }
  [[nodiscard]] std::string stepRow(Step step) {
    account.steps = {std::move(step)};
    return rowOf("steps");
  }

  static constexpr WallTime kNight = std::chrono::sys_days{std::chrono::year{2024} / 5 / 2} + 86'399'999ms;
  CollectionAccount account;
  ArchiveContent content;
};

TEST_F(ManifestTest, NamesTheCollectionAndItsTimesAndListsNothingWhereNothingIs) {
  account.service = "Vistel";
  account.directory = "/var/Vistel-Log";
  account.flags = 0x5F;
  account.began = kNight;
  EXPECT_EQ(text(), R"({
  "manifest": 1,
  "service": "Vistel",
  "directory": "/var/Vistel-Log",
  "flags": "0x5f",
  "began": "2024-05-02T23:59:59.999Z",
  "archived": "2024-05-03T00:00:11.999Z",
  "steps": [],
  "commands": [],
  "sources": [],
  "files": [],
  "remarks": []
}
)");
}

TEST_F(ManifestTest, EachOutcomeOfAStepHasItsWord) {
  const auto row = [&](PartState state) { return stepRow({"S", state, {}, 0ms, {}}); };
  EXPECT_EQ(row(PartState::notRun), R"({"step": "S", "state": "not run"})");
  EXPECT_EQ(row(PartState::running), R"({"step": "S", "state": "running"})");
  EXPECT_EQ(row(PartState::done), R"({"step": "S", "state": "done"})");
  EXPECT_EQ(row(PartState::partial), R"({"step": "S", "state": "partial"})");
  EXPECT_EQ(row(PartState::missing), R"({"step": "S", "state": "missing"})");
  EXPECT_EQ(row(PartState::failed), R"({"step": "S", "state": "failed"})");
  EXPECT_EQ(row(PartState::skipped), R"({"step": "S", "state": "skipped"})");
}

TEST_F(ManifestTest, StepThatRanHasItsBeginningItsDurationAndItsReasons) {
  EXPECT_EQ(stepRow({"Stackshot", PartState::failed, kNight, 1500ms, {"no room", "no time"}}),
            R"({"step": "Stackshot", "state": "failed", "began": "2024-05-02T23:59:59.999Z", )"
            R"("milliseconds": 1500, "why": ["no room", "no time"]})");
}

TEST_F(ManifestTest, CommandRowHasLineStepOutputAndStatus) {
  account.steps = {{"Network dump", PartState::done, {}, 0ms, {}}};
  account.commands = {
      {"ip route", "Network/ip.txt", 0, kNight, PartState::failed, 2, "it ended with status 2"}};
  EXPECT_EQ(rowOf("commands"),
            R"({"command": "ip route", "state": "failed", "step": "Network dump", "file": "Network/ip.txt", )"
            R"("began": "2024-05-02T23:59:59.999Z", "exitStatus": 2, "why": "it ended with status 2"})");
}

TEST_F(ManifestTest, OutputOfSomebodyElsesCommandHasNoLineAndNoStep) {
  account.commands = {{"", "out.txt", 0, {}, PartState::running, {}, "still running"}};
  EXPECT_EQ(rowOf("commands"), R"({"state": "running", "file": "out.txt", "why": "still running"})");
}

TEST_F(ManifestTest, SourceRowHasPathStepAndPlace) {
  account.steps = {{"Thermal log", PartState::missing, {}, 0ms, {}}};
  account.sources = {{"/tmp/log.txt", "Power", 0, PartState::missing, ""}};
  EXPECT_EQ(rowOf("sources"),
            R"({"source": "/tmp/log.txt", "state": "missing", "step": "Thermal log", "directory": "Power"})");
}

TEST_F(ManifestTest, FileRowHasBytesAndHashAndWhetherItIsCut) {
  content.files = {{"a/b.log", 3'000'000'000, "ab12", true}};
  EXPECT_EQ(rowOf("files"), R"({"file": "a/b.log", "bytes": 3000000000, "sha256": "ab12", "cut": true})");
}

TEST_F(ManifestTest, HostileTextsStayInsideTheirStrings) {
  content.files = {{"\"}],\n\x1b\xE2\x80\xAE\\", 0, "", false}};
  EXPECT_EQ(rowOf("files"), R"({"file": "\"}],\n\u001b\u202e\\", "bytes": 0, "sha256": ""})");
  account.commands = {{"echo \xFF\xC3", "", 0, kNight, PartState::done, {}, ""}};
  EXPECT_NE(rowOf("commands").find(R"("command": "echo \ufffd\ufffd")"), std::string::npos);
}

TEST_F(ManifestTest, SaysHowManyRowsDidNotFit) {
  account.rowsLeftOut = 7;
  EXPECT_NE(text().find("\"rowsLeftOut\": 7,\n"), std::string::npos);
}

}  // namespace
}  // namespace zal
