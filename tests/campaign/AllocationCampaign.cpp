#include <memory>
#include <new>
#include <string>

#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"
#include "tests/campaign/AllocationFailures.h"
#include "tests/campaign/Campaigns.h"

namespace accounts {

namespace {

constexpr std::size_t kFewestAllocations = 20'000;
constexpr std::string_view kFault = "bad-alloc";

/// A process that runs out of memory ends. What it leaves is what a kill there would leave.
void tryAllocationsIn(const Scenario& scenario, Report& report) {
  const std::unique_ptr<Invariants> invariants = Invariants::of(scenario);
  const std::size_t count = invariants->undisturbed().allocations;
  for (std::size_t allocation = 0; allocation < count; ++allocation) {
    if (!report.takes(scenario.name, allocation, kFault)) {
      continue;
    }
    const Run run = runOn(scenario.disk, scenario, {.failingAllocation = allocation});
    Complaint complaint = invariants->ofInterruption(run.disk, run.settingsWritten);
    if (!complaint && run.openDescriptors != 0) {
      complaint = "a descriptor stayed open";
    }
    if (!complaint) {
      complaint = invariants->ofNextRun(run.disk);
    }
    report.judge(complaint, "allocation " + std::to_string(allocation));
  }
  report.add("distinct disks afterwards", invariants->distinctDisks());
}

/// A codec gives what it gives with memory enough, or ends with std::bad_alloc: it never takes a
/// want of memory for a malformed file.
template <class Use>
void tryCodec(std::string_view name, Report& report, Use use) {
  if (!report.takes(name)) {
    return;
  }
  std::size_t count = 0;
  decltype(valueOrNone(use())) expected;
  {
    const AllocationFailure none(std::nullopt);
    expected = valueOrNone(use());
    count = AllocationFailure::count();
  }
  for (std::size_t allocation = 0; allocation < count; ++allocation) {
    if (!report.takes(name, allocation, kFault)) {
      continue;
    }
    bool isAsExpected = true;
    try {
      const AllocationFailure failure(allocation);
      isAsExpected = valueOrNone(use()) == expected;
    } catch (const std::bad_alloc&) {
      // What the caller is to see.
    }
    report.judge(isAsExpected ? Complaint() : "the codec gives another result",
                 "allocation " + std::to_string(allocation));
  }
}

/// A value with every kind in it.
PropertyValue sample() {
  PropertyArray everyKind = {true,
                             7,
                             -3,
                             2.5,
                             std::string(200, 'x'),
                             "G\u00f6teborg",
                             PropertyDate{1.5},
                             PropertyData{std::string("\x01\x02", 2)}};
  PropertyArray accounts;
  for (int number = 0; number < 20; ++number) {
    accounts.append(PropertyDictionary{
        {"Identifier", "A-" + std::to_string(number)}, {"Number", number}, {"Values", everyKind}});
  }
  return PropertyDictionary{{"Accounts", accounts}, {"Version", 12}};
}

std::string sampleAsXML() {
  std::string accounts;
  for (int number = 0; number < 20; ++number) {
    accounts += "<dict><key>Identifier</key><string>A &amp; " + std::to_string(number) +
                "</string><key>Values</key><array><true/><integer>-7</integer><real>2.5</real>"
                "<date>2012-09-19T17:09:04Z</date><data>AQIDBA==</data></array></dict>";
  }
  return "<?xml version=\"1.0\" encoding=\"UTF-8\"?><plist version=\"1.0\"><dict>"
         "<key>Accounts</key><array>" +
         accounts + "</array><key>Version</key><integer>12</integer></dict></plist>";
}

void tryCodecs(Report& report) {
  const PropertyValue value = sample();
  const std::string binary = writeBinaryPropertyList(value).value();
  const std::string xml = sampleAsXML();
  tryCodec("binary-writer", report, [&] { return writeBinaryPropertyList(value); });
  tryCodec("binary-reader", report, [&] { return readBinaryPropertyList(binary); });
  tryCodec("binary-reader-of-half", report,
           [&] { return readBinaryPropertyList(binary.substr(0, binary.size() / 2)); });
  tryCodec("xml-reader", report, [&] { return readXMLPropertyList(xml); });
  tryCodec("xml-reader-of-half", report,
           [&] { return readXMLPropertyList(xml.substr(0, xml.size() / 2)); });
}

}  // namespace

bool runAllocationCampaign(const std::vector<Scenario>& scenarios, const Selection& selection) {
  Report report(selection);
  tryCodecs(report);
  for (const Scenario& scenario : scenarios) {
    if (report.takes(scenario.name)) {
      tryAllocationsIn(scenario, report);
    }
  }
  return report.finish("allocations", kFewestAllocations);
}

}  // namespace accounts
