#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace zal {

/// An alert of the agent's, as its record tells it.
struct PostedAlert {
  struct Button {
    std::string name;  ///< "default", "alternate", "other"; what an answer says
    std::string label;
  };
  std::string id;
  std::string title;
  std::string message;
  std::vector<Button> buttons;
  bool takesText = false;
  std::string posted;  ///< "2024-05-02 14:03:07", local
  std::string state;   ///< "waiting", "answered" and others in which it takes no answer any more
  std::string answer;  ///< the button that was chosen; empty unless answered

  [[nodiscard]] bool waits() const { return state == "waiting"; }
};

/// What clients have of the agent's memory, as the agent shows it.
struct MemoryView {
  struct Client {
    std::int64_t process = 0, user = 0;
    std::uint64_t bytes = 0;
    std::uint64_t delayedMessages = 0;
    bool waits = false;
  };
  std::int64_t agent = 0;
  std::uint64_t bytes = 0;  ///< of all of them, former ones included
  std::vector<Client> clients;
};

/// A collection of the agent's, as its progress record tells it.
struct DumpView {
  enum class State { running, done, failed, cutOff };
  struct Step {
    std::string name;
    std::optional<std::chrono::milliseconds> began;  ///< since the collection began; nothing: not yet
  };
  struct Missing {
    std::string what;
    std::string why;
  };
  std::string name;  ///< of the record; no other one has it
  std::string service;
  std::string directory;
  std::vector<Step> steps;
  std::size_t currentStep = 0;  ///< counted from 1; 0: none began
  std::vector<Missing> missing;
  State state = State::running;
  std::string reason;  ///< why it failed
};

}  // namespace zal
