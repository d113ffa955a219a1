#pragma once

#include <string>
#include <string_view>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What stands in the place of what is not shown.
inline constexpr std::string_view kHiddenValue = "(hidden)";

/// A value as it may be shown under a key: `kHiddenValue` in the place of a secret (isSecretKey())
/// and of secrets anywhere within the value, and of the user information of URLs in texts.
/// Booleans, dates and what is empty give nothing away and are never hidden.
PropertyValue withSecretsHidden(std::string_view key, const PropertyValue& value);
/// The same for a value that stands under no key.
PropertyValue withSecretsHidden(const PropertyValue& value);

/// A text with `kHiddenValue` in the place of the user information of the URLs in it, as in
/// "https://(hidden)@mail.example/".
std::string textWithSecretsHidden(std::string_view text);

}  // namespace accounts
