#include "tests/program/AccountsctlFixture.h"

namespace accounts {
namespace {

class AccountsctlDiff : public AccountsctlFixture {
 protected:
  [[nodiscard]] std::string settings(std::string_view name, PropertyValue version,
                                     std::string_view password = "x") const {
    const PropertyDictionary account = {
        {"Type", "Mail"}, {"Identifier", "A"}, {"Password", password}, {"Username", "ada"}};
    return write(name, PropertyDictionary{{"Version", std::move(version)},
                                          {"Accounts", PropertyArray{account}}});
  }
};

TEST_F(AccountsctlDiff, EqualFilesGiveNothingAndZero) {
  const ProgramResult result = run({"diff", settings("a", 12), settings("b", 12)});

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(result.output, "");
  EXPECT_EQ(result.errors, "");
}

TEST_F(AccountsctlDiff, TheFormatOfTheFilesDoesNotMatter) {
  const std::string binary = settings("a", 12);
  run({"convert", binary, path("b"), "--to", "xml"});

  EXPECT_EQ(run({"diff", binary, path("b")}).exitStatus, 0);
}

TEST_F(AccountsctlDiff, FilesThatDifferGiveOne) {
  const ProgramResult result = run({"diff", settings("a", 11), settings("b", 12)});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_EQ(result.output, "- Version: 11\n+ Version: 12\n");
  EXPECT_EQ(result.errors, "");
}

TEST_F(AccountsctlDiff, SecretsThatDifferAreHiddenUnlessAskedFor) {
  const std::string before = settings("a", 12, "swordfish");
  const std::string after = settings("b", 12, "herring");

  const ProgramResult hidden = run({"diff", before, after});
  const ProgramResult shown = run({"diff", "--show-secrets", before, after});

  EXPECT_EQ(hidden.exitStatus, kAttention);
  EXPECT_EQ(hidden.output.find("swordfish"), std::string::npos);
  EXPECT_NE(shown.output.find("    - Password: swordfish\n    + Password: herring\n"),
            std::string::npos)
      << shown.output;
  EXPECT_EQ(run({"diff", "--json", before, after}).output.find("herring"), std::string::npos);
}

TEST_F(AccountsctlDiff, WithJSONTheDifferenceIsOneObject) {
  const ProgramResult result = run({"diff", "--json", settings("a", 11), settings("b", 12)});

  EXPECT_EQ(result.exitStatus, kAttention);
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["command"], "diff");
  EXPECT_EQ(object["kind"], "accountSettings");
  EXPECT_EQ(object["same"], false);
  EXPECT_EQ(object["exitStatus"], kAttention);
  ASSERT_EQ(object["parts"].size(), 1U);
  EXPECT_EQ(object["parts"][0]["part"], nullptr);
  EXPECT_EQ(object["parts"][0]["properties"],
            nlohmann::json::array({{{"path", "Version"}, {"before", 11}, {"after", 12}}}));
}

TEST_F(AccountsctlDiff, MigrationInformationIsComparedStoreByStore) {
  const auto information = [](int version) {
    return PropertyDictionary{
        {"OldMailAccounts", PropertyDictionary{}},
        {"NewAccounSettings",
         PropertyDictionary{{"Accounts", PropertyArray{}}, {"Version", version}}}};
  };

  EXPECT_EQ(run({"diff", write("a", information(11)), write("b", information(12))}).output,
            "NewAccounSettings\n"
            "- Version: 11\n"
            "+ Version: 12\n");
}

TEST_F(AccountsctlDiff, OneFileMayBeStandardInput) {
  const std::string file = settings("a", 12);

  EXPECT_EQ(runRedirected({"diff", file, "-"}, "< '" + file + "'").exitStatus, 0);
  expectRefused(run({"diff", "-", "-"}), kUnusableArguments, "standard input");
}

TEST_F(AccountsctlDiff, FilesOfDifferentKindsCannotBeCompared) {
  expectRefused(run({"diff", settings("a", 12),
                     write("b", PropertyDictionary{{"MailAccounts", PropertyArray{}}})}),
                kMalformedInput, "different kinds");
}

TEST_F(AccountsctlDiff, AMissingFileIsNoDifference) {
  expectRefused(run({"diff", settings("a", 12), path("none")}), kMissingInput, "none");
  expectRefused(run({"diff", path("none"), settings("a", 12)}), kMissingInput, "none");
}

}  // namespace
}  // namespace accounts
