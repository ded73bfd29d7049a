// The writer's TargetSet: targets grouped by element in the order of the declaration.

#include "River/CoreOstraKMTIO/WriterElements.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::VTargetTypeBase;
using VTarget = CoreOstraTypes::VSubjectParametrised::VTarget;

namespace {

/// Elements in the order the language declares them, with the first version of each.
struct VTargetGroup {
  const char* m_pName;
  IVersion m_Lower;
};
const VTargetGroup TargetGroups[] = {
    {"TargetLocalLineToWorldPoint", None},        {"TargetLocalPlaneToWorldPoint", None},
    {"TargetLocalPointToWorldPoint", None},       {"TargetRigidBody", None},
    {"TargetLocalRotationToWorldRotation", None}, {"TargetLocalDirectionToWorldDirection", V3_5},
};

bool IsGaussian(VTargetType type) {
  return type == VTargetTypeBase::ELocalPointToWorldPointGaussian ||
         type == VTargetTypeBase::ELocalLineToWorldPointGaussian ||
         type == VTargetTypeBase::ELocalPlaneToWorldPointGaussian;
}

/// Three state expressions from `offset`; fewer available leaves the rest empty.
std::array<std::string, 3> StateAt(const VTarget& target, std::size_t offset) {
  std::array<std::string, 3> values;
  for (std::size_t i = 0; i < 3 && offset + i < target.m_StateExpressions.size(); ++i)
    values[i] = target.m_StateExpressions[offset + i];
  return values;
}

std::span<const double> CovarianceBlock(const VTarget& target, std::size_t offset,
                                        std::size_t size) {
  if (offset + size > target.m_Covariance.size()) return {};
  return {target.m_Covariance.data() + offset, size};
}

const std::string& NameAt(const std::vector<std::string>& names,
                          const std::vector<std::uint32_t>& indices) {
  static const std::string none;
  return !indices.empty() && indices[0] < names.size() ? names[indices[0]] : none;
}

void WriteRotationAxes(VWriterNode& node, const VTarget& target, const std::string& name) {
  const auto& orientation = target.m_RotationTargetOrientation;
  switch (target.m_RotationCalibrationBehaviour) {
  case VTargetTypeBase::EHingeLike:
    if (orientation.size() != 3) {
      node.Error(ZMT::FormatOrRaw("Target '%s' requires a target orientation", name));
      return;
    }
    WriteDoubleList(node, "AXIS", orientation, V3_5);
    return;
  case VTargetTypeBase::EHardySpicerLike: {
    if (orientation.size() != 3) {
      node.Error(ZMT::FormatOrRaw("Target '%s' requires a target orientation", name));
      return;
    }
    const auto pair = CoreOstraTypesUtils::AxisPairFromJointOrientation(
        {orientation[0], orientation[1], orientation[2]});
    WriteDoubleList(node, "AXIS-PAIR", pair, V3_5);
    return;
  }
  case VTargetTypeBase::EOther:
    if (!orientation.empty()) {
      node.Error(ZMT::FormatOrRaw("Target '%s' should not have a target orientation", name));
    }
    return;
  default:
    node.Error(ZMT::FormatOrRaw("Target '%s' has invalid calibration behaviour type", name));
  }
}

void WriteTarget(VWriterNode& node, const VWriteContext& context, std::size_t index,
                 const std::vector<std::string>& markerNames,
                 const std::vector<std::string>& segmentNames,
                 const std::vector<std::string>& observationNames) {
  const auto& target = context.m_rSubject.m_Targets[index];
  const auto& appTarget = context.m_rAppData.m_Targets[index];
  const VTargetType type = target.m_Type;
  const std::string element = node.Name();
  const bool point = element == "TargetLocalPointToWorldPoint";
  const bool line = element == "TargetLocalLineToWorldPoint";
  const bool plane = element == "TargetLocalPlaneToWorldPoint";
  const bool marked = point || line || plane;
  const bool rigidBody = type == VTargetTypeBase::ERigidBody;
  const bool rotation = type == VTargetTypeBase::ELocalRotationToWorldRotation;
  const bool direction = type == VTargetTypeBase::ELocalDirectionToWorldDirection;

  if (marked) WriteNumbers(node, "COVARIANCE", target.m_Covariance);
  if (point) WriteNumbers(node, "PLACEMENT-COVARIANCE", target.m_PlacementCovariance, V3_3);
  if (line) WriteExpressions(node, "DIRECTION", StateAt(target, 3));
  if (marked) {
    WriteBool(node, "FILL-GAPS", appTarget.m_FillGaps);
    WriteBool(node, "GAUSSIAN", IsGaussian(type));
  }
  WriteBool(node, "HIDDEN", !appTarget.m_Visible);
  WriteText(node, "NAME", appTarget.m_Name, false);
  if (plane) WriteExpressions(node, "NORMAL", StateAt(target, 3));
  if (marked) WriteText(node, "MARKER", NameAt(markerNames, target.m_MarkerIndices), true);
  WriteDouble(node, "OPACITY", appTarget.m_Colour[3]);
  if (line || plane) WriteExpressions(node, "ORIGIN", StateAt(target, 0));
  if (point) WriteExpressions(node, "POSITION", StateAt(target, 0));
  if (rigidBody) {
    WriteExpressions(node, "POSITION", StateAt(target, 3));
    WriteExpressions(node, "ORIENTATION", StateAt(target, 0), V3_1);
    WriteNumbers(node, "COVARIANCE", CovarianceBlock(target, 0, 36), V3_1);
  }
  if (point || rotation) WriteDouble(node, "CALIBRATION-WEIGHT", target.m_CalibrationWeight, V3_5);
  if (rotation) {
    WriteExpressions(node, "ROTATION", StateAt(target, 0), V3_4);
    WriteDouble(node, "WEIGHT", target.m_Weight, V3_4);
    WriteText(node, "ROTATION-OBSERVATION",
              NameAt(observationNames, target.m_RotationObservationIndices), true, V3_4);
    WriteRotationAxes(node, target, appTarget.m_Name);
  }
  if (direction) {
    WriteExpressions(node, "DIRECTION", StateAt(target, 0), V3_5);
    WriteDouble(node, "WEIGHT", target.m_Weight, V3_5);
    WriteText(node, "DIRECTION-OBSERVATION",
              NameAt(observationNames, target.m_RotationObservationIndices), true, V3_5);
  }
  WriteColour(node, "RGB", appTarget.m_Colour);
  WriteText(node, "SEGMENT", NameAt(segmentNames, target.m_SegmentIndices), true);
  if (marked) {
    WriteDouble(node, "WEIGHT", target.m_Weight);
    if (!target.m_ViewNormals.empty() && !IsZero(target.m_ViewNormals[0])) {
      WriteDoubleList(node, "VIEW-NORMAL", target.m_ViewNormals[0]);
    }
  }
  if (marked || rigidBody) {
    WriteEnum(node, "DRAW-STYLE", appTarget.m_DrawStyle, TargetDrawStyleEnum());
  }

  if (marked) {
    node.Child(element + "Template", [&target](VWriterNode& child) {
      WriteNumbers(child, "COVARIANCE", target.m_TemplateCovariance);
    });
    return;
  }
  for (std::size_t i = 0; rigidBody && i < target.m_MarkerIndices.size(); ++i) {
    node.Child("RigidBodyMarker", [&, i](VWriterNode& child) {
      WriteText(child, "NAME", NameAt(markerNames, {target.m_MarkerIndices[i]}), true);
      WriteExpressions(child, "POSITION", StateAt(target, 3 * (i + 2)));
      WriteNumbers(child, "COVARIANCE", CovarianceBlock(target, 36 + 9 * i, 9));
      if (i < target.m_ViewNormals.size() && !IsZero(target.m_ViewNormals[i])) {
        WriteDoubleList(child, "VIEW-NORMAL", target.m_ViewNormals[i]);
      }
    });
  }
}

template <class T, class F> std::vector<std::string> Names(const std::vector<T>& items, F name) {
  std::vector<std::string> names;
  names.reserve(items.size());
  for (const auto& item : items)
    names.push_back(name(item));
  return names;
}

} // namespace

void WriteTargetSet(VWriterNode& node, const VWriteContext& context) {
  const auto& subject = context.m_rSubject;
  const auto markerNames = Names(subject.m_Markers, [](const auto& m) { return m.m_Name; });
  const auto segmentNames = Names(subject.m_Segments, [](const auto& s) { return s.m_Name; });
  const auto observationNames = Names(subject.m_Rotations, [](const auto& r) { return r.m_Name; });
  node.Child("Targets", [&](VWriterNode& targets) {
    for (const auto& group : TargetGroups) {
      for (std::size_t i = 0; i < subject.m_Targets.size(); ++i) {
        const std::string element = TargetElementName(subject.m_Targets[i].m_Type);
        if (element != group.m_pName) continue;
        targets.Child(
            element,
            [&, i](VWriterNode& child) {
              WriteTarget(child, context, i, markerNames, segmentNames, observationNames);
            },
            group.m_Lower);
      }
    }
    for (const auto& target : subject.m_Targets) {
      if (TargetElementName(target.m_Type).empty()) ReportUnstringifiable(targets, "Type");
    }
  });
}

} // namespace CoreOstraKMTIO::Detail
