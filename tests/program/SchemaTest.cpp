#include <fstream>
#include <set>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/JSONSchema.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// Debian's own validator, on what the programs write for a device with something of everything.
class Schemas : public DeviceRootFixture {
 protected:
  Schemas() { copyOverRoot(SOURCE_DIRECTORY "/examples/sample-device"); }

  [[nodiscard]] std::string device(std::string_view path) const {
    return onThisMachine(path).string();
  }
  /// Every kind of output, in the order of the commands.
  [[nodiscard]] std::vector<nlohmann::json> outputs() const {
    writeText("/results", R"({"root":"/a","exitStatus":75,"error":"No room","steps":["7A149"]})"
                          "\n");
    writeText("/roots", "/a\n/b\n");
    std::vector<nlohmann::json> objects;
    const auto add = [&](const std::string& program, const std::vector<std::string>& arguments) {
      objects.push_back(onlyObject(runProgram({.program = program, .arguments = arguments})));
    };
    fs::copy_file(device(kSettingsPath), device("/before.plist"));
    add(accountsctl(), {"status", "--json", "--root", root()});
    add(accountsctl(), {"check", "--json", device(kSettingsPath)});
    add(migrationHost(), {"plan", "--json", "--root", root(), "--channel", device("/log")});
    add(migrationHost(), {"run", "--json", "--root", root(), "--report", device("/report.json")});
    std::ifstream report(device("/report.json"));
    objects.push_back(nlohmann::json::parse(report));
    add(migrationHost(), {"restore", "--json", "--root", root()});
    add(migrationHost(), {"run", "--json"});
    add(accountsctl(), {"show", "--json", device(kSettingsPath)});
    add(accountsctl(), {"diff", "--json", device("/before.plist"), device(kSettingsPath)});
    writeText("/report.json", runProgram({.program = migrationHost(),
                                          .arguments = {"plan", "--root", root(), "--json"}})
                                  .output);
    add(accountsctl(), {"explain", device("/report.json"), "S", "--json"});
    add(accountsctl(), {"convert", "--json", device(kSettingsPath), device("/x"), "--to", "xml"});
    add(accountsctl(), {"summarize", "--json", device("/results"), "--roots", device("/roots")});
    add(accountsctl(), {"show", "--json"});
    add(accountsctl(), {"--json"});
    return objects;
  }
  /// What the validator says of the text in one file and the schema in another; empty for nothing.
  static ProgramResult validate(const std::string& schema, const std::string& text) {
    return runProgram({.program = "python3",
                       .arguments = {"-c",
                                     "import json, sys, jsonschema\n"
                                     "schema = json.load(open(sys.argv[1]))\n"
                                     "jsonschema.Draft202012Validator.check_schema(schema)\n"
                                     "jsonschema.validate(json.load(open(sys.argv[2])), schema)\n",
                                     schema, text}});
  }
};

TEST_F(Schemas, AreMetByEveryKindOfOutputAsAnotherValidatorSays) {
  std::set<std::string> used;
  for (const nlohmann::json& object : outputs()) {
    const std::string name = schemaOf(object);
    used.insert(name);
    writeText("/text.json", object.dump());
    const ProgramResult result =
        validate(SOURCE_DIRECTORY "/docs/schema/" + name + ".json", device("/text.json"));
    EXPECT_EQ(result.exitStatus, 0) << name << "\n" << result.errors;
  }
  std::set<std::string> all;
  for (const auto& entry : fs::directory_iterator(SOURCE_DIRECTORY "/docs/schema")) {
    all.insert(entry.path().stem());
  }
  EXPECT_EQ(used, all);
}

TEST_F(Schemas, AreNotMetByWhatLacksAKeyOrHasAnotherKind) {
  for (const nlohmann::json& object : outputs()) {
    for (const char* key : {"exitStatus", "error", "root", "kind"}) {
      nlohmann::json other = object;
      if (other.contains(key)) {
        other[key] = nlohmann::json::array();
        EXPECT_NE(problemWithSchema(other), "") << other;
      }
    }
    nlohmann::json less = object;
    less.erase("exitStatus");
    EXPECT_NE(problemWithSchema(less), "") << less;
    writeText("/text.json", less.dump());
    const ProgramResult result =
        validate(SOURCE_DIRECTORY "/docs/schema/" + schemaOf(less) + ".json", device("/text.json"));
    EXPECT_NE(result.errors.find("ValidationError"), std::string::npos) << result.errors;
  }
}

TEST_F(Schemas, NameEveryKeyOfTheObjectsThemselves) {
  for (const nlohmann::json& object : outputs()) {
    std::ifstream stream(SOURCE_DIRECTORY "/docs/schema/" + schemaOf(object) + ".json");
    const nlohmann::json schema = nlohmann::json::parse(stream);
    const nlohmann::json& described = !schema.contains("anyOf")  ? schema
                                      : object.contains("error") ? schema["$defs"]["refusal"]
                                                                 : schema["$defs"]["report"];
    for (const auto& [key, value] : object.items()) {
      EXPECT_TRUE(described["properties"].contains(key)) << schemaOf(object) << ": " << key;
    }
  }
}

}  // namespace
}  // namespace accounts
