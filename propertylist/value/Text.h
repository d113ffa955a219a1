#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <utility>

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
  friend class SharedBytesArena;
  friend class PropertyContent;
  /// Memory that many nodes share; it goes with the last of them.
  struct Block : SharedNodeBase {};
  /// Followed by its bytes. There may be millions, so that all it knows of itself is one number.
  class Node : public SharedNodeBase {
   public:
    static constexpr std::size_t kAlignment = 4;
    static constexpr int kSizeBits = 11;
    /// What is longer keeps no block of others alive and wastes none of its room.
    static constexpr std::size_t kLongestInBlock = 1024;
    /// The bit above tells a node in a block.
    static constexpr std::size_t kLongest = 0x7FFF'FFFF;
    static_assert(kLongestInBlock < 1 << kSizeBits);

    /// In a block, or, where that is null, with memory of its own.
    Node(std::string_view content, const Block* block);
    [[nodiscard]] std::string_view view() {
      return {bytes(), isInBlock() ? sizeAndPlace_ & ((1U << kSizeBits) - 1) : sizeAndPlace_};
    }
    /// The block that the node stands in; null for a node with memory of its own.
    [[nodiscard]] Block* block();

   private:
    static constexpr std::uint32_t kInBlock = std::uint32_t{1} << 31;

    [[nodiscard]] char* bytes() { return reinterpret_cast<char*>(this + 1); }
    [[nodiscard]] std::uint32_t placeIn(const Block& block) const;
    [[nodiscard]] bool isInBlock() const { return (sizeAndPlace_ & kInBlock) != 0; }

    /// The size. In a block it has the low bits alone; above them is how far behind the beginning
    /// of the block the node stands, in units of the alignment.
    const std::uint32_t sizeAndPlace_;
  };
  explicit SharedBytes(Node* node) : node_(node) {}
  static void destroyNode(SharedNodeBase* node);
  [[nodiscard]] Node& node() const { return *static_cast<Node*>(node_.get()); }

  SharedNode<SharedBytes> node_;
};

/// Makes many runs of bytes at less cost than one by one: short ones share blocks of memory, each
/// of which is freed when the arena and everything made in it are gone.
class SharedBytesArena {
 public:
  SharedBytesArena() = default;
  SharedBytesArena(const SharedBytesArena&) = delete;
  SharedBytesArena& operator=(const SharedBytesArena&) = delete;
  ~SharedBytesArena() { releaseBlock(block_); }

  /// A copy of the bytes, as SharedBytes() makes it.
  [[nodiscard]] SharedBytes make(std::string_view bytes);

 private:
  friend class SharedBytes;
  static void releaseBlock(SharedBytes::Block* block);

  SharedBytes::Block* block_ = nullptr;
  /// What is left of the block.
  char* free_ = nullptr;
  std::size_t freeSize_ = 0;
};

/// An immutable text in UTF-8, cheap to copy. An unpaired UTF-16 unit read from a file is kept as
/// its generalised UTF-8 sequence, so that it can be written back as it was.
class Text {
 public:
  Text() = default;
  Text(std::string_view text) : bytes_(text) {}
  Text(const std::string& text) : bytes_(text) {}
  Text(const char* text) : bytes_(std::string_view(text)) {}
  explicit Text(SharedBytes bytes) : bytes_(std::move(bytes)) {}

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

/// Hash for containers keyed by Text that are looked up by any kind of text; pair it with
/// `std::equal_to<>`.
struct TextHash {
  using is_transparent = void;
  std::size_t operator()(std::string_view text) const {
    return std::hash<std::string_view>()(text);
  }
};

}  // namespace accounts
