#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "inspection/PropertyListJSON.h"
#include "inspection/StoreLayout.h"
#include "platform/MigrationObserver.h"
#include "propertylist/value/SecretKeys.h"

namespace accounts {

/// A file of accounts as it was read.
struct StoreFile {
  FileKind kind = FileKind::Other;
  PropertyDictionary content;
};

/// Where a log line went.
enum class LogKind : std::uint8_t { Console, Channel };

/// Writes down what a migration does while it does it, one JSON object a line, so that what a
/// migration did until it ended before its time is not lost. RecordedMigration puts the lines
/// together. May be told of log lines from any thread.
class MigrationRecorder final : public MigrationObserver {
 public:
  using WriteLine = std::function<void(std::string_view line)>;

  /// `writeLine` takes a line without its end.
  MigrationRecorder(WriteLine writeLine, Secrets secrets)
      : writeLine_(std::move(writeLine)), secrets_(secrets) {}

  /// The accounts before the migration; what the first stage changes is compared with those of the
  /// settings file among them.
  void recordBefore(const std::vector<StoreFile>& stores);
  /// The settings file after the migration; none when there is none.
  void recordAfter(const std::optional<PropertyDictionary>& settings);

  /// A file was changed: `action` is a participle, such as "removed". With an error it was not.
  void recordFile(std::string_view action, std::string_view path,
                  const std::optional<std::string>& error);
  void recordLogLine(LogKind kind, std::string_view line);

  void stageBegan(std::string_view operation, std::string_view purpose) override;
  void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) override;

 private:
  void write(std::string_view event, JSON content);

  const WriteLine writeLine_;
  const Secrets secrets_;
  std::mutex mutex_;
  /// The accounts after the newest stage that had any.
  AccountsInMemory accounts_;
  std::chrono::steady_clock::time_point stageBegin_;
};

}  // namespace accounts
