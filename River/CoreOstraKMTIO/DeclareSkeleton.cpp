// Skeleton, Segment, the six joint elements and JointTemplate.

#include "River/CoreOstraKMTIO/Declaration.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VJointTypeBase;
using VSegment = CoreOstraTypes::VSubjectParametrised::VSegment;

namespace {

struct VJointElement {
  const char* m_pName;
  VJointType m_Type;
  const char* m_pDocumentation;
};

const VJointElement JointElements[] = {
    {"JointBall", VJointTypeBase::EBall,
     "A ball and socket joint with 3 rotational degrees of freedom only"},
    {"JointDummy", VJointTypeBase::EDummy, "A Dummy joint, i.e. one with no degrees of freedom"},
    {"JointFree", VJointTypeBase::EFree, "A free joint with 6 degrees of freedom"},
    {"JointHardySpicer", VJointTypeBase::EHardySpicer,
     "A Hardy Spicer joint (one that has two intersecting axes of rotation)"},
    {"JointHinge", VJointTypeBase::EHinge, "A hinge joint"},
    {"JointSlider", VJointTypeBase::ESlider, "A slider (or prismatic) joint"},
};

VJointType JointTypeOfElement(const std::string& name) {
  for (const auto& element : JointElements)
    if (name == element.m_pName) return element.m_Type;
  return VJointTypeBase::EDummy;
}

std::array<std::string, 3> AsExpressions(const std::array<double, 3>& values) {
  return {CoreOstraTypesUtils::FormatExpressionNumber(values[0]),
          CoreOstraTypesUtils::FormatExpressionNumber(values[1]),
          CoreOstraTypesUtils::FormatExpressionNumber(values[2])};
}

/// POST-ORIENTATION and POST-POSITION of files before 3.2; the two elements differ only in the
/// documentation of the orientation.
void ReadPost(INode& node, VSubjectKMTExtras::VSegment& io_rExtras,
              const std::string& orientationDocumentation) {
  if (ReadExpressions(node, "POST-ORIENTATION", io_rExtras.m_PostRotation, orientationDocumentation,
                      false, V2_0, V3_1)) {
    io_rExtras.m_HasPost = true;
  }
  if (ReadExpressions(node, "POST-POSITION", io_rExtras.m_PostTranslation,
                      "The position of the child segment in the co-ordinate frame of this joint",
                      false, V2_0, V3_1)) {
    io_rExtras.m_HasPost = true;
  }
}

void ReadRetired(INode& node, const std::string& name,
                 std::map<std::string, std::string>& o_rKept) {
  std::string text;
  if (ReadText(node, name, text, "DEPRECATED")) o_rKept[name] = text;
}

void DeclareJointTemplate(INode& node, VReadContext& context, std::uint32_t index) {
  auto& segment = context.m_rSubject.m_Segments[index];
  auto& extras = context.m_rExtras.m_Segments[index];
  auto& joint = segment.m_Joint;
  const std::size_t n = JointParameterCount(joint.m_JointType);
  ReadNumberList(node, "MEAN", joint.m_TemplateMean, n,
                 "Mean joint state in the uncalibrated subject (template)");
  ReadNumberList(node, "COVARIANCE", joint.m_TemplateCovariance, n * n,
                 "Covariance of the joint state in the uncalibrated subject (template)");
  ReadNumberList(node, "TPOSE-MEAN", joint.m_TPoseMean, n,
                 "Mean joint state in the T-pose subject (template)", false, V2_1);
  ReadNumberList(node, "TPOSE-COVARIANCE", joint.m_TPoseCovariance, n * n,
                 "Covariance of the joint state in the T-pose subject (template)", false, V2_1);
  ReadNumberList(node, "BIND-POSE", joint.m_BindPose, n, "Bind pose for retargeting", false, V3_5);
  ReadExpressions(node, "PRE-ORIENTATION", segment.m_PreRotation,
                  "The orientation of this joint in the co-ordinate frame of the parent segment",
                  false);
  ReadExpressions(node, "PRE-POSITION", segment.m_PreTranslation,
                  "The position of this joint in the co-ordinate frame of the parent segment",
                  false);
  ReadNumbers(node, "INVERSE-POST-ORIENTATION", segment.m_InversePostRotation,
              "The inverse orientation of this joint in the co-ordinate frame of the this segment",
              V3_2);
  ReadNumbers(node, "INVERSE-POST-POSITION", segment.m_InversePostTranslation,
              "The inverse position of the child segment in the co-ordinate frame of this joint",
              V3_2);
  ReadPost(node, extras,
           "The orientation of this joint in the co-ordinate frame of the this segment");
  ReadNumberList(node, "RANGE-CENTRING-STATE", joint.m_TemplateRangeCentringState, n,
                 "Joint type dependent transformation used to centre joint state data in the "
                 "middle of the range space in the uncalibrated subject",
                 false, V3_0);
  ReadNumberList(node, "RANGE-MATRIX", joint.m_TemplateRangeMatrix, n * n,
                 "Covariance-like matrix defining the joint ranges in the uncalibrated subject",
                 false, V3_0);
}

void DeclareJoint(INode& node, VReadContext& context, std::uint32_t index) {
  auto& segment = context.m_rSubject.m_Segments[index];
  auto& extras = context.m_rExtras.m_Segments[index];
  auto& appJoint = context.m_rAppData.m_Segments[index].m_Joint;
  auto& joint = segment.m_Joint;
  joint.m_JointType = JointTypeOfElement(node.Name());
  const std::size_t n = JointParameterCount(joint.m_JointType);

  ReadString(node, "NAME", joint.m_Name, "The name of this joint", XsdId, false);
  if (ReadNumbers(node, "PRE-ORIENTATION", extras.m_PreRotation,
                  "The orientation of this joint in the co-ordinate frame of the parent segment",
                  V2_0)) {
    segment.m_PreRotation = AsExpressions(extras.m_PreRotation);
  }
  if (ReadNumbers(node, "PRE-POSITION", extras.m_PreTranslation,
                  "The position of this joint in the co-ordinate frame of the parent segment",
                  V2_0)) {
    segment.m_PreTranslation = AsExpressions(extras.m_PreTranslation);
  }
  ReadPost(node, extras,
           "The orientation of the child segment in the co-ordinate frame of this joint");
  ReadNumbers(node, "INVERSE-POST-ORIENTATION", segment.m_InversePostRotation,
              "The inverse orientation of the child segment in the co-ordinate frame of this joint",
              V3_2);
  ReadNumbers(node, "INVERSE-POST-POSITION", segment.m_InversePostTranslation,
              "The inverse position of the child segment in the co-ordinate frame of this joint",
              V3_2);
  ReadRetired(node, "EDIT_POSE_MEAN", extras.m_JointStrings);
  ReadRetired(node, "T-POSE", extras.m_JointStrings);
  ReadRetired(node, "BOUNDS", extras.m_JointStrings);
  ReadNumberList(node, "MEAN", joint.m_Mean, n, "The mean state of this joint");
  ReadNumberList(node, "COVARIANCE", joint.m_Covariance, n * n,
                 "The covariance in the mean state of this joint");
  if (ReadOptionalDoubleList(node, "T", extras.m_TPose, n, 0,
                             "The state of this joint in the T-pose. A placeholder (*) indicates "
                             "an unconstrained degree of freedom",
                             XsdString, false)) {
    extras.m_HasTPose = true;
  }
  ReadText(node, "SIGNS", appJoint.m_Signs,
           "A list of either + or - indicating the sign of the state output from this joint");
  ReadText(node, "LABELS", appJoint.m_Labels,
           "A list of text labels to be used for identifying the state output from this joint");
  ReadNumberList(node, "RANGE-CENTRING-STATE", joint.m_RangeCentringState, n,
                 "Joint type dependent transformation used to centre joint state data in the "
                 "middle of the range space",
                 false, V3_0);
  ReadNumberList(node, "RANGE-MATRIX", joint.m_RangeMatrix, n * n,
                 "Covariance-like matrix defining the joint ranges", false, V3_0);

  node.Child("JointTemplate", "Stores the skeleton TEMPLATE", 0, 1, V2_0);
  node.Children([&context, index](INode& child) { DeclareJointTemplate(child, context, index); });

  switch (joint.m_JointType) {
  case VJointTypeBase::EHardySpicer:
    if (ReadNumberList(node, "AXIS-PAIR", extras.m_Axes, AnyCount,
                       "The pair of axes of this (Hardy Spicer) joint")) {
      extras.m_HasAxes = true;
    }
    break;
  case VJointTypeBase::EHinge:
  case VJointTypeBase::ESlider:
    if (ReadNumberList(node, "AXIS", extras.m_Axes, AnyCount, "The axis of this (hinge) joint")) {
      extras.m_HasAxes = true;
    }
    break;
  case VJointTypeBase::EFree:
  case VJointTypeBase::EBall:
    ReadEnum(node, "EULER-ORDER", appJoint.m_EulerOrder, EulerOrderEnum(),
             "The Euler angle order to be used when displaying the state output from this joint",
             false);
    break;
  default:
    break;
  }
}

void DeclareSegment(INode& node, VReadContext& context, ZMT::IOptional<std::uint32_t> parent,
                    std::uint32_t depth) {
  const auto errors = node.ErrorCount();
  auto& subject = context.m_rSubject;
  const auto index = static_cast<std::uint32_t>(subject.m_Segments.size());
  VSegment segment;
  segment.m_SegmentIndex = index;
  segment.m_ParentSegmentIndex = parent;
  segment.m_TreeDepth = depth;
  segment.m_PreRotation = {"0", "0", "0"};
  segment.m_PreTranslation = {"0", "0", "0"};
  VSegmentAppData appSegment;
  VSubjectKMTExtras::VSegment extras;

  ReadString(node, "NAME", segment.m_Name, "The name of this segment", XsdId, true);
  ReadExpressions(node, "POSITION", segment.m_PreTranslation, "DEPRECATED", false, V1_0, V1_0);
  const std::uint8_t opacity = ReadOpacity(node, "The opacity of this segment", V3_0);
  ReadExpressions(node, "ORIENTATION", segment.m_PreRotation, "DEPRECATED", false, V1_0, V1_0);
  ReadExpressions(node, "BOUNDS", segment.m_Bounds,
                  "A pair of vectors describing the upper and lower corners of the box used for "
                  "visualising this segment",
                  false);
  ReadText(node, "MASS", segment.m_MassExpression,
           "The mass of this segment as a proportion of the total subject mass", false, V2_0);
  ReadExpressions(node, "MASS-CENTRE", segment.m_MassCentreExpressions,
                  "The location of this segments centre of mass in the local co-ordinate system",
                  false, V2_0);
  ReadExpressions(node, "INERTIA", segment.m_RadiusOfGyrationExpressions,
                  "The radii of gyration of this segment about the local co-ordinate system axes",
                  false, V2_0);
  ReadColour(node, "RGB", appSegment.m_Colour, "The colour of this segment", XsdString, false);
  ReadText(node, "CONTEXT", appSegment.m_Context, "The context of this segment (e.g. Left, Right)",
           false, V2_0);
  ReadHidden(node, appSegment.m_Visible, "Whether the segment is hidden or visible", false, V3_0);
  ReadDouble(node, "DRAW-END-RATIO", appSegment.m_DrawEndRatio,
             "The ratio between the size of the start and end of the geometry used to represent "
             "the segment",
             XsdDouble, false, V3_0);
  ReadDouble(node, "DRAW-HEIGHT", appSegment.m_DrawHeight,
             "A multiplier applied to the height of the geometry used to represent the segment",
             XsdDouble, false, V3_0);
  ReadDouble(node, "DRAW-TWIST", appSegment.m_DrawTwist,
             "The rotation to apply to the geometry tat represents the segment", XsdDouble, false,
             V3_0);
  ReadDouble(node, "DRAW-WIDTH", appSegment.m_DrawWidth,
             "A multiplier applied to the width of the geometry used to represent the segment",
             XsdDouble, false, V3_0);
  ReadText(node, "PART", appSegment.m_Part,
           "The part of the body this segment represents based on a specific list of body parts",
           false, V3_0);
  ReadRetired(node, "COVARIANCE", extras.m_SegmentStrings);
  ReadRetired(node, "SIZE", extras.m_SegmentStrings);
  ReadEnum(node, "DRAW-STYLE", appSegment.m_DrawStyle, DrawStyleEnum(),
           "Specifies what type of geometry should be used to draw the segment", false, V3_0);
  ReadEnum(node, "DRAW-SHADING", appSegment.m_DrawShading, DrawShadingEnum(),
           "Specifies how the segment should be rendered", false, V3_0);
  appSegment.m_Colour[3] = opacity;

  subject.m_Segments.push_back(std::move(segment));
  context.m_rAppData.m_Segments.push_back(std::move(appSegment));
  context.m_rExtras.m_Segments.push_back(std::move(extras));

  if (depth >= MaxSegmentDepth) {
    node.Error(ZMT::FormatOrRaw("Segment %1% is nested deeper than %2% segments",
                                subject.m_Segments[index].m_Name, MaxSegmentDepth));
  } else {
    node.Child("Segment", "A single segment in the skeletal hierarchy", 0, -1);
    node.Children([&context, index, depth](INode& child) {
      DeclareSegment(child, context, index, depth + 1);
    });
    for (const auto& element : JointElements)
      node.Child(element.m_pName, element.m_pDocumentation, 1, 1);
    node.Children([&context, index](INode& child) { DeclareJoint(child, context, index); }, true);
  }

  if (node.ErrorCount() != errors) {
    // Drop the segment with everything below it; they follow it in depth-first order.
    context.DropSegmentsFrom(index);
  }
}

} // namespace

void DeclareSkeleton(INode& node, VReadContext& context) {
  ReadText(node, "NAME", context.m_rExtras.m_SkeletonName, "DEPRECATED");
  ReadColour(node, "RGB", context.m_rAppData.m_Colour, "The colour of this subject", XsdString,
             false);
  node.Child("Segment", "A single segment in the skeletal hierarchy", 0, -1);
  node.Children([&context](INode& child) { DeclareSegment(child, context, {}, 0); });
}

} // namespace CoreOstraKMTIO::Detail
