#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "platform/ForwardingFileSystem.h"
#include "safetynet/SettingsSaves.h"

namespace accounts {

/// Another file system, seen through something that notices the plug-in's saves. A save reports its
/// outcome to nobody, but it has a form of its own: it alone makes a temporary file, and what it
/// wrote replaces the settings file by a rename.
class SaveObserver final : public ForwardingFileSystem {
 public:
  /// `files` must outlive this.
  SaveObserver(FileSystem& files, std::string settingsPath)
      : ForwardingFileSystem(files), settingsPath_(std::move(settingsPath)) {}

  [[nodiscard]] const SettingsSaves& saves() const { return saves_; }

  std::optional<std::string> makeTemporaryFile() override;
  Result renameFile(std::string_view source, std::string_view destination) override;

 private:
  std::string settingsPath_;
  SettingsSaves saves_;
};

}  // namespace accounts
