#pragma once

#include <cstdint>

namespace accounts {

/// The features that configuration profiles may restrict and that hide dataclasses.
enum class RestrictedFeature : std::uint8_t {
  CloudDocumentSync,
  PhotoStream,
  SharedPhotoStreams,
  CloudBackup,
  CardsAndPassesWhileLocked
};

/// What the installed profiles say of a feature. The numbers are the service's own.
enum class RestrictionAnswer : std::uint8_t {
  NoSetting = 0,
  ExplicitlyAllowed = 1,
  ExplicitlyNotAllowed = 2
};

/// Tells which features the installed configuration profiles allow.
class ProfileRestrictions {
 public:
  virtual ~ProfileRestrictions() = default;

  virtual RestrictionAnswer answerForFeature(RestrictedFeature feature) = 0;
};

}  // namespace accounts
