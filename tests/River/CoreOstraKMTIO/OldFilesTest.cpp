// Hand-written files of older versions read with the conversions of their era.

#include "KmtTestSupport.h"

#include <gmock/gmock.h>

using namespace CoreOstraKMTIO;
using namespace CoreOstraTypes;
using ::testing::Contains;
using ::testing::HasSubstr;

namespace {

boost::filesystem::path DataFile(const std::string& name) {
  return boost::filesystem::path(ANVIL_TEST_DATA) / "kmt" / name;
}

} // namespace

TEST(KmtOldFiles, Version1_0KeepsPreTransformsOnSegmentsAndTargetsOnMarkers) {
  const auto back = ReadFile(DataFile("v1_0.kmt"), "Arm");
  ASSERT_EQ(back.m_Result, ResultOk) << back.m_Errors[0];
  const auto& s = back.m_Records.m_Subject;
  const auto& a = back.m_Records.m_AppData;
  EXPECT_EQ(s.m_Name, "Arm");
  EXPECT_EQ(s.m_SubjectId, NameHash("Arm"));
  ASSERT_EQ(s.m_Segments.size(), 2u);
  EXPECT_EQ(s.m_Segments[1].m_PreTranslation,
            (std::array<std::string, 3>{"0", "0", "-UpperLength"}));
  EXPECT_EQ(s.m_Segments[1].m_PreRotation[0], "0.5");
  EXPECT_EQ(s.m_Segments[1].m_ParentSegmentIndex.Value(), 0u);
  EXPECT_EQ(s.m_Segments[1].m_TreeDepth, 1u);
  EXPECT_EQ(s.m_Segments[0].m_Joint.m_JointType, VJointTypeBase::EBall);
  EXPECT_EQ(a.m_Segments[0].m_Joint.m_EulerOrder, VSubjectApplicationData::VJoint::EXZY);
  EXPECT_EQ(a.m_Colour, (Colour{10, 20, 255, 255})) << "colour components clamp to 255";
  // The hinge has no AXIS: Z with a warning, so its orientation stays the identity.
  EXPECT_THAT(back.m_Warnings, Contains("Hinge joint 'Elbow' is missing AXIS, using default"));
  EXPECT_EQ(s.m_Segments[1].m_Joint.m_JointOrientation, (std::array<double, 3>{0, 0, 0}));
  // Two markers imply Gaussian point targets; the third has no segment and none.
  ASSERT_EQ(s.m_Markers.size(), 3u);
  EXPECT_EQ(s.m_Markers[0].m_Radius, 8.0);
  EXPECT_EQ(s.m_Markers[1].m_Radius, 10.0) << "the file's default radius";
  ASSERT_EQ(s.m_Targets.size(), 2u);
  EXPECT_EQ(s.m_Targets[0].m_Type, VTargetTypeBase::ELocalPointToWorldPointGaussian);
  EXPECT_EQ(s.m_Targets[0].m_SegmentIndices, std::vector<std::uint32_t>{0});
  EXPECT_EQ(s.m_Targets[0].m_StateExpressions,
            (std::vector<std::string>{"0", "10", "-UpperLength"}));
  EXPECT_EQ(s.m_Targets[1].m_MarkerIndices, std::vector<std::uint32_t>{1});
  ASSERT_EQ(a.m_Sticks.size(), 1u);
  EXPECT_EQ(a.m_Sticks[0].m_ColourA, a.m_Sticks[0].m_ColourB);
}

TEST(KmtOldFiles, Version2_0InvertsThePostTransform) {
  const auto back = ReadFile(DataFile("v2_0.kmt"));
  ASSERT_EQ(back.m_Result, ResultOk) << back.m_Errors[0];
  const auto& s = back.m_Records.m_Subject;
  ASSERT_EQ(s.m_StaticParameters.size(), 1u);
  EXPECT_FALSE(s.m_StaticParameters[0].m_UserValue.IsSet());
  EXPECT_FALSE(s.m_StaticParameters[0].m_Visible);
  const auto& segment = s.m_Segments.at(0);
  EXPECT_EQ(segment.m_PreTranslation[2], "UpperLength") << "the template's expressions win";
  EXPECT_EQ(segment.m_Joint.m_TemplateMean, std::vector<double>(6, 1.0));
  EXPECT_NEAR(segment.m_InversePostRotation[2], -1.5707963267948966, 1e-12);
  EXPECT_NEAR(segment.m_InversePostTranslation[0], 0.0, 1e-12);
  EXPECT_NEAR(segment.m_InversePostTranslation[1], 10.0, 1e-12);
  EXPECT_EQ(back.m_Records.m_AppData.m_Segments[0].m_Colour[3], 255)
      << "OPACITY belongs to 3.0 and is ignored";
  EXPECT_THAT(back.m_Warnings,
              Contains("Ignoring OPACITY attribute in Segment element. Not supported in files "
                       "with version 2.0"));
  EXPECT_TRUE(s.m_Markers[0].m_Missing);
  EXPECT_EQ(s.m_Markers[0].m_Status, VSubjectParametrised::VMarker::EOptional);
  ASSERT_EQ(s.m_Targets.size(), 1u);
  EXPECT_EQ(s.m_Targets[0].m_TemplateCovariance, (std::vector<double>{2, 0, 0, 0, 2, 0, 0, 0, 2}));
  EXPECT_EQ(s.m_Targets[0].m_StateExpressions[2], "-UpperLength");
}

TEST(KmtOldFiles, Version2_6NormalisesViewNormalsAndSkipsSelfSticks) {
  const auto back = ReadFile(DataFile("v2_6.kmt"));
  ASSERT_EQ(back.m_Result, ResultOk) << back.m_Errors[0];
  const auto& s = back.m_Records.m_Subject;
  EXPECT_EQ(s.m_Markers[0].m_ViewAngle, 0.5);
  EXPECT_TRUE(s.m_Markers[0].m_Missing);
  EXPECT_EQ(s.m_Markers[0].m_Status, VSubjectParametrised::VMarker::ECalibrationOnly);
  ASSERT_EQ(s.m_Targets.size(), 1u);
  EXPECT_EQ(s.m_Targets[0].m_ViewNormals, (std::vector<std::array<double, 3>>{{0, 0, 1}}));
  EXPECT_TRUE(back.m_Records.m_AppData.m_Sticks.empty());
  EXPECT_THAT(back.m_Warnings, Contains("Skipped Stick using marker Top for MARKER1 and MARKER2"));
  EXPECT_THAT(back.m_Warnings, Contains("Ignoring DESCRIPTOR attribute in Marker element. Not "
                                        "supported in files with version 2.6"));
  // The slider's axis (0, 2, 0) gives the rotation that takes Z to Y.
  const auto axis =
      CoreOstraTypesUtils::AxisFromJointOrientation(s.m_Segments[0].m_Joint.m_JointOrientation);
  EXPECT_NEAR(axis[1], 1.0, 1e-12);
}

TEST(KmtOldFiles, Version3_1TakesPostValuesAsTheInverse) {
  const auto back = ReadFile(DataFile("v3_1.kmt"));
  ASSERT_EQ(back.m_Result, ResultOk) << back.m_Errors[0];
  const auto& s = back.m_Records.m_Subject;
  EXPECT_EQ(s.m_Segments[0].m_InversePostRotation, (std::array<double, 3>{0, 0, 0.5}));
  EXPECT_EQ(s.m_Segments[0].m_InversePostTranslation, (std::array<double, 3>{1, 2, 3}));
  EXPECT_FALSE(back.m_Records.m_AppData.m_Segments[0].m_Visible);
  EXPECT_THAT(back.m_Warnings, Contains("Ignoring SEGMENT attribute in Marker element. Not "
                                        "supported in files with version 3.1"));
  ASSERT_EQ(s.m_Targets.size(), 2u);
  EXPECT_EQ(s.m_Targets[0].m_Type, VTargetTypeBase::ELocalPointToWorldPointGaussian)
      << "a COVARIANCE without GAUSSIAN makes a Gaussian target";
  const auto& body = s.m_Targets[1];
  EXPECT_EQ(body.m_Type, VTargetTypeBase::ERigidBody);
  EXPECT_EQ(body.m_StateExpressions,
            (std::vector<std::string>{"0.1", "0.2", "0.3", "4", "5", "6", "1", "0", "0", "0", "1",
                                      "0", "0", "0", "1"}));
  ASSERT_EQ(body.m_Covariance.size(), 63u);
  EXPECT_EQ(body.m_Covariance[0], 0.0) << "no body COVARIANCE means zeros";
  EXPECT_EQ(body.m_Covariance[36], 1.0) << "no marker COVARIANCE means the unit matrix";
  EXPECT_EQ(body.m_Covariance[45], 2.0);
  EXPECT_EQ(body.m_ViewNormals[0], (std::array<double, 3>{0, 1, 0}));
}

TEST(KmtOldFiles, OnePostAttributeCountsTheOtherAsZero) {
  const auto file = [](const std::string& version, const std::string& joint,
                       const std::string& jointTemplate) {
    return "<KinematicModel VERSION=\"" + version +
           "\"><Skeleton><Segment NAME=\"A\"><JointFree NAME=\"J\" " + joint + "><JointTemplate " +
           jointTemplate +
           "/></JointFree></Segment></Skeleton><MarkerSet><Markers/></MarkerSet>"
           "</KinematicModel>";
  };
  struct VCase {
    std::string m_Version, m_Joint, m_Template;
    std::array<double, 3> m_Rotation, m_Translation;
  };
  const VCase cases[] = {
      // Before 3.0 the file holds Q: a translation alone inverts to its negation.
      {"2.0", "POST-POSITION=\"10 0 -20\"", "", {0, 0, 0}, {-10, 0, 20}},
      {"2.6", "", "POST-ORIENTATION=\"0 0 0.5\"", {0, 0, -0.5}, {0, 0, 0}},
      // 3.0 and 3.1 hold the inverse under the same names.
      {"3.1", "POST-ORIENTATION=\"0 0 0.5\"", "", {0, 0, 0.5}, {0, 0, 0}},
      {"3.0", "", "POST-POSITION=\"1 2 3\"", {0, 0, 0}, {1, 2, 3}},
      // One half on the joint, the other on its template.
      {"3.1", "POST-POSITION=\"1 2 3\"", "POST-ORIENTATION=\"0 0.5 0\"", {0, 0.5, 0}, {1, 2, 3}},
  };
  for (const auto& c : cases) {
    const auto back = ReadString(file(c.m_Version, c.m_Joint, c.m_Template));
    ASSERT_EQ(back.m_Result, ResultOk)
        << c.m_Version << c.m_Joint << c.m_Template << ": " << back.m_Errors[0];
    const auto& segment = back.m_Records.m_Subject.m_Segments.at(0);
    EXPECT_EQ(segment.m_InversePostRotation, c.m_Rotation) << c.m_Version << c.m_Joint;
    EXPECT_EQ(segment.m_InversePostTranslation, c.m_Translation) << c.m_Version << c.m_Joint;
  }
}
