#include "propertylist/PropertyListFile.h"
#include "tests/program/AccountsctlFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

constexpr const char* kLongName =
    "A name that goes on for more columns than a terminal has, since people describe their "
    "accounts in "
    "sentences";
constexpr const char* kIdentifier = "5C0F1A3E-3A5B-4E0C-9D1E-8F6B7A2C4D11";

class AccountsctlShow : public AccountsctlFixture {
 protected:
  /// A settings file with an account that has a long name, and a child.
  [[nodiscard]] std::string familyFile() const {
    return write(
        "family",
        PropertyDictionary{
            {"Version", 12},
            {"Accounts", PropertyArray{PropertyDictionary{
                             {"Type", "Mail"},
                             {"Identifier", kIdentifier},
                             {"DisplayName", kLongName},
                             {"Username", "ada"},
                             {"Enabled Dataclasses", PropertyArray{"com.quarx.Dataclass.Notes",
                                                                   "com.quarx.Dataclass.Mail"}},
                             {"ChildAccounts", PropertyArray{PropertyDictionary{
                                                   {"Type", "SMTP"},
                                                   {"Identifier", "C"},
                                                   {"DisplayName", "A\tname\nof two lines"}}}}}}}});
  }
  /// What the program writes to a terminal of so many columns.
  [[nodiscard]] static std::string onATerminal(const std::vector<std::string>& arguments,
                                               const std::string& columns) {
    std::string command = "exec " + accountsctl();
    for (const std::string& argument : arguments) {
      command += " '" + argument + "'";
    }
    // script(1) gives the program a terminal.
    return runProgram({.program = "script",
                       .arguments = {"--quiet", "--return", "--command", command, "/dev/null"},
                       .environment = {{"COLUMNS", columns}, {"NO_COLOR", "1"}}})
        .output;
  }
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

TEST_F(AccountsctlShow, InAPipeEachAccountIsOneLineOfFieldsBetweenTabs) {
  const ProgramResult result = run({"show", familyFile()});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.errors, "");
  EXPECT_EQ(result.output,
            "Account settings, version 12 (current is 12)\n"
            "1 account and 1 child\n"
            "\tType\tName\tUser\tEnabled\tIdentifier\n"
            "1\tMail\t" +
                std::string(kLongName) + "\tada\tNotes Mail\t" + kIdentifier + "\n" +
                "1.1\tSMTP\tA\\tname\\nof two lines\t\t\tC\n");
}

TEST_F(AccountsctlShow, OnATerminalLongCellsAreCutAndIdentifiersAreNot) {
  for (const char* columns : {"30", "60", "80", "100"}) {
    const std::string output = onATerminal({"show", familyFile()}, columns);
    EXPECT_NE(output.find(kIdentifier), std::string::npos) << output;
    EXPECT_NE(output.find("\u2026"), std::string::npos) << output;
    EXPECT_EQ(output.find(kLongName), std::string::npos) << output;
    // A heading, two lines before the table, and two accounts of one line each.
    EXPECT_EQ(std::count(output.begin(), output.end(), '\n'), 5) << output;
  }
}

TEST_F(AccountsctlShow, OnATerminalLongCellsAreShownWholeOnRequest) {
  std::string output = onATerminal({"show", "--full", familyFile()}, "80");

  EXPECT_NE(output.find(kIdentifier), std::string::npos) << output;
  EXPECT_EQ(output.find("\u2026"), std::string::npos) << output;
  for (const char* word : {"A", "name", "that", "goes", "on"}) {
    EXPECT_NE(output.find(word), std::string::npos) << word;
  }
  EXPECT_GT(std::count(output.begin(), output.end(), '\n'), 5) << output;
}

TEST_F(AccountsctlShow, AWideTerminalCutsNothing) {
  const std::string output = onATerminal({"show", familyFile()}, "300");

  EXPECT_NE(output.find(kLongName), std::string::npos) << output;
  EXPECT_EQ(output.find("\u2026"), std::string::npos) << output;
}

TEST_F(AccountsctlShow, OnATerminalPropertiesAreCutAsWell) {
  const std::string output = onATerminal({"show", "--properties", familyFile()}, "80");
  EXPECT_NE(output.find("\u2026\r\nEnabled Dataclasses"), std::string::npos) << output;

  EXPECT_NE(run({"show", "--properties", familyFile()})
                .output.find("\nDisplayName\t" + std::string(kLongName) + "\n"),
            std::string::npos);
}

TEST_F(AccountsctlShow, AReaderThatGoesAwayIsNoError) {
  const std::string file = write("long", PropertyDictionary{{"text", std::string(300'000, 'x')}});
  for (const char* command :
       {"\"$0\" show \"$1\"", "\"$0\" convert --to xml \"$1\" -", "\"$0\" show --json \"$1\""}) {
    const ProgramResult result = runProgram(
        {.program = "/bin/sh",
         .arguments = {"-c", "{ " + std::string(command) + "; echo $? >&2; } | head -c 1",
                       accountsctl(), file}});

    EXPECT_EQ(result.errors, "0\n") << command;
  }
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

  EXPECT_EQ(readPropertyList(result.output), readValue("file"));
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
