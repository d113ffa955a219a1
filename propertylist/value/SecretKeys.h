#pragma once

#include <string_view>

namespace accounts {

/// Whether secrets are shown to whoever reads what is written for people.
enum class Secrets { Hide, Show };

/// Whether what stands under a key is a secret by the key's name, such as "Password", "userPin" or
/// "OAuth-Token" (docs/secrets.md). Only letters count, large or small.
bool isSecretKey(std::string_view key);

}  // namespace accounts
