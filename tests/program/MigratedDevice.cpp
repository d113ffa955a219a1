#include "tests/program/MigratedDevice.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <sstream>
#include <utility>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/FreshIdentifiers.h"
#include "tests/program/Programs.h"
#include "tests/program/RunProgram.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr std::size_t kLongestShown = 400;
constexpr std::string_view kOfTheHost = "migration-host: ";

std::string textOf(const fs::path& file) {
  std::ifstream stream(file, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), {}};
}

std::vector<std::string> splitLines(const std::string& text) {
  std::istringstream stream(text);
  std::vector<std::string> lines;
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

/// Bytes as a line that a person can read.
std::string escapedBytes(std::string_view bytes) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string line;
  for (const char each : bytes) {
    const auto code = static_cast<unsigned char>(each);
    if (code >= 0x20 && code < 0x7f) {
      line += each;
    } else {
      line.append("\\").append(1, kDigits[code >> 4]).append(1, kDigits[code & 15]);
    }
  }
  return line;
}

/// An ending as lines: what was told, then the device.
std::vector<std::string> linesOf(const Ending& ending) {
  std::vector<std::string> lines =
      splitLines(ending.told.dump(1, ' ', false, nlohmann::json::error_handler_t::replace));
  for (const auto& [path, entry] : ending.tree) {
    std::ostringstream line;
    line << path << " " << std::oct << entry.mode << std::dec << " " << entry.owner << ":"
         << entry.group << " " << escapedBytes(entry.contents);
    lines.push_back(line.str());
  }
  return lines;
}

}  // namespace

std::string differencesOf(const Ending& first, const Ending& second) {
  if (first.told == second.told && first.tree == second.tree) {
    return "";
  }
  const std::vector<std::string> one = linesOf(first);
  const std::vector<std::string> other = linesOf(second);
  const auto [line, otherLine] = std::mismatch(one.begin(), one.end(), other.begin(), other.end());
  // Some lines before, which say what it is in.
  constexpr std::ptrdiff_t kShown = 12;
  std::string text;
  for (auto each = line - std::min(kShown, line - one.begin()); each != line; ++each) {
    text += "  " + each->substr(0, kLongestShown) + "\n";
  }
  const std::string here = line != one.end() ? *line : "";
  const std::string there = otherLine != other.end() ? *otherLine : "";
  const auto place = std::mismatch(here.begin(), here.end(), there.begin(), there.end()).first;
  const auto at = static_cast<std::size_t>(place - here.begin());
  const std::size_t from = at - std::min(at, kLongestShown / 2);
  return text + "- " + here.substr(std::min(from, here.size()), kLongestShown) + "\n+ " +
         there.substr(std::min(from, there.size()), kLongestShown) + "\n";
}

MigratedDevice::MigratedDevice(Make make, Detail detail)
    : make_(std::move(make)),
      detail_(detail),
      directory_(makeTemporaryDirectory(Medium::Memory, "migrated-device")) {
  makeAnew();
  before_ = treeOf(root());
}

MigratedDevice::~MigratedDevice() {
  std::error_code error;
  fs::remove_all(directory_, error);
}

void MigratedDevice::makeAnew() {
  fs::remove_all(root());
  fs::create_directory(root());
  make_(root());
}

Ending MigratedDevice::plan() const {
  return ended({"plan"}, Report::AsTheResult);
}

Ending MigratedDevice::run() const {
  return ended({"run"}, Report::InAFile);
}

Ending MigratedDevice::runBare() const {
  return ended({"run", "--bare"}, detail_ == Detail::Full ? Report::InAFile : Report::AsTheResult);
}

Ending MigratedDevice::ended(std::vector<std::string> arguments, Report report) const {
  const fs::path reportFile = directory_ / "report";
  const fs::path channel = directory_ / "channel";
  fs::remove(channel);
  arguments.insert(arguments.end(), {"--root", root().string(), "--json", "--show-secrets"});
  if (report == Report::InAFile) {
    arguments.insert(arguments.end(), {"--report", reportFile.string()});
  }
  if (detail_ == Detail::Full) {
    arguments.insert(arguments.end(), {"--channel", channel.string()});
  }
  const ProgramResult result = runProgram({.program = migrationHost(),
                                           .arguments = std::move(arguments),
                                           .environment = {{"LC_ALL", "C"}, {"LANGUAGE", "en"}}});
  FreshIdentifiers identifiers(before_);
  const auto comparable = [&](const std::string& text) {
    return withoutTime(identifiers.named(text));
  };
  Ending ending;
  ending.told["exitStatus"] = result.exitStatus;
  ending.told["report"] = nlohmann::json::parse(
      comparable(report == Report::InAFile ? textOf(reportFile) : result.output), nullptr, false);
  EXPECT_TRUE(ending.told["report"].is_object()) << result.errors;
  std::vector<std::string> console = splitLines(comparable(result.errors));
  std::erase_if(console, [](const std::string& line) { return line.starts_with(kOfTheHost); });
  ending.told["console"] = console;
  ending.told["channel"] = splitLines(comparable(textOf(channel)));
  // Numbered anew where not every way tells of the same identifiers before.
  FreshIdentifiers inFiles = detail_ == Detail::Full ? identifiers : FreshIdentifiers(before_);
  for (auto& [path, entry] : treeOf(root())) {
    ending.tree.emplace(withoutTime(path), TreeEntry{entry.mode, entry.owner, entry.group,
                                                     inFiles.named(entry.contents)});
  }
  return ending;
}

}  // namespace accounts
