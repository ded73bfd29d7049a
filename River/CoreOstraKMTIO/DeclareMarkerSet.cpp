// MarkerSet, Markers, Marker with its MarkerTemplate, Sticks and Stick.

#include "River/CoreOstraKMTIO/Declaration.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypes/NameHash.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::VSubjectApplicationData;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;

namespace {

/// What a marker of a file up to 2.6 says about its implied point target.
struct VImpliedTarget {
  std::optional<std::uint32_t> m_Segment;
  std::array<std::string, 3> m_Position{"0", "0", "0"};
  std::vector<double> m_Covariance;
  std::vector<double> m_TemplateCovariance;
  std::array<double, 3> m_ViewNormal{};
};

void DeclareMarkerTemplate(INode& node, VImpliedTarget& io_rImplied,
                           VSubjectKMTExtras::VItem& io_rExtras) {
  ReadExpressions(node, "POSITION", io_rImplied.m_Position,
                  "The position of this marker in the co-ordinate frame of the parent segment",
                  false);
  ReadNumberList(node, "COVARIANCE", io_rImplied.m_TemplateCovariance, 9,
                 "Covariance of the uncalibrated marker (template)");
  std::string placement;
  if (ReadText(node, "PLACEMENT-COVARIANCE", placement, "DEPRECATED", false, V2_1, V2_6)) {
    io_rExtras.m_Strings["PLACEMENT-COVARIANCE"] = placement;
  }
}

void AddImpliedTarget(VReadContext& context, std::uint32_t marker, VImpliedTarget&& implied) {
  VSubjectParametrised::VTarget target;
  target.m_Type = VTargetTypeBase::ELocalPointToWorldPointGaussian;
  target.m_MarkerIndices = {marker};
  target.m_SegmentIndices = {*implied.m_Segment};
  target.m_StateExpressions.assign(implied.m_Position.begin(), implied.m_Position.end());
  target.m_Covariance = std::move(implied.m_Covariance);
  target.m_TemplateCovariance = std::move(implied.m_TemplateCovariance);
  target.m_ViewNormals = {implied.m_ViewNormal};
  context.m_rSubject.m_Targets.push_back(std::move(target));
  context.m_rAppData.m_Targets.emplace_back();
  context.m_rExtras.m_Targets.emplace_back();
}

void DeclareMarker(INode& node, VReadContext& context) {
  const auto errors = node.ErrorCount();
  auto& subject = context.m_rSubject;
  VSubjectParametrised::VMarker marker;
  marker.m_Radius = 10.0;
  VSubjectApplicationData::VMarker appMarker;
  VSubjectKMTExtras::VItem extras;
  VImpliedTarget implied;

  ReadString(node, "NAME", marker.m_Name, "The name of this marker", XsdId, true);
  marker.m_MarkerId = CoreOstraTypes::NameHash(marker.m_Name);
  if (context.HasMarkerId(marker.m_MarkerId)) {
    node.Error(ZMT::FormatOrRaw("Marker %1% has encountered an ID hash collision", marker.m_Name));
    return;
  }
  std::string segmentName;
  if (ReadString(node, "SEGMENT", segmentName, "The segment to which this marker is attached",
                 XsdIdRef, false, None, V2_6)) {
    implied.m_Segment = context.FindSegment(segmentName);
    if (!implied.m_Segment) {
      node.Error(
          ZMT::FormatOrRaw("Marker %1% is using unknown segment %2%", marker.m_Name, segmentName));
    }
  }
  ReadExpressions(node, "POSITION", implied.m_Position,
                  "The position of this marker in the co-ordinate frame of the segment to which "
                  "it is attached",
                  false, None, V2_6);
  ReadNumberList(node, "COVARIANCE", implied.m_Covariance, 9,
                 "The measurement covariance in the position of this marker", false, None, V2_6);
  ReadDouble(node, "RADIUS", marker.m_Radius, "The radius of this marker", XsdDouble, false);
  ReadColour(node, "RGB", appMarker.m_Colour, "The colour of this marker", XsdString, false);
  std::string descriptor;
  if (ReadText(node, "DESCRIPTOR", descriptor, "DEPRECATED", false, V2_0, V2_5)) {
    extras.m_Strings["DESCRIPTOR"] = descriptor;
  }
  std::uint32_t status = marker.m_Status;
  if (ReadEnum(node, "STATUS", status, StatusEnum(),
               "The status of this marker: whether it is required or optional and whether it has "
               "been detected",
               false, V2_0)) {
    marker.m_Missing = (status & MissingStatusBit) != 0;
    marker.m_Status =
        static_cast<VSubjectParametrised::VMarker::EMarkerStatus>(status & ~MissingStatusBit);
  }
  if (ReadNumbers(node, "VIEW-NORMAL", implied.m_ViewNormal,
                  "If the marker is only seen from certain directions, this is the axis of the "
                  "visibility cone",
                  V2_6, V2_6)) {
    implied.m_ViewNormal = NormaliseDirection(implied.m_ViewNormal);
  }
  ReadDouble(node, "VIEW-ANGLE", marker.m_ViewAngle,
             "The angle in radians that describes the width of the visibility cone", XsdDouble,
             false, V2_6);
  node.Child("MarkerTemplate", "Stores the skeleton TEMPLATE", 0, 1, V2_0, V2_6);
  node.Children(
      [&implied, &extras](INode& child) { DeclareMarkerTemplate(child, implied, extras); });

  if (node.ErrorCount() != errors) return;
  const auto index = static_cast<std::uint32_t>(subject.m_Markers.size());
  subject.m_Markers.push_back(std::move(marker));
  context.m_rAppData.m_Markers.push_back(appMarker);
  context.m_rExtras.m_Markers.push_back(std::move(extras));
  if (implied.m_Segment) AddImpliedTarget(context, index, std::move(implied));
}

void DeclareStick(INode& node, VReadContext& context) {
  const auto errors = node.ErrorCount();
  VSubjectApplicationData::VStick stick;
  std::string names[2];
  ReadString(node, "MARKER1", names[0], "The name of the first marker defining this stick",
             XsdIdRef, true);
  ReadString(node, "MARKER2", names[1], "The name of the second marker defining this stick",
             XsdIdRef, true);
  if (ReadColour(node, "RGB", stick.m_ColourA, "The colour of this stick", XsdString, false, V1_0,
                 V2_6)) {
    stick.m_ColourB = stick.m_ColourA;
  }
  ReadColour(node, "RGB1", stick.m_ColourA, "The colour of the first end of the stick", XsdString,
             false, V3_0);
  ReadColour(node, "RGB2", stick.m_ColourB, "The colour of the second end of the stick", XsdString,
             false, V3_0);
  if (node.ErrorCount() != errors) return;
  std::uint32_t* ends[2] = {&stick.m_MarkerIndexA, &stick.m_MarkerIndexB};
  for (int i = 0; i < 2; ++i) {
    const auto marker = context.FindMarker(names[i]);
    if (!marker) {
      node.Error(ZMT::FormatOrRaw("Sticks is using unknown marker %1%", names[i]));
    } else {
      *ends[i] = *marker;
    }
  }
  if (node.ErrorCount() != errors) return;
  if (stick.m_MarkerIndexA == stick.m_MarkerIndexB) {
    node.Warning(
        ZMT::FormatOrRaw("Skipped Stick using marker %1% for MARKER1 and MARKER2", names[0]));
    return;
  }
  context.m_rAppData.m_Sticks.push_back(stick);
}

} // namespace

void DeclareMarkerSet(INode& node, VReadContext& context) {
  ReadText(node, "NAME", context.m_rSubject.m_MarkerSetName, "The name of this marker set", false,
           V1_0);
  node.Child("Markers", "The section of the marker set containing the markers used", 1, 1);
  node.Children([&context](INode& markers) {
    markers.Child("Marker", "A single marker", 0, -1);
    markers.Children([&context](INode& child) { DeclareMarker(child, context); });
  });
  node.Child("Sticks",
             "The section of the marker set containing sticks drawn between markers for "
             "visualisation purposes",
             0, 1);
  node.Children([&context](INode& sticks) {
    sticks.Child("Stick", "A single stick", 0, -1);
    sticks.Children([&context](INode& child) { DeclareStick(child, context); });
  });
}

} // namespace CoreOstraKMTIO::Detail
