#include "tests/accountsettings/CreatorsFixture.h"

#include <stdexcept>

// A broken account-creation map is a programming error: it ends the process, and its text tells the
// engineer where to look.

namespace accounts {
namespace {

class CreatorAssertionsDeathTest : public CreatorsTest {
 protected:
  /// Expects that a full account for the type "Mail" ends the process with a text.
  void expectDeathOfFullAccount(const std::string& text) {
    const BasicAccountReference record = account("A", kMailAccountType);
    EXPECT_EXIT(static_cast<void>(record->fullAccountUsingLoader(nullptr)),
                testing::KilledBySignal(SIGABRT), testing::HasSubstr("BasicAccount: " + text));
  }
};

TEST_F(CreatorAssertionsDeathTest, ATypeWithoutEntryInTheMap) {
  setCreators({});
  expectDeathOfFullAccount(
      "Malformed AccountCreators information. Could not find the information for the type Mail\n");
}

// Not even when the map has an entry under the empty text.
TEST_F(CreatorAssertionsDeathTest, ARecordThatLostItsType) {
  setCreators({{"", PropertyArray{fullAccountCreator("Mail.so", "Creator")}}});
  const BasicAccountReference record = account("A", kMailAccountType);
  record->removeAccountPropertyForKey(kAccountType);
  const std::string text =
      "Malformed AccountCreators information. Could not find the information for the type (null)\n";
  EXPECT_EXIT(static_cast<void>(record->fullAccountUsingLoader(nullptr)),
              testing::KilledBySignal(SIGABRT), testing::HasSubstr(text));
  EXPECT_EXIT(static_cast<void>(record->_cachedSyncAccount()), testing::KilledBySignal(SIGABRT),
              testing::HasSubstr(text));
}

TEST_F(CreatorAssertionsDeathTest, ACreatorWithoutDescription) {
  setCreators({{"Mail", PropertyArray{PropertyDictionary{{"Type", "FullAccount"}}}}});
  expectDeathOfFullAccount(
      "Malformed AccountCreators information. Could not find the description for the FullAccount "
      "with type Mail\n");
}

TEST_F(CreatorAssertionsDeathTest, ADescriptionWithoutFramework) {
  setCreators({{"Mail", PropertyArray{creatorEntry("FullAccount", {{"Class", "Creator"}})}}});
  expectDeathOfFullAccount(
      "Malformed AccountCreators information. Could not find the path to the framework for the "
      "FullAccount with type Mail\n");
}

TEST_F(CreatorAssertionsDeathTest, AFrameworkThatCannotBeLoaded) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Lib/Mail.so", "Creator")}}});
  frameworkLoader.errors["/Lib/Mail.so"] = "undefined symbol: start";
  expectDeathOfFullAccount(
      "Could not load the account creator framework /Lib/Mail.so. Error undefined symbol: start\n");
}

TEST_F(CreatorAssertionsDeathTest, ADescriptionWithAnEmptyClassName) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "")}}});
  expectDeathOfFullAccount(
      "Malformed AccountCreators information. Could not find the name of the class that creates "
      "FullAccount with the type Mail\n");
}

TEST_F(CreatorAssertionsDeathTest, AClassThatTheFrameworkDoesNotBring) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator")}}});
  expectDeathOfFullAccount("The framework/bundle where Creator is defined has not been loaded\n");
}

TEST_F(CreatorAssertionsDeathTest, AClassThatMakesNoFullAccounts) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator")}}});
  frameworkLoader.registerClass("Creator", AccountClass());
  expectDeathOfFullAccount("Could not create the account with class Creator and id A\n");
}

TEST_F(CreatorAssertionsDeathTest, AClassThatNamesNoneForTheType) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator")}}});
  AccountClass creator;
  creator.classForAccountType = [](std::string_view) { return nullptr; };
  frameworkLoader.registerClass("Creator", creator);
  expectDeathOfFullAccount("Could not create the account with class Creator and id A\n");
}

TEST_F(CreatorAssertionsDeathTest, TheTextNamesTheOperationAndTheSourceFile) {
  setCreators({});
  const BasicAccountReference record = account("A", kMailAccountType);
  EXPECT_EXIT(static_cast<void>(record->fullAccountUsingLoader(nullptr)),
              testing::KilledBySignal(SIGABRT),
              testing::HasSubstr("-[BasicAccount _creatorClassNameForAccountType:creatorType:"
                                 "loader:], BasicAccount: "));
}

TEST_F(CreatorAssertionsDeathTest, AMapThatIsNotThere) {
  bundleResources.replaced["AccountCreators"] = std::nullopt;
  expectDeathOfFullAccount(
      "Malformed AccountCreators information. Could not find the information for the type Mail\n");
}

TEST_F(CreatorAssertionsDeathTest, AClassOfFullAccountsThatMakesNone) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator")}}});
  const AccountClass classWithoutOperations;
  AccountClass creator;
  creator.classForAccountType = [&](std::string_view) { return &classWithoutOperations; };
  frameworkLoader.registerClass("Creator", creator);
  expectDeathOfFullAccount("Could not create the account with class Creator and id A\n");
}

/// A sync account that throws whatever it is asked.
struct ThrowingSyncAccount : SyncAccount {
  [[noreturn]] static std::optional<PropertyValue> fail() {
    throw std::runtime_error("no\nserver");
  }

  std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass_isUserRequested(
      std::string_view, std::string_view, bool) override {
    fail();
  }
  std::optional<PropertyValue> refreshContainerListForDataclass_isUserRequested(std::string_view,
                                                                                bool) override {
    fail();
  }
  std::optional<PropertyValue> refreshContainersForDataclass_isUserRequested(std::string_view,
                                                                             bool) override {
    fail();
  }
};

struct ThrowingFullAccount : FullAccount {
  void setParentAccount(AccountRecordReference) override { throw 7; }
};

TEST_F(CreatorAssertionsDeathTest, AClassThatThrowsWhileItMakesAnAccount) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator"),
                                      syncAccountCreator("Mail.so", "Creator")}}});
  AccountClass creator;
  creator.accountWithBasicAccount = [](const AccountRecordReference&) -> FullAccountReference {
    throw std::runtime_error("no\nserver");
  };
  creator.accountToRefreshForBasicAccount =
      [](const AccountRecordReference&) -> SyncAccountReference {
    throw std::runtime_error("no\nserver");
  };
  frameworkLoader.registerClass("Creator", creator);
  expectDeathOfFullAccount("The class Creator threw an exception: no\\nserver\n");
  const BasicAccountReference record = account("A", kMailAccountType);
  EXPECT_EXIT(static_cast<void>(record->_cachedSyncAccount()), testing::KilledBySignal(SIGABRT),
              testing::HasSubstr("The class Creator threw an exception: no\\nserver\n"));

  creator.classForAccountType = [](std::string_view) -> const AccountClass* { throw 7; };
  frameworkLoader.registerClass("Creator", creator);
  expectDeathOfFullAccount("The class Creator threw an exception: one without words\n");
}

TEST_F(CreatorAssertionsDeathTest, AnAccountThatThrowsWhenItIsAsked) {
  setCreators({{"Mail", PropertyArray{fullAccountCreator("Mail.so", "Creator"),
                                      syncAccountCreator("Mail.so", "Creator")}}});
  AccountClass creator;
  creator.accountWithBasicAccount = [](const AccountRecordReference&) {
    return std::make_shared<ThrowingFullAccount>();
  };
  creator.accountToRefreshForBasicAccount = [](const AccountRecordReference&) {
    return std::make_shared<ThrowingSyncAccount>();
  };
  frameworkLoader.registerClass("Creator", creator);
  expectDeathOfFullAccount("The class Creator threw an exception: one without words\n");
  const BasicAccountReference record = account("A", kMailAccountType);
  const auto dies = testing::KilledBySignal(SIGABRT);
  const auto says = [](const std::string& operation) {
    return testing::AllOf(
        testing::HasSubstr("-[BasicAccount " + operation + ":isUserRequested:], "),
        testing::HasSubstr("The class Creator threw an exception: no\\nserver\n"));
  };
  EXPECT_EXIT(record->refreshContainersForDataclass("Mail"), dies,
              says("refreshContainersForDataclass"));
  EXPECT_EXIT(record->refreshContainerListForDataclass("Mail"), dies,
              says("refreshContainerListForDataclass"));
  EXPECT_EXIT(record->refreshContainerWithIdentifier_forDataclass("A", "Mail"), dies,
              says("refreshContainerWithIdentifier:forDataclass"));
}

}  // namespace
}  // namespace accounts
