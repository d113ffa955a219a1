#pragma once

#include <string_view>

/// The names of the lines of a recording.
namespace accounts::events {

inline constexpr std::string_view kBefore = "before";
inline constexpr std::string_view kAfter = "after";
inline constexpr std::string_view kBegan = "began";
inline constexpr std::string_view kEnded = "ended";
inline constexpr std::string_view kFile = "file";
inline constexpr std::string_view kLog = "log";

/// In the lines of the accounts before and after.
inline constexpr std::string_view kVersion = "version";
inline constexpr std::string_view kAccounts = "accounts";

}  // namespace accounts::events
