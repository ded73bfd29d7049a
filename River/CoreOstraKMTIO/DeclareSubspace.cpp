// SubjectDynamicSubspace, PcaControlledParams and PrincipalComponent.

#include "River/CoreOstraKMTIO/Declaration.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"

#include <boost/algorithm/string/classification.hpp>
#include <boost/algorithm/string/split.hpp>

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypesUtils::VGenericDynamicSubspace;

namespace {

void DeclarePrincipalComponent(INode& node, VGenericDynamicSubspace& io_rChunk) {
  VGenericDynamicSubspace::VRemarkableAction action;
  ReadText(node, "NAME", action.m_Name, "Action name", false, V3_5);
  ReadNumberList(node, "JOINT-PARAMS", action.m_JointParams, AnyCount, "PCA basis vector", true,
                 V3_5);
  const bool hasSqrt =
      ReadDouble(node, "SQRT-EIGENVALUE", action.m_SqrtEigenvalue,
                 "Square-root of the eigenvalue for this component", XsdDouble, true, V3_5);
  const bool hasLower = ReadDouble(node, "LOWER-BOUND", action.m_LowerBound,
                                   "Lower bound on the PCA coefficient", XsdDouble, true, V3_5);
  const bool hasUpper = ReadDouble(node, "UPPER-BOUND", action.m_UpperBound,
                                   "Upper bound on the PCA coefficient", XsdDouble, true, V3_5);
  const bool hasSd =
      ReadDouble(node, "TEMPORAL-DERIVATIVE-SD", action.m_TemporalDerivativeStddev,
                 "Standard deviation of the temporal derivative  of the PCA coeffficient",
                 XsdDouble, true, V3_5);
  if (hasSqrt && !(action.m_SqrtEigenvalue > 0.0)) {
    node.Error(ZMT::FormatOrRaw(" Non-negative 'SQRT-EIGENVALUE' at '%s : %s' ", io_rChunk.m_Name,
                                action.m_Name));
  }
  if (hasLower && hasUpper && action.m_LowerBound > action.m_UpperBound) {
    node.Error(ZMT::FormatOrRaw(" 'LOWER-EIGENVALUE' greater than 'UPPER-BOUND' at '%s : %s' ",
                                io_rChunk.m_Name, action.m_Name));
  }
  if (hasSd && action.m_TemporalDerivativeStddev < 0.0) {
    node.Error(ZMT::FormatOrRaw("'TEMPORAL-DERIVATIVE-SD' is negative at '%s %s'", io_rChunk.m_Name,
                                action.m_Name));
  }
  io_rChunk.m_RemarkableActions.push_back(std::move(action));
}

void DeclareChunk(INode& node, VReadContext& context) {
  const auto errors = node.ErrorCount();
  const auto& subject = context.m_rSubject;
  VGenericDynamicSubspace generic;
  std::string jointNames;
  ReadText(node, "NAME", generic.m_Name, "Limb name", true, V3_5);
  ReadText(node, "VERSION", generic.m_Version, "Version", true, V3_5);
  const bool hasJoints = ReadText(node, "JOINT-NAMES", jointNames, "Joint names", true, V3_5);
  ReadNumberList(node, "JOINT-PARAMS-MEAN", generic.m_JointParamsForMeanPose, AnyCount,
                 "Mean joint parameters", true, V3_5);
  if (hasJoints) {
    std::vector<std::string> names;
    boost::algorithm::split(names, jointNames, boost::algorithm::is_any_of(" \t"),
                            boost::algorithm::token_compress_on);
    for (const auto& name : names) {
      if (name.empty()) continue;
      std::size_t segment = 0;
      while (segment < subject.m_Segments.size() &&
             subject.m_Segments[segment].m_Joint.m_Name != name) {
        ++segment;
      }
      if (segment == subject.m_Segments.size()) {
        node.Error(ZMT::FormatOrRaw("Undefined joint '%s'", name));
        continue;
      }
      generic.m_JointNames.push_back(name);
      generic.m_JointTypes.push_back(subject.m_Segments[segment].m_Joint.m_JointType);
    }
  }
  node.Child("PrincipalComponent", "A basis vector for a subject dynamic subspace", 0, -1, V3_5);
  node.Children([&generic](INode& child) { DeclarePrincipalComponent(child, generic); });
  // Nothing read (a schema run) or something wrong: no chunk to check.
  if (!hasJoints || node.ErrorCount() != errors) return;

  generic.m_NumEffectivePrincipalComponents =
      static_cast<std::uint32_t>(generic.m_RemarkableActions.size());
  CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams chunk;
  if (CoreOstraTypesUtils::ValidateGenericDynamicSubspace(generic) !=
          CoreOstraTypesUtils::ESubspaceValidation::EValid ||
      !CoreOstraTypesUtils::BuildPcaControlledParams(subject, generic, chunk)) {
    node.Error("'SubjectDynamicSubspace' is not compatible with subject");
    return;
  }
  context.m_rSubspace.m_PcaControlledParams.push_back(std::move(chunk));
}

} // namespace

void DeclareSubspace(INode& node, VReadContext& context) {
  node.Child("PcaControlledParams", "A pca chunk controlling a group of joints ", 0, -1, V3_5);
  node.Children([&context](INode& child) { DeclareChunk(child, context); });
  auto& subspace = context.m_rSubspace;
  if (subspace.m_PcaControlledParams.empty()) {
    node.Error("'SubjectDynamicSubspace' declared but does not contain any valid "
               "'PcaControlledParams' elements");
  }
  subspace.m_NumJointParameters =
      CoreOstraTypesUtils::JointParameterOffsets(context.m_rSubject).back();
  subspace.m_SubjectId = context.m_rSubject.m_SubjectId;
}

} // namespace CoreOstraKMTIO::Detail
