#include <gtest/gtest.h>

#include "propertylist/value/SecretKeys.h"

// The rule is written down in docs/secrets.md. These lists are its examples: keys as programs,
// services and people spell them.

namespace accounts {
namespace {

constexpr const char* kSecretKeys[] = {
    // Passwords.
    "Password", "password", "PASSWORD", "SMTP PASSWORD", "Pass-Word", "account_passwd",
    "Passphrase", "PassCode", "2nd_Password2", "kSecPassword", "userPassword", "IncomingPassword",
    "passwordHash", "encryptedPassword", "ShadowPasswd", "passkey", "Pass", "pass", "PASS",
    "userPass", "user_pass", "userpass", "USERPASS", "smtp.pass", "imapPass2", "pwd", "PWD",
    "userPwd", "userpwd", "pwdHash", "mail-pswd", "pw", "user_pw", "psw",
    // Numbers that people type.
    "PIN", "Pin", "pin", "userPin", "userpin", "device_pin", "SIM PIN", "PIN2", "pinCode",
    "PINNumber", "puk", "cvv", "CVC", "securityCode", "security_answer", "verificationCode",
    "recovery-code", "RecoveryKey", "UnlockPattern",
    // Codes for one time.
    "otp", "OTP", "totp", "totpSeed_otp", "HOTP", "otpSecret", "oneTimeCode", "oneTimePassword",
    // Tokens.
    "OAuthToken", "OAuth Token Secret", "access_token", "accessToken", "refresh_token", "id_token",
    "x-csrf-token", "deviceTokens", "jwt", "JWT", "JWTValue", "userJwt", "myjwt", "bearer",
    "BearerValue", "Authorization", "AUTHORIZATION", "proxy-authorization", "authCode",
    "code_verifier", "SAMLResponse",
    // Sessions.
    "SessionID", "sessionId", "session_id", "SESSIONID", "PHPSESSID", "JSESSIONID",
    "sessionIdentifier", "session-key", "cookie", "Cookies", "Set-Cookie", "Session Cookie",
    "cookieJar",
    // Keys.
    "ClientSecret", "client_secret", "sharedSecret", "secret", "SECRETS", "AWS_SECRET_ACCESS_KEY",
    "API Key", "apikey", "X-API-Key", "Access-Key", "PrivateKey", "private", "ssh_private",
    "PRIVATE", "privateData", "encryptionKey", "signing_key", "masterKey", "authKey", "Credentials",
    "credentialBlob", "seedPhrase",
    // Mechanisms that carry them.
    "sasl", "SASL", "saslResponse", "imapsasl"};

constexpr const char* kOtherKeys[] = {"",
                                      "-",
                                      "1",
                                      "Username",
                                      "Identifier",
                                      "Hostname",
                                      "AuthenticationScheme",
                                      "IsPrimary",
                                      "Key",
                                      "author",
                                      "Author",
                                      "authors",
                                      "authority",
                                      "authenticated",
                                      "AuthorName",
                                      "OAuth",
                                      "auth",
                                      "passive",
                                      "Passive",
                                      "passiveMode",
                                      "passenger",
                                      "Passbook",
                                      "passport",
                                      "passed",
                                      "PassesCount",
                                      "allowCardsAndPassesWhileLocked",
                                      "bypass",
                                      "compass",
                                      "compassHeading",
                                      "trespass",
                                      "spinner",
                                      "spin",
                                      "Spinning",
                                      "pinned",
                                      "pinning",
                                      "isPinned",
                                      "mapping",
                                      "shipping",
                                      "opinion",
                                      "ping",
                                      "pingInterval",
                                      "pinch",
                                      "pink",
                                      "PinterestName",
                                      "spinCount",
                                      "option",
                                      "options",
                                      "optional",
                                      "adopt",
                                      "stop",
                                      "topic",
                                      "laptop",
                                      "desktop",
                                      "rootPath",
                                      "rootpath",
                                      "hotplug",
                                      "OTPion",
                                      "footprint",
                                      "sessionIdleTimeout",
                                      "session",
                                      "sessionCount",
                                      "SessionStart",
                                      "secretary",
                                      "secretariat",
                                      "privacy",
                                      "PrivacyPolicy",
                                      "tokenizer",
                                      "Tokenization",
                                      "broken",
                                      "UsesASL",
                                      "asl",
                                      "pwned",
                                      "upward",
                                      "PWidth",
                                      "keyboard",
                                      "keyPath",
                                      "monkey",
                                      "publicKey",
                                      "hotkey",
                                      "turkey",
                                      "class",
                                      "ClassPath",
                                      "asset",
                                      "Wallet",
                                      "swap",
                                      "Enabled Dataclasses",
                                      "ChildAccounts",
                                      "DisplayName",
                                      "FullUserName",
                                      "ServerPath",
                                      "Principal Path",
                                      "SSLEnabled",
                                      "PortNumber",
                                      "identity",
                                      "SigningIdentity",
                                      "EncryptionIdentity",
                                      "MaxMessageSize",
                                      "AccountPath",
                                      "uniqueId"};

TEST(SecretKeys, AKeyEndsWhereItEndsWhateverFollowsInMemory) {
  EXPECT_TRUE(isSecretKey(std::string_view("userPINs").substr(0, 7)));
}

TEST(SecretKeys, KeysThatNameASecretAreTold) {
  for (const char* key : kSecretKeys) {
    EXPECT_TRUE(isSecretKey(key)) << key;
  }
}

TEST(SecretKeys, KeysThatNameNoneAreTold) {
  for (const char* key : kOtherKeys) {
    EXPECT_FALSE(isSecretKey(key)) << key;
  }
}

TEST(SecretKeys, TheCaseOfALetterMattersOnlyWhereAWordBegins) {
  for (const char* key : {"password", "token", "pwd", "pass", "pin", "otp", "jwt", "sasl", "bearer",
                          "cookie", "secret", "private"}) {
    std::string capitals(key);
    for (char& letter : capitals) {
      letter = static_cast<char>(std::toupper(static_cast<unsigned char>(letter)));
    }
    const std::string capital = capitals.substr(0, 1) + std::string(key).substr(1);
    for (const std::string& spelling :
         {std::string(key), capitals, capital, "my" + capital, "my_" + capitals,
          "my" + std::string(key), capital + "Value"}) {
      EXPECT_TRUE(isSecretKey(spelling)) << spelling;
    }
  }
}

TEST(SecretKeys, KeysInOtherScriptsAreNoWords) {
  for (const char* key : {"\xD0\xBF\xD0\xB0\xD1\x80", "\xC3\xA9pinette", "\xFF\xFE"}) {
    EXPECT_FALSE(isSecretKey(key)) << key;
  }
}

TEST(SecretKeys, WhatStandsBehindAKeyIsNoneOfIt) {
  EXPECT_FALSE(isSecretKey(std::string_view("pin").substr(0, 2)));
}

}  // namespace
}  // namespace accounts
