#include "tests/accountsettings/CreatorsFixture.h"

namespace accounts {
namespace {

class FullAccountCreationTest : public CreatorsTest {};

TEST_F(FullAccountCreationTest, AClassThatNamesAnotherForTheTypeHasThatOneInstantiated) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  AccountClass instantiated;
  instantiated.initWithProperties = [](const PropertyDictionary& properties) {
    auto made = std::make_shared<RecordedFullAccount>();
    made->properties = properties;
    return made;
  };
  AccountClass creator = classMakingAccountsFromRecords();
  std::string typeAsked;
  creator.classForAccountType = [&](std::string_view type) {
    typeAsked = type;
    return frameworkLoader.classNamed("MailImplementation");
  };
  frameworkLoader.frameworks["/Mail.so"] = {{"MailCreator", creator},
                                            {"MailImplementation", instantiated}};
  const BasicAccountReference record = account("A", kMailAccountType);

  const FullAccountReference made = record->fullAccountUsingLoader(nullptr);

  EXPECT_EQ(typeAsked, "Mail");
  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*made).properties, record->properties());
  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*made).record.lock(), nullptr)
      << "the second choice is not asked";
}

TEST_F(FullAccountCreationTest, AClassWithTheSecondChoiceAloneMakesTheAccountFromTheRecord) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  frameworkLoader.frameworks["/Mail.so"] = {{"MailCreator", classMakingAccountsFromRecords()}};
  const BasicAccountReference record = account("A", kMailAccountType);

  const FullAccountReference made = record->fullAccountUsingLoader(nullptr);

  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*made).record.lock(), record);
}

TEST_F(FullAccountCreationTest, TheNewAccountIsToldItsRecordsParentOnce) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  frameworkLoader.frameworks["/Mail.so"] = {{"MailCreator", classMakingAccountsFromRecords()}};
  const BasicAccountReference parent = account("P", kQuarxAccountType);
  const BasicAccountReference child = account("C", kMailAccountType);
  child->setParentAccount(parent);

  const FullAccountReference made = child->fullAccountUsingLoader(nullptr);

  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*made).parent, parent);
  EXPECT_EQ(dynamic_cast<RecordedFullAccount&>(*made).parentCalls, 1);
}

TEST_F(FullAccountCreationTest, AskingTwiceGivesTheSameAccountAndLoadsNothingAgain) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  frameworkLoader.frameworks["/Mail.so"] = {{"MailCreator", classMakingAccountsFromRecords()}};
  const BasicAccountReference record = account("A", kMailAccountType);

  const FullAccountReference first = record->fullAccountUsingLoader(nullptr);
  const FullAccountReference second = record->fullAccountUsingLoader(nullptr);

  EXPECT_EQ(first, second);
  EXPECT_EQ(frameworkLoader.loads, std::vector<std::string>{"/Mail.so"});
}

TEST_F(FullAccountCreationTest, AnAccountThatWasSetIsTheOneGivenOut) {
  const BasicAccountReference record = account("A", kMailAccountType);
  const auto given = std::make_shared<RecordedFullAccount>();

  record->setFullAccount(given);

  EXPECT_EQ(record->fullAccountUsingLoader(nullptr), given);
  EXPECT_TRUE(frameworkLoader.loads.empty());
}

TEST_F(FullAccountCreationTest, TheDeviceLocalAccountsClassIsTheSystemsOwn) {
  setCreators(
      {{"OnMyDevice", PropertyArray{fullAccountCreator("Device.so", "DeviceLocalAccount")}}});
  const BasicAccountReference record =
      BasicAccount::initWithProperties(DeviceLocalAccount::basicAccountProperties());

  const FullAccountReference made = record->fullAccountUsingLoader(nullptr);

  const auto* deviceLocal = dynamic_cast<const DeviceLocalAccount*>(made.get());
  ASSERT_NE(deviceLocal, nullptr);
  EXPECT_EQ(deviceLocal->properties(), record->properties());
}

TEST_F(FullAccountCreationTest, ALoaderThatHasLoadedTheFrameworkKeepsTheMapsFromBeingLoaded) {
  RecordingLoader loader;
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  frameworkLoader.registerClass("MailCreator", classMakingAccountsFromRecords());
  const BasicAccountReference record = account("A", kMailAccountType);

  const FullAccountReference made = record->fullAccountUsingLoader(&loader);

  EXPECT_NE(made, nullptr) << "the class name still comes from the map";
  EXPECT_EQ(loader.asked, std::vector<PropertyDictionary>{record->properties()});
  EXPECT_TRUE(frameworkLoader.loads.empty());
}

TEST_F(FullAccountCreationTest, ALoaderThatHasNotLoadedTheFrameworkLeavesItToTheMap) {
  RecordingLoader loader;
  loader.hasLoaded = false;
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "MailCreator")}}});
  frameworkLoader.frameworks["/Mail.so"] = {{"MailCreator", classMakingAccountsFromRecords()}};

  EXPECT_NE(account("A", kMailAccountType)->fullAccountUsingLoader(&loader), nullptr);
  EXPECT_EQ(frameworkLoader.loads, std::vector<std::string>{"/Mail.so"});
}

TEST_F(FullAccountCreationTest, OfTwoCreatorsBothFrameworksAreLoadedAndTheLastClassIsUsed) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("First.so", "First"),
                                      syncAccountCreator("Sync.so", "Sync"),
                                      fullAccountCreator("Second.so", "Second")}}});
  const BasicAccountReference record = account("A", kMailAccountType);

  EXPECT_EQ(record->fullAccountCreatorClassNameForAccountType_loader("Mail", nullptr), "Second");
  EXPECT_EQ(frameworkLoader.loads, (std::vector<std::string>{"/First.so", "/Second.so"}));
}

TEST_F(FullAccountCreationTest, ACreatorKindThatTheTypeLacksHasNoClassName) {
  setCreators({{"Mail", PropertyArray{syncAccountCreator("Sync.so", "Sync")}}});

  EXPECT_EQ(account("A", kMailAccountType)
                ->fullAccountCreatorClassNameForAccountType_loader("Mail", nullptr),
            std::nullopt);
}

TEST_F(FullAccountCreationTest, TheMapIsReadOnceForTheProcess) {
  setCreators({{"Mail", PropertyArray{}}});
  const BasicAccountReference record = account("A", kMailAccountType);
  bundleResources.reads.clear();

  record->syncAccountCreatorClassNameForAccountType("Mail");
  record->syncAccountCreatorClassNameForAccountType("Mail");

  EXPECT_EQ(bundleResources.reads, std::vector<std::string>{"AccountCreators"});
}

TEST_F(FullAccountCreationTest, RenewingCredentialsTellsTheHandlerThreeAtOnceAndOnce) {
  std::vector<int> results;

  account("A", kMailAccountType)->renewAccountCredentialsWithHandler([&](int result) {
    results.push_back(result);
  });

  EXPECT_EQ(results, std::vector<int>{3});
}

}  // namespace
}  // namespace accounts
