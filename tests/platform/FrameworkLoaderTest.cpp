#include <gmock/gmock.h>

#include "platform/linux/LinuxFrameworkLoader.h"
#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

using testing::HasSubstr;

/// A device that holds shared objects built by the project.
class FrameworkLoaderTest : public DeviceFixture {
 protected:
  void install(const std::string& hostFile, std::string_view devicePath) const {
    makeFile(devicePath, hostFileContents(hostFile));
  }
  void installExample(const std::string& name, std::string_view devicePath) const {
    install(EXAMPLE_FRAMEWORKS_DIRECTORY "/" + name + ".framework/" + name + ".so", devicePath);
  }
  void installBroken(const std::string& name, std::string_view devicePath) const {
    install(BROKEN_FRAMEWORKS_DIRECTORY "/" + name + ".so", devicePath);
  }

  DeviceRoot root_ = openImage();
  LinuxFrameworkLoader loader_{root_};
};

TEST_F(FrameworkLoaderTest, AFrameworkMakesItsClassesKnown) {
  installExample("MailAccounts", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  EXPECT_TRUE(loaded) << loaded.error();
  const AccountClass* notifier = loader_.classes().classNamed("MailAccountNotifier");
  ASSERT_NE(notifier, nullptr);
  EXPECT_TRUE(notifier->noteAccountChanges);
  EXPECT_TRUE(notifier->accountWillChange_forDataclass);
  EXPECT_FALSE(notifier->accountToRefreshForBasicAccount);
}

TEST_F(FrameworkLoaderTest, AnOptionalOperationThatAClassLacksIsNotAnswered) {
  installExample("GroupwareAccounts", "/Library/Groupware.so");

  ASSERT_TRUE(loader_.loadFramework("/Library/Groupware.so"));

  const AccountClass* notifier = loader_.classes().classNamed("GroupwareAccountNotifier");
  ASSERT_NE(notifier, nullptr);
  EXPECT_TRUE(notifier->noteAccountChanges);
  EXPECT_FALSE(notifier->accountWillChange_forDataclass);
}

TEST_F(FrameworkLoaderTest, SeveralFrameworksStayLoadedSideBySide) {
  installExample("MailAccounts", "/Library/Mail.so");
  installExample("DeviceAndCloudAccounts", "/Library/Cloud.so");

  ASSERT_TRUE(loader_.loadFramework("/Library/Mail.so"));
  ASSERT_TRUE(loader_.loadFramework("/Library/Cloud.so"));

  EXPECT_NE(loader_.classes().classNamed("MailFullAccount"), nullptr);
  EXPECT_NE(loader_.classes().classNamed("CloudFullAccount"), nullptr);
}

TEST_F(FrameworkLoaderTest, AFrameworkThatIsLoadedIsNotRegisteredAgain) {
  installExample("MailAccounts", "/Library/Mail.so");
  ASSERT_TRUE(loader_.loadFramework("/Library/Mail.so"));
  const AccountClass* before = loader_.classes().classNamed("MailAccountNotifier");
  loader_.classes().registerClass("MailFullAccount", AccountClass());

  ASSERT_TRUE(loader_.loadFramework("/Library/Mail.so"));

  EXPECT_EQ(loader_.classes().classNamed("MailAccountNotifier"), before);
  EXPECT_FALSE(loader_.classes().classNamed("MailFullAccount")->classForAccountType)
      << "a second registration would have replaced it";
}

TEST_F(FrameworkLoaderTest, AnUnknownClassIsNone) {
  EXPECT_EQ(loader_.classes().classNamed("MailFullAccount"), nullptr);
}

TEST_F(FrameworkLoaderTest, AMissingFrameworkIsAFailureThatNamesIt) {
  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error(), HasSubstr("/Library/Mail.so: No such file or directory"));
}

TEST_F(FrameworkLoaderTest, AFileThatIsNoSharedObjectIsAFailureInTheLoadersWords) {
  // As long as the header of a shared object, which the loader reads first.
  makeFile("/Library/Mail.so", std::string(100, 'x'));

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error(), HasSubstr("invalid ELF header"));
}

TEST_F(FrameworkLoaderTest, ASharedObjectWithoutTheEntryPointIsAFailureThatNamesIt) {
  installBroken("WithoutEntryPoint", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error(), HasSubstr("undefined symbol: RegisterClasses"));
}

TEST_F(FrameworkLoaderTest, AnUnresolvedSymbolIsAFailureAtLoadTimeThatNamesIt) {
  installBroken("WithUnresolvedSymbol", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error(), HasSubstr("undefined symbol: functionThatNobodyDefines"));
}

TEST_F(FrameworkLoaderTest, ALinkThatLeadsOutOfTheDeviceLoadsNothingFromOutside) {
  makeDirectory("/Library");
  makeLink("/Library/Mail.so",
           EXAMPLE_FRAMEWORKS_DIRECTORY "/MailAccounts.framework/MailAccounts.so");

  EXPECT_FALSE(loader_.loadFramework("/Library/Mail.so"));
  EXPECT_EQ(loader_.classes().classNamed("MailFullAccount"), nullptr);
}

}  // namespace
}  // namespace accounts
