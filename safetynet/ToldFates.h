#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/MigrationObserver.h"

namespace accounts {

/// An event as it is kept, with the stage in which it happened.
struct KeptEvent {
  AccountOrigin account;
  ToldFate fate = ToldFate::Refused;
  AccountOrigin other;
  std::string reason;
  std::string stage;
};

/// Keeps what a migration tells of its stages and its accounts, and passes the stages on.
class ToldFates final : public MigrationObserver {
 public:
  /// Null for nobody else who observes.
  void passOnTo(MigrationObserver* next) { next_ = next; }

  [[nodiscard]] bool wantsAccounts() const override {
    return next_ != nullptr && next_->wantsAccounts();
  }
  void stageBegan(std::string_view operation, std::string_view purpose) override;
  void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) override;
  void accountFared(const AccountEvent& event) override;
  void accountsSaved(const std::vector<AccountOrigin>& accounts) override;

  /// The operations of the stages so far, in order.
  [[nodiscard]] const std::vector<std::string>& stages() const { return stages_; }
  [[nodiscard]] bool hasRun(std::string_view stage) const;
  /// In the order in which they happened.
  [[nodiscard]] const std::vector<KeptEvent>& events() const { return events_; }
  /// The accounts of the settings file as they were saved last; none when no store was opened.
  [[nodiscard]] const std::optional<std::vector<AccountOrigin>>& saved() const { return saved_; }

 private:
  MigrationObserver* next_ = nullptr;
  std::vector<std::string> stages_;
  std::vector<KeptEvent> events_;
  std::optional<std::vector<AccountOrigin>> saved_;
};

}  // namespace accounts
