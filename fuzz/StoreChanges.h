#pragma once

#include "accountsettings/AccountsManager.h"
#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDevice.h"

namespace accounts {

/// Changes a store and its accounts, by any of their operations and in any order, until the input
/// is used up; between two changes the store may be saved, or another program write the file.
void changeStore(FuzzInput& input, FuzzedDevice& device, AccountsManager& store);

}  // namespace accounts
