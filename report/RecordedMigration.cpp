#include "report/RecordedMigration.h"

#include <string_view>
#include <utility>

#include "report/RecordedEvents.h"

namespace accounts {
namespace {

/// Puts the lines together, one after the other.
class Assembly {
 public:
  void add(std::string_view event, JSON content) {
    if (event == events::kBegan) {
      addStage(content);
      isInStage_ = true;
    } else if (event == events::kEnded && isInStage_) {
      end(content);
      isInStage_ = false;
    } else if (event == events::kFile) {
      stageAtHand()["files"].push_back(std::move(content));
    } else if (event == events::kLog) {
      stageAtHand()["log"].push_back(std::move(content));
    } else if (event == events::kBefore || event == events::kAfter) {
      addStores(event, content);
    }
  }

  RecordedMigration take() { return std::move(migration_); }

 private:
  void addStage(const JSON& names) {
    JSON stage = names;
    stage["accounts"] = JSON::array();
    stage["otherProperties"] = JSON::array();
    stage["files"] = JSON::array();
    stage["log"] = JSON::array();
    migration_.stages.push_back(std::move(stage));
  }

  /// The stage that runs; one without a name for what is done between two.
  JSON& stageAtHand() {
    const bool isBetween = !migration_.stages.empty() && migration_.stages.back()["name"].is_null();
    if (!isInStage_ && !isBetween) {
      addStage({{"name", nullptr}, {"title", "Between the stages"}});
    }
    return migration_.stages.back();
  }

  void end(JSON& content) {
    JSON& stage = migration_.stages.back();
    stage["succeeded"] = content["succeeded"];
    stage["seconds"] = content["seconds"];
    if (content.contains("accounts")) {
      stage["accounts"] = std::move(content["accounts"]);
      stage["otherProperties"] = std::move(content["properties"]);
      stage["otherOrder"] = content["otherOrder"];
    }
  }

  void addStores(std::string_view event, JSON& content) {
    migration_.versions[event] = content[events::kVersion];
    (event == events::kBefore ? migration_.accountsBefore : migration_.accountsAfter) =
        std::move(content[events::kAccounts]);
  }

  RecordedMigration migration_;
  bool isInStage_ = false;
};

}  // namespace

RecordedMigration RecordedMigration::fromLines(const std::vector<std::string>& lines) {
  Assembly assembly;
  for (const std::string& line : lines) {
    constexpr bool kAllowExceptions = false;
    JSON object = JSON::parse(line, nullptr, kAllowExceptions);
    if (object.is_object()) {
      for (auto&& [event, content] : object.items()) {
        if (content.is_object()) {
          assembly.add(event, std::move(content));
        }
      }
    }
  }
  return assembly.take();
}

}  // namespace accounts
