#include "River/CoreOstraKMTIO/Writer.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraKMTIO/ExpressionEvaluation.h"
#include "River/CoreOstraKMTIO/PostTransform.h"
#include "River/CoreOstraKMTIO/WriterElements.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "Utils/UtilsRapidXml/XmlBuild.h"

#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

#include <iterator>

namespace CoreOstraKMTIO {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VTargetTypeBase;

IVersion VWriter::VersionFor(int versionCode, const VSubjectParametrised& subject,
                             const VSubjectApplicationData& appData,
                             const VSubjectDynamicSubspace& subspace) {
  if (versionCode != AutomaticVersionCode) return VersionOfCode(versionCode);
  IVersion version = Versions::V3_2;
  auto raise = [&version](const IVersion& to) { version = std::max(version, to); };
  if (!appData.m_Skin.empty()) raise(Versions::V3_3);
  for (const auto& target : subject.m_Targets)
    if (!target.m_PlacementCovariance.empty()) raise(Versions::V3_3);
  if (!subject.m_Rotations.empty()) raise(Versions::V3_4);
  if (!subspace.m_PcaControlledParams.empty() || !subject.m_ModelVersion.empty() ||
      !appData.m_RetargetSourceTemplate.empty() || !appData.m_RetargetSourceSubject.empty()) {
    raise(Versions::V3_5);
  }
  for (const auto& segment : subject.m_Segments)
    if (!segment.m_Joint.m_BindPose.empty()) raise(Versions::V3_5);
  for (const auto& target : subject.m_Targets) {
    if (target.m_Type == VTargetTypeBase::ELocalDirectionToWorldDirection ||
        target.m_CalibrationWeight != 1.0 ||
        target.m_RotationCalibrationBehaviour != VTargetTypeBase::EOther ||
        !target.m_RotationTargetOrientation.empty()) {
      raise(Versions::V3_5);
    }
  }
  return version;
}

void VWriter::SetSchemaLocation(const std::string& xmlnsXsi, const std::string& schemaLocation) {
  m_XmlnsXsi = xmlnsXsi;
  m_SchemaLocation = schemaLocation;
}

bool VWriter::PrepareExtras() {
  CoreOstraTypesUtils::VDynamicExpressionParserSimple parser;
  if (!parser.SetParameters(m_Subject, m_Messages)) return false;
  bool ok = true;
  for (std::size_t i = 0; i < m_Subject.m_Segments.size(); ++i) {
    const auto& segment = m_Subject.m_Segments[i];
    auto& extras = m_Extras.m_Segments[i];
    const auto owner = Detail::VExpressionOwner::Segment(segment.m_Name);
    ok = Detail::EvaluateAll(parser, segment.m_PreRotation, owner, extras.m_PreRotation,
                             m_Messages) &&
         ok;
    ok = Detail::EvaluateAll(parser, segment.m_PreTranslation, owner, extras.m_PreTranslation,
                             m_Messages) &&
         ok;
    if (!m_Version.IsValid() || m_Version < Versions::V3_2) {
      PostTextsFromInverse(m_Version, segment.m_InversePostRotation,
                           segment.m_InversePostTranslation, extras.m_PostRotation,
                           extras.m_PostTranslation);
    }
    const auto& orientation = segment.m_Joint.m_JointOrientation;
    switch (segment.m_Joint.m_JointType) {
    case VJointTypeBase::EHardySpicer: {
      const auto pair = CoreOstraTypesUtils::AxisPairFromJointOrientation(orientation);
      extras.m_Axes.assign(pair.begin(), pair.end());
      break;
    }
    case VJointTypeBase::EHinge:
    case VJointTypeBase::ESlider: {
      const auto axis = CoreOstraTypesUtils::AxisFromJointOrientation(orientation);
      extras.m_Axes.assign(axis.begin(), axis.end());
      break;
    }
    default:
      break;
    }
  }
  return ok;
}

bool VWriter::Build(std::string& o_rText, const VSubjectParametrised& subject,
                    const VSubjectApplicationData& appData, const VSubjectDynamicSubspace& subspace,
                    int versionCode) {
  m_Subject = subject;
  m_AppData = appData;
  m_Subspace = subspace;
  m_Messages.clear();
  m_Version = VersionFor(versionCode, subject, appData, subspace);
  m_Extras = {};
  m_Extras.m_Segments.resize(m_Subject.m_Segments.size());
  m_Extras.m_Markers.resize(m_Subject.m_Markers.size());
  m_Extras.m_Targets.resize(m_Subject.m_Targets.size());
  // The records correspond by index; make the display records match so no index runs out.
  m_AppData.m_Segments.resize(m_Subject.m_Segments.size());
  m_AppData.m_Markers.resize(m_Subject.m_Markers.size());
  m_AppData.m_Targets.resize(m_Subject.m_Targets.size());
  if (!PrepareExtras()) return false;

  rapidxml::xml_document<> document;
  auto* declaration = document.allocate_node(rapidxml::node_declaration);
  UtilsRapidXml::AppendAttribute(document, declaration, "version", "1.0");
  UtilsRapidXml::AppendAttribute(document, declaration, "encoding", "UTF-8");
  UtilsRapidXml::AppendAttribute(document, declaration, "standalone", "no");
  document.append_node(declaration);

  UtilsRapidXml::VWriterNode root(document, m_Version);
  const Detail::VWriteContext context{m_Subject, m_AppData,  m_Subspace,
                                      m_Extras,  m_XmlnsXsi, m_SchemaLocation};
  root.Child("KinematicModel", [&context](UtilsRapidXml::VWriterNode& model) {
    Detail::WriteKinematicModel(model, context);
  });
  const auto& errors = root.Errors();
  m_Messages.insert(m_Messages.end(), errors.begin(), errors.end());
  if (!m_Messages.empty()) return false;
  o_rText.clear();
  rapidxml::print(std::back_inserter(o_rText), document, 0);
  return true;
}

std::uint32_t VWriter::WriteText(std::string& o_rText, const VSubjectParametrised& subject,
                                 const VSubjectApplicationData& appData,
                                 const VSubjectDynamicSubspace& subspace, int versionCode) {
  return Build(o_rText, subject, appData, subspace, versionCode) ? ResultOk : ResultFailed;
}

std::uint32_t VWriter::Write(const boost::filesystem::path& fileName,
                             const VSubjectParametrised& subject,
                             const VSubjectApplicationData& appData,
                             const VSubjectDynamicSubspace& subspace, int versionCode) {
  std::string text;
  if (!Build(text, subject, appData, subspace, versionCode)) return ResultFailed;
  // The old file stays as it was unless every byte reaches the disk.
  UtilsFileSystem::VReplacingFile file;
  if (file.Open(fileName).IsFailure()) {
    m_Messages.push_back(ZMT::FormatOrRaw("Error opening file '%1%' for writing: %2%",
                                          fileName.string(), file.Reason()));
    return ResultFailed;
  }
  // A failed write leaves its reason for the commit, which then fails and cleans up.
  file.Write(text.data(), text.size());
  if (file.Commit().IsFailure()) {
    m_Messages.push_back(
        ZMT::FormatOrRaw("Failed to write file '%1%': %2%", fileName.string(), file.Reason()));
    return ResultFailed;
  }
  return ResultOk;
}

std::uint32_t Write(const boost::filesystem::path& fileName,
                    const CoreOstraTypes::VSubjectParametrised& subject,
                    const CoreOstraTypes::VSubjectApplicationData& appData,
                    const CoreOstraTypes::VSubjectDynamicSubspace& subspace,
                    std::vector<std::string>* o_pMessages, int versionCode) {
  VWriter writer;
  const std::uint32_t result = writer.Write(fileName, subject, appData, subspace, versionCode);
  if (o_pMessages) {
    *o_pMessages = writer.Messages();
  } else {
    for (const auto& message : writer.Messages()) {
      ZMT::GlobalLog().Log("KMTIO", ZMT::ELogError, "CoreOstraKMTIO/Writer", __LINE__, "%1%",
                           message);
    }
  }
  return result;
}

} // namespace CoreOstraKMTIO
