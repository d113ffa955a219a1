#pragma once

#include <string_view>

namespace accounts {

// The stages of a migration that change accounts, by the names of their operations.
inline constexpr std::string_view kMailConversionStage = "_migrateMailAccounts:";
inline constexpr std::string_view kExchangeConversionStage = "_migrateDAAccounts:";

// The upgrade steps, each named after the build whose accounts it takes.
inline constexpr std::string_view kStep7A149 = "_migrateAccountsFrom7A149:";
inline constexpr std::string_view kStep7A150 = "_migrateAccountsFrom7A150:";
inline constexpr std::string_view kStep7A153 = "_migrateAccountsFrom7A153:";
inline constexpr std::string_view kStep7A241 = "_migrateAccountsFrom7A241:";
inline constexpr std::string_view kStep7A242 = "_migrateAccountsFrom7A242:";
inline constexpr std::string_view kStep8A293 = "_migrateAccountsFrom8A293:";
inline constexpr std::string_view kStep8B117 = "_migrateAccountsFrom8B117:";
inline constexpr std::string_view kStep8C136 = "_migrateAccountsFrom8C136:";
inline constexpr std::string_view kStep8F191 = "_migrateAccountsFrom8F191:";
inline constexpr std::string_view kStep9A182 = "_migrateAccountsFrom9A182:";
inline constexpr std::string_view kStep9A334 = "_migrateAccountsFrom9A334:";
inline constexpr std::string_view kStep9B176 = "_migrateAccountsFrom9B176:";

}  // namespace accounts
