#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// An X display of the test's own with a telephone's screen, and a person's hands and eyes for it. While
/// it lives, DISPLAY leads there.
class VirtualDisplay {
 public:
  VirtualDisplay();
  ~VirtualDisplay();
  VirtualDisplay(const VirtualDisplay&) = delete;
  VirtualDisplay& operator=(const VirtualDisplay&) = delete;

  /// Why there can be none on this machine; empty where there can. For GTEST_SKIP.
  [[nodiscard]] static std::string obstacle();

  /// Does what `xdotool WORDS` does; returned: what it prints.
  std::string act(const std::vector<std::string>& words) const;
  /// The window that is seen of a program of that class; empty when there is none.
  [[nodiscard]] std::string windowOf(const std::string& windowClass) const;
  /// Presses that mouse button in the middle of the window.
  void click(const std::string& window, int button) const;
  /// The whole screen as a PNG file.
  void photograph(const std::string& path) const;

 private:
  TemporaryDirectory _directory;
  std::unique_ptr<ChildProgram> _server;
};

/// How many colours there are in a picture; zero when it is none.
[[nodiscard]] int coloursOf(const std::string& picture);

}  // namespace zal::testing
