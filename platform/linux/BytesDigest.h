#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>

namespace accounts {

/// Random bytes without which nobody can tell the digest of other bytes.
class DigestSecret {
 public:
  /// None when the system has no random bytes.
  static std::optional<DigestSecret> makeRandom();

  [[nodiscard]] const std::array<char, 192>& bytes() const { return bytes_; }

 private:
  DigestSecret() = default;
  std::array<char, 192> bytes_;
};

/// What bytes are known again by where they are not kept: 128 bits. Nobody without the secret can
/// tell which other bytes have the same; those that somebody else writes by chance have them once
/// in 2^128 times.
class BytesDigest {
 public:
  struct Value {
    std::uint64_t low = 0;
    std::uint64_t high = 0;
    friend bool operator==(const Value&, const Value&) = default;
  };

  /// That of no bytes yet. The secret must outlive this.
  explicit BytesDigest(const DigestSecret& secret);
  BytesDigest(const BytesDigest&) = delete;
  BytesDigest& operator=(const BytesDigest&) = delete;
  ~BytesDigest();

  /// Appends to the bytes.
  void add(std::string_view bytes);
  /// The digest of the bytes so far.
  [[nodiscard]] Value value() const;

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace accounts
