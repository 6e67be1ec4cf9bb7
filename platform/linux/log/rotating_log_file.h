#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/clock.h"

namespace zal {

/// One current log file: collects records, appends them in one write, steps aside for a rotation.
/// What the disk refuses stays in memory up to a bound and is written when the disk takes it again,
/// each byte once and in order. A symbolic link in the place of the directory or the file is not followed:
/// the file cannot be written then. Not for several threads.
///
///     file.append(record) ... file.flush();   // until file.isRotationDue()
///     if (file.flush()) file.rotateAway(sequence);   // "X.log" is now "X.log.pending-7"
class RotatingLogFile {
 public:
  /// Bytes that are kept of what could not be written; one record more may begin below the bound.
  static constexpr std::size_t kLargestBacklog = 4U << 20U;

  struct Place {
    std::string root;       ///< exists or is made
    std::string directory;  ///< below the root
    std::string fileName;
  };
  /// Complaints about this file are added to `messages`: one when an outage begins, one when it ends.
  RotatingLogFile(Place place, std::uint64_t rotationSize, std::vector<std::string>& messages);
  ~RotatingLogFile();
  RotatingLogFile(const RotatingLogFile&) = delete;
  RotatingLogFile& operator=(const RotatingLogFile&) = delete;

  /// Where the next record's text is appended; endRecord() must follow.
  [[nodiscard]] std::string& beginRecord();
  /// Takes the record back when it is beyond what may be kept in an outage.
  void endRecord();

  /// Appends what is buffered to the file. Returned: whether nothing is left over.
  bool flush();
  /// Gives up a file that somebody removed or renamed, so that the next flush makes a new one. Costs
  /// more than a small write, so it is not for each of them; in an outage flush() does it by itself.
  void leaveIfReplaced();
  /// Whether the file with what is buffered has reached its size, so that the next record belongs
  /// into a new one.
  [[nodiscard]] bool isRotationDue() const {
    return _descriptor >= 0 && _size + _buffer.size() >= _rotationLimit;
  }
  /// Renames the file, of which everything must be written, and begins anew. `sequence` is the first
  /// number to try and then the one that was free. Returned: whether it was renamed; otherwise the
  /// records go on into the old file.
  bool rotateAway(std::uint64_t& sequence);
  /// Gives up the descriptor; the next flush opens the file again.
  void close();

  [[nodiscard]] std::size_t bufferedBytes() const { return _buffer.size(); }
  [[nodiscard]] bool isInOutage() const { return _inOutage; }
  [[nodiscard]] const Place& place() const { return _place; }
  [[nodiscard]] std::string path() const { return _directoryPath() + "/" + _place.fileName; }

  /// Exchanges the buffers: an empty large one serves the next file that needs it.
  void swapBuffer(std::string& other) { _buffer.swap(other); }

  std::uint64_t lastUse = 0;  ///< for whoever keeps many of these
  SteadyTime lastLook{};      ///< when leaveIfReplaced() was called, likewise
  bool isListedDirty = false;

 private:
  [[nodiscard]] std::string _directoryPath() const { return _place.root + "/" + _place.directory; }
  bool _open();
  void _endTornLine();
  void _forgetTornRecord();
  [[nodiscard]] bool _wasReplaced() const;
  std::error_code _renameAway(std::uint64_t& sequence) const;
  int _write();
  void _beginOutage(int error);
  void _endOutage();

  Place _place;
  std::uint64_t _rotationSize;
  std::uint64_t _rotationLimit;
  std::vector<std::string>& _messages;
  std::string _buffer;
  int _descriptor = -1;
  std::uint64_t _size = 0;           // of the file, while it is open
  std::size_t _recordStart = 0;      // of the record being made
  bool _startsInsideRecord = false;  // the buffer's start continues what the file ends with
  bool _inOutage = false;
  bool _rotationFailed = false;
  std::uint64_t _dropped = 0;
};

}  // namespace zal
