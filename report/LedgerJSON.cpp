#include "report/LedgerJSON.h"

#include <utility>

#include "propertylist/value/HiddenSecrets.h"

namespace accounts {
namespace {

std::string counted(std::size_t count, std::string_view what) {
  return std::to_string(count) + " " + std::string(what) +
         (count == 1 ? " was not carried over" : "s were not carried over");
}

JSON entryObject(const AccountLedger& ledger, const LedgerEntry& entry) {
  const OriginKeys keys = keysOf(entry.child ? AccountOrigin::Kind::Settings : entry.account.kind);
  const PropertyDictionary account = ledger.before(entry).value_or(PropertyDictionary());
  const auto textOf = [&](std::string_view key) -> JSON {
    const auto text = account.textForKey(key);
    return text ? JSON(textWithSecretsHidden(text->view())) : JSON(nullptr);
  };
  JSON now = JSON::array();
  for (const LedgerPlace& each : entry.now) {
    now.push_back(AccountLedger::placeOf(each));
  }
  JSON object = {{"file", ledger.paths[indexOf(AccountLedger::fileOf(entry))]},
                 {"place", AccountLedger::placeOf(entry)},
                 {"identifier", textOf(keys.identifier)},
                 {"name", textOf(keys.displayName)},
                 {"fate", identifierOf(entry.fate)},
                 {"words", wordsOf(entry.fate)},
                 {"now", std::move(now)}};
  if (!entry.reason.empty()) {
    object["reason"] = entry.reason;
  }
  return object;
}

}  // namespace

JSON ledgerObject(const AccountLedger& ledger, LedgerDetail detail) {
  JSON counts = JSON::object();
  for (const AccountFate fate : kAccountFates) {
    counts[std::string(identifierOf(fate))] = ledger.countOf(fate);
  }
  JSON leftBehind = JSON::array();
  for (const AccountLedger::LeftBehind& each : ledger.leftBehind) {
    leftBehind.push_back({{"file", ledger.paths[indexOf(each.place)]}, {"key", each.key}});
  }
  JSON object = {{"counts", std::move(counts)},
                 {"losses", ledger.losses()},
                 {"leftBehind", std::move(leftBehind)}};
  if (detail == LedgerDetail::EveryAccount) {
    JSON accounts = JSON::array();
    for (const LedgerEntry& each : ledger.entries) {
      accounts.push_back(entryObject(ledger, each));
    }
    object["accounts"] = std::move(accounts);
  }
  return object;
}

std::string lossesInWords(const AccountLedger& ledger) {
  const std::size_t accounts =
      ledger.countOf(AccountFate::NotCarriedOver) + ledger.unexplained.size();
  const std::size_t files = ledger.lostFiles.size();
  if (files == 0) {
    return accounts == 0 ? "" : counted(accounts, "account");
  }
  return accounts == 0 ? counted(files, "file")
                       : counted(accounts, "account") + " and " + counted(files, "file");
}

std::string lossesWithTheFirst(const AccountLedger& ledger) {
  const std::vector<std::string> losses = ledger.losses();
  return losses.empty()
             ? ""
             : lossesInWords(ledger) + ": " + losses.front() +
                   (losses.size() > 1 ? ", and " + std::to_string(losses.size() - 1) + " more"
                                      : "");
}

}  // namespace accounts
