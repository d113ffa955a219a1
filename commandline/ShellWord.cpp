#include "commandline/ShellWord.h"

#include <algorithm>

namespace accounts {
namespace {

bool isPlain(char character) {
  constexpr std::string_view kAlsoPlain = "/._-+,:@%=";
  return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
         (character >= '0' && character <= '9') ||
         kAlsoPlain.find(character) != std::string_view::npos;
}

}  // namespace

std::string shellWord(std::string_view text) {
  if (!text.empty() && std::ranges::all_of(text, isPlain)) {
    return std::string(text);
  }
  std::string word = "'";
  for (const char character : text) {
    if (character == '\'') {
      word += "'\\''";
    } else {
      word += character;
    }
  }
  return word + "'";
}

}  // namespace accounts
