// KinematicModel, Parameters and Skin.

#include "River/CoreOstraKMTIO/Declaration.h"

#include "DebugServices/GlobalLog.h"

#include <algorithm>
#include <cmath>

namespace CoreOstraKMTIO::Detail {

using namespace Versions;
using namespace UtilsRapidXml;
using CoreOstraTypes::VSubjectParametrised;

namespace {

template <class TRecord>
std::optional<std::uint32_t> FindByName(const std::vector<TRecord>& records,
                                        VReadContext::VNameIndex& index, const std::string& name) {
  if (records.size() < index.m_Count) index = {};
  for (; index.m_Count < records.size(); ++index.m_Count) {
    index.m_First.emplace(records[index.m_Count].m_Name, static_cast<std::uint32_t>(index.m_Count));
  }
  const auto it = index.m_First.find(name);
  if (it == index.m_First.end()) return std::nullopt;
  return it->second;
}

} // namespace

std::optional<std::uint32_t> VReadContext::FindSegment(const std::string& name) const {
  return FindByName(m_rSubject.m_Segments, m_SegmentNames, name);
}

std::optional<std::uint32_t> VReadContext::FindMarker(const std::string& name) const {
  return FindByName(m_rSubject.m_Markers, m_MarkerNames, name);
}

bool VReadContext::HasMarkerId(std::uint32_t id) const {
  const auto& markers = m_rSubject.m_Markers;
  if (markers.size() < m_MarkerIds.m_Count) m_MarkerIds = {};
  if (m_MarkerIds.m_Ids.empty()) m_MarkerIds.m_Ids.reserve(256);
  for (; m_MarkerIds.m_Count < markers.size(); ++m_MarkerIds.m_Count)
    m_MarkerIds.m_Ids.insert(markers[m_MarkerIds.m_Count].m_MarkerId);
  return m_MarkerIds.m_Ids.count(id) != 0;
}

void VReadContext::DropSegmentsFrom(std::uint32_t index) {
  m_rSubject.m_Segments.resize(index);
  m_rAppData.m_Segments.resize(index);
  m_rExtras.m_Segments.resize(index);
  m_SegmentNames = {};
}

bool ReadNumberList(INode& node, std::string_view name, std::vector<double>& o_rValues,
                    std::size_t count, std::string_view documentation, bool required,
                    const IVersion& lower, const IVersion& upper) {
  return ReadDoubleListReplacing(node, name, o_rValues, count, documentation, XsdString, required,
                                 lower, upper);
}

bool ReadText(INode& node, std::string_view name, std::string& o_rValue,
              std::string_view documentation, bool required, const IVersion& lower,
              const IVersion& upper) {
  return ReadString(node, name, o_rValue, documentation, XsdString, required, lower, upper);
}

bool ReadHidden(INode& node, bool& io_rVisible, std::string_view documentation, bool required,
                const IVersion& lower) {
  bool hidden = !io_rVisible;
  if (!ReadBool(node, "HIDDEN", hidden, documentation, XsdString, required, lower)) return false;
  io_rVisible = !hidden;
  return true;
}

std::uint8_t ReadOpacity(INode& node, std::string_view documentation, const IVersion& lower) {
  double opacity = 255.0;
  ReadDouble(node, "OPACITY", opacity, documentation, XsdDouble, false, lower);
  if (std::isnan(opacity)) return 255;
  return static_cast<std::uint8_t>(std::clamp(opacity, 0.0, 255.0));
}

std::array<double, 3> NormaliseDirection(const std::array<double, 3>& direction) {
  const double length = std::sqrt(direction[0] * direction[0] + direction[1] * direction[1] +
                                  direction[2] * direction[2]);
  if (!(length >= 0.001) || !std::isfinite(length)) return direction;
  return {direction[0] / length, direction[1] / length, direction[2] / length};
}

namespace {

void DeclareStaticParameter(INode& node, VReadContext& context) {
  const auto errors = node.ErrorCount();
  VSubjectParametrised::VStaticParameter parameter;
  ReadString(node, "NAME", parameter.m_Name, "The name of this parameter", XsdId, true);
  ReadOptionalDouble(node, "VALUE", parameter.m_UserValue.Raw(),
                     "The value of this parameter (in KMT units)", XsdString, false);
  ReadOptionalDouble(node, "PRIOR", parameter.m_Prior.Raw(),
                     "The prior value for this parameter (in KMT units)", XsdString, false);
  ReadText(node, "EXPRESSION", parameter.m_DefaultExpression,
           "The calculated prior expression for this parameter (in KMT units)", false, V2_0);
  ReadHidden(node, parameter.m_Visible,
             "Specifies whether this parameter will be displayed to the user", false, V2_0);
  ReadBool(node, "ADVANCED", parameter.m_Advanced,
           "Specifies whether this parameter should be listed in the advanced section", XsdString,
           false, V2_0);
  ReadBool(node, "READONLY", parameter.m_ReadOnly,
           "Specifies whether the user may edit this parameter", XsdString, false, V2_0);
  ReadBool(node, "REQUIRED", parameter.m_Required,
           "Specifies whether the user must provide a value for this parameter", XsdString, false,
           V2_0);
  ReadEnum(node, "QUANTITY", parameter.m_Quantity, QuantityEnum(), "The parameter quantity", false,
           V2_0);
  if (node.ErrorCount() == errors) context.m_rSubject.m_StaticParameters.push_back(parameter);
}

void DeclareParameter(INode& node, VReadContext& context) {
  const auto errors = node.ErrorCount();
  VSubjectParametrised::VDynamicParameter parameter;
  ReadString(node, "NAME", parameter.m_Name, "The name of this parameter", XsdId, true);
  ReadDouble(node, "VALUE", parameter.m_Value, "The value of this parameter (in KMT units)",
             XsdDouble, true);
  ReadDouble(node, "PRIOR", parameter.m_Prior, "The prior value for this parameter (in KMT units)",
             XsdDouble, false, V2_0);
  ReadOptionalDouble(node, "SD", parameter.m_StandardDeviation.Raw(),
                     "The standard deviation (SD) in this parameter (in KMT units)", XsdString,
                     false, V2_0);
  ReadHidden(node, parameter.m_Visible,
             "Specifies whether this parameter will be displayed to the user", false, V2_0);
  if (node.ErrorCount() == errors) context.m_rSubject.m_DynamicParameters.push_back(parameter);
}

void DeclareSkin(INode& node, VReadContext& context) {
  auto& appData = context.m_rAppData;
  ReadText(node, "NAME", appData.m_Skin, "Skin name");
  ReadColour(node, "RGB1", appData.m_SkinColourA, "The primary colour applied to the skin",
             XsdString, false);
  ReadColour(node, "RGB2", appData.m_SkinColourB, "The secondary colour applied to the skin",
             XsdString, false);
}

} // namespace

void DeclareParameters(INode& node, VReadContext& context) {
  node.Child("StaticParameter",
             "An individual parameter for describing a physically measured (constant) aspect of "
             "the model geometry",
             0, -1, V2_0);
  node.Children([&context](INode& child) { DeclareStaticParameter(child, context); });
  node.Child("Parameter",
             "An individual parameter for describing a variable aspect of the model geometry", 0,
             -1);
  node.Children([&context](INode& child) { DeclareParameter(child, context); });
}

void DeclareKinematicModel(INode& node, VReadContext& context) {
  auto& subject = context.m_rSubject;
  auto& appData = context.m_rAppData;
  ReadText(node, "MODEL", subject.m_Model,
           "The name of the original model template that is used to generate this file (usually "
           "present in a KMF only)");
  IVersion version(1, 0);
  ReadVersion(node, "VERSION", version, "The version number of the KMT language used in this file",
              XsdString, false);
  node.SetVersion(version);
  context.m_FileVersion = version;
  ReadText(node, "MODEL-VERSION", subject.m_ModelVersion,
           "Generic version number to indicate an update to a model", false, V3_5);
  ReadText(node, "RETARGET-SOURCE-TEMPLATE", appData.m_RetargetSourceTemplate,
           "Template used for retargeting", false, V3_5);
  ReadText(node, "RETARGET-SOURCE-SUBJECT", appData.m_RetargetSourceSubject,
           "Subject used for retargeting", false, V3_5);

  bool development = false;
  if (ReadBool(node, "DEVELOPMENT", development,
               "Whether this KMT version is still in development.", XsdString, false)) {
    node.Error("Attempting to load a KMT version which was saved while in development.");
    context.m_Refused = true;
    node.Abandon();
    return;
  }
  if (version < context.m_MinVersion) {
    node.Error(
        ZMT::FormatOrRaw("Cannot load KMT file with version %1%, minimum supported version is %2%",
                         version.ToString(), context.m_MinVersion.ToString()));
    context.m_Refused = true;
    node.Abandon();
    return;
  }
  if (version > context.m_MaxVersion) {
    node.Error(
        ZMT::FormatOrRaw("Cannot load KMT file with version %1%, maximum supported version is %2%",
                         version.ToString(), context.m_MaxVersion.ToString()));
    context.m_Refused = true;
    node.Abandon();
    return;
  }

  node.Child("Parameters",
             "The section of the KMT/KMF containing the (variable) parameters that describe the "
             "model geometry",
             0, 1);
  node.Children([&context](INode& child) { DeclareParameters(child, context); });
  node.Child("Skeleton", "The skeletal hierarchy part of the model", 1, 1);
  node.Children([&context](INode& child) { DeclareSkeleton(child, context); });
  node.Child("MarkerSet", "The section of the model that describes a marker set", 1, 1);
  node.Children([&context](INode& child) { DeclareMarkerSet(child, context); });
  node.Child("TargetSet", "The section of the model that describes the target set", 0, 1, V3_0);
  node.Children([&context](INode& child) { DeclareTargetSet(child, context); });
  node.Child("Skin", "The skin to apply when rendering the skeleton.", 0, 1, V3_3);
  node.Children([&context](INode& child) { DeclareSkin(child, context); });
  node.Child("SubjectDynamicSubspace", "Subject dynamic subspace specification", 0, 1, V3_5);
  node.Children([&context](INode& child) { DeclareSubspace(child, context); });
}

void DeclareDocument(INode& node, VReadContext& context) {
  node.Child("KinematicModel", "The root node of a kinematic model (KMF)", 1, 1);
  node.Children([&context](INode& model) { DeclareKinematicModel(model, context); });
}

} // namespace CoreOstraKMTIO::Detail
