#include "cli/delivery.h"

#include <chrono>

#include "platform/json_text.h"
#include "platform/value.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr auto kLookAgain = 20ms;
/// One request may be as large as the agent takes.
constexpr std::size_t kQueueLimit = 32U << 20U;

constexpr auto kConfirmation = 2s;

std::string seconds(std::chrono::milliseconds value) {
  return numberText(static_cast<double>(value.count()) / 1000) + " s";
}

}  // namespace

lirra::Client openClient(ToolContext& tool) {
  lirra::Client::Options options;
  options.socketPath = tool.socketPath();
  options.sender = tool.options.sender;
  options.queueLimit = kQueueLimit;
  options.closeTimeoutMs = 0;
  return lirra::Client(options);
}

lirra::Result confirm(ToolContext& tool, lirra::Client& client) {
  const auto deadline = tool.host.now() + tool.options.timeout(kConfirmation);
  for (;;) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - tool.host.now());
    const lirra::Result result = client.flush(static_cast<int>(left.count()));
    if (result != LIRRA_UNREACHABLE || !tool.options.waitForAgent || left <= kLookAgain) return result;
    tool.host.pause(kLookAgain);
  }
}

std::string startHint(ToolContext& tool) {
  const std::string unit = tool.host.isSuperuser() ? "systemctl start zalloggingagent.socket"
                                                   : "systemctl --user start zalloggingagent.socket";
  return "Start it with \"zalloggingagent &\" or \"" + unit + "\"; another socket is named with --socket.";
}

ExitCode failToDeliver(ToolContext& tool, lirra::Result result, const lirra::Client& client) {
  const auto fail = [&](std::string_view trouble, std::string_view hint) {
    return tool.fail(ExitCode::notConfirmed, trouble, hint);
  };
  if (!client || tool.socketPath().empty()) {
    return fail("it is not known where the agent listens",
                "Set XDG_RUNTIME_DIR or LIRRA_SOCKET, or name the socket with --socket.");
  }
  switch (result) {
    case LIRRA_UNREACHABLE:
      if (client.trouble().ends_with("Permission denied")) {
        return fail("this user may not talk to the agent: " + client.trouble(),
                    "Join the group that ipc.group in lirra.toml names.");
      }
      return fail("the agent is not running: " + client.trouble(), startHint(tool));
    case LIRRA_TIMEOUT:
      return fail("the agent did not confirm within " + seconds(tool.options.timeout(kConfirmation)),
                  "It may be busy: try a longer --timeout, and see what \"lirractl status\" says.");
    case LIRRA_LOST:
      return fail(
          "the agent closed the connection before it confirmed",
          "It lets in its own user, the superuser and the group that ipc.group in lirra.toml names; its "
          "own log says whom it turned away.");
    case LIRRA_TOO_LARGE:
      return fail("the request is too large for the agent",
                  "Send the text in pieces, or collect a file with \"file\".");
    default:
      return fail(std::string("the request was not sent: ") + lirra_result_text(result), "");
  }
}

ExitCode deliver(ToolContext& tool, const std::function<lirra::Result(lirra::Client&)>& request) {
  // Asked first, so that an unknown place is told as such.
  if (tool.socketPath().empty())
    return failToDeliver(tool, LIRRA_UNREACHABLE, lirra::Client(lirra::Client::Options{}));
  lirra::Client client = openClient(tool);
  lirra::Result result = client ? request(client) : LIRRA_UNREACHABLE;
  if (result == LIRRA_OK) result = confirm(tool, client);
  if (result != LIRRA_OK) return failToDeliver(tool, result, client);
  if (tool.options.json) tool.out << JsonObject().add("result", "done").text() << "\n";
  return ExitCode::done;
}

}  // namespace zal
