#include "tests/program/AccountsctlFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

constexpr const char* kResults =
    R"({"root":"/i/1","exitStatus":0,"steps":["7A149"],"warnings":["Kept"]})"
    "\n"
    R"({"root":"/i/2","exitStatus":75,"error":"No space left on device"})"
    "\n"
    R"({"root":"/i/3","exitStatus":66,"error":"Cannot open /i/3: Missing"})"
    "\n";

/// The real `accountsctl summarize`.
class AccountsctlSummarize : public AccountsctlFixture {
 protected:
  [[nodiscard]] std::string results() const { return writeText("results.jsonl", kResults); }
};

TEST_F(AccountsctlSummarize, ShowsCountsByOutcomeStepAndError) {
  const ProgramResult result = run({"summarize", results(), "--expected", "5"});

  EXPECT_EQ(result.exitStatus, kAttention);
  EXPECT_EQ(result.errors, "");
  EXPECT_EQ(result.output,
            "Images\tStatus\tOutcome\n"
            "1\t0\tmigrated\n"
            "1\t66\tno such root, description or bundle\n"
            "1\t75\tsomething that may pass\n"
            "2\t\tno result yet\n"
            "3\t\tall results\n"
            "\n"
            "Images\tStep\n"
            "1\t7A149\n"
            "\n"
            "Images\tError\n"
            "1\tCannot open ROOT: Missing\n"
            "1\tNo space left on device\n"
            "\n"
            "1 migrated with warnings\n"
            "1 to run again: --list retry\n"
            "1 to look at before it is run again: --list attention\n");
}

TEST_F(AccountsctlSummarize, WritesOneJSONObject) {
  const nlohmann::json object = onlyObject(run({"summarize", results(), "--json"}));

  EXPECT_EQ(object["command"], "summarize");
  EXPECT_EQ(object["images"], 3);
  EXPECT_EQ(object["expected"], nullptr);
  EXPECT_EQ(object["outcomes"][0],
            (nlohmann::json{{"exitStatus", 0}, {"outcome", "migrated"}, {"images", 1}}));
  EXPECT_EQ(object["steps"][0], (nlohmann::json{{"step", "7A149"}, {"images", 1}}));
  EXPECT_EQ(object["errors"][0],
            (nlohmann::json{{"error", "Cannot open ROOT: Missing"}, {"images", 1}}));
  EXPECT_EQ(object["retry"], nlohmann::json::array({"/i/2"}));
  EXPECT_EQ(object["attention"], nlohmann::json::array({"/i/3"}));
  EXPECT_EQ(object["exitStatus"], kAttention);
}

TEST_F(AccountsctlSummarize, AFleetThatIsMigratedIsASuccess) {
  const std::string file = writeText("results.jsonl", R"({"root":"/a","exitStatus":0})");
  EXPECT_EQ(run({"summarize", file}).exitStatus, 0);
  EXPECT_EQ(run({"summarize", file, "--expected", "1"}).exitStatus, 0);
  EXPECT_EQ(run({"summarize", file, "--expected", "2"}).exitStatus, kAttention);
}

TEST_F(AccountsctlSummarize, ListsRootsForTheNextRun) {
  EXPECT_EQ(run({"summarize", results(), "--list", "retry"}).output, "/i/2\n");
  EXPECT_EQ(run({"summarize", results(), "--list", "attention"}).output, "/i/3\n");
  EXPECT_EQ(run({"summarize", results(), "--list", "migrated", "--null"}).output,
            std::string("/i/1\0", 5));
  EXPECT_EQ(run({"summarize", results(), "--list", "retry"}).exitStatus, 0);
}

TEST_F(AccountsctlSummarize, ListsRootsWithTheirReasons) {
  const std::string file =
      writeText("more.jsonl", std::string(kResults) + R"({"root":"/i/tab\there","exitStatus":70})"
                                                      "\n");

  EXPECT_EQ(run({"summarize", file, "--list", "attention", "--reasons"}).output,
            "/i/3\tCannot open ROOT: Missing\n"
            "/i/tab\\there\tthe plug-in ended by an assertion or a signal\n");
  expectRefused(run({"summarize", file, "--reasons"}), kUnusableArguments, "--list");
}

TEST_F(AccountsctlSummarize, ADirectoryIsTheResultsInIt) {
  std::filesystem::create_directory(path("all"));
  (void)writeText("all/b.json", R"({"root":"/i/1","exitStatus":0})");
  (void)writeText("all/a.json", R"({"root":"/i/2","exitStatus":75})");
  (void)writeText("all/.c.json", R"({"root":"/i/3","exitStatus":75})");
  (void)writeText("all/page.html", "no result");

  const nlohmann::json object = onlyObject(run({"summarize", "--json", path("all")}));

  EXPECT_EQ(object["images"], 2);
  EXPECT_EQ(object["unreadableLines"], 0);
}

TEST_F(AccountsctlSummarize, APageHasEveryImageWithALinkToItsReport) {
  std::filesystem::create_directory(path("reports"));
  (void)writeText("reports/a%2F1.json",
                  R"({"root":"/i/<1>","exitStatus":0,"warnings":["Kept & safe"],)"
                  R"("stages":[{"seconds":1.25},{"seconds":0.5},{}]})");
  (void)writeText("reports/a%2F1.html", "the page");
  (void)writeText("reports/b.json", R"({"root":"/i/2","exitStatus":70,"error":"It \"ended\""})");
  const std::string roots = writeText("roots", "/i/<1>\n/i/2\n/i/3\n");

  const ProgramResult result =
      run({"summarize", "--roots", roots, "--html", path("page.html"), path("reports")});

  EXPECT_EQ(result.exitStatus, kAttention) << result.errors;
  const std::string page = readText("page.html");
  const std::string migrated =
      "<tr><td><a href=\"reports/a%252F1.html\">/i/&lt;1&gt;</a></td><td>migrated</td>"
      "<td>Kept &amp; safe</td><td class=\"number\">1.750 s</td></tr>\n";
  const std::string ended =
      "<tr><td>/i/2</td><td>the plug-in ended by an assertion or a signal</td>"
      "<td>It &quot;ended&quot;</td><td class=\"number\"></td></tr>\n";
  const std::string missing =
      "<tr><td>/i/3</td><td>no result yet</td><td></td><td class=\"number\"></td></tr>\n";
  EXPECT_NE(page.find(ended + missing + migrated), std::string::npos) << page;
  EXPECT_NE(page.find("<td class=\"number\">1</td><td>no result yet</td>"), std::string::npos);
}

TEST_F(AccountsctlSummarize, APageNeedsAFile) {
  expectRefused(run({"summarize", results(), "--html", "-"}), kUnusableArguments,
                "must be a file, since standard output carries the summary");
  expectRefused(run({"summarize", results(), "--html", path("")}), kCannotCreate, "a directory");
}

TEST_F(AccountsctlSummarize, OneIsNotSeveral) {
  const std::string file = writeText("one", "no result\n" + std::string(kResults));

  const std::string output = run({"summarize", file}).output;

  EXPECT_NE(output.find("\n1 line that is no result\n"), std::string::npos) << output;
  EXPECT_NE(output.find("\n1 to look at before it is run again"), std::string::npos) << output;
}

TEST_F(AccountsctlSummarize, KnowsWhichImagesHaveNoResult) {
  const std::string roots = writeText("roots", "/i/4\r\n\n  \n/i/1\r\n/i/5\n/i/4\n/i/3");

  const nlohmann::json object =
      onlyObject(run({"summarize", results(), "--roots", roots, "--json"}));

  EXPECT_EQ(object["expected"], 4);
  EXPECT_EQ(object["images"], 2);
  EXPECT_EQ(object["retry"], nlohmann::json::array());
  EXPECT_EQ(object["missing"], nlohmann::json::array({"/i/4", "/i/5"}));
  EXPECT_EQ(run({"summarize", results(), "--roots", roots, "--list", "missing"}).output,
            "/i/4\n/i/5\n");
  EXPECT_NE(run({"summarize", results(), "--roots", roots})
                .output.find("\n2 without a result: --list missing\n"),
            std::string::npos);
  EXPECT_EQ(onlyObject(run({"summarize", results(), "--json"}))["missing"], nullptr);
}

TEST_F(AccountsctlSummarize, AFleetWithEveryResultIsASuccessWhateverOthersBecame) {
  const std::string roots = writeText("roots", "/i/1");

  EXPECT_EQ(run({"summarize", results(), "--roots", roots}).exitStatus, 0);
}

TEST_F(AccountsctlSummarize, RootsThatCannotBeReadAreMissingInput) {
  expectRefused(run({"summarize", results(), "--roots", path("none")}), kMissingInput, "none");
  expectRefused(run({"summarize", results(), "--list", "missing"}), kUnusableArguments, "--roots");
  expectRefused(run({"summarize", results(), "--roots", "a", "--expected", "1"}),
                kUnusableArguments, "--expected");
}

TEST_F(AccountsctlSummarize, ReadsSeveralFilesAndStandardInput) {
  const std::string later = writeText("later.jsonl", R"({"root":"/i/2","exitStatus":0})");
  const nlohmann::json object =
      onlyObject(runRedirected({"summarize", results(), "-", "--json"}, "< " + later));
  EXPECT_EQ(object["replacedResults"], 1);
  EXPECT_EQ(object["retry"], nlohmann::json::array());
}

TEST_F(AccountsctlSummarize, AMissingFileIsMissingInput) {
  expectRefused(run({"summarize", path("none")}), kMissingInput, "No such file");
}

TEST_F(AccountsctlSummarize, UnusableArgumentsAreRefused) {
  expectRefused(run({"summarize"}), kUnusableArguments, "FILE");
  expectRefused(run({"summarize", "a", "--list", "all"}), kUnusableArguments,
                "must be retry, attention, losses, migrated or missing");
  const std::string help = run({"summarize", "--help"}).output;
  EXPECT_NE(help.find("WHICH is retry, attention, losses, migrated or missing"), std::string::npos)
      << help;
  expectRefused(run({"summarize", "a", "--null"}), kUnusableArguments, "--list");
  expectRefused(run({"summarize", "a", "--expected", "-1"}), kUnusableArguments, "--expected");
}

TEST_F(AccountsctlSummarize, ATerminalShowsProgressAndThenTheSummaryAlone) {
  // script(1) gives the program a terminal; the summary goes to a file.
  const std::string command =
      accountsctl() + " summarize " + results() + " --expected 3 > " + path("summary");
  const ProgramResult result =
      runProgram({.program = "script",
                  .arguments = {"--quiet", "--return", "--command", command, "/dev/null"}});

  EXPECT_NE(result.output.find("1 of 3 images: 1 migrated"), std::string::npos) << result.output;
  EXPECT_TRUE(result.output.ends_with("\r\033[K")) << result.output;
  EXPECT_TRUE(readText("summary").starts_with("Images\tStatus")) << readText("summary");
}

}  // namespace
}  // namespace accounts
