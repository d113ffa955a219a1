#pragma once

#include <unistd.h>

#include <utility>

namespace accounts {

/// An open file of the process; closed when this goes.
class FileDescriptor {
 public:
  /// Takes over an open descriptor.
  explicit FileDescriptor(int number) : number_(number) {}
  FileDescriptor(FileDescriptor&& other) noexcept : number_(std::exchange(other.number_, kNone)) {}
  FileDescriptor& operator=(FileDescriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
  }
  FileDescriptor(const FileDescriptor&) = delete;
  FileDescriptor& operator=(const FileDescriptor&) = delete;
  ~FileDescriptor() {
    if (number_ != kNone) {
      ::close(number_);
    }
  }

  [[nodiscard]] int number() const { return number_; }

  /// Gives the descriptor up without closing it.
  int release() { return std::exchange(number_, kNone); }

 private:
  static constexpr int kNone = -1;
  int number_;
};

}  // namespace accounts
