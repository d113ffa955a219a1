#pragma once

#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Platform.h"
#include "report/MigrationRecorder.h"

namespace accounts {

/// A platform that records what a migration does on another one: its stages, the files that it
/// changes (but for temporary ones), its log lines. Both arguments must outlive it.
class RecordedPlatform {
 public:
  RecordedPlatform(const Platform& platform, MigrationRecorder& recorder);
  ~RecordedPlatform();

  /// Valid as long as this object.
  [[nodiscard]] Platform& platform();

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

}  // namespace accounts
