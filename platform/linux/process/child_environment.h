#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// Whether children get a variable of that name: where programs are, who and where the user is, language
/// and time zone, the way to the buses and to the screen, and what sanitizers are told. Whatever else the
/// agent was started with (preloaded libraries, shells' start files, tokens) is none of theirs.
[[nodiscard]] bool isForChildren(std::string_view name);

/// The variables of this process that its children get. A value, made where a child is started: while it is
/// made no other thread changes the environment.
class ChildEnvironment {
 public:
  ChildEnvironment();
  explicit ChildEnvironment(char* const* variables);

  [[nodiscard]] const std::vector<std::string>& variables() const { return _variables; }
  /// As the system takes it, null at the end; valid while this lives and is not moved.
  [[nodiscard]] char* const* pointers() const { return _pointers.data(); }

  ChildEnvironment(const ChildEnvironment&) = delete;
  ChildEnvironment& operator=(const ChildEnvironment&) = delete;

 private:
  std::vector<std::string> _variables;
  std::vector<char*> _pointers;
};

}  // namespace zal
