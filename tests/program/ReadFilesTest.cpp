#include <sys/stat.h>

#include <functional>

#include "tests/program/NamedFilesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// Every place of both programs where a file is read under a name.
class ReadFiles : public NamedFiles {
 protected:
  ReadFiles() {
    writeHere("--device.plist", "<plist version=\"1.0\"><dict/></plist>");
    fs::copy_file(path("settings.plist"), path("--settings.plist"));
    writeHere("--results", R"({"root":"/a","result":true,"exitStatus":0})"
                           "\n");
    fs::create_directory(path("folder"));
    for (const char* file : {"device.plist", "settings.plist", "results"}) {
      fs::create_symlink("../--" + std::string(file), path("folder/" + std::string(file)));
    }
  }

  /// A command line for the shell, in which FILE is where the file is named, and the file.
  struct Way {
    std::string line;
    std::string file;
  };
  [[nodiscard]] static std::vector<Way> ways() {
    return {{"$TOOL show -- FILE", "settings.plist"},
            {"$TOOL diff -- FILE settings.plist", "settings.plist"},
            {"$TOOL diff -- settings.plist FILE", "settings.plist"},
            {"$TOOL check -- FILE", "settings.plist"},
            {"$TOOL check settings.plist --device FILE", "device.plist"},
            {"$TOOL status --root $ROOT --device FILE", "device.plist"},
            {"$TOOL convert --to xml -- FILE -", "settings.plist"},
            {"$TOOL summarize -- FILE", "results"},
            {"$HOST plan --root $ROOT --device FILE", "device.plist"},
            {"$HOST run --root $ROOT --device FILE", "device.plist"}};
  }
  [[nodiscard]] ProgramResult runWith(const Way& way, const std::string& name) const {
    std::string line = way.line;
    return shell(line.replace(line.find("FILE"), 4, name));
  }
  /// Every way succeeds with the file under the names that `named` makes of its own.
  void expectRead(const std::function<std::string(const std::string&)>& named) const {
    for (const Way& way : ways()) {
      const ProgramResult result = runWith(way, named(way.file));
      EXPECT_EQ(result.exitStatus, 0) << way.line << "\n" << result.errors;
    }
  }
};

TEST_F(ReadFiles, AreFoundFromTheWorkingDirectory) {
  expectRead([](const std::string& file) { return "--" + file; });
  expectRead([](const std::string& file) { return "./--" + file; });
  expectRead([](const std::string& file) { return "../here/folder/../--" + file; });
  expectRead([](const std::string& file) { return "folder/" + file; });
}

TEST_F(ReadFiles, MayBeProcessSubstitutions) {
  expectRead([](const std::string& file) { return "<(sleep 0.05; cat ./--" + file + ")"; });
}

TEST_F(ReadFiles, MayBeStandardInput) {
  expectRead([](const std::string& file) { return "- <--" + file; });
  expectRead([](const std::string& file) { return "- < <(cat ./--" + file + ")"; });
}

TEST_F(ReadFiles, MayBeNamedPipes) {
  ASSERT_EQ(mkfifo(path("pipe").c_str(), 0600), 0);
  for (const Way& way : ways()) {
    Way piped = way;
    piped.line = "cat ./--" + way.file + " >pipe & " + way.line;

    const ProgramResult result = runWith(piped, "pipe");

    EXPECT_EQ(result.exitStatus, 0) << way.line << "\n" << result.errors;
  }
}

TEST_F(ReadFiles, AreRefusedWhereNoFileIs) {
  for (const Way& way : ways()) {
    for (const char* name : {"folder", "none", "/dev/null/none", "."}) {
      if (way.file == "results" && fs::is_directory(path(name))) {
        continue;  // The results in it.
      }
      const ProgramResult result = runWith(way, name);
      EXPECT_EQ(result.exitStatus, kMissingInput) << way.line << " " << name;
      EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
      EXPECT_NE(result.errors.find(name), std::string::npos) << result.errors;
    }
  }
}

TEST_F(ReadFiles, CanBeStandardInputOnce) {
  for (const char* line : {"$TOOL diff - -", "$TOOL check - --device -", "$TOOL summarize - -"}) {
    const ProgramResult result = shell(line);
    EXPECT_EQ(result.exitStatus, kUnusableArguments) << line;
    EXPECT_NE(result.errors.find("standard input"), std::string::npos) << result.errors;
  }
}

class NamedBundle : public NamedFiles {};

TEST_F(NamedBundle, IsFoundFromTheWorkingDirectory) {
  fs::copy(pluginBundle(), path("--bundle"), fs::copy_options::recursive);
  fs::create_directory_symlink("--bundle", path("link"));
  for (const char* name : {"--bundle", "./--bundle/", "../here/--bundle", "link"}) {
    EXPECT_EQ(host("plan", {"--plugin", name}).exitStatus, 0) << name;
    EXPECT_EQ(tool({"check", "settings.plist", "--plugin", name}).exitStatus, 0) << name;
    EXPECT_EQ(tool({"status", "--root", root(), "--plugin", name}).exitStatus, 0) << name;
  }
}

}  // namespace
}  // namespace accounts
