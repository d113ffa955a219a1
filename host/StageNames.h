#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/MigrationObserver.h"

namespace accounts {

/// Notes the stages that a migration goes through, and passes on what it is told.
class StageNames final : public MigrationObserver {
 public:
  /// Null for nobody else who observes.
  explicit StageNames(MigrationObserver* next) : next_(next) {}

  [[nodiscard]] bool wantsAccounts() const override {
    return next_ != nullptr && next_->wantsAccounts();
  }
  void stageBegan(std::string_view operation, std::string_view purpose) override {
    names_.emplace_back(operation);
    if (next_ != nullptr) {
      next_->stageBegan(operation, purpose);
    }
  }
  void stageEnded(bool succeeded,
                  const std::optional<PropertyDictionary>& accountSettings) override {
    if (next_ != nullptr) {
      next_->stageEnded(succeeded, accountSettings);
    }
  }

  /// The operations of the stages so far, in order.
  [[nodiscard]] const std::vector<std::string>& names() const { return names_; }

 private:
  MigrationObserver* const next_;
  std::vector<std::string> names_;
};

}  // namespace accounts
