#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace accounts {

/// How many letters must be put in, taken out, replaced or exchanged with their neighbour to make
/// one word of another, no letter being touched twice.
std::size_t editDistance(std::string_view left, std::string_view right);

/// The word that somebody who wrote another one is likely to have meant: the nearest candidate, the
/// first one of several; none when none is near.
std::optional<std::string> suggestionFor(std::string_view word,
                                         const std::vector<std::string>& candidates);

}  // namespace accounts
