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
    install(FAULTY_FRAMEWORKS_DIRECTORY "/" + name + ".so", devicePath);
  }

  DeviceRoot root_ = openImage();
  /// The lines that the loader wrote.
  struct Log : ConsoleLog {
    std::vector<std::string> lines;
    void writeLine(std::string_view line) override { lines.emplace_back(line); }
  };

  Log log_;
  LinuxFrameworkLoader loader_{root_, log_};
};

TEST_F(FrameworkLoaderTest, AFrameworkMakesItsClassesKnown) {
  installExample("MailAccounts", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  EXPECT_TRUE(loaded) << loaded.error().text;
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

TEST_F(FrameworkLoaderTest, AFrameworkIsRegisteredOnceWhateverNameLeadsToIt) {
  installExample("MailAccounts", "/Library/Mail.so");
  makeLink("/Library/Link.so", "Mail.so");
  std::filesystem::create_hard_link(onHost("/Library/Mail.so"), onHost("/Library/Other.so"));
  ASSERT_TRUE(loader_.loadFramework("/Library/Mail.so"));
  const AccountClass* before = loader_.classes().classNamed("MailAccountNotifier");

  for (const char* const name : {"/Library/Mail.so", "/Library/../Library/Mail.so",
                                 "/Library/Link.so", "/Library/Other.so"}) {
    ASSERT_TRUE(loader_.loadFramework(name)) << name;
  }

  EXPECT_EQ(loader_.classes().classNamed("MailAccountNotifier"), before);
  EXPECT_TRUE(log_.lines.empty()) << "a second registration would have found the first";
}

TEST_F(FrameworkLoaderTest, OfTwoFrameworksWithAClassOfOneNameTheFirstHasIt) {
  installExample("MailAccounts", "/Library/Mail.so");
  installBroken("Throwing", "/Library/Other\n.so");
  ASSERT_TRUE(loader_.loadFramework("/Library/Mail.so"));
  ASSERT_TRUE(loader_.classes().classNamed("MailAccountNotifier")->accountDidChange_forDataclass);

  ASSERT_TRUE(loader_.loadFramework("/Library/Other\n.so"));

  EXPECT_TRUE(loader_.classes().classNamed("MailAccountNotifier")->accountDidChange_forDataclass)
      << "the other framework's class does not answer it";
  EXPECT_EQ(log_.lines,
            std::vector<std::string>{
                "The class MailAccountNotifier of the framework /Library/Other\\n.so is "
                "not taken: /Library/Mail.so has one of that name"});
}

TEST_F(FrameworkLoaderTest, AFrameworkOfOtherHeadersIsAFailureThatSaysSo) {
  installBroken("OfOtherHeaders", "/Library/Other.so");
  installBroken("OfNoVersion", "/Library/Old.so");

  const std::string here = ", which is " + std::to_string(kInterfaceVersion) + " here";
  EXPECT_EQ(loader_.loadFramework("/Library/Other.so").error().text,
            "It was built against other headers: its interface has version 999" + here);
  EXPECT_EQ(loader_.loadFramework("/Library/Old.so").error().text,
            "It was built against other headers: it names no version of its interface" + here);
}

TEST_F(FrameworkLoaderTest, AnUnknownClassIsNone) {
  EXPECT_EQ(loader_.classes().classNamed("MailFullAccount"), nullptr);
}

TEST_F(FrameworkLoaderTest, AMissingFrameworkIsAFailureThatNamesIt) {
  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error().text, HasSubstr("/Library/Mail.so: No such file or directory"));
}

TEST_F(FrameworkLoaderTest, AFileThatIsNoSharedObjectIsAFailureInTheLoadersWords) {
  // As long as the header of a shared object, which the loader reads first.
  makeFile("/Library/Mail.so", std::string(100, 'x'));

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error().text, HasSubstr("invalid ELF header"));
}

TEST_F(FrameworkLoaderTest, ASharedObjectWithoutTheEntryPointIsAFailureThatNamesIt) {
  installBroken("WithoutEntryPoint", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error().text, HasSubstr("undefined symbol: RegisterClasses"));
}

TEST_F(FrameworkLoaderTest, AnUnresolvedSymbolIsAFailureAtLoadTimeThatNamesIt) {
  installBroken("WithUnresolvedSymbol", "/Library/Mail.so");

  const Result loaded = loader_.loadFramework("/Library/Mail.so");

  ASSERT_FALSE(loaded);
  EXPECT_THAT(loaded.error().text, HasSubstr("undefined symbol: functionThatNobodyDefines"));
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
