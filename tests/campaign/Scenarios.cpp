#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/campaign/Run.h"
#include "tests/campaign/Scenario.h"
#include "tests/fakes/StoreContents.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

namespace fs = std::filesystem;

constexpr std::string_view kInformationPreference =
    "/var/mobile/Library/Preferences/com.quarx.accountsettings-logging.plist";
constexpr std::string_view kCrashReports = "/var/mobile/Library/Logs/CrashReporter";
constexpr std::string_view kCopyAside =
    "/var/mobile/Library/Logs/CrashReporter/com.quarx.accountsettings.plist";

PropertyDictionary dictionaryOf(const std::string& bytes, const std::string& origin) {
  const auto value = readPropertyList(bytes);
  if (!value || value->asDictionary() == nullptr) {
    throw std::runtime_error(origin + ": " + (value ? "no dictionary" : value.error().text));
  }
  return *value->asDictionary();
}

std::string bytesOf(const PropertyDictionary& dictionary) {
  return writeBinaryPropertyList(dictionary).value();
}

std::string textOfFile(const fs::path& path) {
  std::ifstream stream(path, std::ios::binary);
  if (!stream) {
    throw std::runtime_error(path.string() + " cannot be read");
  }
  return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

/// What every device has.
SimulatedDisk emptyDevice() {
  SimulatedDisk disk;
  for (const std::string_view path :
       {"/tmp", "/var/mobile/tmp", "/var/mobile/Library/Preferences", "/var/mobile/Library/Mail",
        "/var/mobile/Library/Logs/CrashReporter"}) {
    disk.addDirectory(path);
  }
  disk.addFile("/etc/passwd",
               "root:*:0:0::/var/root:/bin/sh\nmobile:*:501:501::/var/mobile:/bin/sh\n");
  disk.addFile("/etc/group", "wheel:*:0:root\nmobile:*:501:\n");
  return disk;
}

/// Builds a scenario in one line of parts.
class ScenarioBuilder {
 public:
  explicit ScenarioBuilder(std::string name) : scenario_{std::move(name), emptyDevice()} {}

  ScenarioBuilder& with(std::string_view path, std::string contents) {
    scenario_.disk.addFile(path, std::move(contents));
    return *this;
  }
  ScenarioBuilder& with(std::string_view path, const PropertyDictionary& dictionary) {
    return with(path, bytesOf(dictionary));
  }
  ScenarioBuilder& withInformation() {
    return with(kInformationPreference, PropertyDictionary{{"ASSaveMigrationInformation", true}});
  }
  ScenarioBuilder& doing(Scenario::Action action) {
    scenario_.action = action;
    return *this;
  }
  ScenarioBuilder& onTransaction() {
    scenario_.host = Scenario::Host::Transaction;
    return *this;
  }
  operator Scenario() const { return scenario_; }

 private:
  Scenario scenario_;
};

AccountDictionary account(std::string_view identifier, std::string_view type,
                          std::string_view accountClass) {
  return anAccount(identifier, type, accountClass)
      .with(kAccountDisplayName, identifier)
      .with(kAccountUsername, "anna");
}

PropertyDictionary settings(PropertyValue version) {
  return accountSettings(std::move(version),
                         {account("CALDAV-1", kCalDAVAccountType, "CalDAVAccount"),
                          account("IMAP-1", kMailAccountType, "IMAPAccount"),
                          account("EX-1", kExchangeAccountType, "ASAccount")});
}

PropertyDictionary legacyMail() {
  return mailStore(
      {aMailDescription("OLD-IMAP", "IMAPAccount").with(kAccountUsername, "anna"),
       aMailDescription("OLD-GMAIL", "GmailAccount").with(kAccountUsername, "anna@gmail.com")},
      {aMailDescription("OLD-SMTP", "SMTPAccount")});
}

PropertyDictionary legacyExchange() {
  return exchangeStore({anExchangeDescription("OLD-EX").with(kLegacyExchangeDisplayName, "Work")});
}

/// A legacy store with one description that cannot be converted.
PropertyDictionary brokenExchange() {
  return exchangeStore({PropertyDictionary{{kLegacyExchangeDisplayName, "Work"}}});
}

std::string original(std::string_view path) {
  return std::string(path) + ".original";
}

/// A device of tests/fixtures/versions.
Scenario fixture(const std::string& name) {
  Scenario scenario = {"version-" + name, emptyDevice()};
  const fs::path before = fs::path(SOURCE_DIRECTORY) / "tests/fixtures/versions" / name / "before";
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(before)) {
    if (!entry.is_regular_file()) {
      continue;
    }
    const std::string path = "/" + entry.path().lexically_relative(before).string();
    const std::string text = textOfFile(entry.path());
    if (path == kDeviceDescriptionPath) {
      scenario.description = deviceDescriptionFromDictionary(dictionaryOf(text, path));
    } else {
      scenario.disk.addFile(path, bytesOf(dictionaryOf(text, entry.path().string())));
    }
  }
  return scenario;
}

std::vector<Scenario> scenariosOfMigrations() {
  using Builder = ScenarioBuilder;
  const std::string damaged = "This is no property list.";
  const std::string cutOff = bytesOf(settings(12)).substr(0, 100);
  std::vector<Scenario> scenarios = {
      Builder("no-file"),
      Builder("current-settings").with(kSettingsPath, settings(12)),
      Builder("mail").with(kLegacyMailPath, legacyMail()),
      Builder("exchange").with(kLegacyExchangePath, legacyExchange()),
      Builder("mail-and-exchange")
          .with(kLegacyMailPath, legacyMail())
          .with(kLegacyExchangePath, legacyExchange()),
      Builder("mail-with-settings")
          .with(kLegacyMailPath, legacyMail())
          .with(kSettingsPath, settings(12)),
      Builder("exchange-with-settings")
          .with(kLegacyExchangePath, legacyExchange())
          .with(kSettingsPath, settings(12)),
      Builder("mail-and-exchange-with-settings")
          .with(kLegacyMailPath, legacyMail())
          .with(kLegacyExchangePath, legacyExchange())
          .with(kSettingsPath, settings(12)),
      Builder("mail-and-exchange-with-old-settings")
          .with(kLegacyMailPath, legacyMail())
          .with(kLegacyExchangePath, legacyExchange())
          .with(kSettingsPath, settings(9)),
      Builder("originals-and-copies")
          .with(kLegacyMailPath, legacyMail())
          .with(original(kLegacyMailPath), legacyMail())
          .with(original(kLegacyExchangePath), legacyExchange())
          .with("/var/mobile/Library/Mail/AutoFetchEnabled", "")
          .with(kCopyAside, settings(3))
          .with(kSettingsPath, settings(11)),
      Builder("information-of-mail").withInformation().with(kLegacyMailPath, legacyMail()),
      Builder("information-of-upgrade").withInformation().with(kSettingsPath, settings(10)),
      Builder("information-of-nothing").withInformation().with(kSettingsPath, settings(12)),
      Builder("information-directory-is-a-file")
          .withInformation()
          .with(std::string(kCrashReports) + "/AccountMigration", "")
          .with(kSettingsPath, settings(11)),
      Builder("removal-not-begun")
          .with(kSentinelPath, "")
          .with(kLegacyMailPath, legacyMail())
          .with(kLegacyExchangePath, legacyExchange())
          .with(kSettingsPath, settings(12)),
      Builder("removal-half-done")
          .with(kSentinelPath, "Old Account Information Removal Sentinel")
          .with(kLegacyMailPath, legacyMail())
          .with(kSettingsPath, settings(12)),
      Builder("removal-done").with(kSentinelPath, "").with(kSettingsPath, settings(12)),
      Builder("settings-without-version")
          .with(kSettingsPath, PropertyDictionary{{kPlistAccountsKey,
                                                   PropertyArray{account("IMAP-1", kMailAccountType,
                                                                         "IMAPAccount")}}}),
      Builder("damaged-settings").with(kSettingsPath, damaged),
      Builder("cut-off-settings").with(kSettingsPath, cutOff),
      Builder("empty-settings").with(kSettingsPath, ""),
      Builder("damaged-settings-with-mail")
          .with(kSettingsPath, damaged)
          .with(kLegacyMailPath, legacyMail()),
      Builder("damaged-mail").with(kLegacyMailPath, damaged).with(kSettingsPath, settings(12)),
      Builder("damaged-exchange")
          .with(kLegacyExchangePath, damaged)
          .with(kSettingsPath, settings(12)),
      Builder("damaged-exchange-with-mail")
          .with(kLegacyExchangePath, "")
          .with(kLegacyMailPath, legacyMail())
          .with(kSettingsPath, settings(12)),
      Builder("broken-exchange-description")
          .with(kLegacyExchangePath, brokenExchange())
          .with(kSettingsPath, settings(12)),
  };
  // One version before each group of steps: those that do not save, those that do, none.
  for (const char* name :
       {"0", "6", "9", "12", "none", "3-newer-processor", "12-with-legacy-mail"}) {
    scenarios.push_back(fixture(name));
  }
  return scenarios;
}

/// A device on which a migration that keeps the files was killed when it had replaced the settings
/// file.
Scenario killedMigration(std::string name, Scenario scenario) {
  scenario.name = std::move(name);
  scenario.keep = KeepFiles::Always;
  const Run run =
      runOn(scenario.disk, scenario, {.recording = SimulatedKernel::Recording::On, .number = 0});
  const std::optional<std::string> before = scenario.disk.contentsOf(kSettingsPath);
  for (const DiskChange& change : run.changes) {
    scenario.disk.apply(change);
    if (scenario.disk.contentsOf(kSettingsPath) != before) {
      break;
    }
  }
  return scenario;
}

/// A device on which one has come to its end.
Scenario keptMigration(std::string name, Scenario scenario) {
  scenario.name = std::move(name);
  scenario.keep = KeepFiles::Always;
  scenario.disk = runOn(scenario.disk, scenario, {.number = 0}).disk;
  return scenario;
}

/// Puts back what a migration kept.
Scenario restorationOf(Scenario scenario) {
  scenario.action = Scenario::Action::Restoration;
  return scenario;
}

Scenario keeping(std::string name, Scenario scenario) {
  scenario.name = std::move(name);
  scenario.keep = KeepFiles::Always;
  return scenario;
}

Scenario on(const FileSystemAbilities& abilities, std::string name, Scenario scenario) {
  scenario.name = std::move(name);
  scenario.abilities = abilities;
  return scenario;
}

}  // namespace

std::vector<Scenario> allScenarios(Scenario::Host host) {
  std::vector<Scenario> scenarios = scenariosOfMigrations();
  if (host == Scenario::Host::Bare) {
    scenarios.push_back(ScenarioBuilder("save-outside-a-migration")
                            .with(kSettingsPath, settings(12))
                            .doing(Scenario::Action::SaveOutsideMigration));
    return scenarios;
  }
  const Scenario both = ScenarioBuilder("")
                            .with(kLegacyMailPath, legacyMail())
                            .with(kLegacyExchangePath, legacyExchange())
                            .with(kSettingsPath, settings(9))
                            .onTransaction();
  constexpr FileSystemAbilities kNoExchange = {.exchangesNames = false};
  constexpr FileSystemAbilities kPlain = {
      .exchangesNames = false, .sparesNames = false, .hasFlags = false};
  scenarios.push_back(keeping("keeping", both));
  scenarios.push_back(killedMigration("after-a-kill", both));
  scenarios.push_back(on(kNoExchange, "without-exchange", both));
  scenarios.push_back(on(kPlain, "plain-renames", both));
  scenarios.push_back(on(kPlain, "keeping-with-plain-renames", keeping("", both)));
  scenarios.push_back(restorationOf(keptMigration("restoration", both)));
  scenarios.push_back(restorationOf(killedMigration("restoration-after-a-kill", both)));
  for (Scenario& scenario : scenarios) {
    scenario.host = host;
  }
  return scenarios;
}

}  // namespace accounts
