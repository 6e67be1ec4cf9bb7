#include "platform/linux/property_list/pugixml_property_list_writer.h"

#include <gtest/gtest.h>
#include <stdio.h>

#include <cstdlib>
#include <filesystem>
#include <limits>
#include <string>

#include "platform/linux/property_list/property_list_strings.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

class PugixmlPropertyListWriterTest : public ::testing::Test {
 protected:
  /// What Python's plistlib finds in the file, as Python shows it, in ASCII.
  std::string readByPython() const {
    const std::string command =
        "python3 -c 'import plistlib,sys; print(ascii(plistlib.load(open(sys.argv[1],\"rb\"))),end=\"\")' "
        "\"" +
        path + "\" 2>&1";
    FILE* const output = ::popen(command.c_str(), "r");
    if (output == nullptr) return "python3 could not be started";
    std::string text;
    for (int c = ::fgetc(output); c != EOF; c = ::fgetc(output)) text += static_cast<char>(c);
    ::pclose(output);
    return text;
  }
  std::string writtenAndRead(const ValueMap& dictionary) {
    const auto error = writer.write(dictionary, path);
    return error ? error.message() : readByPython();
  }
  void SetUp() override {
    static const bool hasPython = std::system("python3 -c 'import plistlib' 2>/dev/null") == 0;
    if (!hasPython) GTEST_SKIP() << "no python3 here";
  }
  TemporaryDirectory directory;
  const std::string path = directory / "CTState.plist";
  PugixmlPropertyListWriter writer;
};

TEST_F(PugixmlPropertyListWriterTest, AnEmptyDictionaryIsRead) {
  EXPECT_EQ(writtenAndRead({}), "{}");
  EXPECT_EQ(readFile(path),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n  <dict />\n</plist>\n");
}

TEST_F(PugixmlPropertyListWriterTest, EveryKindOfValueIsReadAsWhatItIs) {
  EXPECT_EQ(writtenAndRead({{"b-no", false},
                            {"b-yes", true},
                            {"i", std::int64_t{-71}},
                            {"list", ValueList{"x", std::int64_t{1}, ValueList{}, ValueMap{{"k", true}}}},
                            {"map", ValueMap{{"empty", ValueMap{}}, {"text", ""}}},
                            {"r", 0.1},
                            {"s", "T & <Mobile> \"net\" \xc3\xa9 \xf0\x9f\x93\xb6"}}),
            "{'b-no': False, 'b-yes': True, 'i': -71, 'list': ['x', 1, [], {'k': True}], "
            "'map': {'empty': {}, 'text': ''}, 'r': 0.1, "
            "'s': 'T & <Mobile> \"net\" \\xe9 \\U0001f4f6'}");
}

TEST_F(PugixmlPropertyListWriterTest, TheFileIsAPropertyListOfVersionOne) {
  ASSERT_FALSE(writer.write({{"bands", ValueList{std::int64_t{20}}}, {"sim-status", "ready"}}, path));
  EXPECT_EQ(readFile(path), R"(<?xml version="1.0" encoding="UTF-8"?>
<plist version="1.0">
  <dict>
    <key>bands</key>
    <array>
      <integer>20</integer>
    </array>
    <key>sim-status</key>
    <string>ready</string>
  </dict>
</plist>
)");
}

TEST_F(PugixmlPropertyListWriterTest, IntegersKeepAllOfTheir64BitsAndTheirSign) {
  EXPECT_EQ(writtenAndRead({{"a", std::numeric_limits<std::uint64_t>::max()},
                            {"b", std::numeric_limits<std::int64_t>::min()},
                            {"c", std::uint64_t{9223372036854775808U}}}),
            "{'a': 18446744073709551615, 'b': -9223372036854775808, 'c': 9223372036854775808}");
}

TEST_F(PugixmlPropertyListWriterTest, RealsKeepEveryDigitAndTheOnesWithoutDigitsAreRead) {
  const double infinity = std::numeric_limits<double>::infinity();
  EXPECT_EQ(writtenAndRead({{"a", std::numeric_limits<double>::quiet_NaN()},
                            {"b", infinity},
                            {"c", -infinity},
                            {"d", 5.0},
                            {"e", 1.7976931348623157e308},
                            {"f", 5e-324},
                            {"g", -0.1234567890123456}}),
            "{'a': nan, 'b': inf, 'c': -inf, 'd': 5.0, 'e': 1.7976931348623157e+308, 'f': 5e-324, "
            "'g': -0.1234567890123456}");
}

TEST_F(PugixmlPropertyListWriterTest, ControlCharactersOfAModemBreakNothing) {
  std::string everything;
  for (int c = 0; c < 0x20; ++c) everything += static_cast<char>(c);
  EXPECT_EQ(writtenAndRead({{"a", "Oper\x1b[31mator" + everything + "\x7f"},
                            {std::string("ke\0y", 4), "\x01"},
                            {"z", std::string("+CGMR\0rest", 10)}}),
            "{'a': 'Oper[31mator\\t\\n\\n\\x7f', 'key': '', 'z': '+CGMRrest'}");
}

TEST_F(PugixmlPropertyListWriterTest, WhatIsNoUtf8IsReplaced) {
  EXPECT_EQ(writtenAndRead({{"a", "na\xefve \xc3"},
                            {"b", "\xed\xa0\x80"},               // a surrogate
                            {"c", "\xef\xbf\xbe\xef\xbf\xbf!"},  // U+FFFE and U+FFFF, which XML forbids
                            {"\xff", "\xfe"}}),
            "{'a': 'na\\ufffdve \\ufffd', 'b': '\\ufffd\\ufffd\\ufffd', 'c': '!', '\\ufffd': '\\ufffd'}");
}

TEST_F(PugixmlPropertyListWriterTest, BlanksAreKept) {
  EXPECT_EQ(writtenAndRead({{" k ", "  two  "}, {"b", "\n"}, {"c", " "}}),
            "{' k ': '  two  ', 'b': '\\n', 'c': ' '}");
}

TEST_F(PugixmlPropertyListWriterTest, NullValuesAreLeftOutWithTheirKeys) {
  EXPECT_EQ(writtenAndRead(
                {{"a", Value()}, {"b", ValueList{Value(), "x", Value()}}, {"c", ValueMap{{"d", Value()}}}}),
            "{'b': ['x'], 'c': {}}");
}

TEST_F(PugixmlPropertyListWriterTest, OurOwnReaderReadsItToo) {
  ASSERT_FALSE(writer.write({{"ProductName", "Phone & <more>"}, {"Number", std::int64_t{1}}}, path));
  const auto strings = propertyListStrings(readFile(path));
  EXPECT_EQ(strings, (std::map<std::string, std::string>{{"ProductName", "Phone & <more>"}}));
}

TEST_F(PugixmlPropertyListWriterTest, AnExistingFileIsReplacedInPlace) {
  writeFile(path, std::string(10'000, 'x'));
  std::filesystem::create_hard_link(path, directory / "second-name");
  EXPECT_EQ(writtenAndRead({{"a", "b"}}), "{'a': 'b'}");
  EXPECT_EQ(readFile(directory / "second-name"), readFile(path));
}

TEST_F(PugixmlPropertyListWriterTest, NothingIsWrittenThroughALinkBelowARoot) {
  std::filesystem::create_directories(directory / "elsewhere");
  std::filesystem::create_directories(directory / "root");
  std::filesystem::create_directory_symlink("../elsewhere", directory / "root/CT");
  PugixmlPropertyListWriter rooted({{directory / "root"}, ""});
  EXPECT_EQ(rooted.write({}, directory / "root/CT/CTState.plist"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(listTree(directory / "elsewhere"), "");
}

TEST_F(PugixmlPropertyListWriterTest, APathThatCannotBeWrittenIsTheErrorItself) {
  EXPECT_EQ(writer.write({}, directory / "missing/CTState.plist"), std::errc::no_such_file_or_directory);
  EXPECT_EQ(writer.write({}, directory.path()), std::errc::is_a_directory);
  EXPECT_EQ(writer.write({}, "/dev/full"), std::errc::no_space_on_device);
}

}  // namespace
}  // namespace zal::testing
