#pragma once

#include <filesystem>
#include <memory>
#include <optional>

#include "commandline/BundleLocation.h"
#include "commandline/ExitStatus.h"
#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"

namespace accounts {

/// A plug-in in this process.
class LoadedPlugin {
 public:
  using EntryPoint = MigrationPluginBase*(Platform&);
  explicit LoadedPlugin(EntryPoint& entryPoint) : entryPoint_(entryPoint) {}

  /// Makes one instance of its principal class. The platform must stay alive as long as the
  /// process. An error when it makes none.
  [[nodiscard]] OrProgramError<std::unique_ptr<MigrationPluginBase>> makeInstance(
      Platform& platform) const;

 private:
  EntryPoint& entryPoint_;
};

/// A plug-in bundle: a directory with the plug-in and its resources.
class PluginBundle {
 public:
  /// The bundle at a path, or that of the running program. Nothing is loaded yet. An error
  /// when there is no such directory or no plug-in in it.
  static OrProgramError<PluginBundle> find(const std::optional<std::filesystem::path>& path);

  [[nodiscard]] const std::filesystem::path& path() const { return path_; }
  [[nodiscard]] std::filesystem::path resourcesDirectory() const {
    return resourcesOfBundle(path_);
  }

  /// Loads the plug-in into this process, for good. An error when it cannot be loaded or has no
  /// entry point.
  [[nodiscard]] OrProgramError<LoadedPlugin> load() const;

 private:
  explicit PluginBundle(std::filesystem::path path) : path_(std::move(path)) {}
  [[nodiscard]] std::filesystem::path plugin() const;

  std::filesystem::path path_;
};

}  // namespace accounts
