#pragma once

#include <vector>

#include "safetynet/AccountLedger.h"
#include "safetynet/ChangedKeys.h"
#include "safetynet/CommitRecord.h"
#include "safetynet/ToldFates.h"
#include "transaction/Transaction.h"

namespace accounts {

/// The ledger of a migration in memory. What it told is checked against inputs and result, account
/// by account and value by value: what is not borne out is not carried over. `inputs` are the files
/// that the migration found, `carriedOver` the stores that an earlier run's record says were
/// carried over. O(what the files hold) in total.
AccountLedger makeLedger(Transaction& transaction, const std::vector<DevicePlace>& inputs,
                         const CommitRecord& carriedOver, const ToldFates& told,
                         const DeviceFacts& facts);

}  // namespace accounts
