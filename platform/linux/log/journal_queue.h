#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <vector>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/log/journal_socket.h"
#include "platform/log_facility.h"

namespace zal {

/// Records on their way to the journal, ready to be sent, in a bounded place. Main thread only.
class JournalQueue {
 public:
  JournalQueue();

  /// Returned: whether there was room. A record too large for a datagram goes into sealed memory at
  /// once; what does not go there for want of descriptors or memory had no room either.
  [[nodiscard]] bool add(const LogRecord& record);
  [[nodiscard]] bool empty() const { return _entries.empty(); }
  [[nodiscard]] std::size_t size() const { return _entries.size(); }

  /// The first so many, oldest first. Valid until the queue is next changed.
  [[nodiscard]] std::span<const JournalDatagram> front(std::size_t most);
  void removeFront(std::size_t count);
  /// Moves the first one's bytes into sealed memory. Returned: whether it has changed.
  [[nodiscard]] bool sealFront();
  void clear();

 private:
  struct Entry {
    std::size_t begin = 0;  // in _bytes
    std::size_t size = 0;
    Descriptor memory;
  };
  bool _addSealed(const LogRecord& record);

  const std::string _processId;
  std::string _bytes;
  std::vector<Entry> _entries;
  std::size_t _sealedBytes = 0;
  std::vector<JournalDatagram> _front;
};

}  // namespace zal
