#pragma once

#include <string>

namespace accounts {

/// Names that the primary cloud account's own framework supplies.
class CloudAccountService {
 public:
  virtual ~CloudAccountService() = default;

  /// The account property under which a cloud account's status number stands.
  virtual std::string statusKey() = 0;
  /// The account property that marks the primary cloud account.
  virtual std::string primaryAccountKey() = 0;
  /// The name of the cloud account type, as people see it.
  virtual std::string accountTypeDisplayName() = 0;
};

}  // namespace accounts
