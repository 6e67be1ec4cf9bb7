#include "platform/linux/ipc/client_shares.h"

#include <fstream>
#include <sstream>

namespace zal {
namespace {

constexpr const char* kWaits = "waits";
constexpr const char* kReads = "reads";

}  // namespace

std::string clientSharesPath(const std::string& runtimeRoot) { return runtimeRoot + "/clients/shares"; }

std::string clientSharesText(const ClientShares& shares) {
  std::ostringstream text;
  text << "agent " << shares.agent << " " << shares.bytes << "\n";
  for (const ClientShare& client : shares.clients) {
    text << "client " << client.process << " " << client.user << " " << client.bytes << " "
         << client.delayedMessages << " " << (client.isWaiting ? kWaits : kReads) << "\n";
  }
  return text.str();
}

std::optional<ClientShares> readClientShares(const std::string& path) {
  std::ifstream words(path);
  ClientShares shares;
  std::string kind;
  if (!(words >> kind >> shares.agent >> shares.bytes) || kind != "agent") return std::nullopt;
  while (words >> kind) {
    ClientShare client;
    std::string state;
    if (!(words >> client.process >> client.user >> client.bytes >> client.delayedMessages >> state)) {
      return std::nullopt;
    }
    if (kind != "client" || (state != kWaits && state != kReads)) return std::nullopt;
    client.isWaiting = state == kWaits;
    shares.clients.push_back(client);
  }
  return shares;
}

}  // namespace zal
