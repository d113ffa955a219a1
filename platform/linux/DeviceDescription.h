#pragma once

#include <array>
#include <optional>
#include <string>
#include <string_view>

#include "platform/ExternalSyncSources.h"
#include "platform/ProfileRestrictions.h"
#include "platform/linux/DeviceRoot.h"
#include "platform/linux/PathFailure.h"
#include "propertylist/value/PropertyValue.h"
#include "vocabulary/DeviceServices.h"

namespace accounts {

inline constexpr std::size_t kRestrictedFeatureCount = 5;
inline constexpr std::size_t kSyncDataTypeCount = 4;

/// What the services of a device answer, for a device whose services do not run: an image. As it
/// stands here, no service has an answer.
struct DeviceDescription {
  /// Answers by question.
  PropertyDictionary deviceInfo;
  /// By RestrictedFeature.
  std::array<RestrictionAnswer, kRestrictedFeatureCount> profileRestrictions = {};
  /// Domain to dictionary of key to value; none when the pairing service cannot be reached.
  std::optional<PropertyDictionary> pairingValues;
  /// By SyncDataType.
  std::array<ExternalSyncSourcesAnswer, kSyncDataTypeCount> externalSyncSources;
  std::string cloudStatusKey = "status";
  std::string cloudPrimaryAccountKey = std::string(kPrimaryAccountKey);
  std::string cloudAccountTypeDisplayName = "Stratix";
};

// The keys of a description.
inline constexpr std::string_view kDeviceInfoKey = "DeviceInfo";
inline constexpr std::string_view kProfileRestrictionsKey = "ProfileRestrictions";
inline constexpr std::string_view kPairingValuesKey = "PairingValues";
inline constexpr std::string_view kExternalSyncSourcesKey = "ExternalSyncSources";
inline constexpr std::string_view kCloudAccountKey = "CloudAccount";
inline constexpr std::array kDeviceDescriptionKeys = {kDeviceInfoKey, kProfileRestrictionsKey,
                                                      kPairingValuesKey, kExternalSyncSourcesKey,
                                                      kCloudAccountKey};

/// Where a device holds its own description.
inline constexpr std::string_view kDeviceDescriptionPath = "/etc/device.plist";

/// The description that a dictionary holds. Keys that are missing or of the wrong kind leave their
/// defaults; other keys are ignored.
DeviceDescription deviceDescriptionFromDictionary(const PropertyDictionary& dictionary);

/// A description as it stands in its file, not looked into.
struct DescriptionBytes {
  /// None for a device without a description.
  std::optional<std::string> bytes;
  /// How an error names the file.
  std::string path;
};

/// The description that the device holds itself, at kDeviceDescriptionPath; it may be missing.
OrFailure<DescriptionBytes> readDeviceDescription(const DeviceRoot& root);

/// The description in a file of the host. A failure also when the file is missing.
OrFailure<DescriptionBytes> readHostDeviceDescription(const std::string& path);

/// What a description says; one that is missing has no answers. A failure when the bytes hold no
/// dictionary.
OrFailure<DeviceDescription> decodeDeviceDescription(const DescriptionBytes& read);

}  // namespace accounts
