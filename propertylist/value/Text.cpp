#include "propertylist/value/Text.h"

#include <cstring>
#include <new>

namespace accounts {

namespace {

// Large enough to make the allocation's price small beside that of the bytes.
constexpr std::size_t kBlockSize = std::size_t{1} << 15;

}  // namespace

SharedBytes::Node::Node(std::string_view content, const Block* block)
    : sizeAndPlace_(static_cast<std::uint32_t>(content.size()) |
                    (block != nullptr ? kInBlock | placeIn(*block) << kSizeBits : 0)) {
  std::memcpy(bytes(), content.data(), content.size());
}

std::uint32_t SharedBytes::Node::placeIn(const Block& block) const {
  static_assert(kBlockSize / kAlignment <= kInBlock >> kSizeBits);
  const auto distance = reinterpret_cast<const char*>(this) - reinterpret_cast<const char*>(&block);
  return static_cast<std::uint32_t>(distance) / std::uint32_t{kAlignment};
}

SharedBytes::Block* SharedBytes::Node::block() {
  const std::size_t place = (sizeAndPlace_ & ~kInBlock) >> kSizeBits;
  return isInBlock() ? reinterpret_cast<Block*>(reinterpret_cast<char*>(this) - place * kAlignment)
                     : nullptr;
}

SharedBytes::SharedBytes(std::string_view bytes) {
  if (bytes.empty()) {
    return;
  }
  if (bytes.size() > Node::kLongest) {
    throw std::bad_alloc();
  }
  // Header and bytes share one allocation: most values of an account are short texts.
  void* memory = ::operator new(sizeof(Node) + bytes.size());
  node_ = SharedNode<SharedBytes>(new (memory) Node(bytes, nullptr));
}

void SharedBytes::destroyNode(SharedNodeBase* base) {
  Node* node = static_cast<Node*>(base);
  Block* const block = node->block();
  node->~Node();
  if (block != nullptr) {
    SharedBytesArena::releaseBlock(block);
  } else {
    ::operator delete(node);
  }
}

SharedBytes SharedBytesArena::make(std::string_view bytes) {
  if (bytes.empty() || bytes.size() > SharedBytes::Node::kLongestInBlock) {
    return SharedBytes(bytes);
  }
  constexpr std::size_t kAlignment = SharedBytes::Node::kAlignment;
  static_assert(alignof(SharedBytes::Node) == kAlignment);
  const std::size_t size =
      (sizeof(SharedBytes::Node) + bytes.size() + kAlignment - 1) / kAlignment * kAlignment;
  if (freeSize_ < size) {
    // First of all, since it may fail: the old block is still the arena's then.
    char* const memory = static_cast<char*>(::operator new(kBlockSize));
    releaseBlock(block_);
    block_ = new (memory) SharedBytes::Block;
    free_ = memory + sizeof(SharedBytes::Block);
    freeSize_ = kBlockSize - sizeof(SharedBytes::Block);
  }
  SharedBytes::Node* const node = new (free_) SharedBytes::Node(bytes, block_);
  block_->retain();
  free_ += size;
  freeSize_ -= size;
  return SharedBytes(node);
}

void SharedBytesArena::releaseBlock(SharedBytes::Block* block) {
  if (block != nullptr && block->releaseIsLast()) {
    block->~Block();
    ::operator delete(block);
  }
}

}  // namespace accounts
