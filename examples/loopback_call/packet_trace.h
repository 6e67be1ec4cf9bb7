#pragma once

#include <fstream>
#include <string>

#include "examples/loopback_call/media_endpoint.h"

namespace loopback {

/// What both sides measured, one line a second, as comma-separated values: the file that the call
/// hands to the agent.
class PacketTrace {
 public:
  /// Throws std::runtime_error when the file cannot be made.
  explicit PacketTrace(const std::string& path);
  void add(int second, const MediaEndpoint& caller, const MediaEndpoint& callee);

 private:
  std::ofstream _file;
};

}  // namespace loopback
