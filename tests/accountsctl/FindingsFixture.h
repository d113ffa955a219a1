#pragma once

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "accountsctl/Finding.h"
#include "accountsctl/LegacyFindings.h"
#include "accountsctl/SettingsFindings.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/StoreContents.h"

namespace accounts {

/// A fake device on which files are checked.
class FindingsFixture : public testing::Test {
 protected:
  using Lines = std::vector<std::string>;

  static AccountDictionary mail(std::string_view identifier) {
    return anAccount(identifier, "Mail", "IMAPAccount");
  }

  /// Findings as "PLACE EFFECT CODE".
  static Lines linesOf(const std::vector<Finding>& findings) {
    Lines lines;
    for (const Finding& finding : findings) {
      lines.push_back((finding.place.empty() ? "file" : finding.place) + " " +
                      std::string(nameOf(finding.effect)) + " " + std::string(finding.code));
    }
    return lines;
  }
  /// Those of a settings file with these accounts.
  static Lines found(PropertyArray accountDictionaries) {
    return linesOf(findingsInSettings(accountSettings(12, std::move(accountDictionaries))));
  }

  FakeProcess device;
};

}  // namespace accounts
