// The writer's Skeleton, Segment, joint elements and JointTemplate.

#include "River/CoreOstraKMTIO/WriterElements.h"

#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VJointTypeBase;

namespace {

void WriteRetired(VWriterNode& node, const std::map<std::string, std::string>& kept,
                  const std::string& name) {
  const auto it = kept.find(name);
  if (it != kept.end()) WriteText(node, name, it->second, false);
}

void WriteJointTemplate(VWriterNode& node, const VWriteContext& context, std::size_t index) {
  const auto& segment = context.m_rSubject.m_Segments[index];
  const auto& extras = context.m_rExtras.m_Segments[index];
  const auto& joint = segment.m_Joint;
  WriteNumbers(node, "MEAN", joint.m_TemplateMean);
  WriteNumbers(node, "COVARIANCE", joint.m_TemplateCovariance);
  WriteNumbers(node, "TPOSE-MEAN", joint.m_TPoseMean, V2_1);
  WriteNumbers(node, "TPOSE-COVARIANCE", joint.m_TPoseCovariance, V2_1);
  WriteNumbers(node, "BIND-POSE", joint.m_BindPose, V3_5);
  WriteExpressions(node, "PRE-ORIENTATION", segment.m_PreRotation);
  WriteExpressions(node, "PRE-POSITION", segment.m_PreTranslation);
  WriteDoubleList(node, "INVERSE-POST-ORIENTATION", segment.m_InversePostRotation, V3_2);
  WriteDoubleList(node, "INVERSE-POST-POSITION", segment.m_InversePostTranslation, V3_2);
  WriteExpressions(node, "POST-ORIENTATION", extras.m_PostRotation, V2_0, V3_1);
  WriteExpressions(node, "POST-POSITION", extras.m_PostTranslation, V2_0, V3_1);
  WriteNumbers(node, "RANGE-CENTRING-STATE", joint.m_TemplateRangeCentringState, V3_0);
  WriteNumbers(node, "RANGE-MATRIX", joint.m_TemplateRangeMatrix, V3_0);
}

void WriteJoint(VWriterNode& node, const VWriteContext& context, std::size_t index,
                std::span<const double> tpose) {
  const auto& segment = context.m_rSubject.m_Segments[index];
  const auto& extras = context.m_rExtras.m_Segments[index];
  const auto& appJoint = context.m_rAppData.m_Segments[index].m_Joint;
  const auto& joint = segment.m_Joint;
  WriteText(node, "NAME", joint.m_Name, true);
  WriteDoubleList(node, "PRE-ORIENTATION", extras.m_PreRotation, V2_0);
  WriteDoubleList(node, "PRE-POSITION", extras.m_PreTranslation, V2_0);
  WriteExpressions(node, "POST-ORIENTATION", extras.m_PostRotation, V2_0, V3_1);
  WriteExpressions(node, "POST-POSITION", extras.m_PostTranslation, V2_0, V3_1);
  WriteDoubleList(node, "INVERSE-POST-ORIENTATION", segment.m_InversePostRotation, V3_2);
  WriteDoubleList(node, "INVERSE-POST-POSITION", segment.m_InversePostTranslation, V3_2);
  WriteRetired(node, extras.m_JointStrings, "EDIT_POSE_MEAN");
  WriteRetired(node, extras.m_JointStrings, "T-POSE");
  WriteRetired(node, extras.m_JointStrings, "BOUNDS");
  WriteNumbers(node, "MEAN", joint.m_Mean);
  WriteNumbers(node, "COVARIANCE", joint.m_Covariance);
  if (!tpose.empty()) WriteOptionalDoubleList(node, "T", tpose);
  WriteText(node, "SIGNS", appJoint.m_Signs, false);
  WriteText(node, "LABELS", appJoint.m_Labels, false);
  WriteNumbers(node, "RANGE-CENTRING-STATE", joint.m_RangeCentringState, V3_0);
  WriteNumbers(node, "RANGE-MATRIX", joint.m_RangeMatrix, V3_0);
  node.Child(
      "JointTemplate",
      [&context, index](VWriterNode& child) { WriteJointTemplate(child, context, index); }, V2_0);
  switch (joint.m_JointType) {
  case VJointTypeBase::EHardySpicer:
    WriteNumbers(node, "AXIS-PAIR", extras.m_Axes);
    break;
  case VJointTypeBase::EHinge:
  case VJointTypeBase::ESlider:
    WriteNumbers(node, "AXIS", extras.m_Axes);
    break;
  case VJointTypeBase::EFree:
  case VJointTypeBase::EBall:
    WriteEnum(node, "EULER-ORDER", appJoint.m_EulerOrder, EulerOrderEnum());
    break;
  default:
    break;
  }
}

void WriteSegment(VWriterNode& node, const VWriteContext& context, std::size_t index,
                  const std::vector<std::uint32_t>& offsets) {
  const auto& subject = context.m_rSubject;
  const auto& segment = subject.m_Segments[index];
  const auto& appSegment = context.m_rAppData.m_Segments[index];
  const auto& extras = context.m_rExtras.m_Segments[index];
  WriteText(node, "NAME", segment.m_Name, true);
  WriteExpressions(node, "POSITION", segment.m_PreTranslation, V1_0, V1_0);
  WriteDouble(node, "OPACITY", appSegment.m_Colour[3], V3_0);
  WriteExpressions(node, "ORIENTATION", segment.m_PreRotation, V1_0, V1_0);
  WriteExpressions(node, "BOUNDS", segment.m_Bounds);
  WriteText(node, "MASS", segment.m_MassExpression, false, V2_0);
  WriteExpressions(node, "MASS-CENTRE", segment.m_MassCentreExpressions, V2_0);
  WriteExpressions(node, "INERTIA", segment.m_RadiusOfGyrationExpressions, V2_0);
  WriteColour(node, "RGB", appSegment.m_Colour);
  WriteText(node, "CONTEXT", appSegment.m_Context, false, V2_0);
  WriteBool(node, "HIDDEN", !appSegment.m_Visible, V3_0);
  WriteDouble(node, "DRAW-END-RATIO", appSegment.m_DrawEndRatio, V3_0);
  WriteDouble(node, "DRAW-HEIGHT", appSegment.m_DrawHeight, V3_0);
  WriteDouble(node, "DRAW-TWIST", appSegment.m_DrawTwist, V3_0);
  WriteDouble(node, "DRAW-WIDTH", appSegment.m_DrawWidth, V3_0);
  WriteText(node, "PART", appSegment.m_Part, false, V3_0);
  WriteRetired(node, extras.m_SegmentStrings, "COVARIANCE");
  WriteRetired(node, extras.m_SegmentStrings, "SIZE");
  WriteEnum(node, "DRAW-STYLE", appSegment.m_DrawStyle, DrawStyleEnum(), V3_0);
  WriteEnum(node, "DRAW-SHADING", appSegment.m_DrawShading, DrawShadingEnum(), V3_0);

  for (std::size_t child = index + 1; child < subject.m_Segments.size(); ++child) {
    const auto& parent = subject.m_Segments[child].m_ParentSegmentIndex;
    if (parent.IsSet() && parent.Value() == index) {
      node.Child("Segment", [&context, child, &offsets](VWriterNode& element) {
        WriteSegment(element, context, child, offsets);
      });
    }
  }

  std::vector<double> tpose;
  const auto& constraints = context.m_rSubject.m_TPoseConstraints;
  if (offsets[index + 1] <= constraints.size()) {
    for (std::uint32_t k = offsets[index]; k < offsets[index + 1]; ++k)
      tpose.push_back(constraints[k].Raw());
  }
  const std::string element = JointElementName(segment.m_Joint.m_JointType);
  if (element.empty()) {
    ReportUnstringifiable(node, "JointType");
    return;
  }
  node.Child(element, [&context, index, &tpose](VWriterNode& child) {
    WriteJoint(child, context, index, tpose);
  });
}

} // namespace

void WriteSkeleton(VWriterNode& node, const VWriteContext& context) {
  WriteText(node, "NAME", context.m_rExtras.m_SkeletonName, false);
  WriteColour(node, "RGB", context.m_rAppData.m_Colour);
  const auto offsets = CoreOstraTypesUtils::JointParameterOffsets(context.m_rSubject);
  const auto& segments = context.m_rSubject.m_Segments;
  for (std::size_t i = 0; i < segments.size(); ++i) {
    const auto& parent = segments[i].m_ParentSegmentIndex;
    if (parent.IsSet() && parent.Value() < i) continue;
    node.Child("Segment", [&context, i, &offsets](VWriterNode& child) {
      WriteSegment(child, context, i, offsets);
    });
  }
}

} // namespace CoreOstraKMTIO::Detail
