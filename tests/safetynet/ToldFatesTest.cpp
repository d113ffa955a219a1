#include "safetynet/ToldFates.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace accounts {
namespace {

class Listener final : public MigrationObserver {
 public:
  std::vector<std::string> heard;

  void stageBegan(std::string_view operation, std::string_view purpose) override {
    heard.push_back(std::string(operation) + ": " + std::string(purpose));
  }
  void stageEnded(bool succeeded, const std::optional<AccountsInMemory>& accounts) override {
    heard.push_back(std::string(succeeded ? "succeeded" : "failed") +
                    (accounts ? " with accounts" : ""));
  }
};

TEST(ToldFatesTest, StagesArePassedOn) {
  ToldFates told;
  EXPECT_FALSE(told.wantsAccounts());
  Listener listener;
  told.passOnTo(&listener);
  EXPECT_TRUE(told.wantsAccounts());

  told.stageBegan("step", "what for");
  told.stageEnded(false, std::nullopt);
  told.stageEnded(true, AccountsInMemory());

  EXPECT_THAT(listener.heard,
              testing::ElementsAre("step: what for", "failed", "succeeded with accounts"));
  EXPECT_TRUE(told.hasRun("step"));
}

TEST(ToldFatesTest, AnEventHasTheStageInWhichItHappened) {
  ToldFates told;
  told.accountFared({{AccountOrigin::Kind::Settings, 1}, ToldFate::Refused});
  told.stageBegan("first", "");
  told.stageBegan("second", "");
  told.accountFared({{AccountOrigin::Kind::Settings, 2}, ToldFate::Refused, {}, "why"});
  ASSERT_EQ(told.events().size(), 2u);
  EXPECT_EQ(told.events()[0].stage, "");
  EXPECT_EQ(told.events()[1].stage, "second");
  EXPECT_EQ(told.events()[1].reason, "why");
}

}  // namespace
}  // namespace accounts
