#include "platform/linux/archive/file_hash.h"

namespace zal {

bool FileHash::isTurn(std::uint64_t offset) {
  const std::scoped_lock lock(_mutex);
  return _next == offset;
}

void FileHash::add(std::uint64_t offset, const char* bytes, std::size_t size, std::size_t asked) {
  std::unique_lock lock(_mutex);
  _turned.wait(lock, [&] { return _next == offset; });
  const bool counts = !_ended;
  lock.unlock();
  if (counts) _hash.add(bytes, size);
  lock.lock();
  _ended = _ended || size < asked;
  _next = offset + asked;
  lock.unlock();
  _turned.notify_all();
}

std::string FileHash::takeDigest() {
  const std::scoped_lock lock(_mutex);
  return _hash.takeDigest();
}

}  // namespace zal
