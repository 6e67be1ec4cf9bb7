#pragma once

#include <chrono>
#include <functional>
#include <string_view>

#include "platform/clock.h"

namespace zal {

/// Notices when one thing holds the main thread for too long, and tells by what. While none lives, spans cost
/// a look at a pointer. Main thread only; one at a time.
class MainThreadWatch {
 public:
  /// What it was, as its span says it, and how long, without what was told of spans inside.
  using Report =
      std::function<void(std::string_view kind, std::string_view name, std::chrono::milliseconds held)>;
  /// Tells of what takes longer than the limit. The clock outlives it.
  MainThreadWatch(const Clock& clock, std::chrono::milliseconds limit, Report report);
  ~MainThreadWatch();
  MainThreadWatch(const MainThreadWatch&) = delete;
  MainThreadWatch& operator=(const MainThreadWatch&) = delete;

  /// One thing that the main thread does; may lie in another one. The texts outlive it.
  class Span {
   public:
    explicit Span(std::string_view kind, std::string_view name = {}) {
      if (_watch != nullptr) _begin(kind, name);
    }
    ~Span() {
      if (_isWatched) _end();
    }
    Span(const Span&) = delete;
    Span& operator=(const Span&) = delete;

   protected:
    struct Wanted {};
    explicit Span(Wanted /*is meant to take long*/) : Span("wait") { _isWanted = true; }

   private:
    void _begin(std::string_view kind, std::string_view name);
    void _end();

    bool _isWatched = false;
    bool _isWanted = false;
    std::string_view _kind, _name;
    SteadyTime _began;
    std::chrono::nanoseconds _toldInside;  ///< of spans in this one
    Span* _outer;
  };

  /// A wait that is meant to be: no watch tells of it.
  class WantedWait : public Span {
   public:
    WantedWait() : Span(Wanted()) {}
  };

 private:
  static inline MainThreadWatch* _watch = nullptr;

  const Clock& _clock;
  const std::chrono::milliseconds _limit;
  const Report _report;
  Span* _innermost = nullptr;
};

}  // namespace zal
