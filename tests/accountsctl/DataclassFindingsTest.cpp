#include "tests/accountsctl/FindingsFixture.h"

namespace accounts {
namespace {

constexpr const char* kMail = "com.quarx.Dataclass.Mail";
constexpr const char* kContacts = "com.quarx.Dataclass.Contacts";
constexpr const char* kCalendars = "com.quarx.Dataclass.Calendars";
constexpr const char* kBookmarks = "com.quarx.Dataclass.Bookmarks";
constexpr const char* kBackup = "com.quarx.Dataclass.Backup";

class DataclassFindings : public FindingsFixture {
 protected:
  /// An Exchange account, which supports mail, contacts and calendars but no bookmarks.
  static AccountDictionary exchange() { return anAccount("E", "Exchange", "ExchangeAccount"); }
};

TEST_F(DataclassFindings, SupportedAndProvisionedDataclassesHaveNone) {
  EXPECT_EQ(found({exchange().with("Enabled Dataclasses", PropertyArray{kMail, kContacts})}),
            Lines{});
}

TEST_F(DataclassFindings, AnUnknownDataclassIsIgnored) {
  EXPECT_EQ(found({exchange().with("Enabled Dataclasses", PropertyArray{"pigeons", kMail})}),
            Lines{"1 ignored unknownDataclass"});
}

TEST_F(DataclassFindings, ADataclassThatTheTypeDoesNotSupportIsIgnored) {
  EXPECT_EQ(found({exchange().with("Enabled Dataclasses", PropertyArray{kBookmarks})}),
            Lines{"1 ignored unsupportedDataclass"});
  EXPECT_EQ(found({exchange().with("Provisioned Dataclasses", PropertyArray{kBookmarks})}),
            Lines{"1 ignored unsupportedDataclass"});
}

TEST_F(DataclassFindings, AnEnabledDataclassThatIsNotProvisionedIsIgnored) {
  EXPECT_EQ(found({exchange()
                       .with("Provisioned Dataclasses", PropertyArray{kMail})
                       .with("Enabled Dataclasses", PropertyArray{kMail, kCalendars})}),
            Lines{"1 ignored unprovisionedDataclass"});
}

TEST_F(DataclassFindings, ADataclassThatAProfileForbidsIsIgnored) {
  const PropertyDictionary cloud = anAccount("Q", "QuarxAccount", "ZQAccount")
                                       .with("Enabled Dataclasses", PropertyArray{kBackup});
  EXPECT_EQ(found({cloud}), Lines{});

  device.profileRestrictions.answers[RestrictedFeature::CloudBackup] =
      RestrictionAnswer::ExplicitlyNotAllowed;

  EXPECT_EQ(found({cloud}), Lines{"1 ignored restrictedDataclass"});
}

TEST_F(DataclassFindings, AMemberThatIsNoTextIsIgnored) {
  EXPECT_EQ(found({exchange().with("Enabled Dataclasses", PropertyArray{5, kMail})}),
            Lines{"1 ignored noDataclass"});
}

TEST_F(DataclassFindings, TheListOfAChildWhoseParentHasOneIsIgnored) {
  const PropertyDictionary child = mail("C").with("Enabled Dataclasses", PropertyArray{"pigeons"});
  const PropertyDictionary parent = exchange().withChildren({child});

  EXPECT_EQ(found({AccountDictionary(parent).with("Enabled Dataclasses", PropertyArray{kMail})}),
            Lines{"1.1 ignored overruledDataclasses"});
  EXPECT_EQ(found({parent}), Lines{"1.1 ignored unknownDataclass"});
}

}  // namespace
}  // namespace accounts
