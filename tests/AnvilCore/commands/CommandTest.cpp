#include "AnvilCore/commands/CommandRegistry.h"
#include "AnvilCore/commands/CommandScript.h"
#include "plugin/host/Database.h"
#include <gtest/gtest.h>

using namespace AnvilCore;

namespace {

class ProbeCommand : public Command {
public:
  ProbeCommand(const char* i_pName, bool* o_pDestroyed)
      : Command(i_pName, "Probe", ""), m_pDestroyed(o_pDestroyed) {
    addOption(CommandOption::createInstance("path", 1, Variable::EString, true), 0, false);
    addOption(CommandOption::createInstance("pair", 2, Variable::EFloat, false), 0, false);
    addOption(CommandOption::createInstance("secret", 1, Variable::EBool, false), 0, true);
    addOption(CommandOption::createInstance("", 1, Variable::EBool, false), 0, false);
  }
  ~ProbeCommand() override {
    if (m_pDestroyed) *m_pDestroyed = true;
  }
  bool doCommand(const CommandArgList&) override { return true; }

private:
  bool* m_pDestroyed;
};

TEST(Command, DescribesItsOptions) {
  ProbeCommand command("probe", nullptr);
  EXPECT_EQ(command.getNumOptions(), 3); // the nameless option was refused
  EXPECT_EQ(command.getArgSyntaxString(),
            "probe -path <string> [-pair <float> <float>] [-secret <bool>]");
  EXPECT_EQ(command.getOptionSyntax(1), "-pair <float> <float>");
  EXPECT_EQ(command.getOptionSyntax(9), "");
  EXPECT_TRUE(command.isOptionHidden(2));
  EXPECT_EQ(command.findOption("pair"), 1);
  EXPECT_EQ(command.findOption("Pair"), -1);
  EXPECT_TRUE(command.canExecuteSolo());
  EXPECT_FALSE(command.isUndoable());
  EXPECT_EQ(command.getReturnType(), Variable::EBool);
  EXPECT_TRUE(command.isKindOf(&Command::s_classCommand));

  CommandArgList args(1);
  args[0].m_id = 1;
  EXPECT_FALSE(command.checkArgSyntax(args)); // -path is required
  args[0].m_id = 0;
  EXPECT_TRUE(command.checkArgSyntax(args));
  args[0].m_id = 7;
  EXPECT_FALSE(command.checkArgSyntax(args));
}

TEST(Command, ScriptsHonourArityAndRequiredOptions) {
  CommandRegistry registry;
  registry.add(new ProbeCommand("probe", nullptr));
  std::vector<ScriptCall> calls;
  ScriptError error;
  ASSERT_TRUE(parseScript("probe -pair 1 2.5 -path \"/tmp/a b\"", "x", registry, calls, error))
      << error.toString();
  EXPECT_EQ(calls[0].args[0].m_value.getNumValues(), 2);
  EXPECT_DOUBLE_EQ(calls[0].args[0].m_value.getFloatValue(1), 2.5);
  EXPECT_EQ(calls[0].args[1].m_value.getStringValue(-1), "/tmp/a b");

  EXPECT_FALSE(parseScript("probe -pair 1 2", "x", registry, calls, error));
  EXPECT_EQ(error.message, "probe needs -path");
  EXPECT_FALSE(parseScript("probe -path a -pair 1", "x", registry, calls, error));
  EXPECT_EQ(error.position.column, 22);
}

TEST(Command, UnrefDestroysAtTheLastReference) {
  bool destroyed = false;
  Command* pCommand = new ProbeCommand("probe", &destroyed);
  pCommand->ref();
  pCommand->unref();
  EXPECT_FALSE(destroyed);
  pCommand->deleteThis();
  EXPECT_TRUE(destroyed);
}

TEST(CommandRegistry, RefusesATakenNameAndReleasesOnClear) {
  bool first = false, second = false;
  CommandRegistry registry;
  EXPECT_TRUE(registry.add(new ProbeCommand("probe", &first)));
  EXPECT_FALSE(registry.add(new ProbeCommand("probe", &second)));
  EXPECT_TRUE(second);
  EXPECT_FALSE(registry.add(nullptr));
  EXPECT_EQ(registry.commands().size(), 1u);
  registry.clear();
  EXPECT_TRUE(first);
  EXPECT_EQ(registry.find("probe"), nullptr);
}

TEST(Command, LogsThroughTheHostLog) {
  std::vector<std::pair<HLogLevel, std::string>> lines;
  g_db->setLogSink(
      [&](HLogLevel i_level, const std::string& i_rText) { lines.emplace_back(i_level, i_rText); });
  Command::logWarning("%s value must be %s", "minKeys", "positive");
  Command::logError("%s", std::string(2000, 'x').c_str());
  g_db->setLogSink(nullptr);
  ASSERT_EQ(lines.size(), 2u);
  EXPECT_EQ(lines[0].first, HLogLevel::EWarning);
  EXPECT_EQ(lines[0].second, "minKeys value must be positive");
  EXPECT_EQ(lines[1].first, HLogLevel::EError);
  EXPECT_EQ(lines[1].second.size(), 2000u);
}

TEST(Variable, GivesDefaultsForMissingOrOtherTypedValues) {
  Variable value(Variable::EString);
  value.addString("Z");
  EXPECT_EQ(value.getStringValue(-1), "Z");
  EXPECT_EQ(value.getIntValue(-1), 0);
  EXPECT_EQ(value.getBoolValue(-1), Variable::EFalse);
  EXPECT_EQ(value.getStringValue(3), "");
  Variable flag(Variable::EBool);
  flag.addBool(Variable::EToggle);
  EXPECT_EQ(flag.getBoolValue(-1), Variable::EToggle);
}

} // namespace
