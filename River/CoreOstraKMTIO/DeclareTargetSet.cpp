// TargetSet, Targets, the six target elements, their templates and RigidBodyMarker.

#include "River/CoreOstraKMTIO/Declaration.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypes/NameHash.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"

#include <cmath>

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;
using VTarget = VSubjectParametrised::VTarget;

namespace {

enum class EKind { ELine, EPlane, EPoint, ERigidBody, ERotation, EDirection };

struct VTargetElement {
  const char* m_pName;
  EKind m_Kind;
  const char* m_pDocumentation;
  IVersion m_Lower;
  const char* m_pTemplateName; ///< its template child, for the kinds that have one
};

const VTargetElement TargetElements[] = {
    {"TargetLocalLineToWorldPoint", EKind::ELine, "A target mapping a local line to a world point",
     None, "TargetLocalLineToWorldPointTemplate"},
    {"TargetLocalPlaneToWorldPoint", EKind::EPlane,
     "A target mapping a local plane to a world point", None,
     "TargetLocalPlaneToWorldPointTemplate"},
    {"TargetLocalPointToWorldPoint", EKind::EPoint, "A simple marker attached to a parent segment",
     None, "TargetLocalPointToWorldPointTemplate"},
    {"TargetRigidBody", EKind::ERigidBody,
     "Defines a rigid cluster of markers attached to a segment", None, nullptr},
    {"TargetLocalRotationToWorldRotation", EKind::ERotation,
     "Align a segment with a world orientation", None, nullptr},
    {"TargetLocalDirectionToWorldDirection", EKind::EDirection,
     "Align a segment to a direction constraint", V3_5, nullptr},
};

VTargetType PlainType(EKind kind, bool gaussian) {
  switch (kind) {
  case EKind::ELine:
    return gaussian ? VTargetTypeBase::ELocalLineToWorldPointGaussian
                    : VTargetTypeBase::ELocalLineToWorldPoint;
  case EKind::EPlane:
    return gaussian ? VTargetTypeBase::ELocalPlaneToWorldPointGaussian
                    : VTargetTypeBase::ELocalPlaneToWorldPoint;
  case EKind::EPoint:
    return gaussian ? VTargetTypeBase::ELocalPointToWorldPointGaussian
                    : VTargetTypeBase::ELocalPointToWorldPoint;
  case EKind::ERigidBody:
    return VTargetTypeBase::ERigidBody;
  case EKind::ERotation:
    return VTargetTypeBase::ELocalRotationToWorldRotation;
  case EKind::EDirection:
    return VTargetTypeBase::ELocalDirectionToWorldDirection;
  }
  return VTargetTypeBase::EBadTargetType;
}

const char* CovarianceDocumentation(EKind kind) {
  switch (kind) {
  case EKind::ELine:
    return "Covariance of the line origin and direction";
  case EKind::EPlane:
    return "Covariance of the plane origin and covariance";
  default:
    return "Measurement covariance in the position of the target";
  }
}

const char* TemplateDocumentation(EKind kind) {
  switch (kind) {
  case EKind::ELine:
    return "Template covariance of the line origin and direction";
  case EKind::EPlane:
    return "Template covariance of the plane origin and covariance";
  default:
    return "Template measurement covariance in the position of the target";
  }
}

double Length(const double* v) {
  return std::sqrt(v[0] * v[0] + v[1] * v[1] + v[2] * v[2]);
}

void DeclareRigidBodyMarker(INode& node, VReadContext& context, VTarget& io_rTarget) {
  const auto errors = node.ErrorCount();
  std::string name;
  std::array<std::string, 3> position{"0", "0", "0"};
  std::vector<double> covariance{1, 0, 0, 0, 1, 0, 0, 0, 1};
  std::array<double, 3> viewNormal{};
  ReadString(node, "NAME", name, "The name of this marker", XsdIdRef, true);
  ReadExpressions(node, "POSITION", position, "The position of the marker within the rigid body",
                  true);
  ReadNumberList(node, "COVARIANCE", covariance, 9,
                 "The covariances of the position of the marker within the rigid body");
  if (ReadNumbers(node, "VIEW-NORMAL", viewNormal,
                  "Direction the marker is facing in the co-ordinate system of the segment")) {
    viewNormal = NormaliseDirection(viewNormal);
  }
  if (node.ErrorCount() != errors) return;
  const auto marker = context.FindMarker(name);
  if (!marker) {
    node.Error(ZMT::FormatOrRaw("RigidBodyMarker refers to unknown marker %1%", name));
    return;
  }
  io_rTarget.m_MarkerIndices.push_back(*marker);
  io_rTarget.m_StateExpressions.insert(io_rTarget.m_StateExpressions.end(), position.begin(),
                                       position.end());
  io_rTarget.m_Covariance.insert(io_rTarget.m_Covariance.end(), covariance.begin(),
                                 covariance.end());
  io_rTarget.m_ViewNormals.push_back(viewNormal);
}

/// Names the target's rotation observation, creating it on first use.
void AddObservation(INode& node, VReadContext& context, VTarget& io_rTarget,
                    const std::string& targetName, const std::string& name) {
  if (!io_rTarget.m_RotationObservationIndices.empty()) {
    node.Warning(ZMT::FormatOrRaw("Target %1% has multiple Rotation Observations", targetName));
    return;
  }
  auto& rotations = context.m_rSubject.m_Rotations;
  std::size_t index = 0;
  while (index < rotations.size() && rotations[index].m_Name != name)
    ++index;
  if (index == rotations.size()) {
    const std::uint32_t id = CoreOstraTypes::NameHash(name);
    for (const auto& other : rotations) {
      if (other.m_RotationId == id) {
        node.Error(ZMT::FormatOrRaw("Rotation observation %1% has encountered an ID hash collision",
                                    name));
        return;
      }
    }
    rotations.push_back({name, id});
  }
  io_rTarget.m_RotationObservationIndices.push_back(static_cast<std::uint32_t>(index));
}

/// AXIS or AXIS-PAIR of a rotation target: its calibration behaviour and orientation.
void ReadRotationAxes(INode& node, VTarget& io_rTarget, const std::string& targetName) {
  std::vector<double> axis, pair;
  const bool hasAxis = ReadNumberList(
      node, "AXIS", axis, 3, "The axis of a target constrained on two axis- behaving like a hinge",
      false, V3_5);
  const bool hasPair = ReadNumberList(
      node, "AXIS-PAIR", pair, 6,
      "The pair of axes of a target constrained on a single axis- behaving like a Hardy Spicer",
      false, V3_5);
  if (!hasAxis && !hasPair) {
    io_rTarget.m_RotationCalibrationBehaviour = VTargetTypeBase::EOther;
    return;
  }
  if (hasAxis && hasPair) {
    node.Error(
        ZMT::FormatOrRaw(" Target '%s' AXIS and AXIS-PAIR are mutually exclusive", targetName));
    return;
  }
  if ((hasAxis && Length(axis.data()) < CoreOstraTypesUtils::MinimumAxisLength) ||
      (hasPair && (Length(pair.data()) < CoreOstraTypesUtils::MinimumAxisLength ||
                   Length(pair.data() + 3) < CoreOstraTypesUtils::MinimumAxisLength))) {
    node.Error(
        ZMT::FormatOrRaw(" Target '%s' AXIS or AXIS-PAIR has a 0-magnitude vector", targetName));
    return;
  }
  if (hasAxis) {
    io_rTarget.m_RotationCalibrationBehaviour = VTargetTypeBase::EHingeLike;
    io_rTarget.m_RotationTargetOrientation = axis;
    return;
  }
  const double dot = pair[0] * pair[3] + pair[1] * pair[4] + pair[2] * pair[5];
  if (!(std::abs(dot) <= 0.001)) {
    node.Error(ZMT::FormatOrRaw(" Target '%s'AXIS-PAIR has non-orthogonal axes", targetName));
    return;
  }
  CoreOstraTypesUtils::AxisPair axes;
  std::copy(pair.begin(), pair.end(), axes.begin());
  CoreOstraTypesUtils::Vector3 orientation{};
  if (!CoreOstraTypesUtils::JointOrientationFromAxisPair(axes, orientation)) {
    node.Error(ZMT::FormatOrRaw(" Target '%s' has undefined calibration behaviour", targetName));
    return;
  }
  io_rTarget.m_RotationCalibrationBehaviour = VTargetTypeBase::EHardySpicerLike;
  io_rTarget.m_RotationTargetOrientation.assign(orientation.begin(), orientation.end());
}

void DeclareTarget(INode& node, VReadContext& context, const VTargetElement& element) {
  const auto errors = node.ErrorCount();
  const EKind kind = element.m_Kind;
  const bool marked = kind == EKind::EPoint || kind == EKind::ELine || kind == EKind::EPlane;
  VTarget target;
  target.m_Type = PlainType(kind, false);
  target.m_StateExpressions.assign(TargetStateSize(target.m_Type), "0");
  VTargetAppData appTarget;
  VSubjectKMTExtras::VItem extras;
  std::string markerName, segmentName, observation;
  bool hasCovariance = false, hasGaussian = false, gaussian = false;
  bool hasMarker = false, hasObservation = false;
  std::array<double, 3> viewNormal{};

  if (marked) {
    hasCovariance = ReadNumberList(node, "COVARIANCE", target.m_Covariance, AnyCount,
                                   CovarianceDocumentation(kind));
  }
  if (kind == EKind::EPoint) {
    ReadNumberList(node, "PLACEMENT-COVARIANCE", target.m_PlacementCovariance, AnyCount,
                   "Marker placement covariance", false, V3_3);
  }
  if (kind == EKind::ELine) {
    ReadExpressionList(node, "DIRECTION", target.m_StateExpressions, 3, 3, "Direction of the line",
                       XsdString, true);
  }
  if (marked) {
    ReadBool(node, "FILL-GAPS", appTarget.m_FillGaps, "Whether gaps in the marker data are filled",
             XsdString, false);
    hasGaussian =
        ReadBool(node, "GAUSSIAN", gaussian, "Whether this is a Gaussian target", XsdString, false);
  }
  ReadHidden(node, appTarget.m_Visible,
             "Specifies whether the target should be visible to the user or hidden", true);
  ReadText(node, "NAME", appTarget.m_Name, "The name of this target");
  if (kind == EKind::EPlane) {
    ReadExpressionList(node, "NORMAL", target.m_StateExpressions, 3, 3, "Normal to the plane",
                       XsdString, false);
  }
  if (marked) {
    hasMarker = ReadString(node, "MARKER", markerName, "The marker associated with this target",
                           XsdIdRef, true);
  }
  const std::uint8_t opacity = ReadOpacity(node, "How transparent the target should be when drawn");
  if (kind == EKind::ELine || kind == EKind::EPlane) {
    ReadExpressionList(node, "ORIGIN", target.m_StateExpressions, 3, 0,
                       kind == EKind::ELine ? "Origin of the line" : "Origin of the plane",
                       XsdString, true);
  }
  if (kind == EKind::EPoint) {
    ReadExpressionList(node, "POSITION", target.m_StateExpressions, 3, 0,
                       "Position of the point in the co-ordinate system of the segment", XsdString,
                       true);
  }
  if (kind == EKind::ERigidBody) {
    ReadExpressionList(node, "POSITION", target.m_StateExpressions, 3, 3,
                       "The position of the rigid body  in the co-ordinate frame of the (fake) "
                       "segment to which it is attached",
                       XsdString, true);
    ReadExpressionList(node, "ORIENTATION", target.m_StateExpressions, 3, 0,
                       "The orientation of  the rigid body  in the co-ordinate frame of the (fake) "
                       "segment to which it is attached",
                       XsdString, false, V3_1);
    if (!ReadNumberList(node, "COVARIANCE", target.m_Covariance, 36, "", false, V3_1)) {
      target.m_Covariance.assign(36, 0.0);
    }
  }
  if (kind == EKind::EPoint || kind == EKind::ERotation) {
    ReadDouble(node, "CALIBRATION-WEIGHT", target.m_CalibrationWeight,
               "Non-negative weight for subject scale estimation", XsdDouble, false, V3_5);
  }
  if (kind == EKind::ERotation) {
    ReadExpressionList(node, "ROTATION", target.m_StateExpressions, 3, 0,
                       "The rotation offset of the target observation", XsdString, false, V3_4);
    ReadDouble(node, "WEIGHT", target.m_Weight,
               "The amount of influence the target should have in the solution", XsdDouble, true,
               V3_4);
    hasObservation = ReadText(node, "ROTATION-OBSERVATION", observation,
                              "The observation associated with this target", true, V3_4);
    ReadRotationAxes(node, target, appTarget.m_Name);
  }
  if (kind == EKind::EDirection) {
    ReadExpressionList(node, "DIRECTION", target.m_StateExpressions, 3, 0,
                       "The direction offset of the target observation", XsdString, false, V3_5);
    ReadDouble(node, "WEIGHT", target.m_Weight,
               "The amount of influence the target should have in the solution", XsdDouble, true,
               V3_5);
    hasObservation = ReadText(node, "DIRECTION-OBSERVATION", observation,
                              "The observation associated with this target", true, V3_5);
  }
  ReadColour(node, "RGB", appTarget.m_Colour, "The colour of this target", XsdString, false);
  appTarget.m_Colour[3] = opacity;
  const bool hasSegment = ReadString(node, "SEGMENT", segmentName,
                                     "The segment to which the target is attached", XsdIdRef, true);
  if (marked) {
    ReadDouble(node, "WEIGHT", target.m_Weight,
               "The amount of influence the target should have in the solution", XsdDouble, true);
    if (ReadNumbers(node, "VIEW-NORMAL", viewNormal,
                    "Direction the target is facing in the co-ordinate system of the segment")) {
      viewNormal = NormaliseDirection(viewNormal);
    }
  }
  if (marked || kind == EKind::ERigidBody) {
    ReadEnum(node, "DRAW-STYLE", appTarget.m_DrawStyle, TargetDrawStyleEnum(),
             "How the target should be drawn", false);
  }

  if (marked) {
    node.Child(element.m_pTemplateName, "Stores the skeleton template", 1, 1);
    node.Children([&target, kind](INode& child) {
      ReadNumberList(child, "COVARIANCE", target.m_TemplateCovariance, AnyCount,
                     TemplateDocumentation(kind));
    });
  } else {
    node.Child("RigidBodyMarker", "Defines a marker part of a rigid body target.", 0, -1);
    node.Children(
        [&context, &target](INode& child) { DeclareRigidBodyMarker(child, context, target); });
  }

  if (marked) {
    if (hasMarker) {
      if (const auto marker = context.FindMarker(markerName)) {
        target.m_MarkerIndices = {*marker};
        target.m_ViewNormals = {viewNormal};
      } else {
        node.Error(ZMT::FormatOrRaw("Target is using unknown marker %1%", markerName));
      }
    }
    gaussian = hasGaussian ? gaussian : hasCovariance;
    if (gaussian && !hasCovariance) node.Error("Gaussian target did not supply a COVARIANCE");
    target.m_Type = PlainType(kind, gaussian);
  }
  if (hasSegment) {
    if (const auto segment = context.FindSegment(segmentName)) {
      target.m_SegmentIndices = {*segment};
    } else {
      node.Error(ZMT::FormatOrRaw("Target is using unknown segment %1%", segmentName));
    }
  }
  if (hasObservation && node.ErrorCount() == errors) {
    AddObservation(node, context, target, appTarget.m_Name, observation);
  }
  if (node.ErrorCount() != errors) return;
  context.m_rSubject.m_Targets.push_back(std::move(target));
  context.m_rAppData.m_Targets.push_back(std::move(appTarget));
  context.m_rExtras.m_Targets.push_back(std::move(extras));
}

} // namespace

void DeclareTargetSet(INode& node, VReadContext& context) {
  node.Child("Targets", "The section of the target set containing the targets", 1, 1);
  node.Children([&context](INode& targets) {
    for (const auto& element : TargetElements) {
      targets.Child(element.m_pName, element.m_pDocumentation, 0, -1, element.m_Lower);
      targets.Children(
          [&context, &element](INode& child) { DeclareTarget(child, context, element); });
    }
  });
}

} // namespace CoreOstraKMTIO::Detail
