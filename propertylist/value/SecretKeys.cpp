#include "propertylist/value/SecretKeys.h"

#include <algorithm>
#include <iterator>
#include <string>

namespace accounts {

namespace {

/// A key holds a secret if one of these stands anywhere in its letters, whatever separates them.
constexpr std::string_view kAnywhere[] = {
    "password",      "passwd",         "passphrase",       "passcode",      "passkey",
    "secret",        "token",          "credential",       "cookie",        "bearer",
    "private",       "authorization",  "authorisation",    "sessionid",     "sessid",
    "accesskey",     "apikey",         "authkey",          "authcode",      "encryptionkey",
    "decryptionkey", "signingkey",     "sharedkey",        "masterkey",     "sessionkey",
    "securitycode",  "securityanswer", "verificationcode", "verifiercode",  "recoverycode",
    "recoverykey",   "onetimecode",    "pincode",          "pinnumber",     "seedphrase",
    "codeverifier",  "samlresponse",   "samlassertion",    "unlockpattern", "cvv"};

/// These are too short for that: they have to stand in one of the key's words.
constexpr std::string_view kInAWord[] = {"pwd", "pswd", "jwt", "sasl"};

/// With these a word has to end: "pass", "userpass", "totp". A blank stands at its end.
constexpr std::string_view kAtTheEndOfAWord[] = {"pass ", "pin ", "otp "};

/// These have to be a word.
constexpr std::string_view kWholeWords[] = {" pw ", " psw ", " cvc ", " puk "};

/// Words that hold one of those above and no secret.
constexpr std::string_view kInnocent[] = {"bypass",   "compass",   "trespass",   "surpass",
                                          "overpass", "underpass", "spin",       "secretar",
                                          "tokeniz",  "tokenis",   "sessionidle"};

constexpr bool isCapital(char character) {
  return character >= 'A' && character <= 'Z';
}
constexpr bool isSmall(char character) {
  return character >= 'a' && character <= 'z';
}

/// A key in small letters: all of them, and as words with a blank before and behind each. A word is
/// what stands between anything but letters, and begins where a capital does, as in "userPin" and
/// "JWTValue".
struct SpeltKey {
  std::string letters;
  std::string words = " ";
};

SpeltKey spelt(std::string_view key) {
  SpeltKey result;
  for (std::size_t place = 0; place < key.size(); ++place) {
    const char character = key[place];
    const bool followsSmall = place > 0 && isSmall(key[place - 1]);
    const bool precedesSmall = place + 1 < key.size() && isSmall(key[place + 1]);
    if (!isSmall(character) && !(isCapital(character) && !followsSmall && !precedesSmall)) {
      result.words += ' ';
    }
    if (isSmall(character) || isCapital(character)) {
      const char small =
          isCapital(character) ? static_cast<char>(character - 'A' + 'a') : character;
      result.letters += small;
      result.words += small;
    }
  }
  result.words += ' ';
  return result;
}

/// A text with a gap in the place of each innocent word.
std::string withoutInnocentWords(std::string text) {
  for (const std::string_view innocent : kInnocent) {
    for (std::size_t place = text.find(innocent); place != std::string::npos;
         place = text.find(innocent, place)) {
      text.replace(place, innocent.size(), "-");
    }
  }
  return text;
}

template <std::size_t Count>
bool holdsAny(std::string_view text, const std::string_view (&parts)[Count]) {
  return std::any_of(std::begin(parts), std::end(parts), [&](std::string_view part) {
    return text.find(part) != std::string_view::npos;
  });
}

bool holdsSecretWord(const SpeltKey& key) {
  return holdsAny(key.letters, kAnywhere) || holdsAny(key.words, kInAWord) ||
         holdsAny(key.words, kAtTheEndOfAWord) || holdsAny(key.words, kWholeWords);
}

}  // namespace

bool isSecretKey(std::string_view key) {
  const SpeltKey name = spelt(key);
  return holdsSecretWord(name) &&
         holdsSecretWord({withoutInnocentWords(name.letters), withoutInnocentWords(name.words)});
}

}  // namespace accounts
