#pragma once

#include <algorithm>
#include <cstdint>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

#include "propertylist/Text.h"

namespace accounts {

/// Values by identifier, found in O(1). Listing them is in the order in which their identifiers
/// were first put in, so that nothing visible depends on hashing.
template <class Value>
class IdentifierIndex {
 public:
  /// The value under an identifier, null for none; valid until the index changes.
  [[nodiscard]] const Value* find(std::string_view identifier) const {
    const auto place = entries_.find(identifier);
    return place != entries_.end() ? &place->second.value : nullptr;
  }
  [[nodiscard]] bool contains(std::string_view identifier) const {
    return find(identifier) != nullptr;
  }
  [[nodiscard]] std::size_t size() const { return entries_.size(); }
  /// Grows whenever the index changes, so that what was made from it can tell that it is out of
  /// date.
  [[nodiscard]] std::uint64_t changeCount() const { return changeCount_; }

  /// Puts a value in; one that is there under the identifier is replaced and keeps its place in the
  /// order.
  void set(const Text& identifier, Value value) {
    const auto [place, isNew] = entries_.try_emplace(identifier, Entry{nextPosition_, {}});
    place->second.value = std::move(value);
    nextPosition_ += isNew ? 1 : 0;
    ++changeCount_;
  }
  void remove(std::string_view identifier) {
    const auto place = entries_.find(identifier);
    if (place != entries_.end()) {
      entries_.erase(place);
      ++changeCount_;
    }
  }
  void clear() {
    entries_.clear();
    ++changeCount_;
  }
  void reserve(std::size_t count) { entries_.reserve(count); }

  /// All identifiers with their values, in order; O(n log n).
  [[nodiscard]] std::vector<std::pair<Text, Value>> inOrder() const {
    std::vector<const typename Entries::value_type*> places;
    places.reserve(entries_.size());
    for (const auto& place : entries_) {
      places.push_back(&place);
    }
    std::sort(places.begin(), places.end(), [](const auto* left, const auto* right) {
      return left->second.position < right->second.position;
    });
    std::vector<std::pair<Text, Value>> result;
    result.reserve(places.size());
    for (const auto* place : places) {
      result.emplace_back(place->first, place->second.value);
    }
    return result;
  }

 private:
  struct Entry {
    std::uint64_t position;
    Value value;
  };
  using Entries = std::unordered_map<Text, Entry, TextHash, std::equal_to<>>;
  Entries entries_;
  std::uint64_t nextPosition_ = 0;
  std::uint64_t changeCount_ = 0;
};

}  // namespace accounts
