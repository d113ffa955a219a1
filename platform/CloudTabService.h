#pragma once

namespace accounts {

/// Whether the user's cloud tabs are on, as announced.
enum class CloudTabs { Off, On };

/// The browser's cloud tabs.
class CloudTabService {
 public:
  virtual ~CloudTabService() = default;

  /// Announces that cloud tabs were switched on or off. No answer is awaited.
  virtual void announce(CloudTabs state) = 0;
};

}  // namespace accounts
