#pragma once

#include <cstdint>
#include <string_view>
#include <utility>
#include <vector>

#include "propertylist/value/ContentTable.h"
#include "propertylist/value/KeyedHash.h"
#include "propertylist/value/Text.h"

namespace accounts {

/// Values by identifier, found in O(1). Listing them is in the order in which their identifiers
/// were first put in, so that nothing visible depends on hashing.
template <class Value>
class IdentifierIndex {
 public:
  /// The value under an identifier, null for none; valid until the index changes.
  [[nodiscard]] const Value* find(std::string_view identifier) const {
    const std::uint32_t number = table_.find(hash_(identifier), hasIdentifier(identifier));
    return number != ContentTable::kNone ? &entries_[number].value : nullptr;
  }
  [[nodiscard]] bool contains(std::string_view identifier) const {
    return find(identifier) != nullptr;
  }
  [[nodiscard]] std::size_t size() const { return entries_.size() - removedCount_; }
  /// Grows whenever the index changes, so that what was made from it can tell that it is out of
  /// date.
  [[nodiscard]] std::uint64_t changeCount() const { return changeCount_; }

  /// The value under an identifier, to be changed at once; a fresh one at the end of the order if
  /// there was none.
  Value& operator[](const Text& identifier) {
    ++changeCount_;
    const auto newNumber = static_cast<std::uint32_t>(entries_.size());
    const std::string_view text = identifier;
    // Before the table knows its number, which must never be one of no entry.
    entries_.push_back({identifier, Value()});
    const std::uint32_t number = table_.findOrAdd(hash_(text), newNumber, hasIdentifier(text));
    if (number != newNumber) {
      entries_.pop_back();
    }
    return entries_[number].value;
  }
  /// Puts a value in; one that is there under the identifier is replaced and keeps its place in the
  /// order.
  void set(const Text& identifier, Value value) { (*this)[identifier] = std::move(value); }
  void remove(std::string_view identifier) {
    const std::uint32_t number = table_.find(hash_(identifier), hasIdentifier(identifier));
    if (number == ContentTable::kNone) {
      return;
    }
    // The table keeps its number, under which nothing is found any more.
    removed_.resize(entries_.size(), false);
    removed_[number] = true;
    entries_[number] = {Text(), Value()};
    ++removedCount_;
    ++changeCount_;
    if (2 * removedCount_ > entries_.size()) {
      dropRemovedEntries();
    }
  }
  void clear() {
    entries_.clear();
    removed_.clear();
    table_ = ContentTable();
    removedCount_ = 0;
    ++changeCount_;
  }
  void reserve(std::size_t count) { entries_.reserve(count); }

  /// All identifiers with their values, in order.
  [[nodiscard]] std::vector<std::pair<Text, Value>> inOrder() const {
    std::vector<std::pair<Text, Value>> result;
    result.reserve(size());
    for (std::size_t number = 0; number < entries_.size(); ++number) {
      if (!isRemoved(number)) {
        result.emplace_back(entries_[number].identifier, entries_[number].value);
      }
    }
    return result;
  }

 private:
  struct Entry {
    Text identifier;
    Value value;
  };

  [[nodiscard]] bool isRemoved(std::size_t number) const {
    return number < removed_.size() && removed_[number];
  }

  [[nodiscard]] auto hasIdentifier(std::string_view identifier) const {
    return [this, identifier](std::uint32_t number) {
      return !isRemoved(number) && entries_[number].identifier == identifier;
    };
  }

  void dropRemovedEntries() {
    std::size_t kept = 0;
    for (std::size_t number = 0; number < entries_.size(); ++number) {
      if (!isRemoved(number)) {
        std::swap(entries_[kept++], entries_[number]);
      }
    }
    entries_.resize(kept);
    removed_.clear();
    removedCount_ = 0;
    table_ = ContentTable();
    for (std::uint32_t number = 0; number < entries_.size(); ++number) {
      table_.findOrAdd(hash_(entries_[number].identifier.view()), number,
                       [](std::uint32_t) { return false; });
    }
  }

  std::vector<Entry> entries_;
  /// By number, as far as entries were removed. A flag in each entry would take eight bytes.
  std::vector<bool> removed_;
  std::size_t removedCount_ = 0;
  std::uint64_t changeCount_ = 0;
  KeyedHash hash_;
  ContentTable table_;
};

}  // namespace accounts
