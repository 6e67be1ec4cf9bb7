#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "platform/configuration.h"

namespace zal {

/// What is in memory on behalf of one client, in bytes.
struct MemoryAccount {
  std::uint64_t bytes = 0;
};

/// Somebody whose memory can go to the disk instead.
class MemoryUser {
 public:
  virtual ~MemoryUser() = default;
  /// Of what it could give up now: what that account pays for, or all of it for null.
  [[nodiscard]] virtual std::uint64_t canGiveUp(const MemoryAccount* account) const = 0;
  /// Lets go of it, at once or as fast as the disk takes it.
  virtual void giveUp() = 0;
};

class MemoryLedger;

/// A part of the memory that the ledger counts. Moved to whoever has the memory; what it still holds at its
/// end is given back.
class MemoryHold {
 public:
  MemoryHold() = default;
  MemoryHold(MemoryHold&& other) noexcept = default;
  MemoryHold& operator=(MemoryHold&& other) noexcept;
  MemoryHold(const MemoryHold&) = delete;
  MemoryHold& operator=(const MemoryHold&) = delete;
  ~MemoryHold();

  /// On the account of whom the ledger names as payer at this moment.
  void add(std::uint64_t bytes);
  /// Gives back so much of it, one account after the other.
  void release(std::uint64_t bytes);
  /// Takes over all that the other one holds.
  void absorb(MemoryHold& other);
  [[nodiscard]] std::uint64_t bytes() const;
  [[nodiscard]] std::uint64_t bytesOf(const MemoryAccount& account) const;

 private:
  friend class MemoryLedger;
  struct Share {
    std::shared_ptr<MemoryAccount> account;
    std::uint64_t bytes = 0;
  };
  explicit MemoryHold(MemoryLedger& ledger) : _ledger(&ledger) {}
  Share& _shareOf(const std::shared_ptr<MemoryAccount>& account);

  MemoryLedger* _ledger = nullptr;  // none: nothing is counted
  std::vector<Share> _shares;
};

/// Counts the memory that grows with what clients send, by client and in total, and has the largest users
/// give up theirs when it gets too much. Outlives its users and holds. Main thread only.
class MemoryLedger {
 public:
  explicit MemoryLedger(const MemorySettings& limits) : _limits(limits) {}
  MemoryLedger(const MemoryLedger&) = delete;
  MemoryLedger& operator=(const MemoryLedger&) = delete;

  [[nodiscard]] const MemorySettings& limits() const { return _limits; }
  [[nodiscard]] std::uint64_t total() const { return _total; }
  [[nodiscard]] MemoryHold makeHold() { return MemoryHold(*this); }

  /// Who pays for what is held from now on; null: the agent itself.
  void setPayer(std::shared_ptr<MemoryAccount> payer);
  /// Whether the account has more than its share: the limit of a client or, when there is too little for
  /// all, an equal part of the total.
  [[nodiscard]] bool isOverShare(const MemoryAccount& account) const;
  /// Calls it once, when memory was given back.
  void onRelease(std::function<void()> waiting) { _waiting.push_back(std::move(waiting)); }

  // A user takes part from the one to the other.
  void addUser(MemoryUser& user) { _users.push_back(&user); }
  void removeUser(MemoryUser& user) { std::erase(_users, &user); }
  /// After something was added for this user: whoever has to gives up memory now.
  void relieve(MemoryUser& user);

 private:
  friend class MemoryHold;
  void _add(std::uint64_t bytes);
  void _giveBack(MemoryAccount& account, std::uint64_t bytes);
  void _relieveLargest(const MemoryAccount* account);

  const MemorySettings _limits;
  std::uint64_t _total = 0;
  std::shared_ptr<MemoryAccount> _payer = std::make_shared<MemoryAccount>();
  const std::shared_ptr<MemoryAccount> _own = _payer;
  std::uint64_t _payingAccounts = 0;  // with anything on them
  std::vector<MemoryUser*> _users;
  std::vector<std::function<void()>> _waiting;
};

}  // namespace zal
