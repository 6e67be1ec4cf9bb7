#pragma once

#include <functional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "collectors/collectors.h"
#include "dump/collection_flags.h"
#include "dump/collection_record.h"
#include "dump/wifi_dump.h"
#include "platform/platform.h"
#include "session/session_services.h"

namespace zal {

/// What the steps of one collection work with. Any thread.
struct CollectionContext {
  Platform& platform;
  Collectors& collectors;
  const CollectionRequest& request;
  CollectionRecord& record;
  const SignalWait& wait;
  std::function<void()> dumpCoexistence;  ///< empty: the host has no such manager
  bool withPings;                         ///< the network dump includes them

  [[nodiscard]] const DirectoryRoots& roots() const { return platform.configuration.roots; }
  [[nodiscard]] const CollectionSettings& settings() const { return platform.configuration.collection; }
  [[nodiscard]] FileCollector& files() const { return collectors.files; }
  [[nodiscard]] std::string in(std::string_view name) const {
    return std::string(request.destination).append("/").append(name);
  }
  std::string make(std::string_view name) const {
    std::string directory = in(name);
    platform.files.makeDirectories(directory);
    return directory;
  }
  void makeDestination() const { platform.files.makeDirectories(request.destination); }
  void linkSets(const std::vector<std::string>& names, const std::string& directory,
                bool includeAllGenerations = false) const;
};

/// One row of a collection. Without a flag it belongs to video calls, whatever is asked for.
struct CollectionStep {
  CollectionFlags flag;
  std::string_view name;
  void (*run)(const CollectionContext& at);
  bool isBig = false;          ///< what it takes lies on the disk already, and would be there once more
  bool isForMain = false;      ///< main thread only; the others any one
  bool stopsCaptures = false;  ///< there are none any more when it begins

  [[nodiscard]] bool isWanted(const CollectionRequest& request, bool savesRoom) const {
    return isAskedFor(request) && !(savesRoom && isBig);
  }
  [[nodiscard]] std::string whyNot(const CollectionRequest& request) const;
  [[nodiscard]] bool isAskedFor(const CollectionRequest& request) const;
};

/// All there are, in the order in which they are taken.
[[nodiscard]] std::span<const CollectionStep> collectionSteps();
/// The directories that the closing stages fill.
void makeClosingDirectories(const CollectionContext& at);

}  // namespace zal
