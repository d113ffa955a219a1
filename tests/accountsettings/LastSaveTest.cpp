#include "accountsettings/NewestSave.h"

#include "tests/accountsettings/StoreFixture.h"

namespace accounts {
namespace {

class LastSaveTest : public StoreFixture {
 protected:
  LastSaveTest() { takeLines(); }

  /// Saves these dictionaries as they are: the one that a record makes of each is in memory.
  PropertyArray save(const std::vector<PropertyDictionary>& dictionaries,
                     FixResult fixing = FixResult::Unchanged) {
    std::vector<PropertyValue> elements;
    std::vector<BasicAccountReference> accounts;
    for (const PropertyDictionary& dictionary : dictionaries) {
      accounts.push_back(BasicAccount::initWithProperties(dictionary));
      elements.emplace_back(accounts.back()->properties());
    }
    memory.assign(std::move(accounts));
    return note(PropertyArray(std::move(elements)), fixing);
  }
  PropertyArray note(PropertyArray written, FixResult fixing = FixResult::Unchanged) {
    lastSave.note(written, memory, fixing);
    takeLines();
    return written;
  }
  [[nodiscard]] bool isThere(const PropertyArray& onDisk) const {
    return lastSave.isThere(onDisk, memory);
  }

  OrderedAccounts memory;
  NewestSave lastSave;
};

TEST_F(LastSaveTest, WhatWasWrittenIsThereWhateverMemoryHasNow) {
  const PropertyArray written = save({mail("A"), exchange("P").withChildren({mail("C")})});
  memory.accounts().front()->setAccountProperty_forKey("changed", "Username");
  EXPECT_TRUE(isThere(written));
}

TEST_F(LastSaveTest, TheSameContentThatSomebodyElseWroteIsAnother) {
  save({mail("A")});
  EXPECT_FALSE(isThere({PropertyDictionary(mail("A"))}));
}

TEST_F(LastSaveTest, AnotherIdentifierOrNumberOfAccountsInMemoryEndsIt) {
  const PropertyArray written = save({mail("A"), mail("B")});
  const BasicAccountReference added = recordOf(mail("C"));
  memory.append(added);
  EXPECT_FALSE(isThere(written));
  memory.removeLast("C");
  EXPECT_TRUE(isThere(written));
  memory.accounts().front()->setAccountProperty_forKey("C", kAccountIdentifier);
  EXPECT_FALSE(isThere(written));
}

TEST_F(LastSaveTest, WhatAStoreWouldDropIsLoaded) {
  EXPECT_FALSE(isThere(save({mail("A"), exchange("A")})));
  EXPECT_FALSE(isThere(save({mail("A")}, FixResult::CannotBeKept)));
  EXPECT_TRUE(isThere(save({mail("A")}, FixResult::Changed)));
}

TEST_F(LastSaveTest, WhatAStoreWouldWriteALineAboutIsLoaded) {
  EXPECT_FALSE(isThere(save({exchange("P").withChildren({ofUnknownType("A")})})));
  EXPECT_FALSE(isThere(save({exchange("P").withChildren({"no account"})})));
  EXPECT_FALSE(isThere(save({exchange("P").withChildren({mail("A").with(kAccountClass, "")})})));
}

TEST_F(LastSaveTest, WhatAStoreWouldAddAnIdentifierToIsLoaded) {
  EXPECT_FALSE(
      isThere(save({exchange("P").withChildren({mail("A").without(kAccountIdentifier)})})));
  memory.assign({recordOf(mail("A"))});
  EXPECT_FALSE(isThere(note({PropertyDictionary(mail("A").without(kAccountIdentifier))})));
}

TEST_F(LastSaveTest, WhatTheDiskContributedIsLoadedIfTheFixersWouldChangeOrDropIt) {
  memory.assign({recordOf(mail("A"))});
  EXPECT_TRUE(isThere(note({PropertyDictionary(mail("A").with("Username", "disk"))})));
  EXPECT_FALSE(isThere(note({PropertyDictionary(mailThatCanBeFixed("A"))})));
  EXPECT_FALSE(isThere(note({PropertyDictionary(mailThatCannotBeFixed("A"))})));
}

TEST_F(LastSaveTest, WhatIsChangedBetweenTwoSavesIsLookedAtAgain) {
  const PropertyDictionary kept = mail("A");
  memory.assign({recordOf(mail("A")), recordOf(exchange("P"))});
  EXPECT_TRUE(isThere(note({kept, PropertyDictionary(exchange("P"))})));
  EXPECT_FALSE(
      isThere(note({kept, PropertyDictionary(exchange("P").withChildren({"no account"}))})));
}

}  // namespace
}  // namespace accounts
