#pragma once

#include <string>
#include <vector>

#include "inspection/PropertyListJSON.h"

namespace accounts {

/// What the lines of a MigrationRecorder come to, in the words of docs/json.md.
struct RecordedMigration {
  /// The stages in order, each an object. One that did not end has neither "succeeded" nor
  /// "seconds"; what was done outside all stages is in one without a name.
  JSON stages = JSON::array();
  /// "before" and "after", each null for none.
  JSON versions = {{"before", nullptr}, {"after", nullptr}};
  JSON accountsBefore = JSON::array();
  JSON accountsAfter = JSON::array();

  /// Lines that are no JSON, and what is not known in others, count for nothing.
  static RecordedMigration fromLines(const std::vector<std::string>& lines);
};

}  // namespace accounts
