#pragma once

#include <optional>
#include <vector>

#include "accountsctl/Finding.h"
#include "accountsettings/BasicAccount.h"
#include "inspection/ListedAccount.h"
#include "inspection/StoreLayout.h"

namespace accounts {

// What the store makes of single accounts. It is the store that is asked: each account is made a
// record, and loaded, on its own. There must be a current process (accountsettings/Process).

/// Whether an account gets into a store, and what is found about it.
struct ExaminedAccount {
  /// Null for an account that a store leaves out; of a child also when its parent is left out.
  BasicAccountReference record;
  std::vector<Finding> findings;
};

/// Looks at a top-level account. `rejection` is what becomes of one that is no acceptable account
/// dictionary.
ExaminedAccount examineAccount(const ListedAccount& account, const StoreLayout& layout,
                               Effect rejection);

/// Looks at a child; `parent` is its parent's record, null when that is left out.
ExaminedAccount examineChild(const ListedAccount& child, const BasicAccountReference& parent,
                             const StoreLayout& layout);

/// Adds what is found about the dataclasses of a record.
void addDataclassFindings(const BasicAccount& record, const Finding& about,
                          std::vector<Finding>& findings);

/// A finding about an account, so far without anything found.
Finding findingAbout(const ListedAccount& account, const StoreLayout& layout);

/// Adds a finding about the same account.
void addFinding(std::vector<Finding>& findings, const Finding& about, Effect effect,
                std::string_view code, std::string text);

}  // namespace accounts
