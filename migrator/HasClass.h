#pragma once

#include <algorithm>
#include <array>
#include <span>
#include <string_view>

#include "accountsettings/BasicAccount.h"
#include "vocabulary/AccountClasses.h"

namespace accounts {

/// Whether an account's class is one of these, compared exactly.
inline bool hasClassAmong(const BasicAccount& account, std::span<const std::string_view> classes) {
  const std::optional<Text> accountClass = account.accountClass();
  return accountClass && std::ranges::find(classes, accountClass->view()) != classes.end();
}

inline bool hasClass(const BasicAccount& account, std::string_view accountClass) {
  return hasClassAmong(account, std::array{accountClass});
}

}  // namespace accounts
