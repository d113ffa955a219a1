#pragma once

#include <string_view>

#include "propertylist/PropertyValue.h"

namespace accounts {

/// What stands in the place of a value that is not shown.
inline constexpr std::string_view kHiddenValue = "(hidden)";

/// Whether secrets are shown to whoever reads what is written for people.
enum class Secrets { Hide, Show };

/// Whether what stands under a key is a secret by the key's name, such as "Password" or
/// "OAuth-Token". Capitals and everything but letters and digits in the name do not matter.
bool isSecretKey(std::string_view key);

/// A value as it may be shown under a key: `kHiddenValue` in the place of a secret, and of secrets
/// anywhere within the value. Booleans, dates and what is empty give nothing away and are never
/// hidden.
PropertyValue withSecretsHidden(std::string_view key, const PropertyValue& value);
/// The same for a value that stands under no key.
PropertyValue withSecretsHidden(const PropertyValue& value);

}  // namespace accounts
