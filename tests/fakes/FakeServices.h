#pragma once

#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/Platform.h"
#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "tests/fakes/FakeFileSystem.h"
#include "tests/fakes/FakeFrameworkLoader.h"

namespace accounts {

/// The resources of the repository, unless a test gives its own or takes one away.
class FakeBundleResources : public BundleResources {
 public:
  /// What a test says of a resource: its dictionary, or none for a missing one.
  std::map<std::string, std::optional<PropertyDictionary>, std::less<>> replaced;
  /// Resources that are there but cannot be read.
  std::set<std::string, std::less<>> unreadable;
  /// The names of the resources read, in order.
  std::vector<std::string> reads;

  bool hasPropertyList(std::string_view name) override;
  std::optional<PropertyDictionary> readPropertyList(std::string_view name) override;
};

class FakeCloudAccountService : public CloudAccountService {
 public:
  std::string status = "status";
  std::string primaryAccount = "primaryAccount";
  std::string displayName = "Stratix";

  std::string statusKey() override { return status; }
  std::string primaryAccountKey() override { return primaryAccount; }
  std::string accountTypeDisplayName() override { return displayName; }
};

class FakeCloudTabService : public CloudTabService {
 public:
  explicit FakeCloudTabService(std::vector<std::string>& journal) : journal_(journal) {}
  std::vector<CloudTabs> announcements;

  void announce(CloudTabs state) override {
    journal_.push_back("announceCloudTabs");
    announcements.push_back(state);
  }

 private:
  std::vector<std::string>& journal_;
};

class FakeConsoleLog : public ConsoleLog {
 public:
  explicit FakeConsoleLog(std::vector<std::string>& journal) : journal_(journal) {}
  std::vector<std::string> lines;
  /// Writes every line to standard error too, so that a test of an assertion's text can see it.
  bool alsoStandardError = true;

  void writeLine(std::string_view line) override;

 private:
  std::vector<std::string>& journal_;
};

class FakeDateFormatter : public DateFormatter {
 public:
  std::string date = "2012-9-19-17-9-4";
  std::vector<std::string> patterns;

  std::string currentDate(std::string_view pattern) override {
    patterns.emplace_back(pattern);
    return date;
  }
};

class FakeDeviceInfoService : public DeviceInfoService {
 public:
  std::map<std::string, PropertyValue, std::less<>> answers;
  std::vector<std::string> questions;

  std::optional<PropertyValue> copyAnswer(std::string_view question) override {
    questions.emplace_back(question);
    const auto answer = answers.find(question);
    return answer != answers.end() ? std::optional(answer->second) : std::nullopt;
  }
};

class FakeExternalSyncSources : public ExternalSyncSources {
 public:
  std::map<SyncDataType, ExternalSyncSourcesAnswer> answers;

  ExternalSyncSourcesAnswer copyEnabledSources(SyncDataType dataType) override {
    const auto answer = answers.find(dataType);
    return answer != answers.end() ? answer->second : ExternalSyncSourcesAnswer();
  }
};

class FakeHomeDirectory : public HomeDirectory {
 public:
  std::string path() override { return "/var/mobile"; }
};

class FakeMailDirectory : public MailDirectory {
 public:
  std::string path() override { return "/var/mobile/Library/Mail"; }
};

class FakeLocalizedStrings : public LocalizedStrings {
 public:
  /// Texts by table and key.
  std::map<std::pair<std::string, std::string>, std::string> texts;

  std::string localizedString(std::string_view key, std::string_view defaultValue,
                              std::string_view table) override {
    const auto text = texts.find({std::string(table), std::string(key)});
    if (text != texts.end()) {
      return text->second;
    }
    return std::string(defaultValue.empty() ? key : defaultValue);
  }
};

/// A log system whose single channel is enabled unless a test disables it.
class FakeLogSystem : public LogSystem {
 public:
  class Channel : public LogChannel {
   public:
    bool enabled = true;
    std::vector<std::string> lines;

    [[nodiscard]] bool isEnabled() const override { return enabled; }
    void write(const LogLine& line) override { lines.emplace_back(line.text); }
    /// The lines with the source line's number replaced by "N".
    [[nodiscard]] std::vector<std::string> linesWithoutNumbers() const;
  };
  Channel channel;
  /// The subsystem and category of each channel made.
  std::vector<std::pair<std::string, std::string>> channelsMade;

  LogChannel& makeChannel(std::string_view subsystem, std::string_view category) override {
    channelsMade.emplace_back(subsystem, category);
    return channel;
  }
};

class FakePairingValueStore : public PairingValueStore {
 public:
  bool canConnect = true;
  /// Values by domain and key; the key "" stands for a request without a key.
  std::map<std::pair<std::string, std::string>, PropertyValue> values;
  std::vector<std::pair<std::string, std::optional<std::string>>> requests;
  int openConnections = 0;

  std::unique_ptr<PairingConnection> connect() override;
};

class FakePreferenceDomain : public PreferenceDomain {
 public:
  /// Values by domain and key.
  std::map<std::pair<std::string, std::string>, PropertyValue> values;
  std::vector<std::string> calls;

  void synchronize(std::string_view domain) override {
    calls.push_back("synchronize " + std::string(domain));
  }
  std::optional<PropertyValue> copyValue(std::string_view key, std::string_view domain) override {
    calls.push_back("copyValue " + std::string(key) + " of " + std::string(domain));
    const auto value = values.find({std::string(domain), std::string(key)});
    return value != values.end() ? std::optional(value->second) : std::nullopt;
  }
};

class FakePreferencesBroadcast : public PreferencesBroadcast {
 public:
  explicit FakePreferencesBroadcast(std::vector<std::string>& journal) : journal_(journal) {}
  /// Application and key of each announcement.
  std::vector<std::pair<std::string, std::string>> announcements;

  void announceChange(std::string_view application, std::string_view key) override {
    journal_.push_back("announceChange " + std::string(application) + " " + std::string(key));
    announcements.emplace_back(application, key);
  }

 private:
  std::vector<std::string>& journal_;
};

class FakeProfileRestrictions : public ProfileRestrictions {
 public:
  std::map<RestrictedFeature, RestrictionAnswer> answers;

  RestrictionAnswer answerForFeature(RestrictedFeature feature) override {
    const auto answer = answers.find(feature);
    return answer != answers.end() ? answer->second : RestrictionAnswer::NoSetting;
  }
};

/// Reads and writes with the real codecs over the fake file system.
class FakePropertyLists : public PropertyLists {
 public:
  explicit FakePropertyLists(FakeFileSystem& fileSystem) : fileSystem_(fileSystem) {}
  /// When set, every serialisation fails with this text.
  std::optional<std::string> serializationError;
  /// When set, every serialisation succeeds and gives none.
  bool givesNone = false;

  std::optional<PropertyDictionary> readDictionary(std::string_view path) override;
  OrFailure<SerializedPropertyList> serializeBinary(const PropertyValue& value) override;

 private:
  FakeFileSystem& fileSystem_;
  BinaryPropertyListSerializer serializer_;
};

class FakeSharedResources : public SharedResources {
 public:
  explicit FakeSharedResources(std::vector<std::string>& journal) : journal_(journal) {}
  bool canMakeLock = true;

  std::string systemRootDirectory() override { return "/"; }
  std::string sharedResourcesDirectory() override { return "/var/mobile"; }
  std::unique_ptr<NamedLock> makeLock(std::string_view name) override;

 private:
  std::vector<std::string>& journal_;
};

/// UUIDs that count up: "00000000-0000-0000-0000-000000000001" and so on.
class FakeUUIDGenerator : public UUIDGenerator {
 public:
  bool canGenerate = true;

  std::optional<std::string> randomUUID() override;

 private:
  int count_ = 0;
};

}  // namespace accounts
