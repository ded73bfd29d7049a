#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubjectParametrised;

namespace {

VSubjectParametrised::VStaticParameter Static(const std::string& name, const std::string& expr,
                                              ZMT::IOptional<double> user = {},
                                              ZMT::IOptional<double> prior = {}) {
  VSubjectParametrised::VStaticParameter p;
  p.m_Name = name;
  p.m_DefaultExpression = expr;
  p.m_UserValue = user;
  p.m_Prior = prior;
  return p;
}

} // namespace

TEST(ExpressionParsers, StaticParametersFollowDeclarationOrderAndPrecedence) {
  VSubjectParametrised subject;
  subject.m_StaticParameters = {
      Static("Height", "1800"),
      Static("Leg Length", "Height/2"),
      Static("Override", "Height*100", 7.0),
      Static("FromPrior", "", {}, 3.0),
      Static("Zero", ""),
      Static("Early", "Late + 1"), // refers to a later parameter
      Static("Late", "2"),
      Static("Broken", "(1"),
  };
  VStaticExpressionParser parser;
  std::vector<std::string> errors;
  EXPECT_FALSE(parser.SetParameters(subject, errors));
  EXPECT_THAT(errors,
              testing::ElementsAre("Could not evaluate static parameter Early: Parse Error at "
                                   "column 0: ID \"Late\" was referenced but never declared",
                                   "Could not evaluate static parameter Broken: Parse Error at "
                                   "column 2: Unbalanced parentheses"));
  double v = 0;
  ASSERT_TRUE(parser.Evaluate("'Leg Length' + Override + FromPrior + Zero + Late", v));
  EXPECT_EQ(v, 900.0 + 7.0 + 3.0 + 0.0 + 2.0);
  EXPECT_FALSE(parser.StaticValue("Early", v));
  EXPECT_FALSE(parser.Evaluate("Early", v));
}

TEST(ExpressionParsers, DynamicParametersAreVariablesThatCanChange) {
  VSubjectParametrised subject;
  subject.m_StaticParameters = {Static("Scale", "2")};
  VSubjectParametrised::VDynamicParameter knee;
  knee.m_Name = "KneeOffset";
  knee.m_Value = 10.0;
  subject.m_DynamicParameters = {knee};

  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  ASSERT_TRUE(parser.SetParameters(subject, errors));
  double v = 0;
  ASSERT_TRUE(parser.Evaluate("KneeOffset*Scale", v));
  EXPECT_EQ(v, 20.0);
  ASSERT_TRUE(parser.SetDynamicValue("KneeOffset", -1.0));
  ASSERT_TRUE(parser.Evaluate("KneeOffset*Scale", v));
  EXPECT_EQ(v, -2.0);
  EXPECT_FALSE(parser.SetDynamicValue("Scale", 1.0)); // static, not settable

  VMathNodeSimple node("", 0);
  std::string message;
  ASSERT_TRUE(parser.EvaluateLinear("-KneeOffset/Scale", node, message));
  EXPECT_EQ(node.m_Value, 0.5);
  EXPECT_THAT(node.m_Parameters, testing::ElementsAre("KneeOffset"));
  EXPECT_THAT(node.m_Constants, testing::ElementsAre("Scale"));

  // Redefinition forgets the previous subject.
  ASSERT_TRUE(parser.SetParameters(VSubjectParametrised{}, errors));
  EXPECT_FALSE(parser.Evaluate("KneeOffset", v));
}
