#pragma once

#include <deque>
#include <map>
#include <memory>
#include <string>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/linux/alerts/alert_screen.h"
#include "platform/linux/dialog/dialog_command.h"
#include "platform/linux/dialog/dialog_process.h"

namespace zal {

/// Alerts as windows of their own, each a small program: zenity, else kdialog. At most three at once;
/// further ones wait for their turn. Why there is none is logged once, until there is one again.
/// Main thread only.
class DialogScreen : public AlertScreen {
 public:
  static constexpr std::size_t kMostAtOnce = 3;
  struct Options {
    bool hasDisplay = false;  ///< without one every alert is declined at once
    std::string zenity = "zenity";
    std::string kdialog = "kdialog";
  };

  DialogScreen(asio::io_context& context, AgentLog& log, Options options)
      : _context(context), _log(log), _options(std::move(options)) {}
  ~DialogScreen() override;
  DialogScreen(const DialogScreen&) = delete;
  DialogScreen& operator=(const DialogScreen&) = delete;

  void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) override;
  void withdraw(const std::string& id) override;
  /// All windows disappear: nobody would hear of their buttons.
  void agentEnds() override;

 private:
  struct Shown {
    UserAlert alert;
    AlertHandlers handlers;
    std::shared_ptr<DialogProcess> process;
  };
  struct Turn {
    std::string id;
    UserAlert alert;
    AlertHandlers handlers;
  };
  void _open(Turn turn);
  [[nodiscard]] std::shared_ptr<DialogProcess> _start(const std::string& id, const UserAlert& alert,
                                                      std::string& reason);
  void _takeEnd(const std::string& id, DialogProgram program, const DialogOutcome& outcome);
  void _openNext();
  void _complain(const std::string& reason);

  asio::io_context& _context;
  AgentLog& _log;
  const Options _options;
  std::map<std::string, Shown> _shown;
  std::deque<Turn> _waiting;
  bool _complained = false;
};

}  // namespace zal
