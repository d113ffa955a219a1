#pragma once

#include "inspection/PropertyListJSON.h"
#include "safetynet/AccountLedger.h"

namespace accounts {

/// Which accounts a ledger's JSON names one by one; the others are counted.
enum class LedgerDetail : std::uint8_t { LossesAlone, EveryAccount };

/// A ledger as a JSON object: how many accounts met each fate, what was not carried over and why,
/// what else was left behind, and with all details every account with its fate and where it is now.
JSON ledgerObject(const AccountLedger& ledger, LedgerDetail detail);

/// How many accounts were not carried over, in words such as "1 account was not carried over";
/// files without a readable account are told of, too. Empty when everything was carried over.
std::string lossesInWords(const AccountLedger& ledger);
/// The same with the first loss, in one line.
std::string lossesWithTheFirst(const AccountLedger& ledger);

}  // namespace accounts
