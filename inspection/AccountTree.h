#pragma once

#include "inspection/PropertyListJSON.h"
#include "inspection/StoreLayout.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

/// Appends the accounts of a store's root to a list, each as an object for programs (docs/json.md)
/// with its children in it. A root of a kind without accounts appends none.
void appendAccountTree(JSON& list, const PropertyDictionary& root, FileKind kind, Secrets secrets);

}  // namespace accounts
