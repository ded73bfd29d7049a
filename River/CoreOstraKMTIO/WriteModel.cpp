// The writer's KinematicModel, Parameters, Skin and SubjectDynamicSubspace.

#include "River/CoreOstraKMTIO/WriterElements.h"

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"
#include "Utils/UtilsRapidXml/AttributeText.h"

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;

bool WriteText(VWriterNode& node, std::string_view name, const std::string& value, bool required,
               const IVersion& lower, const IVersion& upper) {
  if (!required && TrimBlanks(value).empty()) return false;
  return WriteString(node, name, value, lower, upper);
}

bool WriteNumbers(VWriterNode& node, std::string_view name, std::span<const double> values,
                  const IVersion& lower, const IVersion& upper) {
  if (values.empty()) return false;
  return WriteDoubleList(node, name, values, lower, upper);
}

bool IsZero(const std::array<double, 3>& direction) {
  return direction[0] == 0.0 && direction[1] == 0.0 && direction[2] == 0.0;
}

namespace {

void WriteParameters(VWriterNode& node, const VWriteContext& context) {
  const auto& subject = context.m_rSubject;
  node.Children(
      "StaticParameter", subject.m_StaticParameters,
      [](VWriterNode& child, const auto& parameter) {
        WriteText(child, "NAME", parameter.m_Name, true);
        WriteOptionalDouble(child, "VALUE", parameter.m_UserValue.Raw());
        WriteOptionalDouble(child, "PRIOR", parameter.m_Prior.Raw());
        WriteText(child, "EXPRESSION", parameter.m_DefaultExpression, false, V2_0);
        WriteBool(child, "HIDDEN", !parameter.m_Visible, V2_0);
        WriteBool(child, "ADVANCED", parameter.m_Advanced, V2_0);
        WriteBool(child, "READONLY", parameter.m_ReadOnly, V2_0);
        WriteBool(child, "REQUIRED", parameter.m_Required, V2_0);
        WriteEnum(child, "QUANTITY", parameter.m_Quantity, QuantityEnum(), V2_0);
      },
      V2_0);
  node.Children("Parameter", subject.m_DynamicParameters,
                [](VWriterNode& child, const auto& parameter) {
                  WriteText(child, "NAME", parameter.m_Name, true);
                  WriteDouble(child, "VALUE", parameter.m_Value);
                  WriteDouble(child, "PRIOR", parameter.m_Prior, V2_0);
                  WriteOptionalDouble(child, "SD", parameter.m_StandardDeviation.Raw(), V2_0);
                  WriteBool(child, "HIDDEN", !parameter.m_Visible, V2_0);
                });
}

void WriteSkin(VWriterNode& node, const VWriteContext& context) {
  const auto& appData = context.m_rAppData;
  WriteText(node, "NAME", appData.m_Skin, false);
  WriteColour(node, "RGB1", appData.m_SkinColourA);
  WriteColour(node, "RGB2", appData.m_SkinColourB);
}

void WriteChunk(VWriterNode& node, const CoreOstraTypesUtils::VGenericDynamicSubspace& chunk) {
  WriteText(node, "NAME", chunk.m_Name, true, V3_5);
  WriteText(node, "VERSION", chunk.m_Version, true, V3_5);
  // Joined by appending: boost's join, inlined here, makes GCC 12 warn falsely (-Wrestrict).
  std::string jointNames;
  for (std::size_t i = 0; i < chunk.m_JointNames.size(); ++i) {
    if (i > 0) jointNames += ' ';
    jointNames += chunk.m_JointNames[i];
  }
  WriteText(node, "JOINT-NAMES", jointNames, true, V3_5);
  WriteDoubleList(node, "JOINT-PARAMS-MEAN", chunk.m_JointParamsForMeanPose, V3_5);
  node.Children(
      "PrincipalComponent", chunk.m_RemarkableActions,
      [](VWriterNode& child, const auto& action) {
        WriteText(child, "NAME", action.m_Name, false, V3_5);
        WriteDoubleList(child, "JOINT-PARAMS", action.m_JointParams, V3_5);
        WriteDouble(child, "SQRT-EIGENVALUE", action.m_SqrtEigenvalue, V3_5);
        WriteDouble(child, "LOWER-BOUND", action.m_LowerBound, V3_5);
        WriteDouble(child, "UPPER-BOUND", action.m_UpperBound, V3_5);
        WriteDouble(child, "TEMPORAL-DERIVATIVE-SD", action.m_TemporalDerivativeStddev, V3_5);
      },
      V3_5);
}

void WriteSubspace(VWriterNode& node, const VWriteContext& context) {
  for (const auto& chunk : context.m_rSubspace.m_PcaControlledParams) {
    CoreOstraTypesUtils::VGenericDynamicSubspace generic;
    if (!CoreOstraTypesUtils::BuildGenericDynamicSubspace(context.m_rSubject, chunk, generic)) {
      node.Error(
          ZMT::FormatOrRaw("Failed to build a generic subspace for chunk '%s'", chunk.m_Name));
      continue;
    }
    node.Child(
        "PcaControlledParams", [&generic](VWriterNode& child) { WriteChunk(child, generic); },
        V3_5);
  }
}

} // namespace

void WriteKinematicModel(VWriterNode& node, const VWriteContext& context) {
  const auto& subject = context.m_rSubject;
  const auto& appData = context.m_rAppData;
  WriteText(node, "xmlns:xsi", context.m_XmlnsXsi, false);
  WriteText(node, "xsi:noNamespaceSchemaLocation", context.m_SchemaLocation, false);
  WriteText(node, "MODEL", subject.m_Model, false);
  WriteVersion(node, "VERSION", node.Version());
  WriteText(node, "MODEL-VERSION", subject.m_ModelVersion, false, V3_5);
  WriteText(node, "RETARGET-SOURCE-TEMPLATE", appData.m_RetargetSourceTemplate, false, V3_5);
  WriteText(node, "RETARGET-SOURCE-SUBJECT", appData.m_RetargetSourceSubject, false, V3_5);

  const bool hasStatic = !subject.m_StaticParameters.empty() && !node.IsOutOfRange(V2_0, None);
  if (hasStatic || !subject.m_DynamicParameters.empty()) {
    node.Child("Parameters", [&context](VWriterNode& child) { WriteParameters(child, context); });
  }
  node.Child("Skeleton", [&context](VWriterNode& child) { WriteSkeleton(child, context); });
  node.Child("MarkerSet", [&context](VWriterNode& child) { WriteMarkerSet(child, context); });
  if (!subject.m_Targets.empty()) {
    node.Child(
        "TargetSet", [&context](VWriterNode& child) { WriteTargetSet(child, context); }, V3_0);
  }
  if (!TrimBlanks(appData.m_Skin).empty()) {
    node.Child(
        "Skin", [&context](VWriterNode& child) { WriteSkin(child, context); }, V3_3);
  }
  if (!context.m_rSubspace.m_PcaControlledParams.empty()) {
    node.Child(
        "SubjectDynamicSubspace", [&context](VWriterNode& child) { WriteSubspace(child, context); },
        V3_5);
  }
}

} // namespace CoreOstraKMTIO::Detail
