#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "propertylist/value/SharedNode.h"

namespace accounts {

/// A run of bytes that many handles share and nobody changes.
class SharedBytes {
 public:
  SharedBytes() = default;
  /// A copy of the bytes. More than 2^31 - 1 are too much memory: std::bad_alloc.
  explicit SharedBytes(std::string_view bytes);

  /// The bytes; valid as long as any handle to them lives.
  [[nodiscard]] std::string_view view() const { return node_ ? node().view() : std::string_view(); }

  /// True when both handles hold the very same node (or both are empty): equal without a
  /// comparison.
  [[nodiscard]] bool isSameAs(const SharedBytes& other) const {
    return node_.get() == other.node_.get();
  }

 private:
  friend class SharedNode<SharedBytes>;
  /// Followed by its bytes.
  class Node : public SharedNodeBase {
   public:
    static constexpr std::size_t kLongest = 0x7FFF'FFFF;

    explicit Node(std::string_view content);
    [[nodiscard]] std::string_view view() const {
      return {reinterpret_cast<const char*>(this + 1), size_};
    }

   private:
    const std::uint32_t size_;
  };
  static void destroyNode(SharedNodeBase* base);
  [[nodiscard]] Node& node() const { return *static_cast<Node*>(node_.get()); }

  SharedNode<SharedBytes> node_;
};

/// An immutable text in UTF-8, cheap to copy. An unpaired UTF-16 unit read from a file is kept as
/// its generalised UTF-8 sequence, so that it can be written back as it was.
class Text {
 public:
  Text() = default;
  Text(std::string_view text) : bytes_(text) {}
  Text(const std::string& text) : bytes_(text) {}
  Text(const char* text) : bytes_(std::string_view(text)) {}

  /// The text; valid as long as any copy of this text lives.
  [[nodiscard]] std::string_view view() const { return bytes_.view(); }
  operator std::string_view() const { return view(); }
  [[nodiscard]] std::string string() const { return std::string(view()); }
  [[nodiscard]] bool empty() const { return view().empty(); }
  /// The bytes, which other texts may share.
  [[nodiscard]] const SharedBytes& bytes() const { return bytes_; }

  friend bool operator==(const Text& left, const Text& right) {
    return left.bytes_.isSameAs(right.bytes_) || left.view() == right.view();
  }
  friend bool operator==(const Text& left, std::string_view right) { return left.view() == right; }
  friend bool operator==(const Text& left, const char* right) { return left.view() == right; }
  friend auto operator<=>(const Text& left, const Text& right) {
    return left.view() <=> right.view();
  }

 private:
  SharedBytes bytes_;
};

}  // namespace accounts
