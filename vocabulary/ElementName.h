#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "vocabulary/AccountVocabulary.h"

namespace accounts {

/// How an account is named by where it stands in its file: `array` and the index in it, and of a
/// child its index among the children, such as "Accounts[2].ChildAccounts[0]".
inline std::string elementName(std::string_view array, std::size_t index,
                               std::optional<std::size_t> child = std::nullopt) {
  const std::string name = std::string(array) + "[" + std::to_string(index) + "]";
  return child ? name + "." + elementName(kAccountChildAccounts, *child) : name;
}

}  // namespace accounts
