#pragma once
// Optional model of a subject's joint parameters as linear combinations of principal components,
// chunk by chunk.

#include "River/CoreOstraTypes/NameHash.h"

#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypes {

class VSubjectDynamicSubspace {
public:
  struct VPcaControlledParams {
    struct VPrincipalComponent {
      std::string m_Name;
      std::vector<double> m_JointParams; ///< the basis vector
      double m_SqrtEigenvalue = 0.0;     ///< standard deviation of the coefficient
      double m_LowerBound = 0.0;
      double m_UpperBound = 0.0;
      double m_TemporalDerivativeStddev = 0.0;
      bool operator==(const VPrincipalComponent&) const = default;
      static constexpr const char* FlowClassName = "PrincipalComponent";
      template <class S, class V> static void FlowFields(S& s, V&& v) {
        v("Name", "", s.m_Name);
        v("JointParams", "", s.m_JointParams);
        v("SqrtEigenvalue", "", s.m_SqrtEigenvalue);
        v("LowerBound", "", s.m_LowerBound);
        v("UpperBound", "", s.m_UpperBound);
        v("TemporalDerivativeStddev", "", s.m_TemporalDerivativeStddev);
      }
    };
    std::uint32_t m_NumEffectivePrincipalComponents = 0;
    /// Positions of the chunk's parameters in the concatenated joint parameters.
    std::vector<std::uint32_t> m_JointParametersIndices;
    std::vector<double> m_JointParametersMean; ///< the mean pose
    std::vector<VPrincipalComponent> m_PrincipalComponents;
    std::string m_Name;
    std::string m_Version;
    bool operator==(const VPcaControlledParams&) const = default;
    static constexpr const char* FlowClassName = "PcaControlledParams";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("NumEffectivePrincipalComponents", "", s.m_NumEffectivePrincipalComponents);
      v("JointParametersIndices", "", s.m_JointParametersIndices);
      v("JointParametersMean", "", s.m_JointParametersMean);
      v("PrincipalComponents", "", s.m_PrincipalComponents);
      v("Name", "", s.m_Name);
      v("Version", "", s.m_Version);
    }
  };

  std::vector<VPcaControlledParams> m_PcaControlledParams;
  std::uint32_t m_NumJointParameters = 0;
  std::uint32_t m_SubjectId = InvalidId;

  bool operator==(const VSubjectDynamicSubspace&) const = default;
  static constexpr const char* FlowClassName = "SubjectDynamicSubspace";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("PcaControlledParams", "", s.m_PcaControlledParams);
    v("NumJointParameters", "", s.m_NumJointParameters);
    v("SubjectId", "", s.m_SubjectId);
  }
};

} // namespace CoreOstraTypes
