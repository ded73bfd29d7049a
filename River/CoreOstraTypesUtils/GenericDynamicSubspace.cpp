#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"

#include "DebugServices/GlobalLog.h"

#include <cmath>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubjectParametrised;
using VPcaControlledParams = CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams;

namespace {

const char* const Channel = "SubjectDynamicSubspaceUtils";

#define SUBSPACE_LOG(level, ...) ZMT_LOG(Channel, level, __VA_ARGS__)

double Dot(const std::vector<double>& a, const std::vector<double>& b) {
  double sum = 0.0;
  for (std::size_t i = 0; i < a.size(); ++i)
    sum += a[i] * b[i];
  return sum;
}

} // namespace

std::vector<std::uint32_t> JointParameterOffsets(const VSubjectParametrised& subject) {
  std::vector<std::uint32_t> offsets{0};
  for (const auto& segment : subject.m_Segments) {
    offsets.push_back(offsets.back() + JointParameterCount(segment.m_Joint.m_JointType));
  }
  return offsets;
}

bool BuildGenericDynamicSubspace(const VSubjectParametrised& subject,
                                 const VPcaControlledParams& chunk,
                                 VGenericDynamicSubspace& o_rGeneric) {
  const auto offsets = JointParameterOffsets(subject);
  VGenericDynamicSubspace generic;
  const auto& indices = chunk.m_JointParametersIndices;
  std::size_t i = 0;
  while (i < indices.size()) {
    // Find the joint whose parameters start at this index.
    std::size_t segment = 0;
    while (segment < subject.m_Segments.size() &&
           !(offsets[segment] == indices[i] && offsets[segment + 1] > offsets[segment])) {
      ++segment;
    }
    if (segment == subject.m_Segments.size()) return false;
    const std::uint32_t count = offsets[segment + 1] - offsets[segment];
    for (std::uint32_t k = 0; k < count; ++k) {
      if (i + k >= indices.size() || indices[i + k] != offsets[segment] + k) return false;
    }
    const auto& joint = subject.m_Segments[segment].m_Joint;
    generic.m_JointNames.push_back(joint.m_Name);
    generic.m_JointTypes.push_back(joint.m_JointType);
    i += count;
  }
  generic.m_Name = chunk.m_Name;
  generic.m_Version = chunk.m_Version;
  generic.m_NumEffectivePrincipalComponents = chunk.m_NumEffectivePrincipalComponents;
  generic.m_JointParamsForMeanPose = chunk.m_JointParametersMean;
  for (const auto& component : chunk.m_PrincipalComponents) {
    generic.m_RemarkableActions.push_back(
        {component.m_Name, component.m_JointParams, component.m_SqrtEigenvalue,
         component.m_LowerBound, component.m_UpperBound, component.m_TemporalDerivativeStddev});
  }
  o_rGeneric = std::move(generic);
  return true;
}

bool BuildPcaControlledParams(const VSubjectParametrised& subject,
                              const VGenericDynamicSubspace& generic,
                              VPcaControlledParams& o_rChunk) {
  const auto offsets = JointParameterOffsets(subject);
  VPcaControlledParams chunk;
  for (const auto& name : generic.m_JointNames) {
    std::size_t segment = 0;
    while (segment < subject.m_Segments.size() &&
           subject.m_Segments[segment].m_Joint.m_Name != name) {
      ++segment;
    }
    if (segment == subject.m_Segments.size()) return false;
    for (std::uint32_t k = offsets[segment]; k < offsets[segment + 1]; ++k) {
      chunk.m_JointParametersIndices.push_back(k);
    }
  }
  chunk.m_Name = generic.m_Name;
  chunk.m_Version = generic.m_Version;
  chunk.m_NumEffectivePrincipalComponents = generic.m_NumEffectivePrincipalComponents;
  chunk.m_JointParametersMean = generic.m_JointParamsForMeanPose;
  for (const auto& action : generic.m_RemarkableActions) {
    chunk.m_PrincipalComponents.push_back({action.m_Name, action.m_JointParams,
                                           action.m_SqrtEigenvalue, action.m_LowerBound,
                                           action.m_UpperBound, action.m_TemporalDerivativeStddev});
  }
  o_rChunk = std::move(chunk);
  return true;
}

ESubspaceValidation ValidateGenericDynamicSubspace(const VGenericDynamicSubspace& subspace) {
  std::size_t parameterCount = 0;
  for (auto type : subspace.m_JointTypes)
    parameterCount += JointParameterCount(type);

  if (parameterCount == 1) {
    SUBSPACE_LOG(ZMT::ELogWarning, "Single-element subspace encountered. Characterisation of a "
                                   "single joint parameter with a subspace is redundant.");
  }
  if (subspace.m_JointTypes.size() != subspace.m_JointNames.size()) {
    SUBSPACE_LOG(ZMT::ELogError, "m_JointTypes has %1% elements, but expecting %2%",
                 subspace.m_JointTypes.size(), subspace.m_JointNames.size());
    return ESubspaceValidation::EInvalid;
  }
  bool valid = true;
  bool free = false;
  for (auto type : subspace.m_JointTypes) {
    if (type == VJointTypeBase::EDummy) valid = false;
    if (type == VJointTypeBase::EFree) free = true;
  }
  if (!valid) SUBSPACE_LOG(ZMT::ELogError, "Dummy joints are not allowed in m_JointTypes");
  if (free) {
    SUBSPACE_LOG(ZMT::ELogWarning, "Free joints in m_JointTypes. Free joints involve parameters "
                                   "of different units, hence not recommended");
  }
  if (!valid) return ESubspaceValidation::EInvalid;
  if (subspace.m_JointParamsForMeanPose.size() != parameterCount) {
    SUBSPACE_LOG(ZMT::ELogError, "m_JointParamsForMeanPose has %1% elements, but expecting %2%",
                 subspace.m_JointParamsForMeanPose.size(), parameterCount);
    return ESubspaceValidation::EInvalid;
  }
  const auto& actions = subspace.m_RemarkableActions;
  if (actions.size() > parameterCount) {
    SUBSPACE_LOG(ZMT::ELogError,
                 "Number of remarkable actions (%1%) exceeds the joint parameter count (%2%)",
                 actions.size(), parameterCount);
    return ESubspaceValidation::EInvalid;
  }
  for (std::size_t i = 0; i < actions.size(); ++i) {
    if (actions[i].m_JointParams.size() != parameterCount) {
      SUBSPACE_LOG(ZMT::ELogError, "Basis vector %1% has %2% elements, but expecting %3%", i,
                   actions[i].m_JointParams.size(), parameterCount);
      return ESubspaceValidation::EInvalid;
    }
  }
  for (std::size_t i = 0; i < actions.size(); ++i) {
    const double squares = Dot(actions[i].m_JointParams, actions[i].m_JointParams);
    if (!(std::abs(squares - 1.0) <= 0.001)) {
      SUBSPACE_LOG(ZMT::ELogError,
                   "Orthogonality constraint violated at basis vector %f. Dot product value: %f", i,
                   squares);
      valid = false;
    }
  }
  for (std::size_t i = 0; i < actions.size(); ++i) {
    for (std::size_t j = i + 1; j < actions.size(); ++j) {
      const double dot = Dot(actions[i].m_JointParams, actions[j].m_JointParams);
      if (!(std::abs(dot) <= 0.001)) {
        SUBSPACE_LOG(ZMT::ELogError,
                     "Orthogonality constraint violated at basis vector pair %1%;%2%. Dot product "
                     "value: %3%",
                     i, j, dot);
        valid = false;
      }
    }
  }
  return valid ? ESubspaceValidation::EValid : ESubspaceValidation::EInvalid;
}

} // namespace CoreOstraTypesUtils
