#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <gtest/gtest.h>

#include <bit>
#include <cstring>

using namespace CoreOstraTypes;

TEST(IOptional, ReservedValuesMeanUnset) {
  ZMT::IOptional<double> d;
  EXPECT_FALSE(d.IsSet());
  EXPECT_EQ(std::bit_cast<std::uint64_t>(d.Raw()), 0x7FEFFFFFFFFFFFFFull);
  d = 0.0;
  EXPECT_TRUE(d.IsSet());
  d = ZMT::IOptional<double>(std::numeric_limits<double>::max());
  EXPECT_FALSE(d.IsSet());
  EXPECT_EQ(d.ValueOr(2.5), 2.5);

  ZMT::IOptional<std::uint32_t> u;
  EXPECT_EQ(u.Raw(), 0xFFFFFFFFu);
  u = 0u;
  EXPECT_TRUE(u.IsSet());
  u.Reset();
  EXPECT_FALSE(u.IsSet());
  static_assert(sizeof(ZMT::IOptional<double>) == sizeof(double));
  static_assert(sizeof(ZMT::IOptional<std::uint32_t>) == 4);
}

TEST(Records, DefaultsAndEnumerationValues) {
  VSubjectParametrised::VSegment seg;
  EXPECT_FALSE(seg.m_ParentSegmentIndex.IsSet());
  EXPECT_EQ(seg.m_Joint.m_JointType, VSubjectParametrised::VJoint::EDummy);
  EXPECT_EQ(VSubject::VJoint{}.m_JointType, VSubject::VJoint::EDummy);
  static_assert(VSubject::VJoint::EBadJointType == 6);
  static_assert(VSubject::VTarget::ELocalDirectionToWorldDirection == 9);
  static_assert(VSubjectParametrised::VTarget::EHardySpicerLike == 3);
  static_assert(VSubjectParametrised::VMarker::EVirtualCalibrationOnly == 3);
  static_assert(VSubjectParametrised::VStaticParameter::EQuantityTime == 4);
  static_assert(VSubjectApplicationData::VJoint::ENone == 6);
  static_assert(VSubjectApplicationData::VSegment::EDrawStyleBodyPart == 7);
  static_assert(VSubjectApplicationData::VTarget::EDrawStyleBoneLines == 2);
  static_assert(JointParameterCount(VSubject::VJoint::EFree) == 6);
  static_assert(JointParameterCount(VSubject::VJoint::EHardySpicer) == 2);

  VSubjectApplicationData::VSegment app;
  std::uint32_t word = 0;
  std::memcpy(&word, app.m_Colour.data(), 4);
  EXPECT_EQ(word, 0xFF5D5D5Du); // little-endian host
  EXPECT_EQ(app.m_DrawEndRatio, 1.0);
  EXPECT_EQ(app.m_DrawHeight, 0.5);
  EXPECT_EQ(app.m_DrawWidth, 0.5);
  EXPECT_EQ(app.m_DrawTwist, 0.0);
  EXPECT_EQ(app.m_DrawShading, VSubjectApplicationData::VSegment::EDrawShadingShadedSmooth);
  EXPECT_EQ(app.m_DrawStyle, VSubjectApplicationData::VSegment::EDrawStyleBox);
  EXPECT_TRUE(app.m_Visible);
}

TEST(Records, EqualityComparesNestedFieldsAndCopiesAreDeep) {
  VSubjectParametrised a;
  a.m_Name = "Bob";
  a.m_Segments.resize(2);
  a.m_Segments[1].m_ParentSegmentIndex = 0u;
  a.m_Segments[1].m_Joint.m_Mean = {1, 2, 3};
  VSubjectParametrised b = a;
  EXPECT_EQ(a, b);
  b.m_Segments[1].m_Joint.m_Mean[2] = 4;
  EXPECT_NE(a, b);
  EXPECT_EQ(a.m_Segments[1].m_Joint.m_Mean[2], 3);
  b = a;
  b.m_Segments[1].m_Bounds[5] = "1";
  EXPECT_NE(a, b);

  VSubjectDynamicSubspace s, t;
  s.m_PcaControlledParams.resize(1);
  s.m_PcaControlledParams[0].m_PrincipalComponents.resize(1);
  t = s;
  EXPECT_EQ(s, t);
  t.m_PcaControlledParams[0].m_PrincipalComponents[0].m_UpperBound = 1.0;
  EXPECT_NE(s, t);

  VSubjectApplicationData x, y;
  y.m_SkinColourB[3] = 0;
  EXPECT_NE(x, y);
}
