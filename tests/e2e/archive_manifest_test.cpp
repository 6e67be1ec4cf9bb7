#include <signal.h>
#include <sys/wait.h>

#include <cstdio>
#include <fstream>

#include "tests/e2e/dump_fixture.h"

namespace zal {
namespace {

using ::testing::AllOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::readFile;
using testing::writeFile;

struct Verified {
  int code = -1;
  std::string text;
};

/// Archives of the real daemon, held against their manifests by the real tool.
class ArchiveManifestE2eTest : public testing::DumpFixture {
 protected:
  [[nodiscard]] std::string dump(std::int64_t flags) {
    lirra::Client client = makeClient();
    return archiveOf(client, ask(client, "Registration", flags));
  }
  static Verified verify(const std::string& archive, const std::string& options = "") {
    FILE* const output =
        ::popen((ZAL_LIRRACTL_PATH " verify '" + archive + "' " + options + " 2>&1").c_str(), "r");
    Verified result;
    char buffer[4096];
    for (std::size_t count = 0; (count = std::fread(buffer, 1, sizeof buffer, output)) > 0;)
      result.text.append(buffer, count);
    result.code = WEXITSTATUS(::pclose(output));
    return result;
  }
  /// The archive's bytes with one of them turned over.
  void flip(const std::string& bytes, std::size_t position) const {
    std::string changed = bytes;
    changed.at(position) = static_cast<char>(changed[position] ^ 0x20);
    writeFile(copy(), changed);
  }
  [[nodiscard]] std::string copy() const { return sandbox / "copy.zip"; }
};

TEST_F(ArchiveManifestE2eTest, AnArchiveTellsWhatIsThereAndWhatIsNot) {
  start();
  writeFile(sandbox / "tmp/vistel_thermal_log.txt", "warm\n");
  const std::string archive = dump(0);
  const Verified whole = verify(archive);
  EXPECT_EQ(whole.code, 0) << whole.text;
  EXPECT_THAT(whole.text, AllOf(HasSubstr(": whole\n  Registration, flags 0x0, from "),
                                HasSubstr("not asked for: Media and radio logs, ")));
  EXPECT_THAT(outputOf("unzip -Z1 '" + archive + "' | tail -n 1"), EndsWith("/Manifest.json\n"));
  // Python reads archive and manifest, and finds each file's hash right.
  EXPECT_EQ(outputOf("python3 - '" + archive + R"(' <<'END'
import hashlib, json, sys, zipfile
archive = zipfile.ZipFile(sys.argv[1])
names = archive.namelist()
top = names[0]
manifest = json.loads(archive.read(names[-1]))
files = {row["file"]: row for row in manifest["files"]}
assert set(files) == {name[len(top):] for name in names[:-1] if not name.endswith("/")}, files
for name, row in files.items():
    content = archive.read(top + name)
    assert len(content) == row["bytes"] and hashlib.sha256(content).hexdigest() == row["sha256"], name
states = {row["step"]: row["state"] for row in manifest["steps"]}
print(len(states), states["Thermal log"], states["Stackshot"], states["Archive"], files["Power/vistel_thermal_log.txt"]["bytes"])
END
)"),
            "24 done skipped done 5\n");
}

TEST_F(ArchiveManifestE2eTest, MissingToolsAndSourcesAreAbsenceAndNoDamage) {
  start();
  const std::string archive = dump(0x10);
  const Verified found = verify(archive);
  EXPECT_EQ(found.code, 6) << found.text;
  EXPECT_THAT(found.text,
              AllOf(HasSubstr(": incomplete\n"), HasSubstr("Thermal log: none of its sources is there: "),
                    HasSubstr("Registration/zaltool.txt: "), HasSubstr("zaltool: not found"),
                    Not(HasSubstr("damaged"))));
  EXPECT_THAT(
      textIn(archive, "Manifest.json"),
      HasSubstr(R"("state": "missing", "step": "Registration and identity", "file": "Registration/)"));
}

TEST_F(ArchiveManifestE2eTest, AnyChangeIsFoundAndToldFromAbsence) {
  start();
  writeFile(sandbox / "tmp/vistel_thermal_log.txt", std::string(3000, 'w') + "\n");
  const std::string bytes = readFile(dump(0));
  ASSERT_GT(bytes.size(), 1000U);
  const std::size_t header = bytes.find("vistel_thermal_log.txt");
  flip(bytes, header + 40);  // the file's data, behind its header
  EXPECT_EQ(verify(copy()).code, 7);
  flip(bytes, bytes.rfind("vistel_thermal_log.txt"));  // its name in the directory
  EXPECT_EQ(verify(copy()).code, 7);
  flip(bytes, bytes.rfind("PK\1\2") + 16);  // a checksum there
  EXPECT_EQ(verify(copy()).code, 7);
  for (const std::size_t tail : {1, 22, 200}) {
    writeFile(copy(), bytes.substr(0, bytes.size() - tail));
    EXPECT_EQ(verify(copy()).code, 7) << tail;
  }
  EXPECT_THAT(verify(copy(), "--json").text, HasSubstr(R"({"result": "damaged", )"));
  writeFile(copy(), bytes);
  EXPECT_EQ(verify(copy()).code, 0);
}

TEST_F(ArchiveManifestE2eTest, AnAgentThatWasKilledMeanwhileIsFollowedByOneThatFinishes) {
  start();
  lirra::Client client = makeClient();
  client.log("Registration", "Default", "said by a client");
  holdSecondStage();
  (void)ask(client, "Registration", 0x04);
  ASSERT_TRUE(testing::eventually([&] {
    const auto all = records();
    return all.size() == 1 && all[0].record.currentStep > 0 &&
           all[0].record.steps[all[0].record.currentStep - 1].name == "Waiting for slow writers";
  }));
  const std::string directory = records()[0].record.directory;
  agent->signal(SIGKILL);
  ASSERT_EQ(agent->waitForExit(), -SIGKILL);
  ASSERT_TRUE(std::filesystem::is_directory(directory));
  start();
  ASSERT_TRUE(testing::eventually([&] {
    const auto all = records();
    return all.size() == 2 && all[1].record.state == DumpProgressRecord::State::done;
  }));
  EXPECT_FALSE(std::filesystem::exists(directory));
  const Verified found = verify(directory + ".zip");
  EXPECT_EQ(found.code, 6) << found.text;
  EXPECT_THAT(found.text, AllOf(HasSubstr("Waiting for slow writers: the agent ended in it\n"),
                                HasSubstr("Baseband logs: the agent ended before it\n")));
  EXPECT_THAT(textIn(directory + ".zip", "Manifest.json"), HasSubstr("\"finishedLater\": true"));
  EXPECT_THAT(outputOf("find " + (sandbox / "") + " -name Latest-Registration -printf %l"),
              directory + ".zip");
}

TEST_F(ArchiveManifestE2eTest, WhatIsNoArchiveIsNeitherWholeNorDamaged) {
  EXPECT_EQ(verify(sandbox / "nothing.zip").code, 3);
  writeFile(copy(), "a text");
  EXPECT_EQ(verify(copy()).code, 4);
  EXPECT_EQ(verify(sandbox / "tmp").code, 4);
}

}  // namespace
}  // namespace zal
