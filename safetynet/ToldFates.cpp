#include "safetynet/ToldFates.h"

#include <algorithm>

namespace accounts {

void ToldFates::stageBegan(std::string_view operation, std::string_view purpose) {
  stages_.emplace_back(operation);
  if (next_ != nullptr) {
    next_->stageBegan(operation, purpose);
  }
}

void ToldFates::stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) {
  if (next_ != nullptr) {
    next_->stageEnded(succeeded, accounts);
  }
}

void ToldFates::accountFared(const AccountEvent& event) {
  events_.push_back({event.account, event.fate, event.other, std::string(event.reason),
                     stages_.empty() ? std::string() : stages_.back()});
}

void ToldFates::accountsSaved(const std::vector<AccountOrigin>& accounts) {
  saved_ = accounts;
}

bool ToldFates::hasRun(std::string_view stage) const {
  return std::ranges::find(stages_, stage) != stages_.end();
}

}  // namespace accounts
