#pragma once

#include <concepts>
#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <utility>

namespace accounts {

/// Bytes that are given away piece by piece, such as those of a file to be: what is large need not
/// stand in memory whole. Like std::string_view this owns no bytes.
class BytesInPieces {
 public:
  /// Takes the next piece; false if it wants no more.
  using Taker = std::function<bool(std::string_view)>;
  /// Gives the pieces to a taker, in order, until it wants no more. Returns whether it took all.
  using Giver = std::function<bool(const Taker&)>;

  /// None.
  BytesInPieces() = default;
  /// One piece.
  template <std::convertible_to<std::string_view> Bytes>
  BytesInPieces(const Bytes& bytes)
      : BytesInPieces(
            std::string_view(bytes).size(),
            [piece = std::string_view(bytes)](const Taker& take) { return take(piece); }) {}
  /// As many bytes as `size` says, made by a giver whenever they are asked for.
  BytesInPieces(std::size_t size, Giver giver) : size_(size), giver_(std::move(giver)) {}

  /// How many there are.
  [[nodiscard]] std::size_t size() const { return size_; }
  /// Gives all of them to a taker, as a giver does.
  [[nodiscard]] bool giveTo(const Taker& take) const { return giver_ == nullptr || giver_(take); }
  /// All of them together.
  [[nodiscard]] std::string whole() const {
    std::string bytes;
    bytes.reserve(size_);
    static_cast<void>(giveTo([&bytes](std::string_view piece) {
      bytes.append(piece);
      return true;
    }));
    return bytes;
  }

 private:
  std::size_t size_ = 0;
  Giver giver_;
};

}  // namespace accounts
