#include "platform/linux/host_identity/linux_system_version.h"

#include <gtest/gtest.h>
#include <sys/utsname.h>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Values = std::map<std::string, std::string>;

std::string kernelRelease() {
  utsname kernel{};
  ::uname(&kernel);
  return kernel.release;
}

class LinuxSystemVersionTest : public ::testing::Test {
 protected:
  /// Reads a configured property list with that text.
  std::optional<Values> readList(const std::string& text) {
    writeFile(root / "version.plist", text);
    return LinuxSystemVersion(root / "version.plist", root.path()).read();
  }
  std::optional<Values> readHost() { return LinuxSystemVersion("", root.path()).read(); }
  static std::string list(const std::string& body) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n" + body + "\n</plist>\n";
  }
  TemporaryDirectory root;
};

TEST_F(LinuxSystemVersionTest, AConfiguredPropertyListGivesTheThreeValues) {
  EXPECT_EQ(
      readList(list(R"(<dict>
  <!-- written by the build -->
  <key>Copyright</key> <string>nobody</string>
  <key>ProductBuildVersion</key> <string>11B554a</string>
  <key>ProductName</key> <string>Phone &amp; OS</string>
  <key>Flags</key> <array><string>x</string></array>
  <key>ProductVersion</key> <string>7.0.4</string>
</dict>)")),
      (Values{
          {"ProductBuildVersion", "11B554a"}, {"ProductName", "Phone & OS"}, {"ProductVersion", "7.0.4"}}));
}

TEST_F(LinuxSystemVersionTest, ValuesThatAreNoStringsOrEmptyAreLeftOut) {
  EXPECT_EQ(readList(list("<dict><key>ProductVersion</key><integer>7</integer>"
                          "<key>ProductBuildVersion</key><string/>"
                          "<key>ProductName</key><string>Phone</string></dict>")),
            (Values{{"ProductName", "Phone"}}));
  EXPECT_EQ(readList(list("<dict/>")), Values{});
}

TEST_F(LinuxSystemVersionTest, ABrokenPropertyListReadsAsNothing) {
  writeFile(root / "etc/os-release", "NAME=Other\n");  // no second source beside a configured one
  EXPECT_EQ(readList(""), std::nullopt);
  EXPECT_EQ(readList("ProductName = Phone"), std::nullopt);
  EXPECT_EQ(readList("<plist><dict><key>ProductName</key><string>Phone</string>"), std::nullopt);
  EXPECT_EQ(readList(list("<array><string>Phone</string></array>")), std::nullopt);
  EXPECT_EQ(readList(list("<dict><key>ProductName</key><key>ProductVersion</key><string>7</string></dict>")),
            std::nullopt);
  EXPECT_EQ(readList(list("<dict><key>ProductName</key></dict>")), std::nullopt);
  EXPECT_EQ(readList(list("<dict><string>Phone</string></dict>")), std::nullopt);
}

TEST_F(LinuxSystemVersionTest, AMissingPropertyListReadsAsNothing) {
  EXPECT_EQ(LinuxSystemVersion(root / "missing.plist", root.path()).read(), std::nullopt);
}

TEST_F(LinuxSystemVersionTest, EachReadIsFresh) {
  LinuxSystemVersion version(root / "version.plist", root.path());
  EXPECT_EQ(version.read(), std::nullopt);
  writeFile(root / "version.plist", list("<dict><key>ProductName</key><string>Phone</string></dict>"));
  EXPECT_EQ(version.read(), (Values{{"ProductName", "Phone"}}));
}

TEST_F(LinuxSystemVersionTest, WithoutAListOsReleaseAndTheKernelAnswer) {
  writeFile(root / "etc/os-release", R"text(# the vendor's
PRETTY_NAME="Some Linux 12 (worm)"
NAME="Some \"Linux\""
VERSION_ID='12'
no assignment
)text");
  writeFile(root / "usr/lib/os-release", "NAME=Other\nBUILD_ID=77\n");
  EXPECT_EQ(readHost(), (Values{{"ProductName", "Some \"Linux\""},
                                {"ProductVersion", "12"},
                                {"ProductBuildVersion", kernelRelease()}}));
}

TEST_F(LinuxSystemVersionTest, ABuildIdComesBeforeTheKernelsRelease) {
  writeFile(root / "usr/lib/os-release", "NAME=Rolling\r\nBUILD_ID=2024.05.01\r\nVERSION_ID=\r\n");
  EXPECT_EQ(readHost(), (Values{{"ProductName", "Rolling"}, {"ProductBuildVersion", "2024.05.01"}}));
}

TEST_F(LinuxSystemVersionTest, WithoutOsReleaseTheKernelStillAnswers) {
  EXPECT_EQ(readHost(), (Values{{"ProductBuildVersion", kernelRelease()}}));
}

}  // namespace
}  // namespace zal::testing
