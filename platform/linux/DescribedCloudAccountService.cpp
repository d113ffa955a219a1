#include "platform/linux/DescribedCloudAccountService.h"

namespace accounts {

std::string DescribedCloudAccountService::statusKey() {
  return description_.cloudStatusKey;
}

std::string DescribedCloudAccountService::primaryAccountKey() {
  return description_.cloudPrimaryAccountKey;
}

std::string DescribedCloudAccountService::accountTypeDisplayName() {
  return description_.cloudAccountTypeDisplayName;
}

}  // namespace accounts
