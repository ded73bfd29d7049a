// The writer's MarkerSet, Marker with MarkerTemplate, and Sticks.

#include "River/CoreOstraKMTIO/WriterElements.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::VTargetTypeBase;
using VTarget = CoreOstraTypes::VSubjectParametrised::VTarget;

namespace {

/// The point target that files up to 2.6 fold into a marker: the first Gaussian point target
/// whose only marker is this one and whose only segment exists.
const VTarget* ImpliedTarget(const VWriteContext& context, std::uint32_t marker) {
  const auto& subject = context.m_rSubject;
  for (const auto& target : subject.m_Targets) {
    if (target.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian &&
        target.m_MarkerIndices.size() == 1 && target.m_MarkerIndices[0] == marker &&
        target.m_SegmentIndices.size() == 1 &&
        target.m_SegmentIndices[0] < subject.m_Segments.size()) {
      return &target;
    }
  }
  return nullptr;
}

std::array<std::string, 3> PositionOf(const VTarget& target) {
  std::array<std::string, 3> position;
  for (std::size_t i = 0; i < 3 && i < target.m_StateExpressions.size(); ++i)
    position[i] = target.m_StateExpressions[i];
  return position;
}

void WriteMarker(VWriterNode& node, const VWriteContext& context, std::uint32_t index) {
  const auto& subject = context.m_rSubject;
  const auto& marker = subject.m_Markers[index];
  const auto& extras = context.m_rExtras.m_Markers[index].m_Strings;
  const VTarget* pImplied = ImpliedTarget(context, index);
  WriteText(node, "NAME", marker.m_Name, true);
  if (pImplied) {
    WriteText(node, "SEGMENT", subject.m_Segments[pImplied->m_SegmentIndices[0]].m_Name, false,
              None, V2_6);
    WriteExpressions(node, "POSITION", PositionOf(*pImplied), None, V2_6);
    WriteNumbers(node, "COVARIANCE", pImplied->m_Covariance, None, V2_6);
  }
  WriteDouble(node, "RADIUS", marker.m_Radius);
  WriteColour(node, "RGB", context.m_rAppData.m_Markers[index].m_Colour);
  if (const auto it = extras.find("DESCRIPTOR"); it != extras.end()) {
    WriteText(node, "DESCRIPTOR", it->second, false, V2_0, V2_5);
  }
  const std::uint32_t status = marker.m_Status | (marker.m_Missing ? MissingStatusBit : 0u);
  WriteEnum(node, "STATUS", status, StatusEnum(), V2_0);
  if (pImplied && !pImplied->m_ViewNormals.empty() && !IsZero(pImplied->m_ViewNormals[0])) {
    WriteDoubleList(node, "VIEW-NORMAL", pImplied->m_ViewNormals[0], V2_6, V2_6);
  }
  WriteDouble(node, "VIEW-ANGLE", marker.m_ViewAngle, V2_6);
  if (!pImplied) return;
  node.Child(
      "MarkerTemplate",
      [pImplied, &extras](VWriterNode& child) {
        WriteExpressions(child, "POSITION", PositionOf(*pImplied));
        WriteNumbers(child, "COVARIANCE", pImplied->m_TemplateCovariance);
        if (const auto it = extras.find("PLACEMENT-COVARIANCE"); it != extras.end()) {
          WriteText(child, "PLACEMENT-COVARIANCE", it->second, false, V2_1, V2_6);
        }
      },
      V2_0, V2_6);
}

void WriteStick(VWriterNode& node, const VWriteContext& context,
                const CoreOstraTypes::VSubjectApplicationData::VStick& stick) {
  const auto& markers = context.m_rSubject.m_Markers;
  if (stick.m_MarkerIndexA >= markers.size() || stick.m_MarkerIndexB >= markers.size()) {
    ReportUnstringifiable(node, "MARKER1");
    return;
  }
  WriteText(node, "MARKER1", markers[stick.m_MarkerIndexA].m_Name, true);
  WriteText(node, "MARKER2", markers[stick.m_MarkerIndexB].m_Name, true);
  WriteColour(node, "RGB", stick.m_ColourA, V1_0, V2_6);
  WriteColour(node, "RGB1", stick.m_ColourA, V3_0);
  WriteColour(node, "RGB2", stick.m_ColourB, V3_0);
}

} // namespace

void WriteMarkerSet(VWriterNode& node, const VWriteContext& context) {
  WriteText(node, "NAME", context.m_rSubject.m_MarkerSetName, false, V1_0);
  node.Child("Markers", [&context](VWriterNode& markers) {
    for (std::uint32_t i = 0; i < context.m_rSubject.m_Markers.size(); ++i) {
      markers.Child("Marker",
                    [&context, i](VWriterNode& child) { WriteMarker(child, context, i); });
    }
  });
  const auto& sticks = context.m_rAppData.m_Sticks;
  if (sticks.empty()) return;
  node.Child("Sticks", [&context, &sticks](VWriterNode& element) {
    element.Children("Stick", sticks, [&context](VWriterNode& child, const auto& stick) {
      WriteStick(child, context, stick);
    });
  });
}

} // namespace CoreOstraKMTIO::Detail
