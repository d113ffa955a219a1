#include "propertylist/PropertyListFile.h"
#include "tests/program/AccountsctlFixture.h"

namespace accounts {
namespace {

class AccountsctlShow : public AccountsctlFixture {
 protected:
  /// A settings file with an account that has a password.
  [[nodiscard]] std::string settingsFile() const {
    return write("settings",
                 PropertyDictionary{
                     {"Version", 12},
                     {"Accounts", PropertyArray{PropertyDictionary{{"Type", "Mail"},
                                                                   {"Class", "IMAPAccount"},
                                                                   {"Identifier", "M"},
                                                                   {"Password", "swordfish"}}}}});
  }
};

TEST_F(AccountsctlShow, APersonSeesTablesWithoutColours) {
  const ProgramResult result = run({"show", settingsFile()});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  EXPECT_EQ(result.output,
            "Account settings, version 12 (current is 12)\n"
            "1 account and 0 children\n"
            "   Type  Name  User  Enabled  Identifier\n"
            "1  Mail                       M\n");
}

TEST_F(AccountsctlShow, StandardInputIsShownToo) {
  const std::string file = settingsFile();

  EXPECT_EQ(runRedirected({"show", "-"}, "< '" + file + "'").output, run({"show", file}).output);
}

TEST_F(AccountsctlShow, TheSampleDeviceIsShownAsWhatItIs) {
  const std::string library = SOURCE_DIRECTORY "/examples/sample-device/var/mobile/Library/";

  EXPECT_TRUE(run({"show", library + "Preferences/com.quarx.accountsettings.plist"})
                  .output.starts_with("Account settings, version 1 (current is 12)\n"));
  EXPECT_TRUE(run({"show", library + "Mail/Accounts.plist"})
                  .output.starts_with("Legacy mail accounts\n3 incoming accounts\n"));
  EXPECT_TRUE(run({"show", library + "Preferences/com.quarx.DataAccess.plist"})
                  .output.starts_with("Legacy Exchange accounts\n"));
  EXPECT_TRUE(run({"show", SOURCE_DIRECTORY "/examples/sample-device/etc/device.plist"})
                  .output.starts_with("Device description\n"));
}

TEST_F(AccountsctlShow, WithJSONTheContentIsOneObject) {
  const std::string file = settingsFile();

  const nlohmann::json object = onlyObject(run({"show", "--json", file}));

  EXPECT_EQ(object["command"], "show");
  EXPECT_EQ(object["file"], file);
  EXPECT_EQ(object["kind"], "accountSettings");
  EXPECT_EQ(object["content"]["Version"], 12);
  EXPECT_EQ(object["content"]["Accounts"][0]["Identifier"], "M");
  EXPECT_EQ(object["exitStatus"], 0);
}

TEST_F(AccountsctlShow, InJSONEveryKindHasItsForm) {
  const std::string file =
      write("values", PropertyDictionary{{"data", PropertyData("\x01\xFF")},
                                         {"date", PropertyDate{0.5}},
                                         {"large", std::numeric_limits<std::uint64_t>::max()},
                                         {"nan", std::numeric_limits<double>::quiet_NaN()},
                                         {"real", 0.5},
                                         {"true", true}});

  EXPECT_EQ(onlyObject(run({"show", "--json", file}))["content"],
            (nlohmann::json{{"data", "<01ff>"},
                            {"date", "2001-01-01T00:00:00.5Z"},
                            {"large", std::numeric_limits<std::uint64_t>::max()},
                            {"nan", "NaN"},
                            {"real", 0.5},
                            {"true", true}}));
}

TEST_F(AccountsctlShow, WithXMLTheContentIsAPropertyList) {
  const std::string file = write("file", PropertyDictionary{{"Version", 12}});

  const ProgramResult result = run({"show", "--xml", file});

  PropertyListError error;
  EXPECT_EQ(readPropertyList(result.output, error), readValue("file"));
}

TEST_F(AccountsctlShow, ContentThatXMLCannotHoldIsAnErrorWithItsPlace) {
  const std::string file = write("file", PropertyDictionary{{"a", "\x01"}});

  expectRefused(run({"show", "--xml", file}), kMalformedInput, "at /a");
}

TEST_F(AccountsctlShow, SecretsAreHiddenInEveryForm) {
  const std::string file = settingsFile();
  for (const char* form : {"--properties", "--json", "--xml"}) {
    const std::string output = run({"show", form, file}).output;
    EXPECT_EQ(output.find("swordfish"), std::string::npos) << output;
    EXPECT_NE(output.find("(hidden)"), std::string::npos) << output;
  }
}

TEST_F(AccountsctlShow, SecretsAreShownOnRequestInEveryForm) {
  const std::string file = settingsFile();
  for (const char* form : {"--properties", "--json", "--xml"}) {
    const std::string output = run({"show", "--show-secrets", form, file}).output;
    EXPECT_NE(output.find("swordfish"), std::string::npos) << output;
    EXPECT_EQ(output.find("(hidden)"), std::string::npos) << output;
  }
}

TEST_F(AccountsctlShow, TheFileStaysAsItWas) {
  const std::string file = settingsFile();
  const std::string before = readText("settings");

  run({"show", file});

  EXPECT_EQ(readText("settings"), before);
  EXPECT_EQ(files(), std::vector<std::string>{"settings"});
}

}  // namespace
}  // namespace accounts
