#include "OstraAlgo/SubjectConversions/CalibratedFromParametrised.h"

#include "DebugServices/GlobalLog.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"
#include "OstraAlgo/SubjectConversions/SkeletonParameterRecords.h"
#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/ExpressionNumber.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

namespace SubjectConversions {

using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypesUtils::FormatExpressionNumber;
using namespace KinematicAlgo;

#define CONVERSION_LOG(level, ...) ZMT_LOG(SubjectConversionChannel, level, __VA_ARGS__)

std::shared_ptr<VSubjectCalibrated> CalibratedFromParametrised(const VSubjectParametrised& subject,
                                                               VSkeletonParameters& o_rParameters) {
  CoreOstraTypes::VSubject solved;
  if (!CoreOstraTypesUtils::SubjectFromParametrised(subject, solved)) {
    CONVERSION_LOG(ZMT::ELogError, "Cannot evaluate subject %1% for its calibrated model",
                   subject.m_Name);
    return nullptr;
  }
  std::vector<std::string> errors, notes;
  auto model = SubjectCalibratedFromRecord(solved, errors, notes);
  for (const auto& note : notes)
    CONVERSION_LOG(ZMT::ELogWarning, "%1%", note);
  if (!model) {
    for (const auto& e : errors)
      CONVERSION_LOG(ZMT::ELogError, "%1%", e);
    CONVERSION_LOG(ZMT::ELogError, "Cannot build the calibrated model of subject %1%",
                   subject.m_Name);
    return nullptr;
  }

  CoreOstraTypesUtils::VDynamicExpressionParserSimple parser;
  parser.SetParameters(subject, errors); // it evaluated, so every static parameter is defined
  const auto namesParameter = [&](auto first, auto last) {
    for (; first != last; ++first)
      if (NamesParameter(parser, *first)) return true;
    return false;
  };

  VSkeletonParameters parameters;
  parameters.SetName(subject.m_Name);
  parameters.Parameters() = SkeletonParametersFromRecord(subject);
  for (const auto& segment : subject.m_Segments) {
    if (!namesParameter(segment.m_PreRotation.begin(), segment.m_PreRotation.end()) &&
        !namesParameter(segment.m_PreTranslation.begin(), segment.m_PreTranslation.end()))
      continue;
    VSkeletonParameterLink link;
    link.m_Segment = segment.m_Name;
    std::copy(segment.m_PreRotation.begin(), segment.m_PreRotation.end(),
              link.m_Expressions.begin());
    std::copy(segment.m_PreTranslation.begin(), segment.m_PreTranslation.end(),
              link.m_Expressions.begin() + 3);
    CoreOstraTypesUtils::Vector3 rotation, translation;
    CoreOstraTypesUtils::InvertAngleAxisPose(
        segment.m_InversePostRotation, segment.m_InversePostTranslation, rotation, translation);
    for (std::size_t i = 0; i < 3; ++i) {
      link.m_Expressions[6 + i] = FormatExpressionNumber(rotation[i]);
      link.m_Expressions[9 + i] = FormatExpressionNumber(translation[i]);
    }
    parameters.SegmentLinks().push_back(std::move(link));
  }
  for (std::uint32_t m = 0; m < subject.m_Markers.size(); ++m) {
    const auto places = MarkerPlaces(subject, m);
    if (places.empty()) continue;
    const auto [t, first] = places.front();
    const auto begin = subject.m_Targets[t].m_StateExpressions.begin() + std::ptrdiff_t(first);
    if (!namesParameter(begin, begin + 3)) continue;
    VMarkerParameterLink link;
    link.m_Marker = subject.m_Markers[m].m_Name;
    std::copy(begin, begin + 3, link.m_Expressions.begin());
    parameters.MarkerLinks().push_back(std::move(link));
  }
  o_rParameters = std::move(parameters);
  return model;
}

} // namespace SubjectConversions
