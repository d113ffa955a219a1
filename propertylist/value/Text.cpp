#include "propertylist/value/Text.h"

#include <cstring>
#include <new>

namespace accounts {

SharedBytes::Node::Node(std::string_view content)
    : size_(static_cast<std::uint32_t>(content.size())) {
  std::memcpy(reinterpret_cast<char*>(this + 1), content.data(), content.size());
}

SharedBytes::SharedBytes(std::string_view bytes) {
  if (bytes.empty()) {
    return;
  }
  if (bytes.size() > Node::kLongest) {
    throw std::bad_alloc();
  }
  // Header and bytes share one allocation: most values of an account are short texts.
  void* const memory = ::operator new(sizeof(Node) + bytes.size());
  node_ = SharedNode<SharedBytes>(new (memory) Node(bytes));
}

void SharedBytes::destroyNode(SharedNodeBase* base) {
  Node* const node = static_cast<Node*>(base);
  node->~Node();
  ::operator delete(node);
}

}  // namespace accounts
