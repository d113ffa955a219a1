#include "fuzz/DeviceServices.h"

#include "fuzz/AnyValue.h"

namespace accounts {

namespace {

/// An answer that is absent, one of two plausible ones, or any value.
void addAnswer(FuzzInput& input, FakeDeviceInfoService& service, std::string_view question,
               const PropertyValue& plausible) {
  switch (input.below(4)) {
    case 0:
    case 1:
      return;
    case 2:
      service.answers.emplace(question, plausible);
      return;
    default:
      service.answers.emplace(question, anyValue(input));
  }
}

void addSyncSources(FuzzInput& input, FakeExternalSyncSources& service) {
  for (const SyncDataType type : {SyncDataType::Bookmarks, SyncDataType::Calendars,
                                  SyncDataType::Contacts, SyncDataType::Notes}) {
    ExternalSyncSourcesAnswer& answer = service.answers[type];
    if (input.flag()) {
      answer.sources = PropertyArray{anyText(input)};
    }
    if (input.seldom()) {
      answer.error = anyText(input).string();
    }
  }
}

void addRestrictions(FuzzInput& input, FakeProfileRestrictions& service) {
  constexpr std::size_t kAnswers = 3;
  for (const RestrictedFeature feature :
       {RestrictedFeature::CloudDocumentSync, RestrictedFeature::PhotoStream,
        RestrictedFeature::SharedPhotoStreams, RestrictedFeature::CloudBackup,
        RestrictedFeature::CardsAndPassesWhileLocked}) {
    service.answers[feature] = static_cast<RestrictionAnswer>(input.below(kAnswers));
  }
}

}  // namespace

void addServices(FuzzInput& input, FuzzedDevice& device) {
  device.sharedResources.canMakeLock = !input.seldom();
  device.uuidGenerator.canGenerate = !input.seldom();
  device.logSystem.channel.enabled = input.below(8) == 7;
  addAnswer(input, device.deviceInfoService, "CPUArchitecture", "armv6");
  addAnswer(input, device.deviceInfoService, "RegionalBehaviorGoogleMail", true);
  addAnswer(input, device.deviceInfoService, "DeviceClass", "Handra Touch");
  if (input.flag()) {
    addSyncSources(input, device.externalSyncSources);
    addRestrictions(input, device.profileRestrictions);
  }
  if (input.flag()) {
    device.preferenceDomain.values.emplace(
        std::pair("com.quarx.accountsettings-logging", "ASSaveMigrationInformation"),
        anyValue(input));
  }
  if (input.seldom()) {
    device.fileSystem.addFile(kSentinelPath, "");
  } else if (input.seldom()) {
    device.fileSystem.addDirectory(kSentinelPath);
  }
}

}  // namespace accounts
