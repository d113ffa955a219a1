#include "migrator/URLEscaping.h"

namespace accounts {

namespace {

/// The legal characters of a URL without those that structure it or escape others: "@", "?", "/",
/// "#", "[", "]" and "%".
constexpr std::string_view kStandingCharacters =
    "abcdefghijklmnopqrstuvwxyz"
    "ABCDEFGHIJKLMNOPQRSTUVWXYZ"
    "0123456789"
    "-_.~!*'();:&=+$,";
constexpr std::string_view kHexadecimalDigits = "0123456789ABCDEF";

}  // namespace

std::string urlEscapedComponent(std::string_view text) {
  std::string escaped;
  escaped.reserve(text.size());
  for (const char character : text) {
    if (kStandingCharacters.find(character) != std::string_view::npos) {
      escaped += character;
    } else {
      const auto byte = static_cast<unsigned char>(character);
      escaped += '%';
      escaped += kHexadecimalDigits[byte >> 4];
      escaped += kHexadecimalDigits[byte & 0xF];
    }
  }
  return escaped;
}

}  // namespace accounts
