#pragma once

#include <string>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

inline std::string quotedKey(std::string_view key) {
  return "\"" + std::string(key) + "\"";
}

/// How two dictionaries differ, keys that may differ left out.
struct Difference {
  /// A clause; empty when nothing was lost.
  std::string loss;
  bool isChanged = false;
};

/// Walks through both at once, since they are in the order of their keys.
template <class MayDiffer>
Difference differenceBetween(const PropertyDictionary& before, const PropertyDictionary& after,
                             MayDiffer&& mayDiffer) {
  Difference difference;
  const auto note = [&](std::string_view key, auto&& clause) {
    difference.isChanged = true;
    if (difference.loss.empty() && !mayDiffer(key)) {
      difference.loss = clause(quotedKey(key));
    }
  };
  auto old = before.begin();
  auto now = after.begin();
  while (old != before.end() || now != after.end()) {
    const int order = old == before.end()  ? 1
                      : now == after.end() ? -1
                                           : old->key.view().compare(now->key.view());
    if (order < 0) {
      note(old->key.view(), [](const std::string& key) { return "its " + key + " is gone"; });
    } else if (order > 0) {
      note(now->key.view(),
           [](const std::string& key) { return "it has a " + key + " that it did not have"; });
    } else if (!(old->value == now->value)) {
      note(old->key.view(),
           [](const std::string& key) { return "its " + key + " gave way to another value"; });
    }
    if (order <= 0) {
      ++old;
    }
    if (order >= 0) {
      ++now;
    }
  }
  return difference;
}

}  // namespace accounts
