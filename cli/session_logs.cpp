#include "cli/session_logs.h"

#include <array>
#include <fstream>
#include <sstream>

namespace zal {
namespace {

constexpr std::string_view kRule = "========================================";

/// The next line without its end; the text goes on behind it.
std::string_view takeLine(std::string_view& text) {
  const std::size_t end = std::min(text.find('\n'), text.size());
  const std::string_view line = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  return line;
}

std::optional<std::string> valueAfter(std::string_view line, std::string_view label) {
  if (!line.starts_with(label)) return std::nullopt;
  return std::string(line.substr(label.size()));
}

/// `text` stands behind the rule and is moved on only when a whole block follows.
std::optional<MetricBlock> takeBlock(std::string_view& text) {
  std::string_view rest = text;
  MetricBlock block;
  block.text = std::string(kRule) + "\n";
  const std::string_view name = takeLine(rest);
  if (!name.starts_with("  [") || !name.ends_with("]")) return std::nullopt;
  block.name = name.substr(3, name.size() - 4);
  block.text.append(name).append("\n");
  const std::array<std::pair<std::string_view, std::string*>, 5> fields{
      {{" Average: ", &block.average},
       {"     Min: ", &block.minimum},
       {"     Max: ", &block.maximum},
       {"  Median: ", &block.median},
       {"  StdDev: ", &block.standardDeviation}}};
  for (const auto& [label, field] : fields) {
    const std::string_view line = takeLine(rest);
    auto value = valueAfter(line, label);
    if (!value) return std::nullopt;
    *field = std::move(*value);
    block.text.append(line).append("\n");
  }
  text = rest;
  return block;
}

}  // namespace

std::optional<std::string> sessionLogName(const SessionDirectory& session, SessionLog log) {
  constexpr std::array<std::string_view, 3> kBeginnings = {"Log (", "Verbose Log (", "Quality Log ("};
  const std::string_view beginning = kBeginnings[static_cast<std::size_t>(log)];
  for (const SessionFile& file : session.files) {
    if (file.path.starts_with(beginning) && file.path.ends_with(").log")) return file.path;
  }
  return std::nullopt;
}

std::optional<std::string> readSessionFile(const SessionDirectory& session, const std::string& name,
                                           ArchiveReader& archives) {
  if (session.isArchive) return archives.text(session.path, name);
  std::ifstream file(session.path + "/" + name, std::ios::binary);
  if (!file) return std::nullopt;
  std::ostringstream text;
  // Copied by the stream, which takes a failed read for an end; a buffer read directly throws it.
  if (file.peek() != std::ifstream::traits_type::eof()) text << file.rdbuf();
  if (file.bad() || !text) return std::nullopt;
  return std::move(text).str();
}

std::vector<MetricBlock> statisticsBlocks(std::string_view qualityLog) {
  std::vector<MetricBlock> blocks;
  while (!qualityLog.empty()) {
    if (takeLine(qualityLog) != kRule) continue;
    if (auto block = takeBlock(qualityLog)) blocks.push_back(std::move(*block));
  }
  return blocks;
}

}  // namespace zal
