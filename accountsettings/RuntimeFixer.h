#pragma once

#include <cstdint>
#include <string_view>

#include "accountsettings/BasicAccount.h"

namespace accounts {

/// What a fixer did with an account.
enum class FixResult : std::int32_t { Unchanged = 0, Changed = 1, CannotBeKept = 2 };

/// Repairs account records each time a store loads or saves them.
class RuntimeFixer {
 public:
  virtual ~RuntimeFixer() = default;

  /// Repairs one record if it needs it. `loggingMessage` names the occasion, "loading accounts" or
  /// "saving accounts".
  virtual FixResult fixBasicAccountIfNeeded_loggingMessage(BasicAccount& account,
                                                           std::string_view loggingMessage) = 0;
  /// Told after records were changed by fixers: false after loading, true after an attempt to save.
  virtual void accountsHaveBeenSaved(bool saved) = 0;
};

}  // namespace accounts
