#include "AnvilCore/commands/CommandScript.h"
#include "AnvilCore/commands/CommandRegistry.h"
#include <gtest/gtest.h>

using namespace AnvilCore;

namespace {

// Records every call it receives; fails when its "fail" option is given as true.
class RecordingCommand : public Command {
public:
  explicit RecordingCommand(std::vector<CommandArgList>& o_rCalls)
      : Command("record", "Records its calls", ""), m_rCalls(o_rCalls) {
    addOption(CommandOption::createInstance("flag", 1, Variable::EBool, false), 0, false);
    addOption(CommandOption::createInstance("count", 1, Variable::EInteger, false), 0, false);
    addOption(CommandOption::createInstance("rate", 1, Variable::EFloat, false), 0, false);
    addOption(CommandOption::createInstance("name", 1, Variable::EString, false), 0, false);
    addOption(CommandOption::createInstance("fail", 1, Variable::EBool, false), 0, false);
  }
  bool doCommand(const CommandArgList& i_rArgs) override {
    m_rCalls.push_back(i_rArgs);
    for (const CommandArgument& arg : i_rArgs)
      if (arg.m_id == 4 && arg.m_value.getBoolValue(-1) == Variable::ETrue) return false;
    return true;
  }

private:
  std::vector<CommandArgList>& m_rCalls;
};

class CommandScriptTest : public ::testing::Test {
protected:
  void SetUp() override { m_registry.add(new RecordingCommand(m_calls)); }

  ScriptError parseError(const std::string& i_text) {
    std::vector<ScriptCall> calls;
    ScriptError error;
    EXPECT_FALSE(parseScript(i_text, "test", m_registry, calls, error)) << i_text;
    EXPECT_TRUE(calls.empty());
    return error;
  }
  std::vector<ScriptCall> parse(const std::string& i_text) {
    std::vector<ScriptCall> calls;
    ScriptError error;
    EXPECT_TRUE(parseScript(i_text, "test", m_registry, calls, error)) << error.toString();
    return calls;
  }

  std::vector<CommandArgList> m_calls;
  CommandRegistry m_registry;
};

TEST_F(CommandScriptTest, OptionsArriveTypedAndInCallOrder) {
  const auto calls = parse("record -name Bob -count -3 -flag on -rate 2.5e1 -flag toggle");
  ASSERT_EQ(calls.size(), 1u);
  const CommandArgList& args = calls[0].args;
  ASSERT_EQ(args.size(), 5u);
  EXPECT_EQ(args[0].m_id, 3u);
  EXPECT_EQ(args[0].m_value.getStringValue(-1), "Bob");
  EXPECT_EQ(args[1].m_id, 1u);
  EXPECT_EQ(args[1].m_value.getIntValue(-1), -3);
  EXPECT_EQ(args[2].m_value.getBoolValue(-1), Variable::ETrue);
  EXPECT_DOUBLE_EQ(args[3].m_value.getFloatValue(-1), 25.0);
  EXPECT_EQ(args[4].m_id, 0u);
  EXPECT_EQ(args[4].m_value.getBoolValue(-1), Variable::EToggle);
  EXPECT_EQ(calls[0].position.line, 1);
  EXPECT_EQ(calls[0].position.column, 1);
}

TEST_F(CommandScriptTest, AcceptsEveryBoolSpelling) {
  const std::pair<const char*, Variable::BoolType> forms[] = {
      {"true", Variable::ETrue}, {"TRUE", Variable::ETrue},    {"1", Variable::ETrue},
      {"on", Variable::ETrue},   {"false", Variable::EFalse},  {"0", Variable::EFalse},
      {"Off", Variable::EFalse}, {"toggle", Variable::EToggle}};
  for (const auto& [text, value] : forms) {
    const auto calls = parse(std::string("record -flag ") + text);
    ASSERT_EQ(calls.size(), 1u) << text;
    EXPECT_EQ(calls[0].args[0].m_value.getBoolValue(-1), value) << text;
  }
}

TEST_F(CommandScriptTest, QuotesEscapesAndComments) {
  const auto calls = parse("  record -name \"Left \\\"Hand\\\" # \\\\ x\" # trailing comment\n"
                           "# a comment line\n"
                           "\n"
                           "\trecord -name \"\" -count 7#comment right after a value\r\n");
  ASSERT_EQ(calls.size(), 2u);
  EXPECT_EQ(calls[0].args[0].m_value.getStringValue(-1), "Left \"Hand\" # \\ x");
  EXPECT_EQ(calls[0].position.column, 3);
  EXPECT_EQ(calls[1].position.line, 4);
  EXPECT_EQ(calls[1].args[0].m_value.getStringValue(-1), "");
  EXPECT_EQ(calls[1].args[1].m_value.getIntValue(-1), 7);
  // A quoted word is a value, never an option name.
  const auto quoted = parse("record -name \"-flag\"");
  EXPECT_EQ(quoted[0].args[0].m_value.getStringValue(-1), "-flag");
}

TEST_F(CommandScriptTest, ErrorsNameLineAndColumn) {
  struct Case {
    const char* text;
    int line, column;
    const char* fragment;
  };
  const Case cases[] = {
      {"recrod -flag on", 1, 1, "unknown command \"recrod\""},
      {"record -flag on\nrecord -colour red", 2, 8, "unknown option \"-colour\" of record"},
      {"record flag on", 1, 8, "expected an option"},
      {"record -count", 1, 14, "-count needs a value (int)"},
      {"record -count ten", 1, 15, "expects a 32-bit integer; found \"ten\""},
      {"record -count 4000000000", 1, 15, "32-bit integer"},
      {"record -count 1.5", 1, 15, "32-bit integer"},
      {"record -rate nan", 1, 14, "finite number"},
      {"record -rate 1e999", 1, 14, "finite number"},
      {"record -flag maybe", 1, 14, "expects a bool"},
      {"record -name -flag on", 1, 14, "found the option \"-flag\""},
      {"record -flag -count 3", 1, 14, "found the option \"-count\""},
      {"\n\nrecord -name \"open", 3, 14, "unterminated"},
      {"record -name \"a\\qb\"", 1, 16, "unknown escape"},
      {"record -name \"a\"b", 1, 17, "followed by a blank"},
      {"record -name a\"b\"", 1, 15, "quote may only start"},
      {"\"record\" -flag on", 1, 1, "unknown command"},
  };
  for (const Case& c : cases) {
    const ScriptError error = parseError(c.text);
    EXPECT_EQ(error.position.line, c.line) << c.text;
    EXPECT_EQ(error.position.column, c.column) << c.text;
    EXPECT_NE(error.message.find(c.fragment), std::string::npos) << c.text << ": " << error.message;
  }
  const ScriptError error = parseError("record -count x");
  EXPECT_EQ(error.toString(), "test:1:15: -count expects a 32-bit integer; found \"x\"");
}

TEST_F(CommandScriptTest, BadLineAnywhereAppliesNothing) {
  ScriptError error;
  EXPECT_FALSE(
      executeScript("record -flag on\nrecord -count 1 -flag sure\n", "s", m_registry, error));
  EXPECT_TRUE(m_calls.empty());
  EXPECT_EQ(error.position.line, 2);
  EXPECT_EQ(error.position.column, 23);
}

TEST_F(CommandScriptTest, RunStopsAtTheFirstFailingCall) {
  ScriptError error;
  EXPECT_FALSE(executeScript("record -count 1\n\nrecord -fail true\nrecord -count 3", "s.ans",
                             m_registry, error));
  ASSERT_EQ(m_calls.size(), 2u);
  EXPECT_EQ(m_calls[0][0].m_value.getIntValue(-1), 1);
  EXPECT_EQ(error.toString(), "s.ans:3:1: record failed");
  // An empty script is valid and does nothing.
  EXPECT_TRUE(executeScript("# nothing\n   \n", "s", m_registry, error));
  EXPECT_EQ(m_calls.size(), 2u);
}

} // namespace
