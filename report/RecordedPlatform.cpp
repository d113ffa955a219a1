#include "report/RecordedPlatform.h"

#include <set>
#include <utility>

#include "platform/ForwardingFileSystem.h"
#include "platform/ReplacedParts.h"

namespace accounts {
namespace {

/// What a temporary file is called: its name means nothing to anybody, and is another each time.
constexpr std::string_view kTemporaryFile = "temporary file";

/// Another file system whose changes are recorded. What happens to a temporary file counts when it
/// takes the place of another one.
class RecordedFileSystem final : public ForwardingFileSystem {
 public:
  RecordedFileSystem(FileSystem& files, MigrationRecorder& recorder)
      : ForwardingFileSystem(files), recorder_(recorder) {}

  Result copyFile(std::string_view source, std::string_view destination) override {
    return recorded("copied", destination, ForwardingFileSystem::copyFile(source, destination));
  }
  Result removeFile(std::string_view path) override {
    // That nothing was there to remove is no news.
    const bool wasThere = fileExists(path);
    Result result = ForwardingFileSystem::removeFile(path);
    return wasThere ? recorded("removed", path, std::move(result)) : result;
  }
  Result createFile(std::string_view path, std::string_view contents) override {
    return recorded("created", path, ForwardingFileSystem::createFile(path, contents));
  }
  Result createDirectoryWithIntermediates(std::string_view path, unsigned permissions) override {
    return recorded("created", path,
                    ForwardingFileSystem::createDirectoryWithIntermediates(path, permissions));
  }
  std::optional<std::string> makeTemporaryFile() override {
    std::optional<std::string> path = ForwardingFileSystem::makeTemporaryFile();
    if (path) {
      temporaryFiles_.insert(*path);
    } else {
      recorder_.recordFile("created", kTemporaryFile, "No temporary file can be made");
    }
    return path;
  }
  Result writeFile(std::string_view path, const SerializedPropertyList& contents) override {
    return recorded("written", path, ForwardingFileSystem::writeFile(path, contents));
  }
  Result writeFileAtomically(std::string_view path,
                             const SerializedPropertyList& contents) override {
    return recorded("written", path, ForwardingFileSystem::writeFileAtomically(path, contents));
  }
  Result setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                          std::string_view groupName) override {
    Result result = ForwardingFileSystem::setOwnerAndGroup(path, ownerName, groupName);
    return result ? result : recorded("given away", path, std::move(result));
  }
  Result renameFile(std::string_view source, std::string_view destination) override {
    return recorded("written", destination, ForwardingFileSystem::renameFile(source, destination));
  }

 private:
  Result recorded(std::string_view action, std::string_view path, Result result) {
    const bool isTemporary = temporaryFiles_.contains(path);
    if (!result || !isTemporary) {
      recorder_.recordFile(action, isTemporary ? kTemporaryFile : path,
                           result ? std::nullopt : std::optional(result.error().text));
    }
    return result;
  }

  MigrationRecorder& recorder_;
  std::set<std::string, std::less<>> temporaryFiles_;
};

class RecordedConsoleLog final : public ConsoleLog {
 public:
  RecordedConsoleLog(ConsoleLog& log, MigrationRecorder& recorder)
      : log_(log), recorder_(recorder) {}

  void writeLine(std::string_view line) override {
    log_.writeLine(line);
    recorder_.recordLogLine(LogKind::Console, line);
  }

 private:
  ConsoleLog& log_;
  MigrationRecorder& recorder_;
};

class RecordedLogChannel final : public LogChannel {
 public:
  RecordedLogChannel(LogChannel& channel, MigrationRecorder& recorder)
      : channel_(channel), recorder_(recorder) {}

  [[nodiscard]] bool isEnabled() const override { return channel_.isEnabled(); }
  void write(const LogLine& line) override {
    channel_.write(line);
    recorder_.recordLogLine(LogKind::Channel, line.text);
  }

 private:
  LogChannel& channel_;
  MigrationRecorder& recorder_;
};

class RecordedLogSystem final : public LogSystem {
 public:
  RecordedLogSystem(LogSystem& log, MigrationRecorder& recorder) : log_(log), recorder_(recorder) {}

  LogChannel& makeChannel(std::string_view subsystem, std::string_view category) override {
    LogChannel& channel = log_.makeChannel(subsystem, category);
    const std::lock_guard guard(mutex_);
    return *channels_.emplace_back(std::make_unique<RecordedLogChannel>(channel, recorder_));
  }

 private:
  LogSystem& log_;
  MigrationRecorder& recorder_;
  std::mutex mutex_;
  std::vector<std::unique_ptr<LogChannel>> channels_;
};

}  // namespace

struct RecordedPlatform::Parts {
  Parts(const Platform& original, MigrationRecorder& recorder)
      : fileSystem(original.fileSystem, recorder),
        consoleLog(original.consoleLog, recorder),
        logSystem(original.logSystem, recorder),
        platform(platformWith(original, {.consoleLog = &consoleLog,
                                         .fileSystem = &fileSystem,
                                         .logSystem = &logSystem,
                                         .migrationObserver = &recorder})) {}

  RecordedFileSystem fileSystem;
  RecordedConsoleLog consoleLog;
  RecordedLogSystem logSystem;
  Platform platform;
};

RecordedPlatform::RecordedPlatform(const Platform& platform, MigrationRecorder& recorder)
    : parts_(std::make_unique<Parts>(platform, recorder)) {}

RecordedPlatform::~RecordedPlatform() = default;

Platform& RecordedPlatform::platform() {
  return parts_->platform;
}

}  // namespace accounts
