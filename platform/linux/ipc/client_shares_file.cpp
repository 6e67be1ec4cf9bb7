#include "platform/linux/ipc/client_shares_file.h"

#include <unistd.h>

#include <algorithm>
#include <chrono>

#include "platform/linux/files/private_directory.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

constexpr std::chrono::milliseconds kShortestDistance{50};
/// Less in memory is what any client has in a call.
constexpr std::uint64_t kWorthAWord = 1U << 20U;

bool isWorthAWord(const ClientShares& shares) {
  return shares.bytes >= kWorthAWord ||
         std::any_of(shares.clients.begin(), shares.clients.end(),
                     [](const ClientShare& client) { return client.delayedMessages > 0; });
}

}  // namespace

bool ClientSharesFile::isDue(SteadyTime now) const {
  return !_path.empty() && now - _written >= kShortestDistance;
}

void ClientSharesFile::write(const ClientShares& shares, SteadyTime now) {
  _written = now;
  if (!isWorthAWord(shares)) return remove();
  // Nobody depends on it: where it cannot be, there is none.
  if (!ensurePrivateDirectory(_path.substr(0, _path.rfind('/')))) return;
  _isThere = !placeWholeFile(_path, clientSharesText(shares), ExistingFile::isReplaced);
}

void ClientSharesFile::remove() {
  if (_isThere) ::unlink(_path.c_str());
  _isThere = false;
}

}  // namespace zal
