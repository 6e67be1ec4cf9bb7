#include "session/session_log_writing.h"

#include <exception>
#include <string>

namespace zal {

bool SessionLogWriting::run() {
  const std::scoped_lock lock(_lock);
  if (!_isDone) {
    _isDone = true;
    _isWritten = _write();
    _files.clear();
  }
  return _isWritten;
}

bool SessionLogWriting::_write() {
  bool isWritten = true;
  for (const File& file : _files) {
    try {
      isWritten &= file();
    } catch (const std::exception& exception) {
      _log.warning(std::string("A file of a session was given up: ") + exception.what());
      isWritten = false;
    }
  }
  return isWritten;
}

}  // namespace zal
