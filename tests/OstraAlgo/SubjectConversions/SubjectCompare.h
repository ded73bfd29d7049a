#pragma once
// Comparisons of subject records shared by the conversion tests: numbers within a tolerance,
// and the pose part of a segment (parent, pre and inverse post transforms).
#include "River/CoreOstraTypes/VSubject.h"

#include <gtest/gtest.h>

#include <cstddef>

template <class A, class B> void ExpectNear(const A& a, const B& b, double tolerance = 1e-12) {
  ASSERT_EQ(a.size(), b.size());
  for (std::size_t i = 0; i < a.size(); ++i)
    EXPECT_NEAR(a[i], b[i], tolerance) << "entry " << i;
}

inline void ExpectSegmentPoseNear(const CoreOstraTypes::VSubject::VSegment& a,
                                  const CoreOstraTypes::VSubject::VSegment& b,
                                  double tolerance = 1e-12) {
  EXPECT_EQ(a.m_ParentSegmentIndex, b.m_ParentSegmentIndex);
  ExpectNear(a.m_PreRotation, b.m_PreRotation, tolerance);
  ExpectNear(a.m_PreTranslation, b.m_PreTranslation, tolerance);
  ExpectNear(a.m_InversePostRotation, b.m_InversePostRotation, tolerance);
  ExpectNear(a.m_InversePostTranslation, b.m_InversePostTranslation, tolerance);
}
