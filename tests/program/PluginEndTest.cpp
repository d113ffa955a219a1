#include <gtest/gtest.h>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

/// How the host reports plug-ins that do not end as they should.
class PluginEnd : public DeviceRootFixture {
 protected:
  /// Runs a plug-in that misbehaves in a way of tests/program/plugins/MisbehavingPlugin.cpp.
  [[nodiscard]] ProgramResult migrateMisbehaving(const std::string& behaviour) const {
    ProgramCall call = migrationCall({"--plugin", MISBEHAVING_BUNDLE, "--json"});
    call.environment["MISBEHAVIOUR"] = behaviour;
    return runProgram(call);
  }

  /// The run ends with status 70, one line that says how the plug-in ended, and the same in JSON.
  static void expectPluginEnded(const ProgramResult& result, const std::string& message) {
    EXPECT_EQ(result.exitStatus, kPluginEnded);
    EXPECT_TRUE(result.hasErrorLine("migration-host: " + message)) << result.errors;
    const nlohmann::json object = onlyObject(result);
    EXPECT_EQ(object["result"], false);
    EXPECT_EQ(object["exitStatus"], kPluginEnded);
    EXPECT_EQ(object["error"], message);
  }
};

TEST_F(PluginEnd, AnAbortIsReported) {
  expectPluginEnded(migrateMisbehaving("abort"), "The plug-in ended by signal 6 (Aborted)");
}

TEST_F(PluginEnd, AKillIsReported) {
  expectPluginEnded(migrateMisbehaving("kill"), "The plug-in ended by signal 9 (Killed)");
}

TEST_F(PluginEnd, AnExceptionIsReportedAsAnAbort) {
  expectPluginEnded(migrateMisbehaving("throw"), "The plug-in ended by signal 6 (Aborted)");
}

TEST_F(PluginEnd, AnExitOfThePluginsOwnIsReported) {
  expectPluginEnded(migrateMisbehaving("exit"), "The plug-in ended the process with exit status 0");
}

TEST_F(PluginEnd, NoInstanceIsReported) {
  expectPluginEnded(migrateMisbehaving("no instance"), "The plug-in made no instance of its class");
}

TEST_F(PluginEnd, AFailedMigrationIsNoError) {
  const ProgramResult result = migrateMisbehaving("fail");

  EXPECT_EQ(result.exitStatus, 1);
  const nlohmann::json object = onlyObject(result);
  EXPECT_EQ(object["dataClassName"], "misbehaviour");
  EXPECT_EQ(object["result"], false);
  EXPECT_EQ(object["exitStatus"], 1);
}

TEST_F(PluginEnd, WhatThePluginPrintsStaysOutOfStandardOutput) {
  write(kSettingsPath, accountSettings(12));

  const ProgramResult result = migrateMisbehaving("print");

  EXPECT_EQ(result.exitStatus, 0);
  EXPECT_EQ(onlyObject(result)["result"], true);
  EXPECT_TRUE(result.hasErrorLine("printed by the plug-in")) << result.errors;
}

TEST_F(PluginEnd, AFatalAssertionOfThePluginIsReportedAfterItsMessage) {
  // The plug-in cannot go on without the account types that its resources list.
  std::filesystem::copy(pluginBundle(), onThisMachine("/bundle.migrator"),
                        std::filesystem::copy_options::recursive);
  std::filesystem::remove(onThisMachine("/bundle.migrator/Resources/AccountTypesProperties.plist"));
  write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"}}}));

  const ProgramResult result =
      migrate({"--plugin", onThisMachine("/bundle.migrator").string(), "--json"});

  expectPluginEnded(result, "The plug-in ended by signal 6 (Aborted)");
  EXPECT_NE(result.errors.find("Could not find AccountTypesProperties.plist"), std::string::npos)
      << result.errors;
}

}  // namespace
}  // namespace accounts
