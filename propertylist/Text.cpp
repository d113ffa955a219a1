#include "propertylist/Text.h"

#include <cstring>
#include <new>

namespace accounts {

namespace {

// Large enough to make the allocation's price small beside that of the bytes.
constexpr std::size_t kBlockSize = std::size_t{1} << 15;
// What is longer keeps no block of others alive and wastes none of its room.
constexpr std::size_t kLongestInBlock = 1024;

}  // namespace

SharedBytes::Node::Node(std::string_view content, Block* blockOfNode)
    : size(content.size()), block(blockOfNode) {
  std::memcpy(bytes(), content.data(), content.size());
}

SharedBytes::SharedBytes(std::string_view bytes) {
  if (bytes.empty()) {
    return;
  }
  // Header and bytes share one allocation: most values of an account are short texts.
  void* memory = ::operator new(sizeof(Node) + bytes.size());
  node_ = SharedNode<SharedBytes>(new (memory) Node(bytes, nullptr));
}

void SharedBytes::destroyNode(SharedNodeBase* base) {
  Node* node = static_cast<Node*>(base);
  Block* const block = node->block;
  node->~Node();
  if (block != nullptr) {
    SharedBytesArena::releaseBlock(block);
  } else {
    ::operator delete(node);
  }
}

SharedBytes SharedBytesArena::make(std::string_view bytes) {
  if (bytes.empty() || bytes.size() > kLongestInBlock) {
    return SharedBytes(bytes);
  }
  constexpr std::size_t kAlignment = alignof(SharedBytes::Node);
  const std::size_t size =
      (sizeof(SharedBytes::Node) + bytes.size() + kAlignment - 1) / kAlignment * kAlignment;
  if (freeSize_ < size) {
    releaseBlock(block_);
    char* const memory = static_cast<char*>(::operator new(kBlockSize));
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
