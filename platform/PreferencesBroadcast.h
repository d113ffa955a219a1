#pragma once

#include <string_view>

namespace accounts {

/// Tells applications that their preferences changed.
class PreferencesBroadcast {
 public:
  virtual ~PreferencesBroadcast() = default;

  /// Announces that the preferences of an application, given by its identifier, changed under a
  /// key.
  virtual void announceChange(std::string_view application, std::string_view key) = 0;
};

}  // namespace accounts
