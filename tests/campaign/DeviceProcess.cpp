#include "tests/campaign/DeviceProcess.h"

#include <array>
#include <cstdio>
#include <stdexcept>
#include <utility>

#include "tests/campaign/AllocationFailures.h"
#include "tests/campaign/SimulatedKernel.h"
#include "vocabulary/AccountVocabulary.h"

namespace accounts {

namespace {

DeviceRoot openDevice() {
  auto root = DeviceRoot::openRoot(std::string(SimulatedKernel::kDeviceDirectory));
  if (!root) {
    throw std::logic_error(root.error().text);
  }
  return std::move(*root);
}

/// The bundle's resources, read once: every run needs them.
const FakeBundleResources& resources() {
  static const FakeBundleResources read = [] {
    FakeBundleResources bundle;
    for (const char* name :
         {"AccountTypesProperties", "DataclassesProperties", "AccountCreators", "MailServices"}) {
      bundle.replaced[name] = bundle.readPropertyList(name);
    }
    return bundle;
  }();
  return read;
}

}  // namespace

OrFailure<SerializedPropertyList> ObservedPropertyLists::serializeBinary(
    const PropertyValue& value) {
  auto serialized = real_.serializeBinary(value);
  const AllocationsSucceed whileObserving;
  const PropertyDictionary* root = value.asDictionary();
  if (serialized && root != nullptr && root->contains(kPlistAccountsKey)) {
    settingsWritten.push_back(bytesOf(*serialized));
  }
  return serialized;
}

std::optional<std::string> CountingUUIDs::randomUUID() {
  std::array<char, 37> text{};
  std::snprintf(text.data(), text.size(), "%08X-0000-4000-8000-%012X", run_, ++count_);
  return std::string(text.data());
}

DeviceProcess::DeviceProcess(const DeviceDescription& description, unsigned run)
    : root(openDevice()),
      cloudAccountService(description),
      deviceInfoService(description),
      externalSyncSources(description),
      pairingValueStore(description),
      profileRestrictions(description),
      uuidGenerator(run),
      bundleResources(resources()) {
  consoleLog.alsoStandardError = false;
  logSystem.channel.enabled = false;
}

}  // namespace accounts
