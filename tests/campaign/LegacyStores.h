#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// A disk without the legacy stores, and the copies that go with them, that another one has not.
SimulatedDisk withoutStoresGoneFrom(const SimulatedDisk& other, SimulatedDisk disk);

/// The bytes of a legacy store with one more account, as a program of the device writes it that has
/// read the bytes of the file before: of a store of its own where these stand for nothing.
std::string withFurtherMailAccount(const std::optional<std::string>& store,
                                   std::string_view identifier);
std::string withFurtherExchangeAccount(const std::optional<std::string>& store,
                                       std::string_view identifier);

}  // namespace accounts
