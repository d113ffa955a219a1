#include "platform/linux/DescribedProfileRestrictions.h"

namespace accounts {

RestrictionAnswer DescribedProfileRestrictions::answerForFeature(RestrictedFeature feature) {
  return description_.profileRestrictions.at(static_cast<std::size_t>(feature));
}

}  // namespace accounts
