#pragma once

#include <optional>
#include <string>

#include "commandline/Terminal.h"
#include "host/DeviceOptions.h"
#include "host/ReportFiles.h"
#include "propertylist/value/SecretKeys.h"
#include "safetynet/MigrationRun.h"

namespace accounts {

/// One run of the plug-in, or a plan of one.
struct RunOptions {
  DeviceOptions device;
  /// A migration or a plan.
  RunPurpose purpose = RunPurpose::Migration;
  /// Runs the plug-in on the device itself, save by save.
  bool bare = false;
  KeepFiles keep = KeepFiles::WhenNeeded;
  /// Whether what the plug-in announces is announced on the system's D-Bus, too.
  bool broadcastsOnDBus = false;
  /// How values are recorded; none for a run that is not recorded.
  std::optional<Secrets> recorded;
  /// The account whose story is told in the place of the whole plan; none for the whole.
  std::optional<std::string> account;
  /// Whether the result is one JSON object, and how people see it otherwise.
  bool wantsJSON = false;
  Terminal terminal;
  ReportFiles reports;
};

/// Migrates one device root, or plans it, and tells of it: reports in their files, the result on
/// standard output, warnings and errors on standard error. Nothing beneath the root is changed
/// unless the whole migration was made in memory and verified; with a plan, nothing at all. Every
/// error is told in the same way. Returns how the program ends.
ExitStatus runMigration(const RunOptions& options);

}  // namespace accounts
