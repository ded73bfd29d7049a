// What the writer writes the reader reads, and what nobody changed comes back as the same text:
// quoted parameter names in expressions, exact joint axes, the inverted post values of old files.

#include "KmtTestSupport.h"

#include <gmock/gmock.h>

using namespace CoreOstraKMTIO;
using namespace CoreOstraTypes;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace {

/// Writes `rich` in the version of `code`, reads the text back and writes that again.
struct VRewrite {
  std::string m_First, m_Second;
  VReadBack m_Back;
};

VRewrite Rewrite(const VRichSubject& rich, int code) {
  VRewrite r;
  VWriter writer;
  EXPECT_EQ(writer.WriteText(r.m_First, rich.m_Subject, rich.m_AppData, rich.m_Subspace, code),
            ResultOk)
      << (writer.Messages().empty() ? "" : writer.Messages()[0]);
  r.m_Back = ReadString(r.m_First);
  EXPECT_EQ(r.m_Back.m_Result, ResultOk)
      << (r.m_Back.m_Errors.empty() ? "" : r.m_Back.m_Errors[0]) << "\n"
      << r.m_First;
  const auto& b = r.m_Back.m_Records;
  EXPECT_EQ(VWriter().WriteText(r.m_Second, b.m_Subject, b.m_AppData, b.m_Subspace, code),
            ResultOk);
  return r;
}

/// The rich subject with a parameter whose name holds a blank, used by quoted names at the
/// start, middle and end of every kind of expression the language stores.
VRichSubject QuotedSubject() {
  VRichSubject rich = MakeRichSubject();
  auto& s = rich.m_Subject;
  s.m_DynamicParameters.push_back({"Hip Width", 90.0, {}, 100.0, true});
  s.m_DynamicParameters.push_back({"it's", 2.0, {}, 2.0, true});
  s.m_StaticParameters[1].m_DefaultExpression = "'Height'/2";
  auto& thigh = s.m_Segments[1];
  thigh.m_PreTranslation = {"2*'Hip Width'", "-'Hip Width'", "('Hip Width')/2"};
  thigh.m_PreRotation = {"'it\\'s'*0", "0*sin('Hip Width')", "0"};
  thigh.m_MassExpression = "0.1*'Hip Width'";
  thigh.m_MassCentreExpressions = {"'Hip Width'^1", "0", "-'it\\'s'"};
  thigh.m_RadiusOfGyrationExpressions = {"1", "'Hip Width'-'it\\'s'", "3"};
  thigh.m_Bounds = {"-'Hip Width'", "-50", "-50", "'Hip Width'", "50", "50*'it\\'s'"};
  for (auto& target : s.m_Targets) {
    if (target.m_Type != VTargetTypeBase::ELocalPointToWorldPointGaussian) continue;
    target.m_StateExpressions = {"'Hip Width'*2", "'Hip Width'/3", "1+'Hip Width'"};
  }
  return rich;
}

} // namespace

TEST(KmtExactText, QuotedNamesInExpressionsReadBackInEveryEra) {
  const VRichSubject rich = QuotedSubject();
  // 1.0 holds the pre transform on the segment, 2.6 targets on markers, 3.5 everything else.
  for (int code : {0, 9, 16}) {
    const auto r = Rewrite(rich, code);
    EXPECT_THAT(r.m_Back.m_Errors, IsEmpty()) << code;
    const auto& s = r.m_Back.m_Records.m_Subject;
    ASSERT_EQ(s.m_Segments.size(), rich.m_Subject.m_Segments.size());
    const auto& thigh = s.m_Segments[1];
    const auto& wanted = rich.m_Subject.m_Segments[1];
    EXPECT_EQ(thigh.m_PreTranslation, wanted.m_PreTranslation) << code;
    EXPECT_EQ(thigh.m_PreRotation, wanted.m_PreRotation) << code;
    EXPECT_EQ(thigh.m_Bounds, wanted.m_Bounds) << code;
    if (code != 0) {
      EXPECT_EQ(thigh.m_MassExpression, wanted.m_MassExpression) << code;
      EXPECT_EQ(thigh.m_MassCentreExpressions, wanted.m_MassCentreExpressions) << code;
      EXPECT_EQ(thigh.m_RadiusOfGyrationExpressions, wanted.m_RadiusOfGyrationExpressions);
      EXPECT_EQ(s.m_StaticParameters[1].m_DefaultExpression, "'Height'/2");
    }
    bool sawTarget = false;
    for (const auto& target : s.m_Targets) {
      if (target.m_Type != VTargetTypeBase::ELocalPointToWorldPointGaussian) continue;
      sawTarget = true;
      EXPECT_THAT(target.m_StateExpressions,
                  ::testing::ElementsAre("'Hip Width'*2", "'Hip Width'/3", "1+'Hip Width'"))
          << code;
    }
    EXPECT_TRUE(sawTarget) << code;
    EXPECT_EQ(r.m_Second, r.m_First) << code;
  }
}

TEST(KmtExactText, ExactAxesAndOldPostValuesComeBackAsRead) {
  const std::string file =
      "<KinematicModel VERSION=\"%V\"><Skeleton>"
      "<Segment NAME=\"A\"><JointHinge NAME=\"J1\" AXIS=\"0 1 0\" %P/>"
      "<Segment NAME=\"B\"><JointHardySpicer NAME=\"J2\" AXIS-PAIR=\"0 1 0 1 0 0\"/>"
      "<Segment NAME=\"C\"><JointSlider NAME=\"J3\" AXIS=\"-1 0 0\"/>"
      "<Segment NAME=\"D\"><JointHinge NAME=\"J4\" AXIS=\"0 0 -1\"/></Segment>"
      "</Segment></Segment></Segment></Skeleton>"
      "<MarkerSet><Markers/></MarkerSet></KinematicModel>";
  struct VCase {
    const char* m_pVersion;
    int m_Code;
    const char* m_pPost;
  };
  const VCase cases[] = {
      {"2.0", 3, "POST-ORIENTATION=\"0 0 0\" POST-POSITION=\"10 0 -20\""},
      {"2.0", 3, "POST-ORIENTATION=\"0 0 1.5707963267948966\" POST-POSITION=\"10 0 0\""},
      {"2.5", 8, "POST-ORIENTATION=\"0.25 -0.5 0.75\" POST-POSITION=\"1.5 -2 3.25\""},
      {"3.1", 12, "POST-ORIENTATION=\"0 0 0.5\" POST-POSITION=\"-0.5 2 0\""},
      {"3.5", 16, ""}};
  for (const auto& c : cases) {
    std::string text = file;
    text.replace(text.find("%V"), 2, c.m_pVersion);
    text.replace(text.find("%P"), 2, c.m_pPost);
    const auto back = ReadString(text);
    ASSERT_EQ(back.m_Result, ResultOk) << back.m_Errors[0];
    std::string written;
    const auto& b = back.m_Records;
    ASSERT_EQ(VWriter().WriteText(written, b.m_Subject, b.m_AppData, b.m_Subspace, c.m_Code),
              ResultOk);
    for (const char* attribute : {"AXIS=\"0 1 0\"", "AXIS-PAIR=\"0 1 0 1 0 0\"", "AXIS=\"-1 0 0\"",
                                  "AXIS=\"0 0 -1\"", c.m_pPost}) {
      EXPECT_THAT(written, HasSubstr(attribute)) << c.m_pPost;
    }
    EXPECT_THAT(written, ::testing::Not(HasSubstr("\"-0 "))) << c.m_pPost;
    EXPECT_THAT(written, ::testing::Not(HasSubstr(" -0 "))) << c.m_pPost;
    EXPECT_THAT(written, ::testing::Not(HasSubstr(" -0\""))) << c.m_pPost;
  }
}
