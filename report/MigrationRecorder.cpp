#include "report/MigrationRecorder.h"

#include <utility>

#include "inspection/AccountTree.h"
#include "inspection/DifferenceJSON.h"
#include "report/RecordedEvents.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {
namespace {

/// More than a line about an account of any device has. One can be as long as all that a file
/// stands for, and there are many.
constexpr std::size_t kLongestLogLine = std::size_t{16} << 10;

/// A line, or as much of it as a report needs and how much it does not have.
std::string shortened(std::string_view line) {
  if (line.size() <= kLongestLogLine) {
    return std::string(line);
  }
  std::size_t end = kLongestLogLine;
  while (end > 0 && (static_cast<unsigned char>(line[end]) & 0xC0) == 0x80) {
    --end;
  }
  return std::string(line.substr(0, end)) + "… (" + std::to_string(line.size() - end) +
         " bytes more)";
}

JSON versionOf(const PropertyDictionary& settings) {
  const PropertyValue* const version = settings.find(kPlistVersionKey);
  return version != nullptr ? jsonOf(*version) : JSON(nullptr);
}

}  // namespace

void MigrationRecorder::write(std::string_view event, JSON content) {
  const std::string line = lineOf(JSON{{event, std::move(content)}});
  const std::lock_guard guard(mutex_);
  writeLine_(line);
}

void MigrationRecorder::recordBefore(const std::vector<StoreFile>& stores) {
  JSON accounts = JSON::array();
  JSON version = nullptr;
  for (const StoreFile& store : stores) {
    appendAccountTree(accounts, store.content, store.kind, secrets_);
    if (store.kind == FileKind::AccountSettings) {
      accountSettings_ = store.content;
      version = versionOf(store.content);
    }
  }
  write(events::kBefore,
        {{events::kVersion, std::move(version)}, {events::kAccounts, std::move(accounts)}});
}

void MigrationRecorder::recordAfter(const std::optional<PropertyDictionary>& settings) {
  JSON accounts = JSON::array();
  JSON version = nullptr;
  if (settings) {
    appendAccountTree(accounts, *settings, FileKind::AccountSettings, secrets_);
    version = versionOf(*settings);
  }
  write(events::kAfter,
        {{events::kVersion, std::move(version)}, {events::kAccounts, std::move(accounts)}});
}

void MigrationRecorder::recordFile(std::string_view action, std::string_view path,
                                   const std::optional<std::string>& error) {
  JSON file = {{"action", action}, {"path", path}};
  if (error) {
    file["error"] = *error;
  }
  write(events::kFile, std::move(file));
}

void MigrationRecorder::recordLogLine(LogKind kind, std::string_view line) {
  write(events::kLog,
        {{"to", kind == LogKind::Console ? "console" : "channel"}, {"text", shortened(line)}});
}

void MigrationRecorder::stageBegan(std::string_view operation, std::string_view purpose) {
  write(events::kBegan, {{"name", operation}, {"title", purpose}});
  stageBegin_ = std::chrono::steady_clock::now();
}

void MigrationRecorder::stageEnded(bool succeeded,
                                   const std::optional<PropertyDictionary>& accountSettings) {
  const std::chrono::duration<double> duration = std::chrono::steady_clock::now() - stageBegin_;
  JSON ended = {{"succeeded", succeeded}, {"seconds", duration.count()}};
  if (accountSettings) {
    const StoreDifference difference =
        differenceBetween(accountSettings_, *accountSettings, FileKind::AccountSettings, secrets_);
    ended.update(differenceObject(difference, *layoutOf(FileKind::AccountSettings)));
    accountSettings_ = *accountSettings;
  }
  write(events::kEnded, std::move(ended));
}

}  // namespace accounts
