#pragma once
// The generic form of one PCA chunk of a dynamic subspace: named by joints rather than by
// positions in the concatenated joint parameters, as subject files store it.

#include "River/CoreOstraTypes/VSubjectDynamicSubspace.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypesUtils {

struct VGenericDynamicSubspace {
  /// One principal component ("remarkable action") of the chunk.
  struct VRemarkableAction {
    std::string m_Name;
    std::vector<double> m_JointParams; ///< basis vector, one entry per chunk parameter
    double m_SqrtEigenvalue = 0.0;
    double m_LowerBound = 0.0;
    double m_UpperBound = 0.0;
    double m_TemporalDerivativeStddev = 0.0;
  };

  std::string m_Name;
  std::string m_Version;
  std::uint32_t m_NumEffectivePrincipalComponents = 0;
  std::vector<std::string> m_JointNames;
  std::vector<CoreOstraTypes::VJointTypeBase::EJointType> m_JointTypes;
  std::vector<double> m_JointParamsForMeanPose;
  std::vector<VRemarkableAction> m_RemarkableActions;
};

/// Result of ValidateGenericDynamicSubspace; the top bit marks failure.
enum class ESubspaceValidation : std::uint32_t { EValid = 0, EInvalid = 0x80000001u };

/// Position of each segment's first joint parameter in the concatenated joint parameters,
/// segments in order; the last entry is the total count.
std::vector<std::uint32_t>
JointParameterOffsets(const CoreOstraTypes::VSubjectParametrised& subject);

/// Generic form of `chunk`: its parameter indices must be whole joints of `subject`, each joint's
/// parameters consecutive and in order. False, with the output untouched, otherwise.
bool BuildGenericDynamicSubspace(
    const CoreOstraTypes::VSubjectParametrised& subject,
    const CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams& chunk,
    VGenericDynamicSubspace& o_rGeneric);

/// Chunk of `generic` for `subject`; false, with the output untouched, when a joint name is not
/// a joint of the subject.
bool BuildPcaControlledParams(
    const CoreOstraTypes::VSubjectParametrised& subject, const VGenericDynamicSubspace& generic,
    CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams& o_rChunk);

/// Checks counts, joint types and the orthonormality (tolerance 0.001) of the basis vectors,
/// logging each problem on "SubjectDynamicSubspaceUtils".
ESubspaceValidation ValidateGenericDynamicSubspace(const VGenericDynamicSubspace& subspace);

} // namespace CoreOstraTypesUtils
