#include "platform/memory_ledger.h"

#include <algorithm>
#include <utility>

namespace zal {

namespace {
/// Less than this is not worth a piece of its own on the disk.
constexpr std::uint64_t kLeastGivenUp = 1U << 20U;
}  // namespace

MemoryHold::~MemoryHold() {
  if (_ledger != nullptr) release(bytes());
}

MemoryHold& MemoryHold::operator=(MemoryHold&& other) noexcept {
  std::swap(_ledger, other._ledger);
  std::swap(_shares, other._shares);
  return *this;
}

void MemoryHold::add(std::uint64_t bytes) {
  if (_ledger == nullptr) return;
  _shareOf(_ledger->_payer).bytes += bytes;
  _ledger->_add(bytes);
}

void MemoryHold::absorb(MemoryHold& other) {
  _ledger = other._ledger;
  for (const Share& share : std::exchange(other._shares, {})) _shareOf(share.account).bytes += share.bytes;
}

/// The last one is the one that is asked for mostly.
MemoryHold::Share& MemoryHold::_shareOf(const std::shared_ptr<MemoryAccount>& account) {
  if (!_shares.empty() && _shares.back().account == account) return _shares.back();
  const auto found = std::find_if(_shares.begin(), _shares.end(),
                                  [&](const Share& share) { return share.account == account; });
  if (found == _shares.end()) return _shares.emplace_back(Share{account, 0});
  std::swap(*found, _shares.back());
  return _shares.back();
}

void MemoryHold::release(std::uint64_t bytes) {
  while (bytes > 0 && !_shares.empty()) {
    Share& share = _shares.front();
    const std::uint64_t given = std::min(bytes, share.bytes);
    bytes -= given;
    share.bytes -= given;
    const auto account = share.account;
    if (share.bytes == 0) _shares.erase(_shares.begin());
    _ledger->_giveBack(*account, given);
  }
}

std::uint64_t MemoryHold::bytes() const {
  std::uint64_t sum = 0;
  for (const Share& share : _shares) sum += share.bytes;
  return sum;
}

std::uint64_t MemoryHold::bytesOf(const MemoryAccount& account) const {
  for (const Share& share : _shares) {
    if (share.account.get() == &account) return share.bytes;
  }
  return 0;
}

void MemoryLedger::setPayer(std::shared_ptr<MemoryAccount> payer) {
  _payer = payer ? std::move(payer) : _own;
}

void MemoryLedger::_add(std::uint64_t bytes) {
  if (_payer->bytes == 0 && bytes > 0) ++_payingAccounts;
  _payer->bytes += bytes;
  _total += bytes;
}

void MemoryLedger::_giveBack(MemoryAccount& account, std::uint64_t bytes) {
  if (bytes == 0) return;
  account.bytes -= bytes;
  _total -= bytes;
  if (account.bytes == 0) --_payingAccounts;
  for (const auto& waiting : std::exchange(_waiting, {})) waiting();
}

bool MemoryLedger::isOverShare(const MemoryAccount& account) const {
  if (account.bytes > _limits.peer) return true;
  return _total > _limits.total &&
         account.bytes > _limits.total / std::max<std::uint64_t>(_payingAccounts, 1);
}

void MemoryLedger::relieve(MemoryUser& user) {
  if (user.canGiveUp(nullptr) > _limits.session) user.giveUp();
  if (_payer->bytes > _limits.peer) _relieveLargest(_payer.get());
  if (_total > _limits.total) _relieveLargest(nullptr);
}

void MemoryLedger::_relieveLargest(const MemoryAccount* account) {
  MemoryUser* largest = nullptr;
  std::uint64_t most = std::min(kLeastGivenUp, _limits.session) - 1;
  for (MemoryUser* const user : _users) {
    const std::uint64_t bytes = user->canGiveUp(account);
    if (bytes <= most) continue;
    most = bytes;
    largest = user;
  }
  if (largest != nullptr) largest->giveUp();
}

}  // namespace zal
