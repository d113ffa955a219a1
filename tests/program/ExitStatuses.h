#pragma once

// What the programs' exit statuses mean, as their help tells. The tests have numbers of their own:
// scripts rely on these, whatever the programs' code calls them.
namespace accounts {

/// accountsctl's answer is one that its caller may want to act on.
inline constexpr int kAttention = 1;
inline constexpr int kMigrationFailed = 1;
inline constexpr int kVerificationFailed = 2;
/// Migrated, but not everything was carried over.
inline constexpr int kNotAllCarriedOver = 3;
inline constexpr int kUnusableArguments = 64;
inline constexpr int kMalformedInput = 65;
inline constexpr int kMissingInput = 66;
inline constexpr int kPluginEnded = 70;
inline constexpr int kCannotCreate = 73;
inline constexpr int kInputOutputError = 74;
/// What stands in the way may pass.
inline constexpr int kMayPass = 75;

}  // namespace accounts
