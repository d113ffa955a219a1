#include "commandline/Suggestion.h"

#include <algorithm>
#include <utility>

namespace accounts {

std::size_t editDistance(std::string_view left, std::string_view right) {
  // Rows of the table of distances between the beginnings of both words: of the beginning of `left`
  // that is one letter shorter than the current one, and of the one shorter by two.
  std::vector<std::size_t> previous(right.size() + 1);
  std::vector<std::size_t> beforePrevious;
  for (std::size_t length = 0; length <= right.size(); ++length) {
    previous[length] = length;
  }
  for (std::size_t row = 1; row <= left.size(); ++row) {
    std::vector<std::size_t> current = {row};
    for (std::size_t column = 1; column <= right.size(); ++column) {
      const bool isSame = left[row - 1] == right[column - 1];
      std::size_t distance = std::min(
          {previous[column] + 1, current[column - 1] + 1, previous[column - 1] + (isSame ? 0 : 1)});
      if (row > 1 && column > 1 && left[row - 1] == right[column - 2] &&
          left[row - 2] == right[column - 1]) {
        distance = std::min(distance, beforePrevious[column - 2] + 1);
      }
      current.push_back(distance);
    }
    beforePrevious = std::exchange(previous, std::move(current));
  }
  return previous.back();
}

std::optional<std::string> suggestionFor(std::string_view word,
                                         const std::vector<std::string>& candidates) {
  // Words of any greater length are no misspelling of an option, and comparing takes their product.
  constexpr std::size_t kLongestWord = 64;
  if (word.size() > kLongestWord) {
    return std::nullopt;
  }
  std::optional<std::string> nearest;
  std::size_t nearestDistance = 0;
  for (const std::string& candidate : candidates) {
    const std::size_t distance = editDistance(word, candidate);
    // One mistake in every three letters.
    const bool isNear = distance <= std::max(word.size(), candidate.size()) / 3;
    if (isNear && (!nearest || distance < nearestDistance)) {
      nearest = candidate;
      nearestDistance = distance;
    }
  }
  return nearest;
}

}  // namespace accounts
