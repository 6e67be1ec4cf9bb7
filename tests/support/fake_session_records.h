#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/session_records.h"

namespace zal::testing {

/// A black box in memory, which a test can look into and carry over to another process's session.
class FakeSessionRecords : public SessionRecords {
 public:
  ~FakeSessionRecords() override;
  struct Kept {
    std::vector<std::string> pieces;
    bool isRemoved = false;
    std::string writtenInto;
    std::uint64_t unreadableBytes = 0;  ///< what the reader of the record is told
  };
  std::vector<std::shared_ptr<Kept>> records;
  bool isEnabled = true;
  std::function<void()> onRead;  ///< after each piece that a reader took

  [[nodiscard]] std::shared_ptr<SessionRecord> begin() override {
    if (!isEnabled) return nullptr;
    records.push_back(std::make_shared<Kept>());
    return std::make_shared<Record>(records.back());
  }
  void flush() override {}
  void recover(const std::function<bool(const UnfinishedRecord& record)>& handler) override {
    for (const auto& kept : records) {
      if (kept->isRemoved) continue;
      kept->isRemoved = handler(Left(*kept, onRead));
    }
  }

 private:
  class Record : public SessionRecord {
   public:
    explicit Record(std::shared_ptr<Kept> kept) : _kept(std::move(kept)) {}
    void append(std::string_view piece) override { _kept->pieces.emplace_back(piece); }
    [[nodiscard]] std::function<void()> removal(const std::string& writtenInto) override {
      return [kept = _kept, writtenInto] {
        kept->isRemoved = true;
        kept->writtenInto = writtenInto;
      };
    }

   private:
    std::shared_ptr<Kept> _kept;
  };
  class Left : public UnfinishedRecord {
   public:
    Left(const Kept& kept, const std::function<void()>& onRead) : _kept(kept), _onRead(onRead) {}
    std::uint64_t read(const std::function<void(std::string_view piece)>& handler) const override {
      for (const std::string& piece : _kept.pieces) {
        handler(piece);
        if (_onRead) _onRead();
      }
      return _kept.unreadableBytes;
    }

   private:
    const Kept& _kept;
    const std::function<void()>& _onRead;
  };
};

}  // namespace zal::testing
