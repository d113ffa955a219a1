#pragma once

#include "platform/BundleResources.h"
#include "platform/CloudAccountService.h"
#include "platform/CloudTabService.h"
#include "platform/ConsoleLog.h"
#include "platform/DateFormatter.h"
#include "platform/DeviceInfoService.h"
#include "platform/ExternalSyncSources.h"
#include "platform/FileSystem.h"
#include "platform/FrameworkLoader.h"
#include "platform/HomeDirectory.h"
#include "platform/LocalizedStrings.h"
#include "platform/LogSystem.h"
#include "platform/MailDirectory.h"
#include "platform/MigrationObserver.h"
#include "platform/PairingValueStore.h"
#include "platform/PreferenceDomain.h"
#include "platform/PreferencesBroadcast.h"
#include "platform/ProfileRestrictions.h"
#include "platform/PropertyLists.h"
#include "platform/SharedResources.h"
#include "platform/UUIDGenerator.h"

namespace accounts {

/// Everything that the system needs of the device, one interface each. The host makes it and keeps
/// it alive as long as the plug-in is loaded.
struct Platform {
  BundleResources& bundleResources;
  CloudAccountService& cloudAccountService;
  CloudTabService& cloudTabService;
  ConsoleLog& consoleLog;
  DateFormatter& dateFormatter;
  DeviceInfoService& deviceInfoService;
  ExternalSyncSources& externalSyncSources;
  FileSystem& fileSystem;
  FrameworkLoader& frameworkLoader;
  HomeDirectory& homeDirectory;
  LocalizedStrings& localizedStrings;
  LogSystem& logSystem;
  MailDirectory& mailDirectory;
  PairingValueStore& pairingValueStore;
  PreferenceDomain& preferenceDomain;
  PreferencesBroadcast& preferencesBroadcast;
  ProfileRestrictions& profileRestrictions;
  PropertyLists& propertyLists;
  SharedResources& sharedResources;
  UUIDGenerator& uuidGenerator;
  /// None for a migration that nobody watches, which then costs nothing.
  MigrationObserver* migrationObserver = nullptr;
};

}  // namespace accounts
