#pragma once

#include <string>

namespace accounts {

/// What the migration host sees of a plug-in: one instance serves one migration.
class MigrationPluginBase {
 public:
  virtual ~MigrationPluginBase() = default;

  /// The name under which the host knows the plug-in's data.
  virtual std::string dataClassName() = 0;
  /// Runs the migration on the calling thread. Called once. Returns whether it succeeded.
  virtual bool performMigration() = 0;
};

}  // namespace accounts
