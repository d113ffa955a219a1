#pragma once

namespace accounts {

/// Whether the programs are built with sanitizers, which make each run several times as slow. Tests
/// of many runs take fewer then, and say so.
#if defined(__SANITIZE_ADDRESS__)
inline constexpr bool kWithSanitizers = true;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
inline constexpr bool kWithSanitizers = true;
#else
inline constexpr bool kWithSanitizers = false;
#endif
#else
inline constexpr bool kWithSanitizers = false;
#endif

}  // namespace accounts
