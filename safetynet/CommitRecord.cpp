#include "safetynet/CommitRecord.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <optional>

#include "safetynet/MigrationCheck.h"

namespace accounts {
namespace {

constexpr std::string_view kFirstLine = "accounts-migration commit record 1\n";
constexpr std::string_view kLastLine = "end\n";
constexpr std::string_view kNothing = "none";
constexpr std::string_view kEarlierRun = "earlier";
constexpr std::array kLegacyStores = {DevicePlace::LegacyExchange, DevicePlace::LegacyMail};

/// The copy of a legacy store that goes with it.
DevicePlace originalOf(DevicePlace store) {
  return store == DevicePlace::LegacyMail ? DevicePlace::LegacyMailOriginal
                                          : DevicePlace::LegacyExchangeOriginal;
}

void append(std::string& text, const CommitRecord::Trace& trace) {
  if (!trace.exists) {
    text.append(" ").append(kNothing);
    return;
  }
  text.append(" ").append(std::to_string(trace.size));
  text.append(" ").append(std::to_string(trace.modified.seconds));
  text.append(" ").append(std::to_string(trace.modified.nanoseconds));
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
    const std::string_view word = next();
    if (word == kNothing) {
      return true;
    }
    trace.exists = true;
    return isNumber(word, trace.size) && nextNumber(trace.modified.seconds) &&
           nextNumber(trace.modified.nanoseconds);
  }
  /// Takes the rest if it is this word.
  bool isLast(std::string_view word) {
    const bool isIt = rest_ == word;
    rest_ = isIt ? std::string_view() : rest_;
    return isIt;
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
  if (!place || std::ranges::find(kLegacyStores, *place) == kLegacyStores.end() ||
      !words.nextTrace(store.store)) {
    return std::nullopt;
  }
  store.isOfEarlierRun = words.isLast(kEarlierRun);
  if (!store.isOfEarlierRun && (!words.nextTrace(store.settingsBefore) || !words.isAtEnd())) {
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
    if (each.isOfEarlierRun) {
      text.append(" ").append(kEarlierRun);
    } else {
      append(text, each.settingsBefore);
    }
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
  const auto traceAt = [&](DevicePlace place) {
    return CommitRecord::traceOf(transaction.snapshot().at(place).identity);
  };
  const CommitRecord::Trace settings = traceAt(DevicePlace::Settings);
  const std::optional<PropertyDictionary> accounts =
      transaction.dictionaryBefore(DevicePlace::Settings);
  for (const CommitRecord::Store& each : record.stores) {
    // Another settings file than before need not be the one with the store's accounts: the run may
    // have been killed before the exchange and another program may have written since.
    const bool isCarriedOver =
        isMigrated(accounts) &&
        (each.isOfEarlierRun ||
         (settings != each.settingsBefore &&
          mayHoldAccountsOf(*accounts, each.place, transaction.dictionaryBefore(each.place))));
    if (isCarriedOver && transaction.exists(originalOf(each.place))) {
      transaction.put(originalOf(each.place), Transaction::Removed{});
    }
    const CommitRecord::Trace standing = traceAt(each.place);
    if (isCarriedOver && each.store.exists && standing == each.store) {
      transaction.put(each.place, Transaction::Removed{});
      needed.stores.push_back(each);
    } else if (isCarriedOver && each.store.exists && !standing.exists) {
      // It may come back until its end is on the medium.
      needed.stores.push_back(each);
    }
  }
  transaction.put(DevicePlace::RemovalSentinel, Transaction::Removed{});
  transaction.put(DevicePlace::CommitRecord, Transaction::Removed{});
  return needed;
}

}  // namespace accounts
