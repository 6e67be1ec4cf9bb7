#include "collectors/gathering_witness.h"

#include <utility>

namespace zal {
namespace {

bool isAtOrBelow(std::string_view path, std::string_view directory) {
  return path.starts_with(directory) && (path.size() == directory.size() || path[directory.size()] == '/');
}

}  // namespace

void GatheringWitnesses::add(std::string directory, std::weak_ptr<GatheringWitness> witness) {
  const std::scoped_lock lock(_mutex);
  std::erase_if(_entries, [](const Entry& entry) { return entry.witness.expired(); });
  _entries.push_back({std::move(directory), std::move(witness)});
}

std::vector<std::shared_ptr<GatheringWitness>> GatheringWitnesses::_of(std::string_view directory) const {
  std::vector<std::shared_ptr<GatheringWitness>> found;
  const std::scoped_lock lock(_mutex);
  for (const Entry& entry : _entries) {
    if (!isAtOrBelow(directory, entry.directory)) continue;
    if (auto witness = entry.witness.lock()) found.push_back(std::move(witness));
  }
  return found;
}

void GatheringWitnesses::source(const std::string& source, const std::string& directory,
                                SourceOutcome outcome, const std::string& why) const {
  for (const auto& witness : _of(directory)) witness->source(source, directory, outcome, why);
}

void GatheringWitnesses::command(std::string_view commandLine, std::string_view directory,
                                 std::string_view fileName, std::optional<int> waitStatus) const {
  const std::string output = std::string(directory).append("/").append(fileName);
  for (const auto& witness : _of(directory)) witness->command(commandLine, output, waitStatus);
}

}  // namespace zal
