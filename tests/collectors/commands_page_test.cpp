#include <gtest/gtest.h>

#include <filesystem>
#include <set>
#include <sstream>

#include "collectors/command_table.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

/// "id file" of every row that the page lists; the file without its directory.
std::set<std::string> listedRows() {
  const auto page = std::filesystem::path(__FILE__).parent_path() / "../../docs/commands.md";
  std::istringstream text(testing::readFile(page.string()));
  std::set<std::string> rows;
  for (std::string line; std::getline(text, line);) {
    if (!line.starts_with("| `")) continue;
    std::istringstream cells(line);
    std::string cell, id, path;
    std::getline(cells, cell, '|');
    std::getline(cells, id, '|');
    std::getline(cells, path, '|');
    const std::string file = path.substr(path.rfind('/') == std::string::npos ? 1 : path.rfind('/') + 1);
    std::string row = id.substr(1) + file;
    std::erase(row, '`');
    row.pop_back();
    EXPECT_TRUE(rows.insert(row).second) << "listed twice: " << row;
  }
  return rows;
}

TEST(CommandsPageTest, ListsExactlyTheRowsOfTheTableWithTheirFiles) {
  std::set<std::string> expected;
  for (const CommandRow& row : CommandTable::allRows()) {
    expected.insert(std::string(row.id) + " " + (row.file.empty() ? "none" : std::string(row.file)));
  }
  EXPECT_EQ(listedRows(), expected);
}

}  // namespace
}  // namespace zal
