#include "AccountsCorpus.h"

#include <cstdint>
#include <random>
#include <string_view>

namespace accounts::bench {

namespace {

std::string hexadecimal(std::mt19937_64& random, std::size_t digitCount) {
  std::string text;
  while (text.size() < digitCount) {
    text.push_back("0123456789ABCDEF"[random() % 16]);
  }
  return text;
}

std::string uuid(std::mt19937_64& random) {
  return hexadecimal(random, 8) + "-" + hexadecimal(random, 4) + "-" + hexadecimal(random, 4) +
         "-" + hexadecimal(random, 4) + "-" + hexadecimal(random, 12);
}

PropertyValue account(std::mt19937_64& random, int index) {
  const std::string user = "person" + std::to_string(index);
  const std::string domain = "mail" + std::to_string(index % 97) + ".example";
  const std::string identifier = uuid(random);
  PropertyDictionary child{{"Identifier", uuid(random)},
                           {"Type", "SMTP"},
                           {"Class", "SMTPAccount"},
                           {"ParentAccountIdentifier", identifier},
                           {"Hostname", "smtp." + domain}};
  return PropertyDictionary{
      {"Identifier", identifier},
      {"Type", index % 3 == 0 ? "IMAP" : "CalDAV"},
      {"Class", index % 3 == 0 ? "IMAPAccount" : "MobileCalDAVAccount"},
      {"DisplayName", index % 5 == 0 ? "Büro " + user : "Office of " + user},
      {"EmailAddresses", PropertyArray{user + "@" + domain, user + ".alias@" + domain}},
      {"FullUserName", "Full Name of " + user},
      {"Hostname", "imap." + domain},
      {"Username", user + "@" + domain},
      {"PortNumber", 993},
      {"SSLEnabled", true},
      {"Active", index % 7 != 0},
      {"Enabled Dataclasses",
       PropertyArray{"com.quarx.Dataclass.Mail", "com.quarx.Dataclass.Notes"}},
      {"MaxMessageBytesByMailbox", PropertyDictionary{{"INBOX", 1 << (index % 20)}}},
      {"DateCreated", PropertyDate{3.0e8 + index * 61.5}},
      {"PrincipalPath", "/principals/__uids__/" + uuid(random) + "/"},
      {"PrincipalURL", "https://dav." + domain + ":8443/principals/users/" + user + "/"},
      {"SyncToken", "HwoQEgwAAAAA" + hexadecimal(random, 28)},
      {"Certificate", PropertyData(hexadecimal(random, 20))},
      {"Weight", index * 0.25},
      {"ChildAccounts", PropertyArray{child}}};
}

void appendXMLText(std::string& xml, std::string_view text) {
  for (const char character : text) {
    switch (character) {
      case '<':
        xml.append("&lt;");
        break;
      case '&':
        xml.append("&amp;");
        break;
      default:
        xml.push_back(character);
    }
  }
}

void appendElement(std::string& xml, std::string_view name, std::string_view text) {
  xml.append("<").append(name).append(">");
  appendXMLText(xml, text);
  xml.append("</").append(name).append(">\n");
}

void appendXML(std::string& xml, const PropertyValue& value, std::size_t depth) {
  xml.append(depth, '\t');
  switch (value.kind()) {
    case PropertyKind::Dictionary:
      xml.append("<dict>\n");
      for (const PropertyEntry& entry : *value.asDictionary()) {
        xml.append(depth + 1, '\t');
        appendElement(xml, "key", entry.key);
        appendXML(xml, entry.value, depth + 1);
      }
      xml.append(depth, '\t').append("</dict>\n");
      break;
    case PropertyKind::Array:
      xml.append("<array>\n");
      for (const PropertyValue& element : *value.asArray()) {
        appendXML(xml, element, depth + 1);
      }
      xml.append(depth, '\t').append("</array>\n");
      break;
    case PropertyKind::String:
      appendElement(xml, "string", *value.asText());
      break;
    case PropertyKind::Integer:
      appendElement(xml, "integer", std::to_string(*value.asSigned()));
      break;
    case PropertyKind::Real:
      appendElement(xml, "real", std::to_string(*value.asReal()));
      break;
    case PropertyKind::Boolean:
      xml.append(*value.asBoolean() ? "<true/>\n" : "<false/>\n");
      break;
    case PropertyKind::Date:
      xml.append("<date>2010-07-07T05:20:00Z</date>\n");
      break;
    case PropertyKind::Data:
      xml.append("<data>MDEyMzQ1Njc4OWFiY2RlZmdoaWo=</data>\n");
      break;
  }
}

}  // namespace

PropertyValue accountsCorpus(int accountCount) {
  // The same seed in every run: the same bytes are measured.
  std::mt19937_64 random(20010101);
  PropertyArray accounts;
  for (int index = 0; index < accountCount; ++index) {
    accounts.append(account(random, index));
  }
  return PropertyDictionary{{"Version", 12}, {"Accounts", accounts}};
}

std::string xmlOf(const PropertyValue& value) {
  std::string xml =
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
      "<!DOCTYPE plist SYSTEM \"PropertyList-1.0.dtd\">\n"
      "<plist version=\"1.0\">\n";
  appendXML(xml, value, 0);
  xml.append("</plist>\n");
  return xml;
}

}  // namespace accounts::bench
