#include <sys/stat.h>

#include <functional>

#include "tests/program/NamedFilesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// The files of this machine that the programs write, under whatever name.
class WrittenFiles : public NamedFiles {
 protected:
  struct Way {
    std::string name;
    std::string beginning;
    std::function<ProgramResult(const std::string& file)> write;
  };

  /// Every option that has a file written.
  [[nodiscard]] std::vector<Way> ways() const {
    return {{"plan --report", "{\"",
             [this](const std::string& file) {
               return host("plan", {"--report", file});
             }},
            {"plan --html", "<!",
             [this](const std::string& file) {
               return host("plan", {"--html", file});
             }},
            {"run --report", "{\"",
             [this](const std::string& file) {
               return host("run", {"--report", file});
             }},
            {"run --html", "<!",
             [this](const std::string& file) {
               return host("run", {"--html", file});
             }},
            {"summarize --html", "<!",
             [this](const std::string& file) {
               return tool({"summarize", "--html", file, "/dev/null"});
             }},
            {"convert", "<?xml", [this](const std::string& file) {
               return tool({"convert", "--to", "xml", "--", "settings.plist", file});
             }}};
  }

  /// Every way writes the file that the name leads to, and no other.
  void expectWritten(const std::string& name, const std::string& target) const {
    for (const Way& way : ways()) {
      SCOPED_TRACE(way.name + " " + name);
      fs::remove(path(target));
      const std::vector<std::string> before = filesHere();

      const ProgramResult result = way.write(name);

      EXPECT_EQ(result.exitStatus, 0) << result.errors;
      EXPECT_TRUE(text(target).starts_with(way.beginning)) << text(target).substr(0, 80);
      fs::remove(path(target));
      EXPECT_EQ(filesHere(), before);
    }
  }
  /// Every way is refused with this status and one line that has these words; nothing is written.
  void expectRefused(const std::string& name, int exitStatus, const std::string& words) const {
    const std::vector<std::string> before = filesHere();
    for (const Way& way : ways()) {
      SCOPED_TRACE(way.name + " " + name);

      const ProgramResult result = way.write(name);

      EXPECT_EQ(result.exitStatus, exitStatus);
      EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
      EXPECT_NE(result.errors.find(words), std::string::npos) << result.errors;
      EXPECT_EQ(filesHere(), before);
    }
  }
};

TEST_F(WrittenFiles, NamedWithoutADirectoryAreInTheWorkingDirectory) {
  expectWritten("file-of-a-test", "file-of-a-test");
  EXPECT_FALSE(fs::exists("/file-of-a-test"));
}

TEST_F(WrittenFiles, NamedWithoutADirectoryMayBeThereAlready) {
  for (const Way& way : ways()) {
    writeHere("file", "old");
    EXPECT_EQ(way.write("file").exitStatus, 0) << way.name;
    EXPECT_TRUE(text("file").starts_with(way.beginning)) << way.name;
  }
}

TEST_F(WrittenFiles, MayBeNamedByTheirWayFromTheWorkingDirectory) {
  fs::create_directory(path("folder"));

  expectWritten("./file", "file");
  expectWritten("../file", "../file");
  expectWritten("folder/file", "folder/file");
  expectWritten("folder/../file", "file");
  expectWritten("folder/./../../here/folder//file", "folder/file");
}

TEST_F(WrittenFiles, MayHaveNamesThatBeginLikeOptions) {
  expectWritten("--report.json", "--report.json");
  expectWritten("-x", "-x");
  expectWritten("./-", "-");
}

TEST_F(WrittenFiles, AreFoundThroughALinkToADirectory) {
  fs::create_directories(path("../elsewhere/deep"));
  fs::create_directory_symlink("../elsewhere/deep", path("link"));

  expectWritten("link/file", "../elsewhere/deep/file");
  // The directory above is that of the place that the link leads to.
  expectWritten("link/../file", "../elsewhere/file");
}

TEST_F(WrittenFiles, AreReplacedWhereALinkLeads) {
  fs::create_directory(path("folder"));
  fs::create_symlink("folder/target", path("link"));
  for (const Way& way : ways()) {
    writeHere("folder/target", "old");
    EXPECT_EQ(way.write("link").exitStatus, 0) << way.name;
    EXPECT_TRUE(text("folder/target").starts_with(way.beginning)) << way.name;
    EXPECT_TRUE(fs::is_symlink(path("link"))) << way.name;
  }
}

TEST_F(WrittenFiles, AreRefusedWhereNoFileCanBe) {
  fs::create_directory(path("folder"));
  fs::create_symlink("nowhere", path("dangling"));
  fs::create_symlink("loop", path("loop"));

  expectRefused("folder", kCannotCreate, "a directory");
  expectRefused(".", kCannotCreate, "a directory");
  expectRefused("..", kCannotCreate, "a directory");
  expectRefused("new/", kCannotCreate, "Is a directory");
  expectRefused("missing/file", kCannotCreate, "No such file or directory");
  expectRefused("settings.plist/file", kCannotCreate, "Not a directory");
  expectRefused("dangling", kCannotCreate, "No such file or directory");
  expectRefused("loop", kCannotCreate, "Too many levels of symbolic links");
  expectRefused("/dev/null", kCannotCreate, "a character device");
  expectRefused("", kUnusableArguments, "must not be empty");
}

TEST_F(WrittenFiles, MayBeAPipeThatSomebodyReads) {
  for (const char* line : {"$HOST plan --root $ROOT --html >(cat >got) >/dev/null",
                           "$HOST run --root $ROOT --report >(cat >got) >/dev/null",
                           "$TOOL convert settings.plist >(cat >got) --to xml"}) {
    EXPECT_EQ(shell(std::string(line) + "; status=$?; wait $!; exit $status").exitStatus, 0)
        << line;
    EXPECT_GT(text("got").size(), 100U) << line;
    fs::remove(path("got"));
  }
}

TEST_F(WrittenFiles, ThatAreAPipeNobodyReadsAreAnErrorRatherThanAWait) {
  ASSERT_EQ(mkfifo(path("pipe").c_str(), 0600), 0);
  for (const Way& way : ways()) {
    const ProgramResult result = way.write("pipe");
    EXPECT_EQ(result.exitStatus, kCannotCreate) << way.name;
    EXPECT_TRUE(result.errors.ends_with(": Cannot write pipe: Nobody reads this pipe\n"))
        << result.errors;
  }
}

TEST_F(WrittenFiles, ReplaceTheSummaryOnStandardOutputNowhere) {
  for (const char* option : {"--report", "--html"}) {
    for (const char* subcommand : {"run", "plan"}) {
      const ProgramResult result = host(subcommand, {option, "-"});
      EXPECT_EQ(result.exitStatus, kUnusableArguments);
      EXPECT_NE(result.errors.find("standard output carries the summary"), std::string::npos)
          << result.errors;
    }
  }
  const ProgramResult page = tool({"summarize", "--html", "-", "/dev/null"});
  EXPECT_EQ(page.exitStatus, kUnusableArguments);
  EXPECT_NE(page.errors.find("standard output carries the summary"), std::string::npos)
      << page.errors;
  EXPECT_EQ(filesHere(), std::vector<std::string>{"settings.plist"});
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(11));
}

class ChannelFile : public NamedFiles {};

TEST_F(ChannelFile, GoesWhereItsNameLeads) {
  fs::create_directory(path("folder"));
  fs::create_symlink("folder/target", path("link"));
  for (const auto& [name, target] : {std::pair("log", "log"),
                                     {"./log", "log"},
                                     {"../log", "../log"},
                                     {"--log", "--log"},
                                     {"folder/../log", "log"},
                                     {"link", "folder/target"}}) {
    write(kSettingsPath, accountSettings(11));
    fs::remove(path(target));

    EXPECT_EQ(host("run", {"--channel", name}).exitStatus, 0) << name;

    EXPECT_NE(text(target), "") << name;
  }
}

}  // namespace
}  // namespace accounts
