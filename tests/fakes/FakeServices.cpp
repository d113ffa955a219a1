#include "tests/fakes/FakeServices.h"

#include <cstdio>
#include <fstream>
#include <iostream>
#include <iterator>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

namespace {

std::optional<PropertyDictionary> dictionaryOf(std::string_view bytes) {
  const auto value = readPropertyList(bytes);
  const PropertyDictionary* dictionary = value ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

std::optional<PropertyDictionary> readRepositoryResource(std::string_view name) {
  std::ifstream file(std::string(ACCOUNTS_RESOURCES_DIRECTORY) + "/" + std::string(name) + ".plist",
                     std::ios::binary);
  return dictionaryOf(
      std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()));
}

}  // namespace

bool FakeBundleResources::hasPropertyList(std::string_view name) {
  if (unreadable.contains(name)) {
    return true;
  }
  const auto place = replaced.find(name);
  return place != replaced.end() ? place->second.has_value()
                                 : readRepositoryResource(name).has_value();
}

std::optional<PropertyDictionary> FakeBundleResources::readPropertyList(std::string_view name) {
  reads.emplace_back(name);
  if (unreadable.contains(name)) {
    return std::nullopt;
  }
  const auto place = replaced.find(name);
  return place != replaced.end() ? place->second : readRepositoryResource(name);
}

void FakeConsoleLog::writeLine(std::string_view line) {
  journal_.push_back("console " + std::string(line));
  lines.emplace_back(line);
  if (alsoStandardError) {
    std::cerr << line << '\n';
  }
}

std::vector<std::string> FakeLogSystem::Channel::linesWithoutNumbers() const {
  std::vector<std::string> result = lines;
  for (std::string& line : result) {
    // The prefix is "OPERATION (NUMBER) "; operations end in a bracket.
    const std::size_t begin = line.find("] (") + 3;
    const std::size_t end = line.find(')', begin);
    line.replace(begin, end - begin, "N");
  }
  return result;
}

std::unique_ptr<PairingConnection> FakePairingValueStore::connect() {
  class Connection : public PairingConnection {
   public:
    explicit Connection(FakePairingValueStore& store) : store_(store) { ++store_.openConnections; }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;
    ~Connection() override { --store_.openConnections; }

    std::optional<PropertyValue> copyValue(std::string_view domain,
                                           std::optional<std::string_view> key) override {
      store_.requests.emplace_back(domain, key);
      const auto value = store_.values.find({std::string(domain), std::string(key.value_or(""))});
      return value != store_.values.end() ? std::optional(value->second) : std::nullopt;
    }

   private:
    FakePairingValueStore& store_;
  };
  return canConnect ? std::make_unique<Connection>(*this) : nullptr;
}

std::optional<PropertyDictionary> FakePropertyLists::readDictionary(std::string_view path) {
  const std::optional<std::string> bytes = fileSystem_.read(path);
  return bytes ? dictionaryOf(*bytes) : std::nullopt;
}

OrFailure<SerializedPropertyList> FakePropertyLists::serializeBinary(const PropertyValue& value) {
  if (serializationError) {
    return Failure{.text = *serializationError};
  }
  if (givesNone) {
    return SerializedPropertyList();
  }
  auto serialized = serializer_.serialize(value);
  if (!serialized) {
    return Failure{.text = serialized.error().text};
  }
  return *std::move(serialized);
}

std::unique_ptr<NamedLock> FakeSharedResources::makeLock(std::string_view name) {
  class Lock : public NamedLock {
   public:
    Lock(std::string_view name, std::vector<std::string>& journal)
        : name_(name), journal_(journal) {}
    void lock() override { journal_.push_back("lock " + name_); }
    void unlock() override { journal_.push_back("unlock " + name_); }

   private:
    std::string name_;
    std::vector<std::string>& journal_;
  };
  return canMakeLock ? std::make_unique<Lock>(name, journal_) : nullptr;
}

std::optional<std::string> FakeUUIDGenerator::randomUUID() {
  if (!canGenerate) {
    return std::nullopt;
  }
  char text[37];
  std::snprintf(text, sizeof text, "00000000-0000-0000-0000-%012d", ++count_);
  return std::string(text);
}

}  // namespace accounts
