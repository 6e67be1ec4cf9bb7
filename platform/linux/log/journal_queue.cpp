#include "platform/linux/log/journal_queue.h"

#include <unistd.h>

#include <algorithm>
#include <utility>

#include "platform/linux/log/journal_entry.h"
#include "platform/linux/log/sealed_memory.h"

namespace zal {
namespace {

constexpr std::size_t kMostBytes = 256U << 10U;
/// Above this no record is sent as a datagram: a usual socket buffer holds hardly more.
constexpr std::size_t kLargestDatagram = 64U << 10U;
/// Once so many bytes lie in sealed memory nothing more goes there; one record may be larger.
constexpr std::size_t kMostSealedBytes = 4U << 20U;
/// An entry has fewer bytes than that which are not the client's.
constexpr std::size_t kMostOfOurs = 256;
/// A buffer that a burst blew up is not kept.
constexpr std::size_t kLargestSpareQueue = 16U << 10U;

}  // namespace

JournalQueue::JournalQueue() : _processId(std::to_string(::getpid())) {}

bool JournalQueue::add(const LogRecord& record) {
  const std::size_t atMost = kMostOfOurs + record.type.size() + record.category.size() + record.line.size();
  if (atMost > kLargestDatagram) return _addSealed(record);
  const std::size_t begin = _bytes.size();
  // Asked before anything is encoded: in a flood most records end here.
  if (begin + atMost > kMostBytes) return false;
  appendJournalEntry(_bytes, record, _processId);
  _entries.push_back({begin, _bytes.size() - begin, {}});
  return true;
}

bool JournalQueue::_addSealed(const LogRecord& record) {
  if (_sealedBytes >= kMostSealedBytes) return false;
  std::string head;
  appendJournalEntryHead(head, record, _processId);
  Descriptor memory = makeSealedMemory({head, record.line, kJournalEntryTail});
  if (!memory.isOpen()) return false;
  const std::size_t size = head.size() + record.line.size() + kJournalEntryTail.size();
  _sealedBytes += size;
  _entries.push_back({_bytes.size(), size, std::move(memory)});
  return true;
}

std::span<const JournalDatagram> JournalQueue::front(std::size_t most) {
  _front.clear();
  for (std::size_t i = 0; i < std::min(most, _entries.size()); ++i) {
    const Entry& entry = _entries[i];
    if (entry.memory.isOpen()) {
      _front.push_back({{}, entry.memory.get()});
    } else {
      _front.push_back({{_bytes.data() + entry.begin, entry.size}});
    }
  }
  return _front;
}

void JournalQueue::removeFront(std::size_t count) {
  if (count == 0) return;
  if (count >= _entries.size()) {
    clear();
    return;
  }
  const auto end = _entries.begin() + static_cast<std::ptrdiff_t>(count);
  for (auto entry = _entries.begin(); entry != end; ++entry) {
    if (entry->memory.isOpen()) _sealedBytes -= entry->size;
  }
  _entries.erase(_entries.begin(), end);
  const std::size_t gone = _entries.front().begin;
  _bytes.erase(0, gone);
  for (Entry& entry : _entries) entry.begin -= gone;
}

bool JournalQueue::sealFront() {
  Entry& entry = _entries.front();
  if (entry.memory.isOpen()) return false;
  entry.memory = makeSealedMemory({std::string_view(_bytes).substr(entry.begin, entry.size)});
  if (entry.memory.isOpen()) _sealedBytes += entry.size;
  return entry.memory.isOpen();
}

void JournalQueue::clear() {
  _entries.clear();
  _bytes.clear();
  _sealedBytes = 0;
  if (_bytes.capacity() <= kLargestSpareQueue) return;
  _bytes = std::string();
  _entries = std::vector<Entry>();
  _front = std::vector<JournalDatagram>();
}

}  // namespace zal
