#include "River/CoreOstraTypesUtils/SubjectCheck.h"

#include "DebugServices/GlobalLog.h"
#include "DebugServices/GlobalLogStream.h"
#include "River/CoreOstraTypesUtils/CovarianceTest.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <cmath>
#include <set>
#include <string>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;
using Normals = std::vector<std::array<double, 3>>;

#define CHECK_LOG(...) ZMT_LOG(SubjectCheckChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

// Tolerance of the unit-length tests on directions and view normals.
constexpr double UnitTolerance = 1e-6;

/// Expected counts of a target type. A marker count of -1 means "at least 3" and a state or
/// covariance size of -1 the rigid-body forms; a covariance size of -2 means any size.
struct VTargetShape {
  const char* m_pName;
  int m_Markers;
  int m_Rotations;
  int m_State;
  int m_Covariance;
  std::size_t m_TestedBlock; ///< size n of the n by n covariance test; 0 for none
};

bool ShapeOf(VTargetTypeBase::ETargetType type, VTargetShape& o_rShape) {
  switch (type) {
  case VTargetTypeBase::ELocalPointToWorldPoint:
    o_rShape = {"ELocalPointToWorldPoint", 1, 0, 3, -2, 0};
    return true;
  case VTargetTypeBase::ELocalPointToWorldPointGaussian:
    o_rShape = {"ELocalPointToWorldPointGaussian", 1, 0, 3, 9, 3};
    return true;
  case VTargetTypeBase::ELocalPlaneToWorldPoint:
    o_rShape = {"ELocalPlaneToWorldPoint", 1, 0, 6, -2, 0};
    return true;
  case VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    o_rShape = {"ELocalPlaneToWorldPointGaussian", 1, 0, 6, 1, 0};
    return true;
  case VTargetTypeBase::ELocalLineToWorldPoint:
    o_rShape = {"ELocalLineToWorldPoint", 1, 0, 6, -2, 0};
    return true;
  case VTargetTypeBase::ELocalLineToWorldPointGaussian:
    o_rShape = {"ELocalLineToWorldPointGaussian", 1, 0, 6, 4, 0};
    return true;
  case VTargetTypeBase::ERigidBody:
    o_rShape = {"ERigidBody", -1, 0, -1, -1, 0};
    return true;
  case VTargetTypeBase::ELocalRotationToWorldRotation:
    // This spelling is part of the messages' text.
    o_rShape = {"ElocalRotationToWorldRotation", 0, 1, 3, 0, 0};
    return true;
  case VTargetTypeBase::ELocalDirectionToWorldDirection:
    o_rShape = {"ELocalDirectionToWorldDirection", 0, 1, 3, 0, 0};
    return true;
  default:
    return false;
  }
}

double SquaredNorm(const std::array<double, 3>& v) {
  return v[0] * v[0] + v[1] * v[1] + v[2] * v[2];
}

bool CheckViewNormals(const Normals& normals, std::size_t markerCount) {
  bool ok = normals.empty() || normals.size() == markerCount;
  for (const auto& normal : normals) {
    const double s = SquaredNorm(normal);
    if (!(s == 0.0 || std::abs(s - 1.0) <= UnitTolerance)) ok = false;
  }
  if (!ok) CHECK_LOG("Invalid target view normals");
  return ok;
}

bool CheckRotationRules(VTargetTypeBase::ERotationCalibrationBehaviourType behaviour,
                        const std::vector<double>& orientation) {
  switch (behaviour) {
  case VTargetTypeBase::EOther:
    if (orientation.empty()) return true;
    CHECK_LOG("Incorrect rotation target orientation size. Expected 0. Actual %d",
              orientation.size());
    return false;
  case VTargetTypeBase::EHingeLike:
  case VTargetTypeBase::EHardySpicerLike:
    if (orientation.size() == 3) return true;
    CHECK_LOG("Incorrect rotation target orientation size. Expected 3. Actual %d ",
              orientation.size());
    return false;
  default:
    CHECK_LOG("Invalid rotation calibration behaviour");
    return false;
  }
}

/// Size rule of an optional vector: n entries, or empty.
bool SizeOrEmpty(const std::vector<double>& v, std::size_t n) {
  return v.empty() || v.size() == n;
}

/// The matrix test on a filled matrix of the right size; an empty one has nothing to test.
bool MatrixOk(const std::vector<double>& m, std::size_t n) {
  return m.empty() || m.size() != n * n || IsValidCovarianceBlock(m.data(), n);
}

bool CheckIndices(const std::vector<std::uint32_t>& indices, std::size_t count,
                  const char* message) {
  bool ok = true;
  for (auto index : indices) {
    if (index < count) continue;
    CHECK_LOG(message, index);
    ok = false;
  }
  return ok;
}

std::string TargetName(const VSubjectApplicationData* pAppData, std::size_t index) {
  if (pAppData && index < pAppData->m_Targets.size() && !pAppData->m_Targets[index].m_Name.empty())
    return pAppData->m_Targets[index].m_Name;
  return std::to_string(index);
}

} // namespace

bool CheckJoint(const VSubject::VJoint& joint) {
  const std::size_t n = JointParameterCount(joint.m_JointType);
  bool ok = true;
  auto rule = [&ok](bool holds, const char* message) {
    if (holds) return;
    CHECK_LOG(message);
    ok = false;
  };
  rule(joint.m_Mean.size() == n, "Incorrent 'Mean' vector size.");
  const bool covarianceSized = joint.m_Covariance.size() == n * n;
  rule(covarianceSized, "Incorrect 'Covariance' vector size.");
  // A joint without parameters has an empty covariance and nothing to test.
  rule(!covarianceSized || n == 0 || IsValidCovarianceBlock(joint.m_Covariance.data(), n),
       "Invalid joint covariance matrix");
  rule(SizeOrEmpty(joint.m_RangeCentringState, n), "Incorrect 'RangeCenteringState' vector size.");
  rule(SizeOrEmpty(joint.m_RangeMatrix, n * n), "Incorrect 'RangeMatrix' size.");
  rule(MatrixOk(joint.m_RangeMatrix, n), "Invalid joint range matrix");
  rule(joint.m_RangeCentringState.empty() == joint.m_RangeMatrix.empty(),
       "Inconsistent range information.");
  return ok;
}

bool CheckTarget(const VSubject& subject, std::size_t index) {
  if (index >= subject.m_Targets.size()) {
    CHECK_LOG("Out-of-range target index %1%", index);
    return false;
  }
  const auto& target = subject.m_Targets[index];
  VTargetShape shape;
  if (!ShapeOf(target.m_Type, shape)) {
    CHECK_LOG("Unknown target type");
    return false;
  }
  bool ok = true;
  const std::size_t markers = target.m_MarkerIndices.size();
  const bool rigid = target.m_Type == VTargetTypeBase::ERigidBody;

  if (shape.m_Markers == 1 && markers != 1) {
    CHECK_LOG("Incorrect number of markers, %1% type expects 1 marker", shape.m_pName);
    ok = false;
  } else if (shape.m_Markers == 0 && markers != 0) {
    CHECK_LOG("Incorrect number of markers, %1% type expects no markers", shape.m_pName);
    ok = false;
  } else if (shape.m_Markers < 0 && markers < 3) {
    CHECK_LOG("Incorrect number of markers, %1% type expects at least 3 markers", shape.m_pName);
    ok = false;
  }
  const std::size_t rotations = target.m_RotationObservationIndices.size();
  if (shape.m_Rotations == 0 && rotations != 0) {
    CHECK_LOG("Incorrect number of rotation observations, %1% type expects no rotation "
              "observations",
              shape.m_pName);
    ok = false;
  } else if (shape.m_Rotations == 1 && rotations != 1) {
    CHECK_LOG("Incorrect number of rotation observations, %1% type expects 1 rotation observation",
              shape.m_pName);
    ok = false;
  }
  if (target.m_SegmentIndices.size() != 1) {
    CHECK_LOG("Incorrect number of parent segments, %1% type expects 1 segment", shape.m_pName);
    ok = false;
  }
  if (rigid) {
    if (target.m_State.size() != 3 * (markers + 2)) {
      CHECK_LOG("Incorrect state size, ERigidBody type expects size 3*(MarkerCount+2)");
      ok = false;
    }
    if (target.m_Covariance.size() != 36 + 9 * markers) {
      CHECK_LOG("Incorrect covariance size, ERigidBody type expects size 36 + 9*MarkerCount");
      ok = false;
    } else if (!IsValidRigidBodyCovariance(target.m_Covariance)) {
      CHECK_LOG("Invalid target covariance matrix");
      ok = false;
    }
  } else {
    if (target.m_State.size() != std::size_t(shape.m_State)) {
      CHECK_LOG("Incorrect state size, %1% type expects size %2%", shape.m_pName, shape.m_State);
      ok = false;
    }
    if (shape.m_Covariance >= 0 && target.m_Covariance.size() != std::size_t(shape.m_Covariance)) {
      CHECK_LOG("Incorrect covariance size, %1% type expects size %2%", shape.m_pName,
                shape.m_Covariance);
      ok = false;
    } else if (shape.m_TestedBlock != 0 &&
               !IsValidCovarianceBlock(target.m_Covariance.data(), shape.m_TestedBlock)) {
      CHECK_LOG("Invalid target covariance matrix");
      ok = false;
    }
  }

  if (target.m_Type == VTargetTypeBase::ELocalRotationToWorldRotation) {
    ok = CheckRotationRules(target.m_RotationCalibrationBehaviour,
                            target.m_RotationTargetOrientation) &&
         ok;
  }
  if (target.m_Type == VTargetTypeBase::ELocalDirectionToWorldDirection &&
      target.m_State.size() == 3) {
    const double s = SquaredNorm({target.m_State[0], target.m_State[1], target.m_State[2]});
    if (!(std::abs(s - 1.0) <= UnitTolerance)) {
      CHECK_LOG("Direction should be a unit vector");
      ok = false;
    }
  }
  ok = CheckIndices(target.m_MarkerIndices, subject.m_Markers.size(),
                    "Out of range marker index %1%") &&
       ok;
  ok = CheckIndices(target.m_RotationObservationIndices, subject.m_Rotations.size(),
                    "Out of range rotation observation index %1%") &&
       ok;
  ok = CheckIndices(target.m_SegmentIndices, subject.m_Segments.size(),
                    "Out of range segment index %1%") &&
       ok;
  ok = CheckViewNormals(target.m_ViewNormals, markers) && ok;
  return ok;
}

bool SubjectCheck(const VSubject& subject) {
  // 1. Marker ids and names are unique; the first repeat ends the check.
  std::set<std::uint32_t> ids;
  std::set<std::string> names;
  for (const auto& marker : subject.m_Markers) {
    if (!ids.insert(marker.m_MarkerId).second) {
      CHECK_LOG("Marker duplicate id: %1%", marker.m_MarkerId);
      return false;
    }
    if (!names.insert(marker.m_Name).second) {
      CHECK_LOG("Marker duplicate name: %1%", marker.m_Name);
      return false;
    }
  }

  // 2. Targets, each fully.
  bool targetsOk = true;
  for (std::size_t i = 0; i < subject.m_Targets.size(); ++i)
    targetsOk = CheckTarget(subject, i) && targetsOk;
  if (!targetsOk) return false;

  // 3. Segments in order; the first segment that breaks a rule ends the check.
  const auto& segments = subject.m_Segments;
  for (std::size_t i = 0; i < segments.size(); ++i) {
    const auto& segment = segments[i];
    bool ok = CheckJoint(segment.m_Joint);
    if (segment.m_SegmentIndex != i) {
      CHECK_LOG("Inconsistent segment index.");
      ok = false;
    }
    const auto& parent = segment.m_ParentSegmentIndex;
    if (i == 0) {
      if (segment.m_TreeDepth != 0) {
        CHECK_LOG("The tree depth of the root must be equal to 0.");
        ok = false;
      }
      if (parent.IsSet()) {
        CHECK_LOG("The parent segment of the root segment must not be set.");
        ok = false;
      }
    } else if (!parent.IsSet()) {
      CHECK_LOG("The parent segment of a child segment must be set.");
      ok = false;
    } else if (parent.Value() >= segments.size()) {
      CHECK_LOG("Out-of-range parent segment index.");
      ok = false;
    } else if (parent.Value() >= i) {
      CHECK_LOG("The segments are not in depth-first order.");
      ok = false;
    } else if (segment.m_TreeDepth != segments[parent.Value()].m_TreeDepth + 1) {
      CHECK_LOG("The tree depth of a child must be equal to the parent depth + 1");
      ok = false;
    }
    if (!ok) return false;
  }
  return true;
}

bool CheckJointTemplate(const VSubjectParametrised::VJoint& joint) {
  const std::size_t n = JointParameterCount(joint.m_JointType);
  bool ok = true;
  auto rule = [&ok](bool holds, const char* message) {
    if (holds) return;
    CHECK_LOG(message);
    ok = false;
  };
  rule(SizeOrEmpty(joint.m_TemplateMean, n), "Incorrect 'TemplateMean' vector size.");
  rule(SizeOrEmpty(joint.m_TemplateCovariance, n * n), "Incorrect 'TemplateCovariance' size.");
  rule(MatrixOk(joint.m_TemplateCovariance, n), "Invalid joint template covariance matrix");
  rule(joint.m_TemplateMean.empty() == joint.m_TemplateCovariance.empty(),
       "Inconsistent template stats information.");
  rule(SizeOrEmpty(joint.m_TemplateRangeCentringState, n),
       "Incorrect 'TemplateRangeCentringState' vector size.");
  rule(SizeOrEmpty(joint.m_TemplateRangeMatrix, n * n), "Incorrect 'TemplateRangeMatrix' size.");
  rule(MatrixOk(joint.m_TemplateRangeMatrix, n), "Invalid joint range matrix");
  rule(joint.m_TemplateRangeCentringState.empty() == joint.m_TemplateRangeMatrix.empty(),
       "Inconsistent template range information.");
  rule(SizeOrEmpty(joint.m_BindPose, n), "Incorrect 'BindPose' vector size.");
  return ok;
}

bool CheckTargetTemplate(const VSubjectParametrised::VTarget& target) {
  const char* name = nullptr;
  std::size_t size = 0;
  std::size_t tested = 0; // n of the n by n test
  const std::size_t markers = target.m_MarkerIndices.size();
  switch (target.m_Type) {
  case VTargetTypeBase::ELocalPointToWorldPoint:
    name = "ELocalPointToWorldPoint", size = 9, tested = 3;
    break;
  case VTargetTypeBase::ELocalPointToWorldPointGaussian:
    name = "ELocalPointToWorldPointGaussian", size = 9, tested = 3;
    break;
  case VTargetTypeBase::ELocalPlaneToWorldPoint:
    name = "ELocalPlaneToWorldPoint";
    break;
  case VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    name = "ELocalPlaneToWorldPointGaussian", size = 1, tested = 1;
    break;
  case VTargetTypeBase::ELocalLineToWorldPoint:
    name = "ELocalLineToWorldPoint";
    break;
  case VTargetTypeBase::ELocalLineToWorldPointGaussian:
    name = "ELocalLineToWorldPointGaussian", size = 4, tested = 2;
    break;
  case VTargetTypeBase::ERigidBody:
    name = "ERigidBody", size = 36 + 9 * markers;
    break;
  case VTargetTypeBase::ELocalRotationToWorldRotation:
    name = "ELocalRotationToWorldRotation";
    break;
  case VTargetTypeBase::ELocalDirectionToWorldDirection:
    name = "ELocalDirectionToWorldDirection";
    break;
  default:
    CHECK_LOG("Unknown target type");
    return false;
  }
  bool ok = true;
  const auto& covariance = target.m_TemplateCovariance;
  // An empty template covariance means no template value.
  if (!covariance.empty()) {
    if (covariance.size() != size) {
      if (target.m_Type == VTargetTypeBase::ERigidBody) {
        CHECK_LOG("Incorrect template covariance size, ERigidBody type expects size 36 + "
                  "9*MarkerCount");
      } else {
        CHECK_LOG("Incorrect template covariance size, %1% type expects size %2%", name, size);
      }
      ok = false;
    } else if (target.m_Type == VTargetTypeBase::ERigidBody
                   ? !IsValidRigidBodyCovariance(covariance)
                   : (tested != 0 && !IsValidCovarianceBlock(covariance.data(), tested))) {
      CHECK_LOG("Invalid target template covariance matrix");
      ok = false;
    }
  }
  const bool weighted = target.m_Type == VTargetTypeBase::ELocalPointToWorldPoint ||
                        target.m_Type == VTargetTypeBase::ELocalPointToWorldPointGaussian ||
                        target.m_Type == VTargetTypeBase::ELocalRotationToWorldRotation;
  if (weighted && !(target.m_CalibrationWeight >= 0.0)) {
    CHECK_LOG("Invalid target calibration weight");
    ok = false;
  }
  if (target.m_Type == VTargetTypeBase::ELocalRotationToWorldRotation) {
    ok = CheckRotationRules(target.m_RotationCalibrationBehaviour,
                            target.m_RotationTargetOrientation) &&
         ok;
  }
  return CheckViewNormals(target.m_ViewNormals, markers) && ok;
}

bool SubjectParametrisedCheck(const VSubjectParametrised& subject,
                              const VSubjectApplicationData* pAppData) {
  // 1. The subject at its own parameter values is a valid solved subject.
  VSubject solved;
  if (!SubjectFromParametrised(subject, solved)) return false;
  if (!SubjectCheck(solved)) return false;

  // 2. Joint template values.
  bool ok = true;
  for (const auto& segment : subject.m_Segments) {
    if (CheckJointTemplate(segment.m_Joint)) continue;
    ZMT_LOG_STREAM(SubjectCheckChannel, ZMT::ELogError)
        << "Segment " << segment.m_Name << ", invalid template values";
    ok = false;
  }
  if (!ok) return false;

  // 3. Target template values and weights.
  for (std::size_t i = 0; i < subject.m_Targets.size(); ++i) {
    if (CheckTargetTemplate(subject.m_Targets[i])) continue;
    ZMT_LOG_STREAM(SubjectCheckChannel, ZMT::ELogError)
        << "Target " << TargetName(pAppData, i) << ", invalid weights or template values";
    ok = false;
  }
  if (!ok) return false;

  // 4. Static parameters.
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  if (!parser.SetParameters(subject, errors)) {
    CHECK_LOG("Error parsing Subject static parameter expressions");
    return false;
  }

  // 5. Pre transforms.
  static const char* const Axes[] = {"X", "Y", "Z"};
  double value = 0.0;
  for (const auto& segment : subject.m_Segments) {
    for (int axis = 0; axis < 3; ++axis) {
      const auto& rotation = segment.m_PreRotation[axis];
      if (!rotation.empty() && !parser.Evaluate(rotation, value)) {
        ZMT_LOG_STREAM(SubjectCheckChannel, ZMT::ELogError)
            << "Segment " << segment.m_Name << ", " << Axes[axis]
            << " pre-rotation, invalid expresssion: " << rotation;
        ok = false;
      }
      const auto& translation = segment.m_PreTranslation[axis];
      if (!translation.empty() && !parser.Evaluate(translation, value)) {
        ZMT_LOG_STREAM(SubjectCheckChannel, ZMT::ELogError)
            << "Segment " << segment.m_Name << ", " << Axes[axis]
            << " pre-translation, invalid expresssion: " << translation;
        ok = false;
      }
    }
  }
  if (!ok) return false;

  // 6. Target state expressions.
  for (std::size_t i = 0; i < subject.m_Targets.size(); ++i) {
    const auto& expressions = subject.m_Targets[i].m_StateExpressions;
    for (std::size_t k = 0; k < expressions.size(); ++k) {
      if (expressions[k].empty() || parser.Evaluate(expressions[k], value)) continue;
      ZMT_LOG_STREAM(SubjectCheckChannel, ZMT::ELogError)
          << "Target " << TargetName(pAppData, i) << ", state component " << k
          << ", invalid expresssion: " << expressions[k];
      ok = false;
    }
  }
  return ok;
}

} // namespace CoreOstraTypesUtils
