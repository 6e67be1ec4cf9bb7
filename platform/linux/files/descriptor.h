#pragma once

#include <unistd.h>

#include <utility>

namespace zal {

/// Owns one open descriptor, or none (-1).
class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int number) : _number(number) {}
  Descriptor(Descriptor&& other) noexcept : _number(other.release()) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    if (this != &other) {
      _close();
      _number = other.release();
    }
    return *this;
  }
  ~Descriptor() { _close(); }

  [[nodiscard]] int get() const { return _number; }
  [[nodiscard]] bool isOpen() const { return _number >= 0; }
  [[nodiscard]] int release() { return std::exchange(_number, -1); }

 private:
  void _close() {
    if (_number >= 0) ::close(_number);
  }
  int _number = -1;
};

}  // namespace zal
