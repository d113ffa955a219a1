#include "platform/linux/BytesDigest.h"

#include <sys/random.h>

// The library's functions become this file's own: nothing more is loaded when a program starts.
#define XXH_INLINE_ALL
#include <xxhash.h>

namespace accounts {

std::optional<DigestSecret> DigestSecret::makeRandom() {
  DigestSecret secret;
  const auto size = static_cast<ssize_t>(secret.bytes_.size());
  return ::getrandom(secret.bytes_.data(), secret.bytes_.size(), 0) == size ? std::optional(secret)
                                                                            : std::nullopt;
}

struct BytesDigest::State {
  XXH3_state_t value;
};

BytesDigest::BytesDigest(const DigestSecret& secret) : state_(std::make_unique<State>()) {
  XXH3_128bits_reset_withSecret(&state_->value, secret.bytes().data(), secret.bytes().size());
}

BytesDigest::~BytesDigest() = default;

void BytesDigest::add(std::string_view bytes) {
  XXH3_128bits_update(&state_->value, bytes.data(), bytes.size());
}

BytesDigest::Value BytesDigest::value() const {
  const XXH128_hash_t hash = XXH3_128bits_digest(&state_->value);
  return {.low = hash.low64, .high = hash.high64};
}

}  // namespace accounts
