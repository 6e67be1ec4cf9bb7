#pragma once

#include <memory>
#include <string>

#include "platform/spill_files.h"

namespace zal::testing {

/// Spill files in memory, on a medium that can be told to refuse.
class FakeSpillFiles : public SpillFiles {
 public:
  int made = 0;
  std::uint64_t spilled = 0;  ///< bytes
  bool refusesWrites = false;
  bool refusesReads = false;

  [[nodiscard]] std::unique_ptr<SpillFile> make() override {
    ++made;
    return std::make_unique<File>(*this);
  }

 private:
  class File : public SpillFile {
   public:
    explicit File(FakeSpillFiles& medium) : _medium(medium) {}
    bool append(std::string_view bytes) override {
      if (_medium.refusesWrites) return false;
      _bytes.append(bytes);
      _medium.spilled += bytes.size();
      return true;
    }
    [[nodiscard]] std::uint64_t size() const override { return _bytes.size(); }
    bool read(std::uint64_t offset, char* buffer, std::size_t size) override {
      if (_medium.refusesReads || offset + size > _bytes.size()) return false;
      _bytes.copy(buffer, size, offset);
      return true;
    }
    [[nodiscard]] std::string trouble() const override { return "the fake medium refuses"; }

   private:
    FakeSpillFiles& _medium;
    std::string _bytes;
  };
};

}  // namespace zal::testing
