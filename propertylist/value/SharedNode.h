#pragma once

#include <sys/single_threaded.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <utility>

namespace accounts {

/// Base of every heap node of the value model: counts the handles that share the node. The count is
/// atomic, because tables that are computed once per process are read, and so copied, by any
/// thread; a process that never had a second thread is spared the price of that. 32 bits are
/// enough: as many handles would not fit into memory.
class SharedNodeBase {
 public:
  SharedNodeBase() = default;
  SharedNodeBase(const SharedNodeBase&) = delete;
  SharedNodeBase& operator=(const SharedNodeBase&) = delete;

  void retain() {
    if (__libc_single_threaded != 0) {
      references_.store(references_.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
    } else {
      references_.fetch_add(1, std::memory_order_relaxed);
    }
  }

  /// Lets go of one reference. Returns true when it was the last one: the caller then
  /// destroys the node.
  [[nodiscard]] bool releaseIsLast() {
    if (__libc_single_threaded != 0) {
      const std::uint32_t left = references_.load(std::memory_order_relaxed) - 1;
      references_.store(left, std::memory_order_relaxed);
      return left == 0;
    }
    return references_.fetch_sub(1, std::memory_order_acq_rel) == 1;
  }

  /// True when exactly one handle holds the node, so that it may be changed in place.
  [[nodiscard]] bool isUnshared() const { return references_.load(std::memory_order_acquire) == 1; }

 private:
  std::atomic<std::uint32_t> references_{1};
};

/// An owning handle to a shared node, null allowed. Copying shares the node. `Owner` is the class
/// that holds the handle: its static `destroyNode(SharedNodeBase*)` frees a node that nobody holds
/// any more. Handles know the node by its base alone, so that a class can hold one before its node
/// is defined.
template <class Owner>
class SharedNode {
 public:
  SharedNode() = default;
  /// Takes over the reference that a new node is born with.
  explicit SharedNode(SharedNodeBase* node) : node_(node) {}
  SharedNode(const SharedNode& other) : node_(other.node_) {
    if (node_ != nullptr) {
      node_->retain();
    }
  }
  SharedNode(SharedNode&& other) noexcept : node_(std::exchange(other.node_, nullptr)) {}
  // The copy makes it safe to assign to oneself.
  SharedNode& operator=(const SharedNode& other) {  // NOLINT(bugprone-unhandled-self-assignment)
    SharedNode copy(other);
    std::swap(node_, copy.node_);
    return *this;
  }
  SharedNode& operator=(SharedNode&& other) noexcept {
    std::swap(node_, other.node_);
    return *this;
  }
  ~SharedNode() {
    if (node_ != nullptr && node_->releaseIsLast()) {
      Owner::destroyNode(node_);
    }
  }

  [[nodiscard]] SharedNodeBase* get() const { return node_; }
  explicit operator bool() const { return node_ != nullptr; }

 private:
  SharedNodeBase* node_ = nullptr;
};

}  // namespace accounts
