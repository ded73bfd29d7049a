// Write then read in every version the exporters offer (and the two older eras' boundaries):
// what comes back is the subject minus exactly what that version can't hold.

#include "KmtTestSupport.h"

#include "River/CoreOstraKMTIO/KMTLanguage.h"

using namespace CoreOstraKMTIO;
using namespace CoreOstraTypes;
using Versions::V2_0;
using Versions::V2_1;
using Versions::V2_6;
using Versions::V3_0;
using Versions::V3_1;
using Versions::V3_3;
using Versions::V3_4;
using Versions::V3_5;

namespace {

/// The rich subject as a file of `version` gives it back.
VRichSubject Expected(const IVersion& version) {
  VRichSubject rich = MakeRichSubject();
  auto& s = rich.m_Subject;
  auto& a = rich.m_AppData;
  if (version < V3_5) {
    s.m_ModelVersion.clear();
    a.m_RetargetSourceTemplate.clear();
    a.m_RetargetSourceSubject.clear();
    for (auto& segment : s.m_Segments)
      segment.m_Joint.m_BindPose.clear();
    rich.m_Subspace = {};
    for (std::size_t i = s.m_Targets.size(); i-- > 0;) {
      if (s.m_Targets[i].m_Type == VTargetTypeBase::ELocalDirectionToWorldDirection) {
        s.m_Targets.erase(s.m_Targets.begin() + long(i));
        a.m_Targets.erase(a.m_Targets.begin() + long(i));
      }
    }
    s.m_Rotations.pop_back();
    for (auto& target : s.m_Targets) {
      target.m_CalibrationWeight = 1.0;
      target.m_RotationCalibrationBehaviour = VTargetTypeBase::EOther;
      target.m_RotationTargetOrientation.clear();
    }
  }
  if (version < V3_4) {
    s.m_Rotations.clear();
    for (auto& target : s.m_Targets) {
      if (target.m_Type != VTargetTypeBase::ELocalRotationToWorldRotation) continue;
      target.m_StateExpressions = {"0", "0", "0"};
      target.m_Weight = 1.0;
      target.m_RotationObservationIndices.clear();
    }
  }
  if (version < V3_3) {
    a.m_Skin.clear();
    a.m_SkinColourA = a.m_SkinColourB = DefaultColour;
    for (auto& target : s.m_Targets)
      target.m_PlacementCovariance.clear();
  }
  if (version < V3_1) {
    for (auto& target : s.m_Targets) {
      if (target.m_Type != VTargetTypeBase::ERigidBody) continue;
      std::fill_n(target.m_StateExpressions.begin(), 3, "0");
      std::fill_n(target.m_Covariance.begin(), 36, 0.0);
    }
  }
  if (version < V3_0) {
    for (auto& segment : a.m_Segments) {
      const auto joint = segment.m_Joint;
      const auto context = segment.m_Context;
      const auto colour = segment.m_Colour;
      segment = {};
      segment.m_Joint = joint;
      segment.m_Context = context;
      segment.m_Colour = {colour[0], colour[1], colour[2], 255};
    }
    for (auto& segment : s.m_Segments) {
      auto& joint = segment.m_Joint;
      joint.m_RangeCentringState.clear();
      joint.m_RangeMatrix.clear();
      joint.m_TemplateRangeCentringState.clear();
      joint.m_TemplateRangeMatrix.clear();
    }
    for (auto& stick : a.m_Sticks)
      stick.m_ColourB = stick.m_ColourA;
    // Only the Gaussian point targets survive, folded into their markers, in marker order.
    std::vector<VSubjectParametrised::VTarget> implied;
    for (std::uint32_t m = 0; m < s.m_Markers.size(); ++m) {
      for (const auto& target : s.m_Targets) {
        if (target.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian &&
            target.m_MarkerIndices == std::vector<std::uint32_t>{m}) {
          auto kept = target;
          if (version < V2_6) kept.m_ViewNormals = {{0, 0, 0}};
          if (version < V2_0) kept.m_TemplateCovariance.clear();
          implied.push_back(kept);
          break;
        }
      }
    }
    s.m_Targets = implied;
    a.m_Targets.assign(implied.size(), {});
  }
  if (version < V2_6) {
    for (auto& marker : s.m_Markers)
      marker.m_ViewAngle = 0.0;
  }
  if (version < V2_1) {
    for (auto& segment : s.m_Segments) {
      segment.m_Joint.m_TPoseMean.clear();
      segment.m_Joint.m_TPoseCovariance.clear();
    }
  }
  if (version < V2_0) {
    s.m_StaticParameters.clear();
    for (auto& parameter : s.m_DynamicParameters) {
      parameter.m_Prior = 0.0;
      parameter.m_StandardDeviation.Reset();
      parameter.m_Visible = true;
    }
    for (auto& segment : s.m_Segments) {
      segment.m_MassExpression.clear();
      segment.m_MassCentreExpressions = {};
      segment.m_RadiusOfGyrationExpressions = {};
      segment.m_InversePostRotation = {};
      segment.m_InversePostTranslation = {};
      auto& joint = segment.m_Joint;
      joint.m_TemplateMean.clear();
      joint.m_TemplateCovariance.clear();
      if (version > Versions::V1_0) {
        segment.m_PreRotation = {"0", "0", "0"};
        segment.m_PreTranslation = {"0", "0", "0"};
      }
    }
    for (auto& segment : a.m_Segments)
      segment.m_Context.clear();
    for (auto& marker : s.m_Markers) {
      marker.m_Status = VSubjectParametrised::VMarker::ERequired;
      marker.m_Missing = false;
    }
  }
  return rich;
}

/// Compares two readings, first aligning the values the language keeps in another form.
void ExpectSameRecords(VRichSubject actual, const VRichSubject& expected) {
  auto& s = actual.m_Subject;
  ASSERT_EQ(s.m_Segments.size(), expected.m_Subject.m_Segments.size());
  for (std::size_t i = 0; i < s.m_Segments.size(); ++i) {
    auto& segment = s.m_Segments[i];
    const auto& wanted = expected.m_Subject.m_Segments[i];
    AlignNear(segment.m_Joint.m_JointOrientation, wanted.m_Joint.m_JointOrientation,
              "JointOrientation");
    AlignNear(segment.m_InversePostRotation, wanted.m_InversePostRotation, "InversePostRotation");
    AlignNear(segment.m_InversePostTranslation, wanted.m_InversePostTranslation,
              "InversePostTranslation");
  }
  EXPECT_EQ(s.m_StaticParameters, expected.m_Subject.m_StaticParameters);
  EXPECT_EQ(s.m_DynamicParameters, expected.m_Subject.m_DynamicParameters);
  EXPECT_EQ(s.m_Segments, expected.m_Subject.m_Segments);
  EXPECT_EQ(s.m_Markers, expected.m_Subject.m_Markers);
  EXPECT_EQ(s.m_Rotations, expected.m_Subject.m_Rotations);
  ASSERT_EQ(s.m_Targets.size(), expected.m_Subject.m_Targets.size());
  for (std::size_t i = 0; i < s.m_Targets.size(); ++i)
    EXPECT_EQ(s.m_Targets[i], expected.m_Subject.m_Targets[i]) << "target " << i;
  EXPECT_EQ(s.m_TPoseConstraints, expected.m_Subject.m_TPoseConstraints);
  EXPECT_EQ(s, expected.m_Subject);
  EXPECT_EQ(actual.m_AppData.m_Segments, expected.m_AppData.m_Segments);
  EXPECT_EQ(actual.m_AppData.m_Targets, expected.m_AppData.m_Targets);
  EXPECT_EQ(actual.m_AppData, expected.m_AppData);
  EXPECT_EQ(actual.m_Subspace, expected.m_Subspace);
}

class KmtRoundTrip : public ::testing::TestWithParam<int> {};

} // namespace

TEST_P(KmtRoundTrip, ReadsBackWhatTheVersionHolds) {
  VScratch scratch;
  const auto path = scratch / "rich.kmt";
  const auto rich = MakeRichSubject();
  std::vector<std::string> messages;
  ASSERT_EQ(Write(path, rich.m_Subject, rich.m_AppData, rich.m_Subspace, &messages, GetParam()),
            ResultOk)
      << (messages.empty() ? "" : messages[0]);
  EXPECT_TRUE(messages.empty());

  const auto back = ReadFile(path);
  ASSERT_EQ(back.m_Result, ResultOk) << (back.m_Errors.empty() ? "" : back.m_Errors[0]);
  const IVersion version = VersionOfCode(GetParam());
  for (const auto& warning : back.m_Warnings) {
    // Only the retired joint axis defaults may speak: no attribute is out of place.
    EXPECT_EQ(warning.find("Ignoring"), std::string::npos) << warning;
  }
  ExpectSameRecords(back.m_Records, Expected(version));

  std::string output;
  const auto schema = scratch / "kmt.xsd";
  ASSERT_TRUE(VReader().WriteSchema(schema));
  EXPECT_EQ(Xmllint("--noout --schema " + schema.string() + " " + path.string(), output), 0)
      << output;
}

TEST_P(KmtRoundTrip, WritingWhatWasReadGivesTheSameText) {
  const auto rich = MakeRichSubject();
  std::string first, second;
  ASSERT_EQ(VWriter().WriteText(first, rich.m_Subject, rich.m_AppData, rich.m_Subspace, GetParam()),
            ResultOk);
  const auto back = ReadString(first);
  ASSERT_EQ(back.m_Result, ResultOk) << (back.m_Errors.empty() ? "" : back.m_Errors[0]);
  const auto& b = back.m_Records;
  ASSERT_EQ(VWriter().WriteText(second, b.m_Subject, b.m_AppData, b.m_Subspace, GetParam()),
            ResultOk);
  EXPECT_EQ(second, first);
  EXPECT_EQ(first.find("e-16"), std::string::npos) << "no rounding noise in exact axes";
}

INSTANTIATE_TEST_SUITE_P(Versions, KmtRoundTrip,
                         ::testing::Values(0, 1, 3, 8, 9, 11, 12, 13, 14, 15, 16),
                         [](const auto& info) {
                           const auto version = VersionOfCode(info.param);
                           return "V" + std::to_string(version.m_Major) + "_" +
                                  std::to_string(version.m_Minor);
                         });

TEST(KmtWriter, AutomaticVersionFollowsTheContent) {
  auto rich = MakeRichSubject();
  const auto versionOf = [&rich] {
    return VWriter::VersionFor(AutomaticVersionCode, rich.m_Subject, rich.m_AppData,
                               rich.m_Subspace);
  };
  EXPECT_EQ(versionOf(), V3_5);
  rich.m_Subspace = {};
  rich.m_Subject.m_ModelVersion.clear();
  rich.m_AppData.m_RetargetSourceTemplate.clear();
  rich.m_AppData.m_RetargetSourceSubject.clear();
  rich.m_Subject.m_Segments[0].m_Joint.m_BindPose.clear();
  rich.m_Subject.m_Targets.pop_back();
  EXPECT_EQ(versionOf(), V3_5) << "calibration weights and behaviours still need 3.5";
  for (auto& target : rich.m_Subject.m_Targets) {
    target.m_CalibrationWeight = 1.0;
    target.m_RotationCalibrationBehaviour = VTargetTypeBase::EOther;
    target.m_RotationTargetOrientation.clear();
  }
  EXPECT_EQ(versionOf(), V3_4);
  rich.m_Subject.m_Rotations.clear();
  EXPECT_EQ(versionOf(), V3_3);
  rich.m_AppData.m_Skin.clear();
  for (auto& target : rich.m_Subject.m_Targets)
    target.m_PlacementCovariance.clear();
  EXPECT_EQ(versionOf(), Versions::V3_2);

  VWriter writer;
  std::string text;
  ASSERT_EQ(
      writer.WriteText(text, rich.m_Subject, rich.m_AppData, rich.m_Subspace, AutomaticVersionCode),
      ResultOk);
  EXPECT_NE(text.find("VERSION=\"3.2\""), std::string::npos);
}

TEST(KmtWriter, InvalidCodesWriteEveryEra) {
  const auto rich = MakeRichSubject();
  for (int code : {2, 10, 17, -1}) {
    VWriter writer;
    std::string text;
    ASSERT_EQ(writer.WriteText(text, rich.m_Subject, rich.m_AppData, rich.m_Subspace, code),
              ResultOk);
    EXPECT_NE(text.find("VERSION=\"-1.-1\""), std::string::npos);
    for (const char* attribute :
         {" POSITION=", " POST-ORIENTATION=", " INVERSE-POST-ORIENTATION=", " DESCRIPTOR", " RGB1=",
          "<MarkerTemplate", "<TargetSet", " SEGMENT=\"Pelvis\"", "<SubjectDynamicSubspace"}) {
      if (std::string(attribute) == " DESCRIPTOR") continue;
      EXPECT_NE(text.find(attribute), std::string::npos) << code << attribute;
    }
    const auto back = ReadString(text);
    EXPECT_EQ(back.m_Result, ResultFailed) << "the invalid version can't be read back";
  }
}

TEST(KmtWriter, EraSpecificAttributes) {
  const auto rich = MakeRichSubject();
  auto textOf = [&rich](int code) {
    std::string text;
    VWriter().WriteText(text, rich.m_Subject, rich.m_AppData, rich.m_Subspace, code);
    return text;
  };
  // 3.1 stores the inverse post values under the old names, as the numbers themselves.
  const auto v31 = textOf(12);
  EXPECT_NE(v31.find("POST-ORIENTATION=\"0.20000000000000001 0.10000000000000001 "
                     "-0.29999999999999999\""),
            std::string::npos);
  EXPECT_EQ(v31.find("INVERSE-POST"), std::string::npos);
  EXPECT_EQ(v31.find("<Skin"), std::string::npos);
  // 1.0 keeps the pre transform as segment expressions.
  const auto v10 = textOf(0);
  EXPECT_NE(v10.find("POSITION=\"HipWidth 0 -10\""), std::string::npos);
  EXPECT_NE(v10.find("ORIENTATION=\"0.1 0 -0.25\""), std::string::npos);
  // 2.6 folds the Gaussian point target into its marker.
  const auto v26 = textOf(9);
  EXPECT_NE(v26.find("SEGMENT=\"Pelvis\" POSITION=\"HipWidth 20 30\""), std::string::npos);
  EXPECT_NE(v26.find("<MarkerTemplate POSITION=\"HipWidth 20 30\""), std::string::npos);
  // An empty subspace writes no element, also at 3.5.
  auto noSubspace = rich;
  noSubspace.m_Subspace = {};
  std::string v35;
  VWriter().WriteText(v35, noSubspace.m_Subject, noSubspace.m_AppData, noSubspace.m_Subspace, 16);
  EXPECT_EQ(v35.find("SubjectDynamicSubspace"), std::string::npos);
}
