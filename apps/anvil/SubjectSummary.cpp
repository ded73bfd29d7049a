#include "SubjectSummary.h"

#include "Subcommands.h"

#include "River/CoreOstraKMTIO/Reader.h"

#include <boost/algorithm/string/case_conv.hpp>
#include <boost/filesystem/path.hpp>

#include <map>

namespace anvil {

namespace {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VTargetTypeBase;

const char* JointKind(VJointTypeBase::EJointType i_type) {
  switch (i_type) {
  case VJointTypeBase::EFree:
    return "free";
  case VJointTypeBase::EBall:
    return "ball";
  case VJointTypeBase::EHardySpicer:
    return "hardy-spicer";
  case VJointTypeBase::EHinge:
    return "hinge";
  case VJointTypeBase::ESlider:
    return "slider";
  case VJointTypeBase::EDummy:
    return "dummy";
  default:
    return "invalid";
  }
}

const char* TargetKind(VTargetTypeBase::ETargetType i_type) {
  switch (i_type) {
  case VTargetTypeBase::ELocalPointToWorldPoint:
  case VTargetTypeBase::ELocalPointToWorldPointGaussian:
    return "point";
  case VTargetTypeBase::ELocalLineToWorldPoint:
  case VTargetTypeBase::ELocalLineToWorldPointGaussian:
    return "line";
  case VTargetTypeBase::ELocalPlaneToWorldPoint:
  case VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    return "plane";
  case VTargetTypeBase::ERigidBody:
    return "rigid body";
  case VTargetTypeBase::ELocalRotationToWorldRotation:
    return "rotation";
  case VTargetTypeBase::ELocalDirectionToWorldDirection:
    return "direction";
  default:
    return "invalid";
  }
}

/// "kind n, kind m" in the order the kinds were first met; "none" for no items.
template <class T, class F> std::string CountByKind(const std::vector<T>& i_rItems, F i_kind) {
  std::vector<std::pair<std::string, int>> counts;
  for (const auto& item : i_rItems) {
    const std::string kind = i_kind(item);
    auto it = std::find_if(counts.begin(), counts.end(),
                           [&kind](const auto& entry) { return entry.first == kind; });
    if (it == counts.end()) {
      counts.emplace_back(kind, 1);
    } else {
      ++it->second;
    }
  }
  if (counts.empty()) return "none";
  std::string text;
  for (const auto& [kind, count] : counts)
    text += (text.empty() ? "" : ", ") + kind + " " + std::to_string(count);
  return text;
}

} // namespace

bool isSubjectFile(const std::string& i_rPath) {
  const std::string extension =
      boost::algorithm::to_lower_copy(boost::filesystem::path(i_rPath).extension().string());
  return extension == ".kmt" || extension == ".kmf" || extension == ".kms" || extension == ".kmr";
}

void describeSubject(const CoreOstraTypes::VSubjectParametrised& i_rSubject,
                     const UtilsRapidXml::IVersion& i_version, std::ostream& o_rOut) {
  const auto& s = i_rSubject;
  o_rOut << "Subject: " << s.m_Name << "\n";
  o_rOut << "Version: " << i_version.ToString() << "\n";
  o_rOut << "Parameters: " << s.m_StaticParameters.size() << " static, "
         << s.m_DynamicParameters.size() << " dynamic\n";
  o_rOut << "Segments: " << s.m_Segments.size() << "\n";
  o_rOut << "Joints: " << CountByKind(s.m_Segments, [](const auto& segment) {
    return JointKind(segment.m_Joint.m_JointType);
  }) << "\n";
  o_rOut << "Markers: " << s.m_Markers.size() << "\n";
  o_rOut << "Targets: " << CountByKind(s.m_Targets, [](const auto& target) {
    return TargetKind(target.m_Type);
  }) << "\n";
}

void describeMessages(const std::vector<std::string>& i_rErrors,
                      const std::vector<std::string>& i_rWarnings, std::ostream& o_rOut) {
  for (const auto& error : i_rErrors)
    o_rOut << "error: " << error << "\n";
  for (const auto& warning : i_rWarnings)
    o_rOut << "warning: " << warning << "\n";
}

int runSubjectInfo(const std::string& i_rPath, std::ostream& o_rOut) {
  CoreOstraKMTIO::VReader reader;
  CoreOstraTypes::VSubjectParametrised subject;
  CoreOstraTypes::VSubjectApplicationData appData;
  CoreOstraTypes::VSubjectDynamicSubspace subspace;
  std::vector<std::string> errors, warnings;
  const auto result = reader.Read(i_rPath, subject, appData, subspace, errors, warnings);
  if (result != CoreOstraKMTIO::ResultOk) {
    printError("cannot read subject file '" + i_rPath + "'");
    describeMessages(errors, warnings, o_rOut);
    return EExitWriteFailed;
  }
  describeSubject(subject, reader.FileVersion(), o_rOut);
  describeMessages(errors, warnings, o_rOut);
  return EExitOk;
}

} // namespace anvil
