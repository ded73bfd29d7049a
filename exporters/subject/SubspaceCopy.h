#pragma once
// What the KMS and KMR exporters share.
#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"

/// Copies the three fields of a setup's subspace.
inline void copySubspace(const CoreOstraTypes::VSubjectDynamicSubspace& i_rFrom,
                         CoreOstraTypes::VSubjectDynamicSubspace& o_rTo) {
  o_rTo.m_PcaControlledParams = i_rFrom.m_PcaControlledParams;
  o_rTo.m_NumJointParameters = i_rFrom.m_NumJointParameters;
  o_rTo.m_SubjectId = i_rFrom.m_SubjectId;
}
