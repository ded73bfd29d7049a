#include "River/CoreOstraTypesUtils/MathParser.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

using namespace CoreOstraTypesUtils;

namespace {

class MathParser : public testing::Test {
protected:
  MathParser() {
    m_Factory.AddVariable("Angle", std::span<const double>(&m_Angle, 1));
    m_Factory.AddConstant("Left Width", std::span<const double>(&m_Width, 1));
    m_Factory.AddConstant("it's", std::span<const double>(&m_Quote, 1));
    m_Factory.AddConstant("_w2", std::span<const double>(&m_Width, 1));
  }

  double Value(const std::string& text) {
    MathNodePtr node;
    std::string message;
    EXPECT_TRUE(Parse(m_Factory, text, node, message)) << text << ": " << message;
    EXPECT_EQ(message, "Parse Succeeded");
    return node ? static_cast<const VMathNodeSimple&>(*node).m_Value : NAN;
  }
  std::string Text(const std::string& text) {
    MathNodePtr node;
    std::string message;
    return Parse(m_Factory, text, node, message) ? node->Text() : message;
  }
  std::string Error(const std::string& text, char delimiter = ',') {
    MathNodePtr node;
    std::string message;
    EXPECT_FALSE(Parse(m_Factory, text, node, message, delimiter)) << text;
    EXPECT_EQ(node, nullptr);
    return message;
  }

  double m_Angle = 0.5;
  double m_Width = 4.0;
  double m_Quote = 3.0;
  VMathFactorySimple m_Factory;
};

} // namespace

TEST_F(MathParser, PrecedenceAndAssociativity) {
  EXPECT_EQ(Value("1 + 2 * 3"), 7.0);
  EXPECT_EQ(Value("(1 + 2) * 3"), 9.0);
  EXPECT_EQ(Value("8 / 2 / 2"), 2.0);
  EXPECT_EQ(Value("10 - 4 - 3"), 3.0);
  EXPECT_EQ(Value("2 ^ 3 ^ 2"), 64.0); // left to right
  EXPECT_EQ(Value("2^-1"), 0.5);
  EXPECT_EQ(Value("-2^2"), 4.0); // the sign binds to the primary
  EXPECT_EQ(Value("2 * -3"), -6.0);
  EXPECT_EQ(Value("1--1"), 2.0);
  EXPECT_EQ(Value("+3"), 3.0);
  EXPECT_TRUE(std::isinf(Value("1/0")));
}

TEST_F(MathParser, NumbersNamesAndFunctions) {
  EXPECT_EQ(Value("1.5e3"), 1500.0);
  EXPECT_EQ(Value("1.5e+3"), Value("1.5e3"));
  EXPECT_EQ(Value(".25"), 0.25);
  EXPECT_TRUE(std::isinf(Value("1.#INF")));
  EXPECT_TRUE(std::isnan(Value("1.#IND")));
  EXPECT_EQ(Value("-'Left Width'*cos(Angle)"), -4.0 * std::cos(0.5));
  EXPECT_EQ(Value("'it\\'s' + _w2"), 7.0);
  EXPECT_EQ(Value("SIN(0) + TAN(0)"), 0.0);
  EXPECT_EQ(Value("sin(cos(0) - 1)"), 0.0);
}

TEST_F(MathParser, NormalisedText) {
  EXPECT_EQ(Text("a_b"), "Parse Error at column 0: ID \"a_b\" was referenced but never declared");
  EXPECT_EQ(Text("Angle-1/2"), "( Angle + -( 1 * 1/2 ) )");
  EXPECT_EQ(Text("sin(Angle)^2"), "( sin( Angle ) ^ 2 )");
  EXPECT_EQ(Text("1.5e3"), "1500");
  EXPECT_EQ(Text("'Left Width'"), "Left Width");
}

TEST_F(MathParser, MalformedTextsGiveTheirMessages) {
  EXPECT_EQ(Error(""), "Parse Error at column 0: Empty expression");
  EXPECT_EQ(Error("   "), "Parse Error at column 3: Empty expression");
  EXPECT_EQ(Error("()"), "Parse Error at column 1: Missing argument");
  EXPECT_EQ(Error("(1 + 2"), "Parse Error at column 6: Unbalanced parentheses");
  EXPECT_EQ(Error("1 + 2)"), "Parse Error at column 5: Unexpected token \")\"");
  EXPECT_EQ(Error("1 $ 2"), "Parse Error at column 2: Unexpected token \"$\"");
  EXPECT_EQ(Error("1 +"), "Parse Error at column 3: Unexpected token \"\"");
  EXPECT_EQ(Error("--1"), "Parse Error at column 1: Unexpected token \"-\"");
  EXPECT_EQ(Error("1.2.3"), "Parse Error at column 0: Unexpected token \"1.2.3\"");
  EXPECT_EQ(Error("'open"), "Parse Error at column 0: Missing variable name terminator before "
                            "end of expression");
  EXPECT_EQ(Error("Sin(0)"), "Parse Error at column 3: Unknown function \"Sin\"");
  EXPECT_EQ(Error("sin(1,2)"), "Parse Error at column 7: Cannot evaluate \"sin\" for 2 input "
                               "arguments (1 arguments required)");
  EXPECT_EQ(Error("sin()"), "Parse Error at column 4: Cannot evaluate \"sin\" for 0 input "
                            "arguments (1 arguments required)");
  EXPECT_EQ(Error("sin(1,"), "Parse Error at column 6: Missing argument(s) in function \"sin\"");
  EXPECT_EQ(Error("sin(1"), "Parse Error at column 5: Unbalanced parentheses");
  EXPECT_EQ(Error("Width * 2"),
            "Parse Error at column 0: ID \"Width\" was referenced but never declared");
  EXPECT_EQ(Error("1 2", ' '), "Invalid delimiting character ' '");
  EXPECT_EQ(Error(std::string(300, '(') + "1" + std::string(300, ')')),
            "Parse Error at column 256: Expression nested too deeply");
}

TEST(MathFactorySimpleLinear, TracksParametersAndConstants) {
  VMathFactorySimpleLinear factory;
  const double a = 2.0, b = 3.0, c = 5.0;
  factory.AddVariable("a", std::span<const double>(&a, 1));
  factory.AddVariable("b", std::span<const double>(&b, 1));
  factory.AddConstant("c", std::span<const double>(&c, 1));
  MathNodePtr node;
  std::string message;
  ASSERT_TRUE(Parse(factory, "a*c - cos(b)/a + 1", node, message));
  const auto& simple = static_cast<const VMathNodeSimple&>(*node);
  EXPECT_DOUBLE_EQ(simple.m_Value, 2.0 * 5.0 - std::cos(3.0) / 2.0 + 1.0);
  EXPECT_THAT(simple.m_Parameters, testing::ElementsAre("a", "b"));
  EXPECT_THAT(simple.m_Constants, testing::ElementsAre("c"));
  EXPECT_EQ(factory.Plus(node, nullptr), nullptr);
  EXPECT_EQ(factory.MakeFunction("log"), nullptr);
}

TEST(ExpressionNumber, SeventeenDigitsAndPortableNonFiniteSpellings) {
  EXPECT_EQ(FormatExpressionNumber(0.1), "0.10000000000000001");
  EXPECT_EQ(FormatExpressionNumber(-2.0), "-2");
  EXPECT_EQ(FormatExpressionNumber(-0.0), "0");
  EXPECT_EQ(FormatExpressionNumber(1e-320), "9.9998886718268301e-321");
  EXPECT_EQ(FormatExpressionNumber(INFINITY), "inf");
  EXPECT_EQ(FormatExpressionNumber(-INFINITY), "-inf");
  EXPECT_EQ(FormatExpressionNumber(std::nan("")), "nan");
  EXPECT_EQ(FormatExpressionNumber(-std::nan("")), "-nan");
}
