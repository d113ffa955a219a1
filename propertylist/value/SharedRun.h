#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <utility>

#include "propertylist/value/SharedNode.h"

namespace accounts {

/// A shared node with a run of elements in its own memory: they are found, made and freed with the
/// node, not by a second piece of memory. It never moves; what does not fit goes into a larger one.
/// `Head` is what the node has besides its elements.
template <class Element, class Head = SharedNodeBase>
class alignas(std::uint64_t) SharedRun : public Head {
 public:
  /// An empty run with room for a number of elements.
  static SharedRun* make(std::size_t capacity) {
    static_assert(sizeof(SharedRun) % alignof(Element) == 0);
    void* const memory = ::operator new(sizeof(SharedRun) + capacity * sizeof(Element));
    return new (memory) SharedRun(capacity);
  }
  static void destroy(SharedNodeBase* node) {
    SharedRun* const run = static_cast<SharedRun*>(node);
    std::destroy(run->begin(), run->end());
    run->~SharedRun();
    ::operator delete(run);
  }

  [[nodiscard]] std::size_t size() const { return size_; }
  [[nodiscard]] std::size_t capacity() const { return capacity_; }
  [[nodiscard]] Element* begin() { return reinterpret_cast<Element*>(this + 1); }
  [[nodiscard]] Element* end() { return begin() + size_; }

  /// Adds an element at the end, made in its place of what is given. There must be room.
  template <class Source>
  Element& append(Source&& source) {
    Element* const place = new (end()) Element(std::forward<Source>(source));
    ++size_;
    return *place;
  }
  /// Adds an element before another one, or at the end. There must be room.
  void insert(Element* place, Element element) {
    if (place == end()) {
      append(std::move(element));
      return;
    }
    Element* const last = end() - 1;
    append(std::move(*last));
    std::move_backward(place, last, last + 1);
    *place = std::move(element);
  }
  /// Removes all elements from one on.
  void truncate(Element* firstRemoved) {
    std::destroy(firstRemoved, end());
    size_ = static_cast<std::uint32_t>(firstRemoved - begin());
  }

 private:
  explicit SharedRun(std::size_t capacity) : capacity_(static_cast<std::uint32_t>(capacity)) {}
  ~SharedRun() = default;

  std::uint32_t size_ = 0;
  std::uint32_t capacity_;
};

}  // namespace accounts
