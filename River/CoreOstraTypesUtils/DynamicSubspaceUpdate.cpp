#include "River/CoreOstraTypesUtils/DynamicSubspaceUpdate.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"

#include <set>
#include <string>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::VSubjectDynamicSubspace;
using CoreOstraTypes::VSubjectParametrised;

#define UPDATE_LOG(...) ZMT_LOG(SubjectDynamicSubspaceUtilsChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

/// Index of the one segment whose joint is `name`, or the segment count when there is none;
/// `o_rUnique` tells whether the name occurs once at most.
std::size_t FindJoint(const VSubjectParametrised& subject, const std::string& name,
                      bool& o_rUnique) {
  std::size_t found = subject.m_Segments.size();
  o_rUnique = true;
  for (std::size_t i = 0; i < subject.m_Segments.size(); ++i) {
    if (subject.m_Segments[i].m_Joint.m_Name != name) continue;
    if (found != subject.m_Segments.size())
      o_rUnique = false;
    else
      found = i;
  }
  return found;
}

/// The chunk of `after` for `chunk` of `before`, or false with the reason logged.
bool UpdateChunk(const VSubjectParametrised& before, const VSubjectParametrised& after,
                 const VSubjectDynamicSubspace::VPcaControlledParams& chunk,
                 VSubjectDynamicSubspace::VPcaControlledParams& o_rChunk) {
  VGenericDynamicSubspace generic;
  if (!BuildGenericDynamicSubspace(before, chunk, generic)) {
    UPDATE_LOG("Subspace chunk '%1%' does not cover whole joints of subject %2%", chunk.m_Name,
               before.m_Name);
    return false;
  }
  for (std::size_t j = 0; j < generic.m_JointNames.size(); ++j) {
    const std::string& name = generic.m_JointNames[j];
    bool unique = true;
    const std::size_t segment = FindJoint(after, name, unique);
    if (segment == after.m_Segments.size()) {
      UPDATE_LOG("Joint '%1%' of subspace chunk '%2%' is not in subject %3%", name, chunk.m_Name,
                 after.m_Name);
      return false;
    }
    if (!unique) {
      UPDATE_LOG("Joint '%1%' of subspace chunk '%2%' is named more than once in subject %3%", name,
                 chunk.m_Name, after.m_Name);
      return false;
    }
    if (after.m_Segments[segment].m_Joint.m_JointType != generic.m_JointTypes[j]) {
      UPDATE_LOG("Joint '%1%' of subspace chunk '%2%' changed type", name, chunk.m_Name);
      return false;
    }
  }
  if (ValidateGenericDynamicSubspace(generic) != ESubspaceValidation::EValid) return false;
  return BuildPcaControlledParams(after, generic, o_rChunk);
}

} // namespace

bool UpdateDynamicSubspace(const VSubjectParametrised& before, const VSubjectParametrised& after,
                           VSubjectDynamicSubspace& io_rSubspace) {
  if (io_rSubspace.m_PcaControlledParams.empty()) return true;
  const auto run = [&]() {
    const std::uint32_t count = JointParameterOffsets(before).back();
    if (io_rSubspace.m_NumJointParameters != count) {
      UPDATE_LOG("The subspace has %1% joint parameters, subject %2% has %3%",
                 io_rSubspace.m_NumJointParameters, before.m_Name, count);
      return false;
    }
    VSubjectDynamicSubspace updated = io_rSubspace;
    std::set<std::uint32_t> used;
    for (std::size_t c = 0; c < io_rSubspace.m_PcaControlledParams.size(); ++c) {
      auto& chunk = updated.m_PcaControlledParams[c];
      if (!UpdateChunk(before, after, io_rSubspace.m_PcaControlledParams[c], chunk)) return false;
      for (auto index : chunk.m_JointParametersIndices) {
        if (!used.insert(index).second) {
          UPDATE_LOG("Subspace chunk '%1%' shares joint parameter %2% with another chunk",
                     chunk.m_Name, index);
          return false;
        }
      }
    }
    updated.m_NumJointParameters = JointParameterOffsets(after).back();
    updated.m_SubjectId = after.m_SubjectId;
    io_rSubspace = std::move(updated);
    return true;
  };
  if (run()) return true;
  UPDATE_LOG("Subspace update cannot be performed");
  return false;
}

} // namespace CoreOstraTypesUtils
