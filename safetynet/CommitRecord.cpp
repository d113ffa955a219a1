#include "safetynet/CommitRecord.h"

#include <algorithm>
#include <charconv>
#include <optional>

#include "safetynet/MigrationCheck.h"

namespace accounts {
namespace {

constexpr std::string_view kFirstLine = "accounts-migration commit record 1\n";
constexpr std::string_view kLastLine = "end\n";
constexpr std::string_view kAnySettings = "any";

void append(std::string& text, std::string_view word) {
  text.append(" ").append(word);
}

void append(std::string& text, const CommitRecord::Trace& trace) {
  append(text, std::to_string(trace.size));
  append(text, std::to_string(trace.modified.seconds));
  append(text, std::to_string(trace.modified.nanoseconds));
}

/// A word that says a text, whatever is in it: two digits for each byte.
std::string hexadecimal(std::string_view text) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string word = "=";
  for (const char each : text) {
    const auto byte = static_cast<unsigned char>(each);
    word += kDigits[byte >> 4];
    word += kDigits[byte & 0x0f];
  }
  return word;
}

std::optional<std::string> textOf(std::string_view word) {
  if (!word.starts_with('=') || word.size() % 2 == 0) {
    return std::nullopt;
  }
  std::string text;
  for (std::size_t index = 1; index < word.size(); index += 2) {
    unsigned byte = 0;
    const char* const end = word.data() + index + 2;
    const auto [stop, error] = std::from_chars(word.data() + index, end, byte, 16);
    if (error != std::errc() || stop != end) {
      return std::nullopt;
    }
    text += static_cast<char>(byte);
  }
  return text;
}

void append(std::string& text, const std::optional<CommitRecord::Proof>& proof) {
  append(text, proof ? std::to_string(proof->settingsSize) : std::string(kAnySettings));
  for (const std::string& each : proof ? proof->accounts : std::vector<std::string>()) {
    append(text, hexadecimal(each));
  }
}

/// Takes words from a line.
class Words {
 public:
  explicit Words(std::string_view line) : rest_(line) {}

  std::string_view next() {
    const std::size_t end = std::min(rest_.find(' '), rest_.size());
    const std::string_view word = rest_.substr(0, end);
    rest_.remove_prefix(std::min(end + 1, rest_.size()));
    return word;
  }
  template <class Number>
  bool nextNumber(Number& number) {
    return isNumber(next(), number);
  }
  bool nextTrace(CommitRecord::Trace& trace) {
    trace.exists = true;
    return nextNumber(trace.size) && nextNumber(trace.modified.seconds) &&
           nextNumber(trace.modified.nanoseconds);
  }
  bool nextProof(std::optional<CommitRecord::Proof>& proof) {
    const std::string_view word = next();
    if (word == kAnySettings) {
      return true;
    }
    proof = CommitRecord::Proof{};
    if (!isNumber(word, proof->settingsSize)) {
      return false;
    }
    while (!isAtEnd()) {
      const auto account = textOf(next());
      if (!account) {
        return false;
      }
      proof->accounts.push_back(*account);
    }
    return true;
  }
  [[nodiscard]] bool isAtEnd() const { return rest_.empty(); }

 private:
  template <class Number>
  static bool isNumber(std::string_view word, Number& number) {
    const auto [stop, error] = std::from_chars(word.data(), word.data() + word.size(), number);
    return error == std::errc() && stop == word.data() + word.size() && !word.empty();
  }

  std::string_view rest_;
};

std::optional<CommitRecord::Store> storeFrom(std::string_view line) {
  Words words(line);
  CommitRecord::Store store;
  const auto place = placeNamed(words.next());
  if (!place ||
      std::ranges::find(kLegacyStores, *place, &LegacyStore::store) == kLegacyStores.end() ||
      !words.nextTrace(store.store) || !words.nextProof(store.proof) || !words.isAtEnd()) {
    return std::nullopt;
  }
  store.place = *place;
  return store;
}

}  // namespace

std::string CommitRecord::text() const {
  std::string text(kFirstLine);
  for (const Store& each : stores) {
    text.append(listed(each.place).name);
    append(text, each.store);
    append(text, each.proof);
    text.append("\n");
  }
  return text.append(kLastLine);
}

CommitRecord CommitRecord::parse(std::string_view text) {
  CommitRecord record;
  if (!text.starts_with(kFirstLine) || !text.ends_with(kLastLine)) {
    return record;
  }
  text.remove_prefix(kFirstLine.size());
  while (text != kLastLine) {
    const std::size_t end = text.find('\n');
    const auto store =
        end != std::string_view::npos ? storeFrom(text.substr(0, end)) : std::nullopt;
    if (!store) {
      return CommitRecord();
    }
    record.stores.push_back(*store);
    text.remove_prefix(end + 1);
  }
  return record;
}

CommitRecord::Trace CommitRecord::traceOf(const FileIdentity& identity) {
  return identity.exists() ? Trace{true, identity.size, identity.modified} : Trace();
}

CommitRecord finishInterruptedCommit(Transaction& transaction) {
  CommitRecord needed;
  if (!transaction.snapshot().at(DevicePlace::CommitRecord).identity.exists()) {
    return needed;
  }
  const std::optional<std::string> text = transaction.bytesBefore(DevicePlace::CommitRecord);
  const CommitRecord record = CommitRecord::parse(text.value_or(""));
  const std::uint64_t size = transaction.snapshot().at(DevicePlace::Settings).identity.size;
  const std::optional<PropertyDictionary> settings =
      transaction.dictionaryBefore(DevicePlace::Settings);
  for (const CommitRecord::Store& each : record.stores) {
    const bool isProved = !each.proof || (each.proof->accounts.empty()
                                              ? each.proof->settingsSize == size
                                              : hasAnyAccount(settings, each.proof->accounts));
    if (!isMigrated(settings) || !isProved) {
      continue;
    }
    const DevicePlace original =
        std::ranges::find(kLegacyStores, each.place, &LegacyStore::store)->original;
    if (transaction.exists(original)) {
      transaction.put(original, Transaction::Removed{});
    }
    const FileIdentity& standing = transaction.snapshot().at(each.place).identity;
    if (CommitRecord::traceOf(standing) == each.store) {
      transaction.put(each.place, Transaction::Removed{});
      needed.stores.push_back(each);
    } else if (!standing.exists()) {
      // It may come back until its end is on the medium.
      needed.stores.push_back(each);
    }
  }
  transaction.put(DevicePlace::RemovalSentinel, Transaction::Removed{});
  transaction.put(DevicePlace::CommitRecord, Transaction::Removed{});
  return needed;
}

}  // namespace accounts
